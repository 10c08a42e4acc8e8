#include "UsageXml.h"
#include "SynthesisReport.h"

bool CrvC_UsageXml::readUsageXml(const QString &path, CrvC_ReportData &data)
{
    data.usageXmlPath = path;
    return false;
}

void CrvC_UsageXml::appendTables(const CrvC_ReportData &data, QStringList &lines)
{
    lines << QStringLiteral("&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>")
          << QStringLiteral("<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4><B>Device Usage "
                            "Statistics</B></TD></TR>")
          << QStringLiteral("<TR ALIGN=CENTER BGCOLOR='#FFFF99'><TD><B>Macro Statistics</B></TD>"
                            "<TD><B>Miscellaneous Statistics</B></TD><TD><B>Net Statistics</B>"
                            "</TD><TD><B>Site Usage</B></TD></TR><TR VALIGN=TOP>")
          << CrvC_SynthesisReport::macroStatisticsCell(data)
          << QStringLiteral("<TD>&nbsp;</TD><TD>&nbsp;</TD>") << QStringLiteral("<TD>&nbsp;</TD>")
          << QStringLiteral("</TR></TABLE>");
}
