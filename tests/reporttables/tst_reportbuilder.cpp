#include "common/TestEnvironment.h"
#include "project/CorvidSettings.h"
#include "report/PageStore.h"
#include "report/ReportBuilder.h"

#include <QDir>
#include <QTemporaryDir>
#include <QtTest>

#include <new>

namespace {

const QString EmptyDeviceTable = QStringLiteral(
    "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
    "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4><B>Device Usage Statistics</B></TD></TR>\n"
    "<TR ALIGN=CENTER BGCOLOR='#FFFF99'><TD><B>Macro Statistics</B></TD><TD><B>Miscellaneous "
    "Statistics</B></TD><TD><B>Net Statistics</B></TD><TD><B>Site Usage</B></TD></TR>"
    "<TR VALIGN=TOP>\n"
    "<TD>&nbsp;</TD>\n<TD>&nbsp;</TD><TD>&nbsp;</TD>\n<TD>&nbsp;</TD>\n</TR></TABLE>\n");

} // namespace

class tst_ReportBuilder : public QObject
{
    Q_OBJECT

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
    std::unique_ptr<QTemporaryDir> m_dir;
    QString m_oldCurrent;
    int m_asked = 0;     // times the design name was asked for
    QStringList m_busy;  // the cursor: "busy", "idle"

    // Fixed clock and identifiers; the design name prompt answers `answer`
    // with `typed`.
    CrvC_ReportBuilder::Environment environment(bool answer = false, const QString &typed = QString())
    {
        CrvC_ReportBuilder::Environment env;
        env.now = [] { return QDateTime(QDate(2009, 3, 17), QTime(14, 5, 9)); };
        env.newIdentifier = [] { return QStringLiteral("0123456789abcdef0123456789abcdef"); };
        env.randomId = [] { return QStringLiteral("5eed5eed5eed5eed5eed5eed5eed5eed"); };
        env.askDesignName = [this, answer, typed](QString &name) {
            ++m_asked;
            name = typed;
            return answer;
        };
        env.setBusy = [this](bool on) { m_busy << (on ? QStringLiteral("busy") : QStringLiteral("idle")); };
        return env;
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        m_oldCurrent = QDir::currentPath();
    }

    // Every test builds in an empty working directory of its own: without a
    // project the builder reads and writes there.
    void init()
    {
        m_dir.reset(new QTemporaryDir);
        QVERIFY(QDir::setCurrent(m_dir->path()));
        m_asked = 0;
        m_busy.clear();
        CrvC_Settings::setValue(CrvC_Settings::RandomID,
                                QStringLiteral("fedcba9876543210fedcba9876543210"));
    }

    void cleanup() { QDir::setCurrent(m_oldCurrent); }

    // The project file gets its extension when it has none; files named after
    // the project are read only when there is one: without it nothing named
    // ".orb..." in the working directory is opened.
    void projectFile_data()
    {
        QTest::addColumn<QString>("given");
        QTest::addColumn<QString>("used");
        QTest::newRow("upper-case extension kept") << "top.ORB" << "top.ORB";
        QTest::newRow("extension appended") << "top" << "top.orb";
        QTest::newRow("only a final extension counts") << "top.orb.bak" << "top.orb.bak.orb";
        QTest::newRow("no project file") << "" << ".orb";
    }

    void projectFile()
    {
        QFETCH(QString, given);
        QFETCH(QString, used);
        QVERIFY(CorvidTest::writeFile(used + QLatin1String(".runs"),
                                      "synth 2025-03-03T09:12:40 41 completed\n"));
        CrvC_ReportBuilder builder(environment());
        builder.createReport(given, QStringLiteral("top"), QStringLiteral("Xc6"));
        QCOMPARE(builder.data().projectFile, used);
        QCOMPARE(builder.pageText().contains(QLatin1String("<dtag-section name=\"RunStatistics\">")),
                 !given.isEmpty());
    }

    void designName_data()
    {
        QTest::addColumn<QString>("given");
        QTest::addColumn<bool>("accept");
        QTest::addColumn<QString>("typed");
        QTest::addColumn<int>("asked");
        QTest::addColumn<QString>("device"); // tells which map report was read

        QTest::newRow("caller's name used with its blanks") << "  top  " << true << "other" << 0
                                                            << "untrimmed";
        QTest::newRow("typed name trimmed") << "" << true << "  top  " << 1 << "trimmed";
        QTest::newRow("cancelled: nothing built") << "" << false << "top" << 1 << "";
    }

    void designName()
    {
        QFETCH(QString, given);
        QFETCH(bool, accept);
        QFETCH(QString, typed);
        QFETCH(int, asked);
        QFETCH(QString, device);
        CorvidTest::writeFile(QStringLiteral("top_map.ktp"), "Target Device : trimmed\n");
        CorvidTest::writeFile(QStringLiteral("  top  _map.ktp"), "Target Device : untrimmed\n");
        CorvidTest::writeFile(QStringLiteral("_map.ktp"), "Target Device : nameless\n");
        CrvC_ReportBuilder builder(environment(accept, typed));
        builder.createReport(QStringLiteral("top.orb"), given, QString());
        QCOMPARE(m_asked, asked);
        QCOMPARE(builder.data().targetDevice, device);
        QCOMPARE(builder.written(), !device.isEmpty());
        QCOMPARE(QFile::exists(builder.reportPath()), !device.isEmpty());
    }

