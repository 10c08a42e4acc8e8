#include "ReportBuilder.h"
#include "CommandLog.h"
#include "CoresStatistics.h"
#include "HelpViewerData.h"
#include "PageStore.h"
#include "ProjectStatistics.h"
#include "RunStatistics.h"
#include "SectionBuffer.h"
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

#include <QThread>

// Under AddressSanitizer the heap is the sanitizer's: glibc's malloc_trim
// would walk arenas that were never set up.
#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define CORVID_ASAN_HEAP 1
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#define CORVID_ASAN_HEAP 1
#endif
#if defined(__GLIBC__) && !defined(CORVID_ASAN_HEAP)
#define CORVID_TRIM_HEAP 1
#include <malloc.h>
#endif

#include <atomic>
#include <exception>
#include <memory>
#include <new>
#include <optional>
#include <system_error>
#include <thread>
#include <vector>

const char *const CrvC_ReportBuilder::ReportFileName = "device_usage_statistics.html";

// A little more than the review dialog shows of a large page (250,000
// characters, cut there at a line end), so that it still sees the cut.
const qsizetype CrvC_ReportBuilder::PageTextLimit = 256 * 1024;

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
    explicit BusyCursor(const std::function<void(bool)> &setBusy) : m_setBusy(setBusy)
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

// Hands memory that is free again back to the system: a large build leaves
// much of it in the heaps of its threads, to no use until the next build.
void releaseFreedMemory()
{
#if defined(CORVID_TRIM_HEAP)
    malloc_trim(0);
#endif
}

// Runs the pure file readers side by side. The calling thread reads the
// first reader (the largest), then helps the workers with the rest: one
// worker per further processor core, two at most. Few threads rather than
// one per reader: each thread allocates from a heap of its own that keeps
// what it freed, so every extra thread adds to the peak memory of a build,
// and the largest results are best kept in the calling thread's heap, which
// the next build reuses.
class ReaderPool
{
public:
    explicit ReaderPool(std::vector<std::function<void()>> readers)
        : m_readers(std::move(readers)), m_failures(m_readers.size())
    {
        const int workers = qBound(1, QThread::idealThreadCount() - 1, 2);
        for (int i = 0; i < workers; ++i) {
            try {
                m_threads.emplace_back([this] { work(); });
            } catch (const std::system_error &) {
                break; // the calling thread reads what no worker takes
            }
        }
    }

    ~ReaderPool() { join(); }

    // Takes part in the reading until every reader is done, then rethrows
    // the first failure of a reader, in reader order.
    void finish()
    {
        if (!m_readers.empty())
            run(0);
        work();
        join();
        for (const std::exception_ptr &failure : m_failures) {
            if (failure)
                std::rethrow_exception(failure);
        }
    }

private:
    void work()
    {
        for (std::size_t i = m_next++; i < m_readers.size(); i = m_next++) {
            run(i);
            // What a reader needed only on the way may serve the others.
            releaseFreedMemory();
        }
    }

    void run(std::size_t i)
    {
        try {
            m_readers[i]();
        } catch (...) {
            m_failures[i] = std::current_exception();
        }
    }

    void join()
    {
        for (std::thread &thread : m_threads) {
            if (thread.joinable())
                thread.join();
        }
    }

    std::vector<std::function<void()>> m_readers;
    std::vector<std::exception_ptr> m_failures;
    std::atomic<std::size_t> m_next{1}; // the first is the calling thread's
    std::vector<std::thread> m_threads;
};

} // namespace

// The page as it is assembled: every line goes at once, as UTF-8 with "\n"
// between lines, to each of its files (the page and the build's own copy),
// and into the kept beginning until that is full.
class CrvC_ReportBuilder::PageWriter
{
public:
    PageWriter(const QStringList &paths, QString &text, bool &cut) : m_text(text), m_cut(cut)
    {
        m_text.clear();
        m_cut = false;
        m_open = true;
        for (const QString &path : paths) {
            m_files.push_back(std::make_unique<QSaveFile>(path));
            // QSaveFile would replace the link's target; the page goes only
            // where the path itself says.
            m_open = m_open && !QFileInfo(path).isSymLink() && m_files.back()->open(QIODevice::WriteOnly);
        }
    }

    void operator()(const QString &line)
    {
        if (m_lines++ > 0)
            add(QStringLiteral("\n"));
        add(line);
    }

    // A line already encoded, as the readers hand back their large sections.
    void section(CrvC_SectionBuffer &text)
    {
        if (m_lines++ > 0)
            add(QStringLiteral("\n"));
        // The first slice is a megabyte or the whole text, more than the
        // kept beginning can take; three bytes hold at least one UTF-16 unit,
        // so a character split at the cut lies past the room left.
        if (!text.drain([this](const QByteArray &slice) {
                write(slice);
                if (!m_cut)
                    keep(QString::fromUtf8(slice.constData(),
                                           qMin(slice.size(), 3 * (PageTextLimit - m_text.size() + 1))));
            }))
            m_open = false; // a section lost on the way: the page is not written
    }

