[SaveAs]
SaveReportAs=standard.htm

[general]
description=Standard report
