[SaveAs]
SaveReportAs=standard.htm