    // True when every file is complete in place of its previous version.
    bool commit()
    {
        for (const auto &file : m_files)
            m_open = m_open && file->commit();
        return m_open;
    }

private:
    void add(const QString &text)
    {
        // A long line is encoded a slice at a time rather than copied whole.
        const qsizetype slice = 1 << 16;
        QStringView rest(text);
        while (m_open && !rest.isEmpty()) {
            qsizetype n = qMin(slice, rest.size());
            if (n < rest.size() && rest.at(n - 1).isHighSurrogate())
                ++n;
            write(rest.left(n).toUtf8());
            rest = rest.mid(n);
        }
        keep(text);
    }

    void write(const QByteArray &bytes)
    {
        for (const auto &file : m_files) {
            if (m_open && file->write(bytes) != bytes.size())
                m_open = false; // QSaveFile keeps the old file; commit fails
        }
    }

    void keep(const QString &text)
    {
        if (m_cut)
            return;
        const qsizetype room = PageTextLimit - m_text.size();
        if (text.size() <= room) {
            m_text += text;
            return;
        }
        qsizetype kept = room;
        // Never keep half of a surrogate pair.
        if (kept > 0 && text.at(kept - 1).isHighSurrogate())
            --kept;
        m_text += QStringView(text).left(kept);
        m_cut = true;
    }

    std::vector<std::unique_ptr<QSaveFile>> m_files;
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
    if (!environment.randomId) {
        const bool keep = !environment.preview;
        environment.randomId = [keep] { return CrvC_Settings::randomId(keep); };
    }
    return environment;
}

CrvC_ReportBuilder::CrvC_ReportBuilder() : CrvC_ReportBuilder(Environment())
{
}

CrvC_ReportBuilder::CrvC_ReportBuilder(Environment environment) : m_env(withDefaults(std::move(environment)))
{
    m_data.reportPath = QFileInfo(projectFilePath(QString::fromLatin1(ReportFileName))).absoluteFilePath();
}

QString CrvC_ReportBuilder::projectDirectory()
{
    auto *service = CitP::InstanceTable::GetInstance(GuiI::IProjectManager::serviceId());
    auto *manager =
        service ? static_cast<GuiI::IProjectManager *>(service->GetInterface(GuiI::IProjectManager::iid()))
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
    return CrvC_VersionSection::projectIteration(m_data, CrvC_VersionSection::repository(m_env));
}

void CrvC_ReportBuilder::createReport(const QString &projectFileArg, const QString &designName,
                                      const QString &targetFamily)
{
    m_data.targetFamily = targetFamily;
    buildReport(projectFileArg, designName);
}

void CrvC_ReportBuilder::buildReport(const QString &projectFileArg, QString designName)
{
    // Busy from the end of the design-name prompt to the end of the build.
    std::optional<BusyCursor> busy;
    m_afterPrompt = [this, &busy] { busy.emplace(m_env.setBusy); };
    const bool prepared = prepare(projectFileArg, std::move(designName));
    m_afterPrompt = nullptr;
    if (prepared)
        write();
}

bool CrvC_ReportBuilder::prepare(const QString &projectFileArg, QString designName)
{
    m_data.projectFile = projectFileArg.endsWith(QLatin1String(".orb"), Qt::CaseInsensitive)
                             ? projectFileArg
                             : projectFileArg + QLatin1String(".orb");
    m_data.projectGiven = !projectFileArg.isEmpty();

    // A copy kept by an earlier build may have gone to the send step: it is
    // left to CrvC_PageStore.
    m_written = false;
    m_pagePath.clear();
    m_ownFolder.clear();
    m_page.clear();
    m_pageCut = false;
    m_paths.clear();
    if (designName.isEmpty() && m_env.askDesignName) {
        QString entered;
        // Cancelled: the user wants no report of this design.
        if (!m_env.askDesignName(entered))
            return false;
        designName = entered.trimmed();
    }
    m_designName = designName;
    if (m_afterPrompt)
        m_afterPrompt();

    m_paths << m_data.reportPath;
    if (m_env.pageFolder) {
        m_ownFolder = m_env.pageFolder();
        if (m_ownFolder.isEmpty())
            return false; // no copy of its own, nothing the send step could stand by
        m_paths << m_ownFolder + QLatin1Char('/') + QLatin1String(ReportFileName);
    }

    try {
        m_directory = projectDirectory();
        m_heading = QLatin1String("<H3>Device Usage Page (") + QLatin1String(ReportFileName)
                    + QLatin1String(")</H3>");
        for (const char *text : HeadingTexts)
            m_heading += QCoreApplication::translate(HeadingContext, text);
        // The map report is read only as far as its target lines (a few lines
        // at most), which the version section needs for the host's label.
        CrvC_SynthesisReport::readTargetInfo(inProject(QStringLiteral("_map.ktp"), true), m_data);
        m_versionSection = CrvC_VersionSection::versionSection(m_data, m_env);
        m_runStatistics = CrvC_RunStatistics::runStatisticsSection(m_data.projectFileToOpen());
        m_projectStatistics = CrvC_ProjectStatistics::projectStatisticsSection(
            m_data.projectFileToOpen(), m_env.now().date(), CrvC_VersionSection::repository(m_env));
    } catch (const std::bad_alloc &) {
        // As when the page runs out of memory: nothing written, no copy.
        m_pageCut = true;
        discardOwnCopy();
        return false;
    }
    return true;
}

