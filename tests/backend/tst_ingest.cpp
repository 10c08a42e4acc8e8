// corvid-ingest, corvid-stats and corvid-receiver --ingest as the maker runs
// them, on pages that corvid-report builds from varied inputs, into SQLite
// and into a PostgreSQL server of the test's own.

#include "common/PostgresServer.h"
#include "common/TestEnvironment.h"
#include "common/TestServer.h"

#include "backend/Statistics.h"
#include "report/CommandLog.h"
#include "report/SynthesisReport.h"
#include "report/UsageXml.h"

#include <QDirIterator>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QSqlDatabase>
#include <QSqlQuery>
#include <QtTest>

using namespace CorvidTest;

namespace {

// The page's values as "tag" or "tag:name" and the value.
using Values = QList<QPair<QString, QString>>;

// What the builder's readers take from the inputs, in page order.
Values builderValues(const QString &dir, const QString &design)
{
    CrvC_ReportData d;
    const QString base = dir + "/" + design;
    CrvC_SynthesisReport::readTargetInfo(base + "_map.ktp", d);
    CrvC_SynthesisReport::readMacroStatistics(base + ".snx", d);
    CrvC_UsageXml::readUsageXml(base + "_usage.xml", d);
    CrvC_CommandLog::readCommandLog(base + ".cmd_log", d);
    CrvC_CommandLog::checkFuseLog(dir + "/fuse.log", d);
    Values values{{"dtag-property:TargetDevice", d.targetDevice},
                  {"dtag-property:TargetPackage", d.targetPackage},
                  {"dtag-property:TargetSpeed", d.targetSpeed}};
    static const QRegularExpression item("^<(dtag-item\\d)>(.*)</\\1>$");
    auto group = [&](const QString &name, const QStringList &items) {
        values.append({"dtag-group-name:" + name, name});
        for (const QString &text : items)
            values.append({item.match(text).captured(1), item.match(text).captured(2)});
    };
    for (const auto &entry : d.macroStatistics)
        group(entry.first, entry.second);
    for (const auto *table : {&d.designStatistics, &d.deviceUsage, &d.reportConfigData, &d.reportPinData})
        for (auto it = table->cbegin(); it != table->cend(); ++it)
            group(it.key(), it.value());
    for (const QString &line : d.commandHistory)
        values.append({"dtag-cmdline", line});
    return values;
}

bool copyTree(const QString &from, const QString &to)
{
    QDirIterator it(from, QDir::Files, QDirIterator::Subdirectories);
    while (it.hasNext()) {
        const QString source = it.next();
        if (!writeFile(to + source.mid(from.size()), readFile(source)))
            return false;
    }
    return true;
}

} // namespace

class TestIngest : public QObject
{
    Q_OBJECT
    std::unique_ptr<Environment> m_env;
    PostgresServer m_postgres;
    QString m_work;

    ToolRun ingest(const QStringList &arguments) { return runStaged("corvid-ingest", arguments, m_work); }

    // Rows in all tables of the SQLite store at `file` but its schema version.
    static int rowCount(const QString &file)
    {
        int rows = -1;
        {
            QSqlDatabase db = QSqlDatabase::addDatabase("QSQLITE", "count");
            db.setDatabaseName(file);
            QSqlQuery tables(db);
            if (db.open())
                rows = 0;
            tables.exec("SELECT name FROM sqlite_master WHERE type = 'table' AND name <> 'corvid_schema'");
            while (tables.next()) {
                QSqlQuery count(db);
                count.exec("SELECT COUNT(*) FROM " + tables.value(0).toString());
                rows += count.next() ? count.value(0).toInt() : 1000000;
            }
        }
        QSqlDatabase::removeDatabase("count");
        return rows;
    }

    static void sqlite(const QString &file, const QString &statement)
    {
        {
            QSqlDatabase db = QSqlDatabase::addDatabase("QSQLITE", "change");
            db.setDatabaseName(file);
            QVERIFY(db.open());
            QSqlQuery query(db);
            QVERIFY2(query.exec(statement), qPrintable(statement));
        }
        QSqlDatabase::removeDatabase("change");
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new Environment);
        QVERIFY2(m_postgres.start(), qPrintable(m_postgres.error()));
        QVERIFY(m_env->writeDataFile("orb_version", "product=Orb Design Suite\nversion=14.7\n"));
        // Where corvid-report, without the test mode of QStandardPaths, looks.
        const QString helpFile =
            qEnvironmentVariable("XDG_DATA_HOME") + "/Vantor/Common/14.7/orbhelpviewerdata.xml";
        QVERIFY(writeFile(helpFile,
                          readFile(Environment::sourceDir() + "/examples/helpviewer/orbhelpviewerdata.xml")));

