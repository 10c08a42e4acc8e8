#pragma once

#include "ReportData.h"

// The "Software Quality" run statistics of the host and the usage pages that
// place-and-route and the simulator leave in the project directory.
class CrvC_RunStatistics
{
public:
    static QString runStatisticsSection(const CrvC_ReportData &data);
    static QString parUsageSection();
    static QString osimUsageSection();
};
