#include "ProjectRepositoryValues.h"

const char *const ProjectRepositoryValues::ProjectIdKey = "Corvid-DataCollection-Project-ID";
const char *const ProjectRepositoryValues::SendIterationKey = "Corvid-DataCollection-Send-Iteration";

ProjectRepositoryValues &ProjectRepositoryValues::instance()
{
    static ProjectRepositoryValues values;
    return values;
}

QString ProjectRepositoryValues::getValue(const QString &, const QString &) const
{
    return QString();
}

void ProjectRepositoryValues::setValue(const QString &, const QString &, const QString &) const
{
}

QString ProjectRepositoryValues::projectAgeInDays(const QString &) const
{
    return QString();
}
