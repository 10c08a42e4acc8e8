#pragma once

#include "project/ProjectDataManager.h"
#include "project/ProjectRepositoryValues.h"

#include <QDate>
#include <QString>

// The "Project Statistics" table: the project facts of the host's project
// model and the project's age in days.
class CrvC_ProjectStatistics
{
public:
    // The table for the host's current project and the age of `projectFile`
    // on `today`, read through `values`.
    static QString
    projectStatisticsSection(const QString &projectFile, const QDate &today,
                             const ProjectRepositoryValues &values = ProjectRepositoryValues::instance());

    // The table for the given facts, followed by the age row ("Project
    // duration(days)") with `age` (empty when unknown): two cells to a row.
    static QString sectionText(const ProjectDataManager::PairList &rows, const QString &age);
};
