[SaveAs]
SaveReportAs=top.doc
