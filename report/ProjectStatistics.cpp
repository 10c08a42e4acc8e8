#include "ProjectStatistics.h"

QString CrvC_ProjectStatistics::projectStatisticsSection(const QString &)
{
    return QString();
}
