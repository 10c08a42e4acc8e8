#pragma once

#include "ReportBuilder.h"

// The "Software Version and Target Device" table: product and version,
// platform, target, the random, project and iteration identifiers, the
// registration identifier and the date the report was made.
class CrvC_VersionSection
{
public:
    // The whole table, its lines joined with "\n".
    static QString versionSection(CrvC_ReportData &data,
                                  const CrvC_ReportBuilder::Environment &environment);
    // The send iteration, cached in data.projectIteration.
    static QString projectIteration(CrvC_ReportData &data);
};