    // Each build's own copy, in a folder of its own, goes when a later build finds it old.
    void ownCopies()
    {
        CrvC_ReportBuilder::Environment env = environment();
        QDateTime when = QDateTime::currentDateTime();
        env.pageFolder = [&when] { return CrvC_PageStore::newFolder(when); };
        const QString outside = m_dir->filePath(QStringLiteral("outside"));
        QVERIFY(CorvidTest::writeFile(outside + QLatin1String("/kept"), "x"));
        QVERIFY(QDir().mkpath(CrvC_PageStore::root()));
        QVERIFY(QFile::link(outside, CrvC_PageStore::root() + QLatin1String("/link")));
        QStringList copies;
        for (int build = 0; build < 2; ++build) {
            CrvC_ReportBuilder builder(env);
            builder.createReport(QStringLiteral("top"), QStringLiteral("top"), QString());
            copies << builder.pagePath();
            QCOMPARE(QFileInfo(copies.last()).fileName(), QStringLiteral("device_usage_statistics.html"));
            when = when.addDays(CrvC_PageStore::KeepDays + 1);
        }
        QVERIFY(!QFile::exists(copies.at(0)) && QFile::exists(copies.at(1)));
        QVERIFY(QFile::exists(outside + QLatin1String("/kept")));
    }

    void noInputFiles()
    {
        CrvC_ReportBuilder builder(environment());
        builder.createReport(QStringLiteral("top"), QStringLiteral("top"), QStringLiteral("Xc6"));
        QCOMPARE(m_busy, QStringList({"busy", "idle"}));

        const QString page = builder.pageText();
        QVERIFY(page.contains(QLatin1String("</TR>\n</TABLE>\n") + EmptyDeviceTable));
        QVERIFY(page.contains(QLatin1String("<dtag-property name=\"RandomID\">"
                                            "5eed5eed5eed5eed5eed5eed5eed5eed</dtag-property>")));
        QVERIFY(!page.contains(QLatin1String("Configuration Data")) && !page.contains(QLatin1String("Pin Data")));

        QVERIFY(builder.written());
        QVERIFY(!builder.pageCut());
        QCOMPARE(QDir::current().absoluteFilePath(builder.reportPath()),
                 m_dir->filePath(QStringLiteral("device_usage_statistics.html")));
        QCOMPARE(CorvidTest::readFile(builder.reportPath()), page.toUtf8());
    }

    // A page larger than the review shows goes whole to the file; the
    // builder keeps its beginning.
    void largePageKeepsBeginning()
    {
        QByteArray xml = "<DeviceUsageReport><DeviceUsage>\n";
        const qsizetype items = CrvC_ReportBuilder::PageTextLimit / 40 + 1000;
        for (qsizetype i = 0; i < items; ++i) {
            if (i % 50 == 0)
                xml += (i ? "</group>\n" : "") + QByteArray("<group name=\"G")
                       + QByteArray::number(i) + "\">\n";
            xml += "<item name=\"Sl\xc3\xaf" "ce\" value=\"" + QByteArray::number(i) + "\"/>\n";
        }
        xml += "</group></DeviceUsage></DeviceUsageReport>\n";
        QVERIFY(CorvidTest::writeFile(QStringLiteral("top_usage.xml"), xml));

        CrvC_ReportBuilder builder(environment());
        builder.createReport(QStringLiteral("top"), QStringLiteral("top"), QString());
        QVERIFY(builder.written());
        QVERIFY(builder.pageCut());
        QCOMPARE(builder.pageText().size(), CrvC_ReportBuilder::PageTextLimit);
        const QString file = QString::fromUtf8(CorvidTest::readFile(builder.reportPath()));
        QVERIFY(file.size() > CrvC_ReportBuilder::PageTextLimit);
        QVERIFY(file.startsWith(builder.pageText()));
        QVERIFY(file.contains(QStringLiteral("Sl\u00efce=") + QString::number(items - 1)));
        QVERIFY(file.endsWith(QLatin1String("\n</BODY></HTML>")));
    }

    // The page is written whole or not at all: the previous file, or the
    // file a link points to, stays as it was, and the cursor comes back.
    void pageNotWritten_data()
    {
        QTest::addColumn<QString>("how");
        QTest::newRow("report path is a symbolic link") << "link";
        QTest::newRow("folder of the report path missing") << "missing";
        QTest::newRow("memory runs out") << "memory";
    }

    void pageNotWritten()
    {
        QFETCH(QString, how);
        const QByteArray old = "previous page";
        QVERIFY(CorvidTest::writeFile(QStringLiteral("target.html"), old));
        CrvC_ReportBuilder::Environment env = environment();
        if (how == QLatin1String("memory"))
            env.now = []() -> QDateTime { throw std::bad_alloc(); };
        CrvC_ReportBuilder builder(env);
        if (how == QLatin1String("link"))
            QVERIFY(QFile::link(QStringLiteral("target.html"), builder.reportPath()));
        else
            builder.setReportPath(how == QLatin1String("missing") ? QStringLiteral("gone/page.html")
                                                                   : QStringLiteral("target.html"));

        builder.createReport(QStringLiteral("top"), QStringLiteral("top"), QString());
        QVERIFY(!builder.written());
        QCOMPARE(m_busy, QStringList({"busy", "idle"}));
        QCOMPARE(CorvidTest::readFile(QStringLiteral("target.html")), old);
        if (how == QLatin1String("link"))
            QVERIFY(QFileInfo(builder.reportPath()).isSymLink());
        QCOMPARE(QDir::current().entryList(QDir::Files | QDir::Hidden).size(),
                 how == QLatin1String("link") ? 2 : 1); // no temporary file left
    }
};

QTEST_GUILESS_MAIN(tst_ReportBuilder)
#include "tst_reportbuilder.moc"