        // Three projects: the sample, the sample with odd values, and one
        // without any tool reports; one page each, the last in an upload folder.
        m_work = m_env->home() + "/work";
        const QString sample = Environment::sourceDir() + "/examples/ledctrl";
        for (const char *name : {"ledctrl", "odd"})
            QVERIFY(copyTree(sample, m_work + "/" + name));
        QByteArray usage = readFile(m_work + "/odd/ledctrl_usage.xml");
        usage.replace("Number of Slice LUTs", "LUTs a&lt;1 &amp; b&gt;0 &quot;q&quot; \xc3\xa4 \xe2\x82\xac");
        QVERIFY(writeFile(m_work + "/odd/ledctrl_usage.xml", usage));
        QVERIFY(writeFile(m_work + "/odd/ledctrl.cmd_log", "map -x <a&b> \"q\" -y\n\n\xc3\xa4 --long=1\n"));
        QVERIFY(writeFile(m_work + "/empty/ledctrl_usage.xml", "<usage/>"));
        QVERIFY(QDir().mkpath(m_work + "/pages/000007"));
        const QStringList pages{"pages/a.html", "pages/b.html", "pages/000007/device_usage_statistics.html"};
        const QStringList projects{"ledctrl", "odd", "empty"}, families{"Xc6", "Xc7", "Ya1"};
        for (int i = 0; i < 3; ++i) {
            QStringList arguments{"--family", families.at(i), "--out", pages.at(i)};
            if (i < 2)
                arguments += {"--project", projects.at(i) + "/ledctrl.orb"};
            const ToolRun report = runStaged(
                "corvid-report", arguments + QStringList{projects.at(i) + "/ledctrl_usage.xml"}, m_work);
            QVERIFY2(report.exitCode == 0, qPrintable(report.output));
        }
        QVERIFY(writeFile(m_work + "/pages/000007/@fields.txt",
                          "received=2026-12-06T14:27:03Z\ndomain=ex%C3%A4mple.org\nregid=R-1\n"
                          "stored_as=device_usage_statistics.html\n"));
    }

    // --print gives back every value the builder's readers produced.
    void printsWhatTheBuilderWrote_data()
    {
        QTest::addColumn<QString>("page");
        QTest::addColumn<QString>("project");
        QTest::newRow("sample project") << "pages/a.html"
                                        << "ledctrl";
        QTest::newRow("odd values") << "pages/b.html"
                                    << "odd";
        QTest::newRow("no tool reports") << "pages/000007/device_usage_statistics.html"
                                         << "empty";
    }

    void printsWhatTheBuilderWrote()
    {
        QFETCH(QString, page);
        QFETCH(QString, project);
        const ToolRun print = ingest({"--print", page});
        QCOMPARE(print.exitCode, 0);
        Values printed;
        for (const QJsonValue &v : QJsonDocument::fromJson(print.output.toUtf8())["values"].toArray()) {
            const QString name = v["name"].toString();
            printed.append(
                {v["tag"].toString() + (v["name"].isNull() ? QString() : ":" + name), v["value"].toString()});
        }
        const Values expected = builderValues(m_work + "/" + project, "ledctrl");
        int found = 0;
        for (const auto &value : printed)
            if (found < expected.size() && value == expected.at(found))
                ++found;
        QVERIFY2(found == expected.size(),
                 qPrintable(expected.value(found).first + "=" + expected.value(found).second));
        QVERIFY(printed.contains({"dtag-property:TargetFamily", QStringLiteral("Xc6")})
                == (project == "ledctrl"));
    }

    // Each page once, then already present; the same answers from both engines.
    void sameAnswersFromSQLiteAndPostgreSQL()
    {
        QVERIFY2(m_postgres.createDatabase("corvid"), qPrintable(m_postgres.error()));
        const QStringList urls{"sqlite:" + m_work + "/corvid.sqlite", m_postgres.url("corvid")};
        for (const QString &url : urls) {
            QCOMPARE(ingest({"--db", url, "pages"}).output,
                     QStringLiteral("ingested 3, already present 0, rejected 0\n"));
            QCOMPARE(ingest({"--db", url, "--commit-every", "1", "pages", "pages/a.html"}).output,
                     QStringLiteral("ingested 0, already present 4, rejected 0\n"));
        }
        for (const QString &query : CrvB_Statistics::queries()) {
            QStringList answers;
            for (const QString &url : urls)
                answers.append(
                    runStaged("corvid-stats", {"--db", url, "--format", "json", query}, m_work).output);
            QCOMPARE(answers.at(0), answers.at(1));
            QVERIFY2(QJsonDocument::fromJson(answers.at(0).toUtf8()).array().size() > 0, qPrintable(query));
        }
        const QString families = runStaged("corvid-stats", {"--db", urls.at(1), "families"}, m_work).output;
        QVERIFY2(families.contains(QRegularExpression("Xc7 +1\n")), qPrintable(families));
        const QString html =
            runStaged("corvid-stats", {"--format", "html", "--db", urls.at(0), "tools"}, m_work).output;
        QVERIFY(html.contains("<svg") && html.contains("<td>synth</td>") && !html.contains("<script"));
    }

    // A page that is turned down leaves no rows and is kept in rejected/.
    void hostilePagesLeaveNoRows_data()
    {
        QTest::addColumn<QByteArray>("page");
        QTest::addColumn<QString>("reason");
        QTest::newRow("not UTF-8") << QByteArray("<dtag-cmdline>\xfe</dtag-cmdline>") << "not UTF-8";
        QTest::newRow("no values") << QByteArray("<HTML></HTML>") << "no dtag values";
        QTest::newRow("truncated") << readFile(m_work + "/pages/a.html").left(5000) << "cut off";
        QTest::newRow("too deep") << QByteArray("<dtag-a>").repeated(40) << "deeper than 16";
        QTest::newRow("too large") << QByteArray() << "larger than 67108864 bytes";
        QByteArray forged = readFile(m_work + "/pages/a.html");
        forged.replace(">xc6a25<", ">xc6a25</dtag-property><dtag-property name=\"TargetFamily\">Zz9<");
        QTest::newRow("forged value") << forged << "\"TargetFamily\" is given twice";
    }

    void hostilePagesLeaveNoRows()
    {
        QFETCH(QByteArray, page);
        QFETCH(QString, reason);
        const QString file = m_work + "/hostile/" + QTest::currentDataTag() + ".html";
        QVERIFY(writeFile(file, page));
        if (page.isEmpty())
            QVERIFY(QFile(file).resize(64 * 1024 * 1024 + 1));
        const ToolRun run = ingest({"--db", "sqlite:hostile/store.sqlite", file});
        QVERIFY2(run.output.contains(reason), qPrintable(run.output));
        QVERIFY(run.output.endsWith("ingested 0, already present 0, rejected 1\n"));
        QCOMPARE(rowCount(m_work + "/hostile/store.sqlite"), 0);
        const QDir rejected(m_work + "/hostile/rejected");
        QCOMPARE(rejected.entryList({"*" + QFileInfo(file).fileName() + ".reason"}).size(), 1);
        QCOMPARE(rejected.entryList({"*" + QFileInfo(file).fileName()}).size(), page.isEmpty() ? 0 : 1);
    }

    // Ingest on arrival: a database that refuses the page keeps the upload,
    // and a later run takes it.
    void receiverKeepsUploadsTheDatabaseRefused()
    {
        const QString db = m_work + "/received.sqlite";
        QVERIFY(ingest({"--db", "sqlite:" + db, "hostile/none"}).output.endsWith("rejected 0\n"));
        sqlite(db, "CREATE TRIGGER refuse BEFORE INSERT ON report BEGIN SELECT RAISE(ABORT, 'refused'); END");
        TestServer server;
        QVERIFY2(server.start({"--ingest", "sqlite:" + db}), qPrintable(server.error()));
        const QStringList upload{"--cacert", server.caFile(), "-F", "access=v9orn", "-F", "domain=d", "-F"};
        for (const char *page : {"a", "b"}) {
            if (*page == 'b')
                sqlite(db, "DROP TRIGGER refuse");
            const ToolRun sent =
                runStaged("vancurl",
                          upload
                              + QStringList{QStringLiteral("file_loc=@pages/%1.html").arg(page),
                                            server.baseUrl() + "/upload"},
                          m_work);
            QVERIFY2(sent.exitCode == 0, qPrintable(sent.output));
        }
        const QString log = server.log();
        QVERIFY2(log.contains("ingest 000001: failed") && log.contains("refused"), qPrintable(log));
        QVERIFY2(log.contains("ingest 000002: ingested 1, already present 0, rejected 0"), qPrintable(log));
        QCOMPARE(server.upload(0).file, readFile(m_work + "/pages/a.html"));
        QCOMPARE(ingest({"--db", "sqlite:" + db, server.dataDir()}).output,
                 QStringLiteral("ingested 1, already present 1, rejected 0\n"));
    }
};

QTEST_GUILESS_MAIN(TestIngest)
#include "tst_ingest.moc"
