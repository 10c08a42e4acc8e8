#include "RunStatistics.h"

QString CrvC_RunStatistics::runStatisticsSection(const CrvC_ReportData &)
{
    return QString();
}

QString CrvC_RunStatistics::parUsageSection()
{
    return QString();
}

QString CrvC_RunStatistics::osimUsageSection()
{
    return QString();
}
