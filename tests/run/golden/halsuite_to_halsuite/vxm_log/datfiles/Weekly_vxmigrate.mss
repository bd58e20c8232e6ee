[SaveAs]
SaveReportAs=weekly_report.htm

[general]
description=Weekly traffic for the shop

[style]
reportstyle=Corporate
reportlanguage=german
helpcards=Y

[content]
Section0_Name=TopPages_SectionItem
Section0_ItemType=1
Section0_GraphType=3
Section0_elements=10
Section1_Name=TopPages_SectionItem
Section1_ItemType=2
Section1_Elements=25
Section1_SubElements=5
Section2_Name=Browsers_SectionItem
Section2_ItemType=1
Section2_GraphType=9
Section2_elements=8
