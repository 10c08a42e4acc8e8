#pragma once

#include "ReportBuilder.h"

#include "project/ProjectRepositoryValues.h"

// The "Software Version and Target Device" table: product and version,
// platform, target, the random, project and iteration identifiers, the
// registration identifier and the date the report was made.
class CrvC_VersionSection
{
public:
    // The whole table, its lines joined with "\n". Makes the user's random
    // identifier on first use and the project identifier of a project file
    // that has none yet. Unset hooks of `environment` get the builder's
    // defaults (CrvC_ReportBuilder::withDefaults).
    static QString versionSection(CrvC_ReportData &data, const CrvC_ReportBuilder::Environment &environment);

    // The send iteration, cached in data.projectIteration: the project's
    // stored counter when it is a base-10 integer, otherwise "1"; empty when
    // the repository cannot be read.
    static QString
    projectIteration(CrvC_ReportData &data,
                     const ProjectRepositoryValues &values = ProjectRepositoryValues::instance());
    // The repository accessor of a build with `environment`: read-only for a
    // preview.
    static const ProjectRepositoryValues &repository(const CrvC_ReportBuilder::Environment &environment);

    // The project's identifier from the repository of data.projectFileToOpen(). A
    // project file without one gets environment.newIdentifier() stored; without
    // a project file the new identifier is used for this report only.
    static QString projectId(const CrvC_ReportData &data, const CrvC_ReportBuilder::Environment &environment);

    // The user's registration text, or the build value "Registration_ID" when
    // the host has no user information.
    static QString reportRegistrationId();

    // The host's label of the product configuration for `targetDevice`;
    // empty when it has none.
    static QString productConfigurationLabel(const QString &targetDevice);

    // The host's short platform name in upper case ("LIN64").
    static QString platformName();
};
