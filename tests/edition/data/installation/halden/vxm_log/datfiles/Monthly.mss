[SaveAs]
SaveReportAs=monthly.xls

[style]
reportlanguage=Default

[content]
Section0_Name=Visitors_SectionItem
Section0_ItemType=2
Section1_Name=TopPages_SectionItem
Section1_ItemType=1
