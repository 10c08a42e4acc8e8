#include "VersionSection.h"

QString CrvC_VersionSection::versionSection(CrvC_ReportData &, const CrvC_ReportBuilder::Environment &)
{
    return QString();
}

QString CrvC_VersionSection::projectIteration(CrvC_ReportData &data)
{
    if (data.projectIteration.isEmpty())
        data.projectIteration = QStringLiteral("1");
    return data.projectIteration;
}
