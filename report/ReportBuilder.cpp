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
#include "host/Identifier.h"
#include "host/InstanceTable.h"
#include "host/ProjectManager.h"
#include "host/String.h"

#include "project/CorvidSettings.h"

#include <QCoreApplication>
#include <QFileInfo>
#include <QSaveFile>

#include <future>
#include <new>
#include <system_error>

const char *const CrvC_ReportBuilder::ReportFileName = "device_usage_statistics.html";

// About 4 MB of text: far more than a reader scrolls through, and a text
// view stays responsive with it.
const qsizetype CrvC_ReportBuilder::PageTextLimit = 2 * 1024 * 1024;

namespace {

// The heading's texts are translated in the review dialog's context.
const char *const HeadingContext = "CrvC_DataCollectionDialog";
const char *const HeadingTexts[] = {
    QT_TRANSLATE_NOOP("CrvC_DataCollectionDialog",
                      "This HTML page displays the device usage statistics that will be sent to "
                      "Vantor. "),
    QT_TRANSLATE_NOOP("CrvC_DataCollectionDialog",
                      "The file also contains predefined XML tags used to simplify processing."),
    QT_TRANSLATE_NOOP("CrvC_DataCollectionDialog",
                      "<BR>&nbsp;<BR>Please verify the contents are okay to send to "
                      "Vantor!<BR>&nbsp;<BR><HR>&nbsp;<BR>"),
};

// Restores the busy cursor however the build ends.
class BusyCursor
{
public:
    explicit BusyCursor(const std::function<void(bool)> &setBusy)
        : m_setBusy(setBusy)
    {
        if (m_setBusy)
            m_setBusy(true);
    }
    ~BusyCursor()
    {
        if (m_setBusy)
            m_setBusy(false);
    }
    BusyCursor(const BusyCursor &) = delete;
    BusyCursor &operator=(const BusyCursor &) = delete;

private:
    const std::function<void(bool)> &m_setBusy;
};

// Runs `task` on a thread of its own; when no thread can be started, on the
// thread that asks for the result.
template<typename Task>
auto startReader(Task task) -> std::future<decltype(task())>
{
    try {
        return std::async(std::launch::async, task);
    } catch (const std::system_error &) {
        return std::async(std::launch::deferred, task);
    }
}

} // namespace

// The page as it is assembled: every line goes to the file at once, as UTF-8
// with "\n" between lines, and into the kept beginning until that is full.
class CrvC_ReportBuilder::PageWriter
{
public:
    PageWriter(const QString &path, QString &text, bool &cut)
        : m_file(path)
        , m_text(text)
        , m_cut(cut)
    {
        m_text.clear();
        m_cut = false;
        // QSaveFile would replace the link's target; the page goes only
        // where the report path itself says.
        if (!QFileInfo(path).isSymLink())
            m_open = m_file.open(QIODevice::WriteOnly);
    }

    void operator()(const QString &line)
    {
        if (m_lines++ > 0)
            add(QStringLiteral("\n"));
        add(line);
    }

    // True when the whole page is in place of the previous file.
    bool commit() { return m_open && m_file.commit(); }

private:
    void add(const QString &text)
    {
        if (m_open) {
            const QByteArray bytes = text.toUtf8();
            if (m_file.write(bytes) != bytes.size())
                m_open = false; // QSaveFile keeps the old file; commit fails
        }
        if (m_cut)
            return;
        const qsizetype room = PageTextLimit - m_text.size();
        if (text.size() <= room) {
            m_text += text;
            return;
        }
        qsizetype keep = room;
        // Never keep half of a surrogate pair.
        if (keep > 0 && text.at(keep - 1).isHighSurrogate())
            --keep;
        m_text += QStringView(text).left(keep);
        m_cut = true;
    }

    QSaveFile m_file;
    bool m_open = false;
    qsizetype m_lines = 0;
    QString &m_text;
    bool &m_cut;
};

CrvC_ReportBuilder::Environment CrvC_ReportBuilder::withDefaults(Environment environment)
{
    if (!environment.now)
        environment.now = [] { return QDateTime::currentDateTime(); };
    if (!environment.newIdentifier)
        environment.newIdentifier = &Port::Identifier::newIdentifier;
    if (!environment.randomId)
        environment.randomId = &CrvC_Settings::randomId;
    return environment;
}

CrvC_ReportBuilder::CrvC_ReportBuilder(Environment environment)
    : m_env(withDefaults(std::move(environment)))
{
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
    m_data.projectGiven = !projectFileArg.isEmpty();

    if (designName.isEmpty() && m_env.askDesignName) {
        QString entered;
        if (m_env.askDesignName(entered))
            designName = entered.trimmed();
    }

    m_written = false;
    BusyCursor busy(m_env.setBusy);
    try {
        PageWriter page(m_data.reportPath, m_page, m_pageCut);
        assemble(designName, page);
        m_written = page.commit();
    } catch (const std::bad_alloc &) {
        // The unfinished page is dropped; the previous file stays.
        m_written = false;
        m_pageCut = true;
    }
}

