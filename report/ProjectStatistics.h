#pragma once

#include <QString>

// The "Project Statistics" table: the project facts of the host's project
// model and the project's age in days.
class CrvC_ProjectStatistics
{
public:
    static QString projectStatisticsSection(const QString &projectFile);
};
