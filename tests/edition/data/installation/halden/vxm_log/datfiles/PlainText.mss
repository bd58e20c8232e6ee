[SaveAs]
SaveReportAs=plain.txt
