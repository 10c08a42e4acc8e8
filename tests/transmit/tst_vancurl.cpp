// vancurl against corvid-receiver over HTTPS on 127.0.0.1, with throwaway
// certificates: exit statuses, what reaches standard output, what is stored.

#include "common/TestEnvironment.h"
#include "common/TestServer.h"

#include <QDir>
#include <QProcess>
#include <QtTest>

using namespace CorvidTest;

namespace {

struct Run
{
    int exitCode = -1;
    QByteArray out;
    QByteArray err;
};

Run vancurl(const QStringList &arguments, const QStringList &environment = QStringList())
{
    QProcess process;
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    for (const QString &entry : environment)
        env.insert(entry.section(QLatin1Char('='), 0, 0), entry.section(QLatin1Char('='), 1));
    process.setProcessEnvironment(env);
    process.start(Environment::stageDir() + QLatin1String("/bin/vancurl"), arguments);
    Run run;
    if (process.waitForFinished(90000) && process.exitStatus() == QProcess::NormalExit)
        run.exitCode = process.exitCode();
    run.out = process.readAllStandardOutput();
    run.err = process.readAllStandardError();
    return run;
}

const char lookupPath[] = "/cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=corvidupload";

} // namespace

class TestVancurl : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void transfers_data();
    void transfers();
    void uploadsNeverOverwrite();
    void helpAndStop();

private:
    QString expand(QString text) const;

    std::unique_ptr<Environment> m_env;
    std::unique_ptr<TestServer> m_server;
    TestCertificates m_otherCa;
    QString m_report;
    QString m_big;
};

void TestVancurl::initTestCase()
{
    m_env.reset(new Environment);
    m_server.reset(new TestServer);
    QVERIFY2(m_server->start({QStringLiteral("--max-bytes"), QStringLiteral("20000")}),
             qPrintable(m_server->error()));
    QVERIFY2(m_otherCa.create(m_server->scratchDir() + QLatin1String("/other"), QStringLiteral("Other CA")),
             qPrintable(m_otherCa.error()));
    m_report = m_server->scratchDir() + QLatin1String("/device_usage_statistics.html");
    QByteArray report("<html>\r\n\xc3\xa4\0\xff</html>\n", 20);
    QVERIFY(writeFile(m_report, report));
    m_big = m_server->scratchDir() + QLatin1String("/big.html");
    QVERIFY(writeFile(m_big, QByteArray(30000, 'x')));
}

QString TestVancurl::expand(QString text) const
{
    return text.replace(QLatin1String("{URL}"), m_server->baseUrl())
        .replace(QLatin1String("{CA}"), m_server->caFile())
        .replace(QLatin1String("{OTHERCA}"), m_otherCa.caFile())
        .replace(QLatin1String("{REPORT}"), m_report)
        .replace(QLatin1String("{BIG}"), m_big);
}

void TestVancurl::transfers_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::addColumn<QStringList>("environment");
    QTest::addColumn<int>("exitCode");
    QTest::addColumn<QString>("output"); // expected in standard output ("" for nothing at all)
    QTest::addColumn<int>("stored");     // new uploads on the receiver

    const QString lookup = QLatin1String("{URL}") + QLatin1String(lookupPath);
    const QStringList upload = {"-F", "file_loc=@{REPORT}", "-F", "domain=c.d", "-F", "regid=R-1"};
    const QString address = QStringLiteral("URL={URL}/upload\"");

    QTest::newRow("lookup") << QStringList{"--cacert", "{CA}", lookup} << QStringList() << 0 << address << 0;
    QTest::newRow("options in another order")
        << QStringList{"-F", "access=v9orn", "--cacert", "{CA}", "-F", "file_loc=@{REPORT}", "{URL}/upload"}
        << QStringList() << 0 << "report 1 received" << 1;
    QTest::newRow("upload") << QStringList{"--cacert", "{CA}"} + upload + QStringList{"-F", "access=v9orn", "{URL}/upload"}
                            << QStringList() << 0 << "received" << 1;
    QTest::newRow("proxy environment ignored")
        << QStringList{"--cacert", "{CA}", lookup}
        << QStringList{"https_proxy=http://127.0.0.1:9", "HTTPS_PROXY=http://127.0.0.1:9",
                       "ALL_PROXY=http://127.0.0.1:9", "all_proxy=http://127.0.0.1:9"}
        << 0 << address << 0;
    QTest::newRow("unreachable proxy") << QStringList{"--proxy", "127.0.0.1:9", "--cacert", "{CA}", lookup}
                                       << QStringList() << 4 << "" << 0;
    QTest::newRow("wrong access code") << QStringList{"--cacert", "{CA}"} + upload + QStringList{"-F", "access=v9orm", "{URL}/upload"}
                                       << QStringList() << 6 << "" << 0;
    QTest::newRow("no access code") << QStringList{"--cacert", "{CA}"} + upload + QStringList{"{URL}/upload"}
                                    << QStringList() << 6 << "" << 0;
    QTest::newRow("no file field")
        << QStringList{"--cacert", "{CA}", "-F", "domain=c.d", "-F", "access=v9orn", "{URL}/upload"}
        << QStringList() << 6 << "" << 0;
    QTest::newRow("file field not a file")
        << QStringList{"--cacert", "{CA}", "-F", "file_loc={REPORT}", "-F", "access=v9orn", "{URL}/upload"}
        << QStringList() << 6 << "" << 0;
    QTest::newRow("body over the limit")
        << QStringList{"--cacert", "{CA}", "-F", "file_loc=@{BIG}", "-F", "access=v9orn", "{URL}/upload"}
        << QStringList() << 6 << "" << 0;
    QTest::newRow("unknown topic") << QStringList{"--cacert", "{CA}", "{URL}/cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=x"}
                                   << QStringList() << 6 << "" << 0;
    QTest::newRow("wrong CA") << QStringList{"--cacert", "{OTHERCA}", lookup} << QStringList() << 5 << "" << 0;
    QTest::newRow("system CAs only") << QStringList{lookup} << QStringList() << 5 << "" << 0;
    QTest::newRow("CA file missing") << QStringList{"--cacert", "{CA}.missing", lookup} << QStringList() << 5 << "" << 0;
    QTest::newRow("upload file missing")
        << QStringList{"--cacert", "{CA}", "-F", "file_loc=@{REPORT}.missing", "-F", "access=v9orn", "{URL}/upload"}
        << QStringList() << 3 << "" << 0;
    QTest::newRow("nothing listening") << QStringList{"--cacert", "{CA}", "https://127.0.0.1:9/x"}
                                       << QStringList() << 4 << "" << 0;
    QTest::newRow("no URL") << QStringList{"--cacert", "{CA}"} << QStringList() << 2 << "" << 0;
    QTest::newRow("URL not last") << QStringList{lookup, "--cacert", "{CA}"} << QStringList() << 2 << "" << 0;
    QTest::newRow("option without value") << QStringList{lookup, "--proxy"} << QStringList() << 2 << "" << 0;
    QTest::newRow("field without =") << QStringList{"-F", "file_loc", lookup} << QStringList() << 2 << "" << 0;
    QTest::newRow("unknown option") << QStringList{"--insecure", lookup} << QStringList() << 2 << "" << 0;
    QTest::newRow("other scheme") << QStringList{"file:///etc/hostname"} << QStringList() << 2 << "" << 0;
}

