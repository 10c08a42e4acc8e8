// How inputs are opened: the one way to open a file (Port::InputFile), the
// XML guard, and every reader given a pipe, a device, a directory, an
// oversized file or a DTD trick in place of its input.
#include "common/TestEnvironment.h"

#include "host/InputFile.h"
#include "host/MsgManData.h"
#include "host/XmlGuard.h"
#include "host/project/ProjectDocument.h"
#include "project/CorvidSettings.h"
#include "report/CommandLog.h"
#include "report/CoresStatistics.h"
#include "report/HelpViewerData.h"
#include "report/ReportBuilder.h"
#include "report/RunStatistics.h"
#include "report/SynthesisReport.h"
#include "report/UsageXml.h"

#include "RunRecords.h"

#include <QElapsedTimer>
#include <QTemporaryDir>
#include <QtTest>

#include <functional>

#include <sys/stat.h>

using Port::InputFile;
using Port::XmlGuard;
using Status = InputFile::Status;

// Puts something that is not a usable input where a reader looks for one.
namespace HostileInputs {

enum class Case {
    Fifo,               // a named pipe with no writer
    DeviceLink,         // a symbolic link to /dev/zero
    Directory,          // a directory of that name
    OverLimit,          // a sparse file one byte above the limit of its kind
    Endless,            // a symbolic link to /proc/self/pagemap: size 0, reads without end
    EntityDoubling,     // an internal DTD whose entities double at every level
    NestedContentModel, // an internal DTD with 70,000 nested parentheses
    Utf7EntityDoubling, // the same two, declared and written in UTF-7
    Utf7NestedContentModel,
    AttributeFlood, // 160,000 attributes on one element
};

const char *name(Case c)
{
    static const char *const names[] = {
        "named pipe",           "link to /dev/zero",          "directory",
        "over the limit",       "link to /proc/self/pagemap", "entity doubling",
        "nested content model", "utf7-entity-doubling",       "utf7-nested-content-model",
        "attribute flood"};
    return names[int(c)];
}

// Plants case `c` at `path`; `reader` names the fuzzers' regression folder
// that holds the DTD samples. False when it could not be made.
bool plant(const QString &path, Case c, InputFile::Kind kind, const QString &reader = QString())
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile::remove(path);
    switch (c) {
    case Case::Fifo:
        return ::mkfifo(QFile::encodeName(path).constData(), 0600) == 0;
    case Case::DeviceLink:
        return QFile::link(QStringLiteral("/dev/zero"), path);
    case Case::Directory:
        return QDir().mkpath(path);
    case Case::OverLimit: {
        QFile file(path);
        return file.open(QIODevice::WriteOnly) && file.resize(InputFile::sizeLimit(kind) + 1);
    }
    case Case::Endless:
        return QFile::link(QStringLiteral("/proc/self/pagemap"), path);
    case Case::EntityDoubling:
    case Case::NestedContentModel:
    case Case::Utf7EntityDoubling:
    case Case::Utf7NestedContentModel:
        return QFile::copy(
            QStringLiteral(CORVID_SOURCE_DIR "/tests/fuzz/regressions/%1/%2.xml")
                .arg(reader, QString::fromLatin1(name(c)).replace(QLatin1Char(' '), QLatin1Char('-'))),
            path);
    case Case::AttributeFlood: {
        QByteArray xml = "<r";
        for (int i = 0; i < 160000; ++i)
            xml += " a" + QByteArray::number(i) + "=''";
        return CorvidTest::writeFile(path, xml + "/>");
    }
    }
    return false;
}

} // namespace HostileInputs

using HostileInputs::Case;
Q_DECLARE_METATYPE(HostileInputs::Case)
Q_DECLARE_METATYPE(InputFile::Status)

