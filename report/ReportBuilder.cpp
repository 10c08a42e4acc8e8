#include "ReportBuilder.h"
#include "CommandLog.h"
#include "CoresStatistics.h"
#include "HelpViewerData.h"
#include "ProjectStatistics.h"
#include "RunStatistics.h"
#include "SynthesisReport.h"
#include "UsageXml.h"
#include "VersionSection.h"

#include "host/AutoRelease.h"
#include "host/InstanceTable.h"
#include "host/ProjectManager.h"
#include "host/String.h"

#include "project/CorvidSettings.h"

#include <QCoreApplication>
#include <QSaveFile>
#include <QStringConverter>

const char *const CrvC_ReportBuilder::ReportFileName = "device_usage_statistics.html";

namespace {

QString tr(const char *text)
{
    return QCoreApplication::translate("CrvC_DataCollectionDialog", text);
}

} // namespace

CrvC_ReportBuilder::CrvC_ReportBuilder(Environment environment)
    : m_env(std::move(environment))
{
    if (!m_env.now)
        m_env.now = [] { return QDateTime::currentDateTime(); };
    if (!m_env.newIdentifier)
        m_env.newIdentifier = &CrvC_Settings::newIdentifier;
    m_data.reportPath = projectFilePath(QString::fromLatin1(ReportFileName));
}

QString CrvC_ReportBuilder::projectDirectory()
{
    auto *service = CitP::InstanceTable::GetInstance(GuiI::IProjectManager::serviceId());
    auto *manager = service ? static_cast<GuiI::IProjectManager *>(
                                  service->GetInterface(GuiI::IProjectManager::iid()))
                            : nullptr;
    if (!manager)
        return QString();
    Prjrep::AutoRelease<CitI::IInterface> project(manager->getCurrentProject());
    if (!project)
        return QString();
    auto *file = static_cast<Dpm::IProjectFile *>(project->GetInterface(Dpm::IProjectFile::iid()));
    auto *project2 =
        file ? static_cast<Dpm::IProject2 *>(file->GetInterface(Dpm::IProject2::iid())) : nullptr;
    if (!project2)
        return QString();
    Port::StringBase directory;
    project2->getProjectDirectory(directory);
    return Gui::Clip::String::convert(directory);
}

QString CrvC_ReportBuilder::projectFilePath(const QString &name)
{
    const QString directory = projectDirectory();
    return directory.isEmpty() ? name : directory + QLatin1Char('/') + name;
}

QString CrvC_ReportBuilder::projectIteration()
{
    return CrvC_VersionSection::projectIteration(m_data);
}

void CrvC_ReportBuilder::createReport(const QString &projectFileArg, const QString &designName,
                                      const QString &targetFamily)
{
    m_data.targetFamily = targetFamily;
    buildReport(projectFileArg, designName);
}

void CrvC_ReportBuilder::buildReport(const QString &projectFileArg, QString designName)
{
    m_data.projectFile = projectFileArg.endsWith(QLatin1String(".orb"), Qt::CaseInsensitive)
                             ? projectFileArg
                             : projectFileArg + QLatin1String(".orb");

    if (designName.isEmpty() && m_env.askDesignName) {
        QString entered;
        if (m_env.askDesignName(entered))
            designName = entered.trimmed();
    }

    if (m_env.setBusy)
        m_env.setBusy(true);

    const QString fileName = QString::fromLatin1(ReportFileName);
    QStringList lines;
    lines.reserve(32);
    lines << QStringLiteral("<HTML><HEAD><TITLE>Device Usage Statistics Report</TITLE></HEAD>")
          << QStringLiteral("<BODY TEXT='#000000' BGCOLOR='#FFFFFF' LINK='#0000EE' "
                            "VLINK='#551A8B' ALINK='#FF0000'>");
    lines << QLatin1String("<H3>Device Usage Page (") + fileName + QLatin1String(")</H3>")
                 + tr("This HTML page displays the device usage statistics that will be sent to "
                      "Vantor. ")
                 + tr("The file also contains predefined XML tags used to simplify processing.")
                 + tr("<BR>&nbsp;<BR>Please verify the contents are okay to send to "
                      "Vantor!<BR>&nbsp;<BR><HR>&nbsp;<BR>");

    CrvC_SynthesisReport::readTargetInfo(projectFilePath(designName + QLatin1String("_map.ktp")),
                                         m_data);
    lines << CrvC_VersionSection::versionSection(m_data, m_env);
    CrvC_SynthesisReport::readMacroStatistics(projectFilePath(designName + QLatin1String(".snx")),
                                              m_data);
    CrvC_UsageXml::readUsageXml(projectFilePath(designName + QLatin1String("_usage.xml")), m_data);
    CrvC_CommandLog::readCommandLog(projectFilePath(designName + QLatin1String(".cmd_log")), m_data);
    CrvC_CommandLog::checkFuseLog(projectFilePath(QStringLiteral("fuse.log")), m_data);

    CrvC_UsageXml::appendTables(m_data, lines);

    if (!m_data.commandHistory.isEmpty())
        lines << CrvC_CommandLog::commandLineHistorySection(m_data);
    lines << CrvC_RunStatistics::runStatisticsSection(m_data.projectFile);
    lines << CrvC_HelpViewerData().sectionText();
    lines << CrvC_ProjectStatistics::projectStatisticsSection(m_data.projectFile, m_env.now().date());
    lines << CrvC_CoresStatistics().sectionText(
        projectFilePath(designName + QLatin1String("_lnkgen.drpt")));
    lines << CrvC_RunStatistics::parUsageSection(
        projectFilePath(QStringLiteral("par_usage_statistics.html")));
    lines << CrvC_RunStatistics::osimUsageSection(
        projectFilePath(QStringLiteral("osim/osim_usage_statistics.html")));
    lines << QStringLiteral("</BODY></HTML>");

    m_page = lines.join(QLatin1Char('\n'));

    // Written through a temporary file, so that a failure half-way never
    // leaves a cut-off page in place of the previous one.
    m_written = false;
    QSaveFile file(m_data.reportPath);
    if (file.open(QIODevice::WriteOnly)) {
        file.write(m_page.toUtf8());
        m_written = file.commit();
    }

    if (m_env.setBusy)
        m_env.setBusy(false);
}