void TestVancurl::transfers()
{
    QFETCH(QStringList, arguments);
    QFETCH(QStringList, environment);
    QFETCH(int, exitCode);
    QFETCH(QString, output);
    QFETCH(int, stored);

    for (QString &argument : arguments)
        argument = expand(argument);
    const int before = m_server->uploadFolders().size();
    const Run run = vancurl(arguments, environment);
    QVERIFY2(run.exitCode == exitCode, run.err.constData());
    if (exitCode == 0) {
        QVERIFY(run.err.isEmpty());
        QVERIFY2(run.out.contains(expand(output).toUtf8()), run.out.constData());
    } else {
        // Failures: a one-line reason, and nothing a caller could take for an answer.
        QVERIFY(run.out.isEmpty());
        QVERIFY(run.err.startsWith("vancurl: "));
        QCOMPARE(run.err.count('\n'), 1);
    }
    QCOMPARE(m_server->uploadFolders().size(), before + stored);
    if (stored) {
        const TestServer::Upload upload = m_server->upload(before);
        QCOMPARE(upload.file, readFile(m_report));
        QCOMPARE(upload.fields.value("file_loc"), QStringLiteral("device_usage_statistics.html"));
        QCOMPARE(upload.fields.value("access"), QStringLiteral("v9orn"));
    }
}

void TestVancurl::uploadsNeverOverwrite()
{
    // A folder already in the receiver's way (an earlier run, another
    // receiver) is skipped, not reused.
    const QStringList before = m_server->uploadFolders();
    const QString next = m_server->dataDir() + QStringLiteral("/%1").arg(before.size() + 1, 6, 10, QLatin1Char('0'));
    QVERIFY(writeFile(next + QLatin1String("/fields.txt"), "earlier\n"));
    const QStringList arguments = {"--cacert", m_server->caFile(), "-F", "file_loc=@" + m_report,
                                   "-F", "domain=x.y", "-F", "access=v9orn", m_server->baseUrl() + "/upload"};
    QCOMPARE(vancurl(arguments).exitCode, 0);
    QCOMPARE(vancurl(arguments).exitCode, 0);
    QCOMPARE(readFile(next + QLatin1String("/fields.txt")), QByteArray("earlier\n"));
    const QStringList after = m_server->uploadFolders();
    QCOMPARE(after.size(), before.size() + 3);
    QCOMPARE(m_server->upload(after.size() - 1).fields.value("domain"), QStringLiteral("x.y"));
    QCOMPARE(m_server->upload(after.size() - 2).file, readFile(m_report));
}

void TestVancurl::helpAndStop()
{
    for (const char *program : {"vancurl", "corvid-receiver"}) {
        const ToolRun run = runStaged(QLatin1String(program), {QStringLiteral("--help")}, QDir::tempPath());
        QCOMPARE(run.exitCode, 0);
        QVERIFY(run.output.startsWith(QLatin1String("Usage: ") + QLatin1String(program)));
    }
    const QString log = m_server->log();
    QVERIFY2(log.contains(QLatin1String(" POST /upload 403 ")), qPrintable(log));
    QVERIFY2(m_server->stop(), "the receiver did not stop cleanly on SIGTERM");
}

QTEST_GUILESS_MAIN(TestVancurl)
#include "tst_vancurl.moc"
