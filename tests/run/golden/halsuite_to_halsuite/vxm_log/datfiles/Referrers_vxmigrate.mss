[SaveAs]
SaveReportAs=referrers.doc

[general]
description=Where visitors come from

[style]
reportstyle=Plain
reportlanguage=spanish
helpcards=N

[content]
Section0_Name=Referrers_SectionItem
Section0_ItemType=2
Section0_Elements=50