namespace {

// One reader: its kind, a small well-formed input, and what it made of the
// file, as text to compare. XML readers name their root element and the
// fuzzers' regression folder that holds their DTD samples.
struct Reader
{
    const char *name;
    InputFile::Kind kind;
    QByteArray sample;
    std::function<QString(const QString &path)> read;
    const char *root = nullptr;
    const char *regressions = nullptr;
};

// A reader that fills report data, and what it filled.
template<typename Fill, typename Show>
std::function<QString(const QString &)> filling(Fill fill, Show show)
{
    return [fill, show](const QString &path) {
        CrvC_ReportData data;
        fill(path, data);
        return QString(show(data));
    };
}

QString history(const CrvC_ReportData &data)
{
    return data.commandHistory.join(QLatin1Char('|'));
}

QList<Reader> readers()
{
    return {
        {"map report", InputFile::MapReport,
         "Target Device : xc3s500e\nTarget Package : fg320\nTarget Speed : -4\n",
         filling(CrvC_SynthesisReport::readTargetInfo,
                 [](const CrvC_ReportData &data) -> QString {
                     return data.targetDevice + data.targetPackage + data.targetSpeed;
                 })},
        {"synthesis report", InputFile::SynthesisReport,
         "Advanced HDL Synthesis Report\n# RAMs : 1\n 16x8-bit RAM : 1\n================\n",
         filling(CrvC_SynthesisReport::readMacroStatistics, CrvC_SynthesisReport::macroStatisticsCell)},
        {"usage XML", InputFile::UsageXml,
         "<DeviceUsageReport><DeviceUsage><group name='Slices'><item name='Used' value='12'/>"
         "</group></DeviceUsage></DeviceUsageReport>",
         [](const QString &path) -> QString {
             CrvC_ReportData data;
             const bool read = CrvC_UsageXml::readUsageXml(path, data);
             return QString::number(read) + data.deviceUsage.keys().join(QLatin1Char('|'));
         },
         "DeviceUsageReport", "usagexml"},
        {"command log", InputFile::CommandLog, "par -w top\n",
         filling(CrvC_CommandLog::readCommandLog, history)},
        {"fuse log", InputFile::FuseLog, "", filling(CrvC_CommandLog::checkFuseLog, history)},
        {"netlist-build report", InputFile::CoreReport,
         "<document><scope stringID='LNKGEN_CORE_INSTANCE'>"
         "<item stringID='LNKGEN_CORE_INFO' type='counter' depth='4'/></scope></document>",
         [](const QString &path) { return QString::fromUtf8(CrvC_CoresStatistics().sectionText(path)); },
         "document", "coresstatistics"},
        {"help viewer data", InputFile::HelpViewerData,
         "<OrbHelpViewerData><SearchString found='true' count='3'>fifo</SearchString></OrbHelpViewerData>",
         [](const QString &path) -> QString {
             return path == CrvC_HelpViewerData::helpFilePath() ? CrvC_HelpViewerData().sectionText()
                                                                : QStringLiteral("wrong path");
         },
         "OrbHelpViewerData", "helpviewerdata"},
        {"sub-report page", InputFile::SubReport, "<P>a</P>\n<P>b</P>\n",
         [](const QString &path) { return CrvC_RunStatistics::parUsageSection(path); }},
        {"run records", InputFile::RunRecords, "synth 2026-01-01T10:00:00 12 completed\n",
         [](const QString &path) -> QString {
             UtilC::RunRecords records;
             return QString::number(records.read(path)) + records.htmlTable();
         }},
        // Read the only way the plug-in reads it: from the first installation root.
        {"install-wide settings", InputFile::InstallSettings,
         "collectusagestatistics=false\ntimestamp=2026-01-01T00:00:00\n",
         [](const QString &) -> QString {
             QString timestamp;
             bool collect = true;
             CrvC_Settings::readInstallSettings(timestamp, collect);
             return QString::number(collect) + timestamp;
         }},
        {"project file", InputFile::ProjectFile,
         "<project name='p'><sources><file path='a.vhd'/></sources></project>",
         [](const QString &path) -> QString {
             OrbProject::ProjectDocument document;
             QString error;
             return document.read(path, &error) ? document.name + QString::number(document.sources.size())
                                                : QStringLiteral("refused");
         },
         "project", "projectdocument"},
    };
}

} // namespace

