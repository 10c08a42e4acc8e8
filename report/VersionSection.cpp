#include "VersionSection.h"

#include "host/Env.h"
#include "host/String.h"
#include "host/Version.h"
#include "project/ProjectRepositoryValues.h"

namespace {

QString versionValue(const char *key)
{
    return Gui::Clip::String::convert(Port::Version::getValue(key));
}

} // namespace

QString CrvC_VersionSection::productConfigurationLabel(const QString &targetDevice)
{
    return Gui::Clip::String::convert(
        Port::UserInformation::getProductConfigurationLabel(targetDevice.toUtf8().constData()));
}

QString CrvC_VersionSection::platformName()
{
    return Gui::Clip::String::convert(Port_Env::GetPlatformPath()).toUpper();
}

QString CrvC_VersionSection::reportRegistrationId()
{
    const QString text = Gui::Clip::String::convert(Port::UserInformation::getRegistrationText());
    if (text.isEmpty() || text == QLatin1String(Port::UserInformation::NoInformationText))
        return versionValue("Registration_ID");
    return text;
}

QString CrvC_VersionSection::projectId(const CrvC_ReportData &data,
                                       const CrvC_ReportBuilder::Environment &environment)
{
    const QString fresh = CrvC_ReportBuilder::withDefaults(environment).newIdentifier();
    return repository(environment).projectIdentifier(data.projectFileToOpen(), fresh);
}

QString CrvC_VersionSection::projectIteration(CrvC_ReportData &data, const ProjectRepositoryValues &values)
{
    // Looked up once: a repository that could not be read when the page was
    // made must not give the send a counter the page never showed.
    if (data.projectIteration.isEmpty() && !data.projectIterationRead) {
        data.projectIteration = values.sendIteration(data.projectFileToOpen());
        data.projectIterationRead = true;
    }
    return data.projectIteration;
}

const ProjectRepositoryValues &
CrvC_VersionSection::repository(const CrvC_ReportBuilder::Environment &environment)
{
    return environment.preview ? ProjectRepositoryValues::readOnly() : ProjectRepositoryValues::instance();
}

QString CrvC_VersionSection::versionSection(CrvC_ReportData &data,
                                            const CrvC_ReportBuilder::Environment &hooks)
{
    const CrvC_ReportBuilder::Environment environment = CrvC_ReportBuilder::withDefaults(hooks);
    const QString product = versionValue("product");
    const QString version = versionValue("version");
    const QString registrationId = reportRegistrationId();
    const QString platform = platformName();
    const QString label = productConfigurationLabel(data.targetDevice);

    // Computed in this order: random, project, iteration.
    const QString random = environment.randomId();
    const QString project = projectId(data, environment);
    const QString iteration = projectIteration(data, repository(environment));

    const QDateTime now = environment.now();

    static const QLatin1String rowStart("<TR ALIGN=LEFT>");
    static const QLatin1String rowEnd("</TR>");
    static const QLatin1String valueEnd("</dtag-property></TD>");
    const auto labelCell = [](const char *text) -> QString {
        return QLatin1String("<TD BGCOLOR='#FFFF99'><B>") % QLatin1String(text) % QLatin1String("</B></TD>");
    };
    const auto value = [](const char *name, const QString &text) -> QString {
        return QLatin1String("<TD><dtag-property name=\"") % QLatin1String(name) % QLatin1String("\">") % text
               % valueEnd;
    };

    QStringList lines;
    lines.reserve(31);
    lines << QStringLiteral("<TABLE BORDER CELLSPACING=0 WIDTH='100%'>")
          << QStringLiteral(
                 "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN='4'><B>Software "
                 "Version and Target Device</B></TD></TR>");
    lines << rowStart << labelCell("Product Version:")
          << QLatin1String("<TD><dtag-property name=\"ProductVersion\">") % product % QLatin1Char(':')
                 % version % QLatin1String("</dtag-property><dtag-property name=\"ProductConfiguration\"> (")
                 % label % QLatin1Char(')') % valueEnd
          << labelCell("Target Family:") << value("TargetFamily", data.targetFamily) << rowEnd;
    lines << rowStart << labelCell("OS Platform:") << value("OSPlatform", platform)
          << labelCell("Target Device:") << value("TargetDevice", data.targetDevice) << rowEnd;
    lines << rowStart << labelCell("Project ID (random number)")
          << QLatin1String("<TD><dtag-property name=\"RandomID\">") % random
                 % QLatin1String("</dtag-property>.<dtag-property name=\"ProjectID\">") % project
                 % QLatin1String("</dtag-property>.<dtag-property name=\"ProjectIteration\">") % iteration
                 % valueEnd
          << labelCell("Target Package:") << value("TargetPackage", data.targetPackage) << rowEnd;
    lines << rowStart << labelCell("Registration ID") << value("RegistrationID", registrationId)
          << labelCell("Target Speed:") << value("TargetSpeed", data.targetSpeed) << rowEnd;
    lines << rowStart << labelCell("Date Generated") << value("Date Generated", now.toString(Qt::TextDate))
          << rowEnd;
    lines << QStringLiteral("</TABLE>");
    return lines.join(QLatin1Char('\n'));
}
