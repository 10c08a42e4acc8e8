#include "CoresStatistics.h"

CrvC_CoresStatistics::CrvC_CoresStatistics() = default;
CrvC_CoresStatistics::~CrvC_CoresStatistics() = default;

QString CrvC_CoresStatistics::sectionText(const QString &)
{
    return QString();
}
