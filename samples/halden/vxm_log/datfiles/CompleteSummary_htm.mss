[SaveAs]
SaveReportAs=summary.htm
