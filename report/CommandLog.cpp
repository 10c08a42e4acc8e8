#include "CommandLog.h"

bool CrvC_CommandLog::readCommandLog(const QString &, CrvC_ReportData &)
{
    return false;
}

bool CrvC_CommandLog::checkFuseLog(const QString &, CrvC_ReportData &)
{
    return false;
}

QString CrvC_CommandLog::commandLineHistorySection(const CrvC_ReportData &)
{
    return QString();
}
