#include "HostileInputs.h"
#include "common/TestEnvironment.h"

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

using HostileInputs::Case;
using Port::InputFile;

Q_DECLARE_METATYPE(HostileInputs::Case)

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
template <typename Fill, typename Show>
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
         filling(CrvC_SynthesisReport::readTargetInfo, [](const CrvC_ReportData &data) -> QString {
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
        {"command log", InputFile::CommandLog, "par -w top\n", filling(CrvC_CommandLog::readCommandLog, history)},
        {"fuse log", InputFile::FuseLog, "", filling(CrvC_CommandLog::checkFuseLog, history)},
        {"netlist-build report", InputFile::CoreReport,
         "<document><scope stringID='LNKGEN_CORE_INSTANCE'>"
         "<item stringID='LNKGEN_CORE_INFO' type='counter' depth='4'/></scope></document>",
         [](const QString &path) { return CrvC_CoresStatistics().sectionText(path); },
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

class tst_HostileInputs : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;

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
                cases << Case::OverLimit;
            if (all.at(i).regressions) {
                cases << Case::EntityDoubling << Case::NestedContentModel;
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
            QVERIFY(CorvidTest::writeFile(path, "<?xml version=\"1.0\"?>\n<!DOCTYPE " + QByteArray(reader.root)
                                                + " SYSTEM \"http://127.0.0.1:9/none.dtd\">\n" + reader.sample));
            QCOMPARE(reader.read(path), plain);
        } else {
            QVERIFY(HostileInputs::plant(path, hostile, reader.kind,
                                         QString::fromLatin1(reader.regressions)));
            QElapsedTimer timer;
            timer.start();
            QCOMPARE(reader.read(path), missing);
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
        const char *const inputs[] = {"top.snx", "top_map.ktp", "top_usage.xml", "top.cmd_log",
                                      "fuse.log", "top_lnkgen.drpt", "par_usage_statistics.html",
                                      "osim/osim_usage_statistics.html"};
        for (const char *input : inputs)
            QVERIFY(HostileInputs::plant(project + QLatin1Char('/') + QLatin1String(input), Case::Fifo,
                                         InputFile::UsageXml));
        QVERIFY(HostileInputs::plant(CrvC_HelpViewerData::helpFilePath(), Case::Fifo,
                                     InputFile::HelpViewerData));

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

QTEST_GUILESS_MAIN(tst_HostileInputs)
#include "tst_hostileinputs.moc"