class tst_InputFile : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;
    QStringList m_debug;
    Port_MsgManData::Sink m_previousSink;

    QString inputPath(const Reader &reader) const
    {
        if (reader.kind == InputFile::HelpViewerData)
            return CrvC_HelpViewerData::helpFilePath();
        if (reader.kind == InputFile::InstallSettings)
            return m_env->installRoot() + QLatin1String("/data/reports/corvidsettings");
        return m_dir.filePath(QString::fromLatin1(reader.name).replace(QLatin1Char(' '), QLatin1Char('_')));
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        QVERIFY(m_dir.isValid());
        qputenv("APPDATA", QFile::encodeName(m_dir.filePath(QStringLiteral("appdata"))));
        m_previousSink = Port_MsgManData::setSink(
            [this](const Port_MsgManData::Message &m) { m_debug << QString::fromStdString(m.text); });
    }

    void init() { m_debug.clear(); }
    void cleanupTestCase() { Port_MsgManData::setSink(m_previousSink); }

    void open_data()
    {
        QTest::addColumn<QString>(
            "setup"); // "regular", "link", "missing", "dangling", "at limit" or a case name
        QTest::addColumn<int>("kind");
        QTest::addColumn<InputFile::Status>("status");

        const std::pair<const char *, Status> setups[] = {
            {"regular", Status::Opened},
            {"link", Status::Opened},
            {"at limit", Status::Opened},
            {"missing", Status::Missing},
            {"dangling", Status::Missing},
            {"named pipe", Status::NotRegular},
            {"link to /dev/zero", Status::NotRegular},
            {"directory", Status::NotRegular},
            {"over the limit", Status::TooLarge},
        };
        // Two kinds with different limits are enough here; every kind meets
        // every hostile case through its reader in reader() below.
        for (int kind : {int(InputFile::InstallSettings), int(InputFile::UsageXml)})
            for (const auto &s : setups)
                QTest::addRow("%s: %s", InputFile::kindName(InputFile::Kind(kind)), s.first)
                    << QString::fromLatin1(s.first) << kind << s.second;
    }

    void open()
    {
        QFETCH(QString, setup);
        QFETCH(int, kind);
        QFETCH(InputFile::Status, status);
        const InputFile::Kind k = InputFile::Kind(kind);
        const QString path = m_dir.filePath(QString::number(kind) + setup);
        const QString regular = m_dir.filePath(QStringLiteral("regular-target"));
        QVERIFY(CorvidTest::writeFile(regular, "contents\n"));

        InputFile file;
        if (setup == QLatin1String("regular"))
            QVERIFY(CorvidTest::writeFile(path, "contents\n"));
        else if (setup == QLatin1String("link") || setup == QLatin1String("dangling"))
            QVERIFY(
                QFile::link(setup == QLatin1String("link") ? regular : path + QLatin1String(".none"), path));
        else if (setup == QLatin1String("at limit"))
            QVERIFY(CorvidTest::writeFile(path, QByteArray())
                    && QFile::resize(path, InputFile::sizeLimit(k)));
        for (Case c : {Case::Fifo, Case::DeviceLink, Case::Directory, Case::OverLimit})
            if (setup == QLatin1String(HostileInputs::name(c)))
                QVERIFY(HostileInputs::plant(path, c, k));

        QString reason;
        QCOMPARE(file.open(path, k, &reason), status);
        QCOMPARE(file.isOpen(), status == Status::Opened);
        QCOMPARE(InputFile::isAvailable(path, k), status == Status::Opened);
        if (status == Status::Opened) {
            QCOMPARE(file.pos(), qint64(0));
            QByteArray contents;
            if (setup != QLatin1String("at limit"))
                QVERIFY(file.readRest(contents) && contents == "contents\n");
        }
        // Refusals leave a debug line naming the file and the reason; nothing else does.
        if (status == Status::Opened || status == Status::Missing)
            QVERIFY2(m_debug.isEmpty(), qPrintable(m_debug.join(QLatin1Char('|'))));
        else
            QVERIFY2(!reason.isEmpty() && m_debug.value(0).contains(path)
                         && m_debug.value(0).contains(reason),
                     qPrintable(m_debug.join(QLatin1Char('|'))));
        QByteArray bytes("stale");
        QCOMPARE(InputFile::readAll(path, k, bytes), status);
        if (status != Status::Opened)
            QVERIFY(bytes.isEmpty());
    }

    void prolog_data()
    {
        QTest::addColumn<QByteArray>("xml");
        QTest::addColumn<bool>("refused");

        // No false alarms: an external DTD (no parser here fetches it), brackets
        // outside a subset.
        QTest::newRow("public identifier with a bracket")
            << QByteArray("<!DOCTYPE r PUBLIC \"-//x//[DTD]//EN\" 'r[1].dtd'><r/>") << false;
        QTest::newRow("comment and instruction first")
            << QByteArray("\xEF\xBB\xBF<!-- <!DOCTYPE [ --><?pi [ ?>\n<r/>") << false;
        QTest::newRow("bracket in the content") << QByteArray("<r>[<![CDATA[x]]></r>") << false;
        QTest::newRow("empty") << QByteArray() << false;
        QTest::newRow("empty internal subset") << QByteArray("<!DOCTYPE r []><r/>") << true;
        QTest::newRow("external and internal")
            << QByteArray("<!DOCTYPE r SYSTEM 'r.dtd' [<!ELEMENT r ANY>]><r/>") << true;
        QTest::newRow("declaration without a doctype") << QByteArray("<!ENTITY a 'b'><r/>") << true;
        QTest::newRow("after a long comment")
            << QByteArray("<!--" + QByteArray(200000, 'x') + "--><!DOCTYPE r [ ]><r/>") << true;
        QTest::newRow("UTF-8 byte-order mark, then a subset")
            << QByteArray("\xEF\xBB\xBF<!DOCTYPE r [<!ENTITY a 'b'>]><r/>") << true;
        const auto document = [](const char *encoding,
                                 const char *rest = "<!DOCTYPE r [<!ENTITY a 'b'>]><r/>") {
            return QStringLiteral("<?xml version='1.0' encoding='%1'?>%2")
                .arg(QLatin1String(encoding), QLatin1String(rest));
        };
        QByteArray le("\xFF\xFE");
        const QString utf16 = document("UTF-16");
        le.append(reinterpret_cast<const char *>(utf16.utf16()), utf16.size() * 2);
        QTest::newRow("UTF-16LE with a byte-order mark") << le << true;
        QTest::newRow("UTF-16LE without one") << le.mid(2) << true;
        QByteArray be;
        for (QChar c : utf16)
            be.append(char(c.unicode() >> 8)).append(char(c.unicode() & 0xFF));
        QTest::newRow("UTF-16BE without a byte-order mark") << be << true;
        QByteArray utf32;
        for (QChar c : document("UTF-32"))
            utf32.append(char(c.unicode())).append(3, '\0');
        QTest::newRow("UTF-32LE") << utf32 << true;

        // The encoding a parser would switch to: only Unicode, and only the
        // one the first bytes already show.
        QTest::newRow("UTF-7") << document("UTF-7", "+ADw-r/+AD4-").toLatin1() << true;
        QTest::newRow("Latin-1, spaced, lower case")
            << QByteArray("<?xml version='1.0' encoding = \"iso-8859-1\" ?><r/>") << false;
        QTest::newRow("encoding in an instruction that is no declaration")
            << QByteArray("<?xml-stylesheet encoding='UTF-7'?><r/>") << true;
        QByteArray mismatch;
        for (QChar c : document("UTF-8", "<r/>"))
            mismatch.append(char(c.unicode())).append('\0');
        QTest::newRow("UTF-16 bytes declaring UTF-8") << mismatch << true;
        QTest::newRow("UTF-8 declaring UTF-16") << document("UTF-16", "<r/>").toLatin1() << true;
    }

    void prolog()
    {
        QFETCH(QByteArray, xml);
        QFETCH(bool, refused);
        QCOMPARE(!XmlGuard::prologProblem(xml).isEmpty(), refused);
    }

    void depth_data()
    {
        QTest::addColumn<QByteArray>("xml");
        QTest::addColumn<int>("maxDepth");
        QTest::addColumn<bool>("tooDeep");

        const auto nested = [](int levels) -> QByteArray {
            return QByteArray("<d>").repeated(levels) + QByteArray("</d>").repeated(levels);
        };
        QTest::newRow("at the limit") << nested(5) << 5 << false;
        QTest::newRow("one level past") << nested(6) << 5 << true;
        QTest::newRow("50000 levels") << nested(50000) << XmlGuard::MaxDepth << true;
        QTest::newRow("siblings do not add up")
            << QByteArray("<r>" + QByteArray("<a/>").repeated(20) + "</r>") << 2 << false;
    }

    void depth()
    {
        QFETCH(QByteArray, xml);
        QFETCH(int, maxDepth);
        QFETCH(bool, tooDeep);
        QCOMPARE(XmlGuard::exceedsDepth(xml, maxDepth), tooDeep);

        // The streaming readers' counter agrees, and ends the stream with an error.
        QXmlStreamReader reader(xml);
        int depth = 0;
        int deepest = 0;
        while (!reader.atEnd()) {
            XmlGuard::readNext(reader, depth, maxDepth);
            deepest = qMax(deepest, depth);
        }
        QCOMPARE(deepest > maxDepth, tooDeep);
        if (tooDeep)
            QVERIFY(reader.hasError());
    }

    void reader_data()
    {
        QTest::addColumn<int>("index");
        QTest::addColumn<QString>("setup"); // "external DTD", or a hostile case
        QTest::addColumn<HostileInputs::Case>("hostile");

        const QList<Reader> all = readers();
        for (int i = 0; i < all.size(); ++i) {
            QList<Case> cases = {Case::Fifo, Case::DeviceLink, Case::Directory};
            // The fuse log is never read, so its size does not matter.
            if (all.at(i).kind != InputFile::FuseLog)
                cases << Case::OverLimit << Case::Endless;
            if (all.at(i).regressions) {
                cases << Case::EntityDoubling << Case::NestedContentModel << Case::Utf7EntityDoubling
                      << Case::Utf7NestedContentModel << Case::AttributeFlood;
                QTest::addRow("%s: external DTD", all.at(i).name) << i << "external DTD" << Case::Fifo;
            }
            for (Case c : cases)
                QTest::addRow("%s: %s", all.at(i).name, HostileInputs::name(c)) << i << QString() << c;
        }
    }

    // A hostile input reads as a missing one, at once; a document type line
    // naming an external DTD reads as the same document without it.
    void reader()
    {
        QFETCH(int, index);
        QFETCH(QString, setup);
        QFETCH(HostileInputs::Case, hostile);
        const Reader reader = readers().at(index);
        const QString path = inputPath(reader);

        QFile::remove(path);
        QDir(path).removeRecursively();
        const QString missing = reader.read(path);
        QVERIFY(CorvidTest::writeFile(path, reader.sample));
        const QString plain = reader.read(path);
        QVERIFY2(plain != missing, "the sample must give a result of its own");
        QVERIFY(QFile::remove(path));

        if (setup == QLatin1String("external DTD")) {
            QVERIFY(CorvidTest::writeFile(
                path, "<?xml version=\"1.0\"?>\n<!DOCTYPE " + QByteArray(reader.root)
                          + " SYSTEM \"http://127.0.0.1:9/none.dtd\">\n" + reader.sample));
            QCOMPARE(reader.read(path), plain);
        } else {
            QVERIFY(
                HostileInputs::plant(path, hostile, reader.kind, QString::fromLatin1(reader.regressions)));
            // An endless file is read up to the limit: a small one keeps the test quick.
            const qint64 limit = InputFile::setSizeLimit(reader.kind, hostile == Case::Endless ? 1 << 20 : 0);
            QElapsedTimer timer;
            timer.start();
            const QString result = reader.read(path);
            InputFile::setSizeLimit(reader.kind, limit);
            QCOMPARE(result, missing);
            QVERIFY2(timer.elapsed() < 5000, qPrintable(QString::number(timer.elapsed())));
        }
        QFile::remove(path);
        QDir(path).removeRecursively();
    }

    // Every input of the page replaced by a named pipe at once: the page is
    // still built, and quickly.
    void wholePage()
    {
        const QString project = m_dir.filePath(QStringLiteral("project"));
        QVERIFY(QDir().mkpath(project + QLatin1String("/osim")));
        const QString previous = QDir::currentPath();
        QVERIFY(QDir::setCurrent(project));
        const char *const inputs[] = {"top.snx",
                                      "top_map.ktp",
                                      "top_usage.xml",
                                      "top.cmd_log",
                                      "fuse.log",
                                      "top_lnkgen.drpt",
                                      "par_usage_statistics.html",
                                      "osim/osim_usage_statistics.html"};
        for (const char *input : inputs)
            QVERIFY(HostileInputs::plant(project + QLatin1Char('/') + QLatin1String(input), Case::Fifo,
                                         InputFile::UsageXml));
        QVERIFY(
            HostileInputs::plant(CrvC_HelpViewerData::helpFilePath(), Case::Fifo, InputFile::HelpViewerData));

        QElapsedTimer timer;
        timer.start();
        CrvC_ReportBuilder builder;
        builder.createReport(QStringLiteral("top"), QStringLiteral("top"), QStringLiteral("Xc6"));
        const qint64 elapsed = timer.elapsed();
        QDir::setCurrent(previous);
        QFile::remove(CrvC_HelpViewerData::helpFilePath());

        QVERIFY(builder.pageText().endsWith(QLatin1String("</BODY></HTML>")));
        QVERIFY(builder.pageText().contains(QLatin1String("Device Usage Statistics</B>")));
        QVERIFY(!builder.pageText().contains(QLatin1String("Tool Usage")));
        QVERIFY2(elapsed < 10000, qPrintable(QString::number(elapsed)));
    }
};

QTEST_GUILESS_MAIN(tst_InputFile)
#include "tst_inputfile.moc"
