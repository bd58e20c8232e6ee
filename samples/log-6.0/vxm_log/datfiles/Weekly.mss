[SaveAs]
SaveReportAs=weekly_report.htm

[general]
description=Weekly traffic for the shop
