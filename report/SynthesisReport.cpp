#include "SynthesisReport.h"

bool CrvC_SynthesisReport::readTargetInfo(const QString &, CrvC_ReportData &)
{
    return true;
}

bool CrvC_SynthesisReport::readMacroStatistics(const QString &, CrvC_ReportData &)
{
    return true;
}

QString CrvC_SynthesisReport::macroStatisticsCell(const CrvC_ReportData &)
{
    return QStringLiteral("<TD>&nbsp;</TD>");
}