void CrvC_ReportBuilder::assemble(const QString &designName, PageWriter &page)
{
    const QString directory = projectDirectory();
    const auto inProject = [&directory](const QString &name) {
        return directory.isEmpty() ? name : directory + QLatin1Char('/') + name;
    };
    const QString mapReport = inProject(designName + QLatin1String("_map.ktp"));
    const QString synthesisReport = inProject(designName + QLatin1String(".snx"));
    const QString usageXml = inProject(designName + QLatin1String("_usage.xml"));
    const QString commandLog = inProject(designName + QLatin1String(".cmd_log"));
    const QString fuseLog = inProject(QStringLiteral("fuse.log"));
    const QString coresReport = inProject(designName + QLatin1String("_lnkgen.drpt"));
    const QString parPage = inProject(QStringLiteral("par_usage_statistics.html"));
    const QString osimPage = inProject(QStringLiteral("osim/osim_usage_statistics.html"));

    // The pure file readers start at once, each on a copy of the fields (the
    // copies share their contents until a reader adds to them).
    const CrvC_ReportData start = m_data;
    auto targetInfo = startReader([start, mapReport] {
        CrvC_ReportData d = start;
        CrvC_SynthesisReport::readTargetInfo(mapReport, d);
        return d;
    });
    auto macros = startReader([start, synthesisReport] {
        CrvC_ReportData d = start;
        CrvC_SynthesisReport::readMacroStatistics(synthesisReport, d);
        return d;
    });
    auto usage = startReader([start, usageXml] {
        CrvC_ReportData d = start;
        CrvC_UsageXml::readUsageXml(usageXml, d);
        return d;
    });
    auto commands = startReader([start, commandLog, fuseLog] {
        CrvC_ReportData d = start;
        CrvC_CommandLog::readCommandLog(commandLog, d);
        CrvC_CommandLog::checkFuseLog(fuseLog, d);
        return d;
    });
    auto help = startReader([] { return CrvC_HelpViewerData().sectionText(); });
    auto cores = startReader([coresReport] { return CrvC_CoresStatistics().sectionText(coresReport); });
    auto par = startReader([parPage] { return CrvC_RunStatistics::parUsageSection(parPage); });
    auto osim = startReader([osimPage] { return CrvC_RunStatistics::osimUsageSection(osimPage); });

    const QString fileName = QString::fromLatin1(ReportFileName);
    page(QStringLiteral("<HTML><HEAD><TITLE>Device Usage Statistics Report</TITLE></HEAD>"));
    page(QStringLiteral("<BODY TEXT='#000000' BGCOLOR='#FFFFFF' LINK='#0000EE' "
                        "VLINK='#551A8B' ALINK='#FF0000'>"));
    QString heading = QLatin1String("<H3>Device Usage Page (") + fileName + QLatin1String(")</H3>");
    for (const char *text : HeadingTexts)
        heading += QCoreApplication::translate(HeadingContext, text);
    page(heading);

    // The host, the repository and the settings are asked on this thread,
    // while the readers work.
    {
        const CrvC_ReportData target = targetInfo.get();
        m_data.targetDevice = target.targetDevice;
        m_data.targetPackage = target.targetPackage;
        m_data.targetSpeed = target.targetSpeed;
    }
    page(CrvC_VersionSection::versionSection(m_data, m_env));
    const QString runStatistics = CrvC_RunStatistics::runStatisticsSection(m_data.projectFileToOpen());
    const QString projectStatistics = CrvC_ProjectStatistics::projectStatisticsSection(
        m_data.projectFileToOpen(), m_env.now().date());

    m_data.macroStatistics = macros.get().macroStatistics;
    {
        CrvC_ReportData read = usage.get();
        m_data.usageXmlPath = read.usageXmlPath;
        m_data.designStatistics.swap(read.designStatistics);
        m_data.deviceUsage.swap(read.deviceUsage);
        m_data.reportConfigData.swap(read.reportConfigData);
        m_data.reportPinData.swap(read.reportPinData);
        m_data.reportConfigDataCount = read.reportConfigDataCount;
        m_data.reportPinDataCount = read.reportPinDataCount;
    }
    m_data.commandHistory = commands.get().commandHistory;

    CrvC_Lines tables([&page](const QString &line) { page(line); });
    CrvC_UsageXml::appendTables(m_data, tables);

    if (!m_data.commandHistory.isEmpty())
        page(CrvC_CommandLog::commandLineHistorySection(m_data));
    page(runStatistics);
    page(help.get());
    page(projectStatistics);
    page(cores.get());
    page(par.get());
    page(osim.get());
    page(QStringLiteral("</BODY></HTML>"));
}
