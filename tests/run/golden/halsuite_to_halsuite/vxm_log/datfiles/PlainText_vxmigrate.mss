[SaveAs]
SaveReportAs=plain.txt

[content]
Section0_Name=TopPages_SectionItem
Section0_ItemType=2