void CrvC_ReportBuilder::write()
{
    try {
        PageWriter page(m_paths, m_page, m_pageCut);
        assemble(page);
        m_written = page.commit();
    } catch (const std::bad_alloc &) {
        // The unfinished page is dropped; the previous file stays.
        m_written = false;
        m_pageCut = true;
    }
    if (m_written)
        m_pagePath = m_paths.last();
    else
        discardOwnCopy();
    m_versionSection.clear();
    m_runStatistics.clear();
    m_projectStatistics.clear();
    releaseFreedMemory();
}

QString CrvC_ReportBuilder::inProject(const QString &name, bool designNamed) const
{
    const QString file = designNamed ? m_designName + name : name;
    return m_directory.isEmpty() ? file : m_directory + QLatin1Char('/') + file;
}

void CrvC_ReportBuilder::discardOwnCopy()
{
    if (m_ownFolder.isEmpty())
        return;
    CrvC_PageStore::remove(m_ownFolder);
    if (m_pagePath.startsWith(m_ownFolder + QLatin1Char('/')))
        m_pagePath.clear();
    m_ownFolder.clear();
}

void CrvC_ReportBuilder::assemble(PageWriter &page)
{
    const QString synthesisReport = inProject(QStringLiteral(".snx"), true);
    const QString usageXml = inProject(QStringLiteral("_usage.xml"), true);
    const QString commandLog = inProject(QStringLiteral(".cmd_log"), true);
    const QString fuseLog = inProject(QStringLiteral("fuse.log"));
    const QString coresReport = inProject(QStringLiteral("_lnkgen.drpt"), true);
    const QString parPage = inProject(QStringLiteral("par_usage_statistics.html"));
    const QString osimPage = inProject(QStringLiteral("osim/osim_usage_statistics.html"));

    // The pure file readers start at once, each on a copy of the fields (the
    // copies share their contents until a reader adds to them). The later
    // sections come back encoded: half the memory while they wait for their
    // turn.
    const CrvC_ReportData start = m_data;
    CrvC_ReportData usage = start, macros = start, commands = start;
    CrvC_SectionBuffer history, help, cores, par, osim;
    // Largest first: the usage XML for the calling thread, then what needs
    // most memory on the way, while the usage tables are still small.
    ReaderPool readers({
        [&] { CrvC_UsageXml::readUsageXml(usageXml, usage); },
        [&] {
            CrvC_CommandLog::readCommandLog(commandLog, commands);
            CrvC_CommandLog::checkFuseLog(fuseLog, commands);
            if (commands.commandHistory.isEmpty())
                return;
            CrvC_CommandLog::commandLineHistorySection(commands, history);
            commands.commandHistory.clear();
        },
        [&] { CrvC_CoresStatistics().writeSection(coresReport, cores); },
        [&] { CrvC_HelpViewerData().writeSection(help); },
        [&] { CrvC_SynthesisReport::readMacroStatistics(synthesisReport, macros); },
        [&] { par += QStringView(CrvC_RunStatistics::parUsageSection(parPage)); },
        [&] { osim += QStringView(CrvC_RunStatistics::osimUsageSection(osimPage)); },
    });

    page(QStringLiteral("<HTML><HEAD><TITLE>Device Usage Statistics Report</TITLE></HEAD>"));
    page(
        QStringLiteral("<BODY TEXT='#000000' BGCOLOR='#FFFFFF' LINK='#0000EE' "
                       "VLINK='#551A8B' ALINK='#FF0000'>"));
    page(m_heading);
    page(m_versionSection);
    readers.finish();

    m_data.macroStatistics.swap(macros.macroStatistics);
    m_data.usageXmlPath = usage.usageXmlPath;
    m_data.designStatistics.swap(usage.designStatistics);
    m_data.deviceUsage.swap(usage.deviceUsage);
    m_data.reportConfigData.swap(usage.reportConfigData);
    m_data.reportPinData.swap(usage.reportPinData);
    m_data.reportConfigDataCount = usage.reportConfigDataCount;
    m_data.reportPinDataCount = usage.reportPinDataCount;
    CrvC_Lines tables([&page](const QString &line) { page(line); });
    CrvC_UsageXml::appendTables(m_data, tables);
    // Written: the tables need not stay in memory.
    m_data.macroStatistics.clear();
    m_data.designStatistics.clear();
    m_data.deviceUsage.clear();
    m_data.reportConfigData.clear();
    m_data.reportPinData.clear();

    if (!history.isEmpty())
        page.section(history);
    page(m_runStatistics);
    page.section(help);
    page(m_projectStatistics);
    page.section(cores);
    page.section(par);
    page.section(osim);
    page(QStringLiteral("</BODY></HTML>"));
}
