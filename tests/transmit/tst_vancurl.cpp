// vancurl against corvid-receiver over HTTPS on 127.0.0.1, with throwaway
// certificates: exit statuses, what reaches standard output, what is stored.

#include "common/TestEnvironment.h"
#include "common/TestServer.h"

#include <QProcess>
#include <QtTest>

using namespace CorvidTest;

class TestVancurl : public QObject
{
    Q_OBJECT
    std::unique_ptr<Environment> m_env;
    std::unique_ptr<TestServer> m_server;
    std::unique_ptr<TestServer> m_moved; // answers uploads with a redirection
    TestCertificates m_otherCa;
    QString m_report;

    // Runs vancurl with `arguments` ({URL}, {CA}, ... filled in) and proxy
    // variables that lead nowhere: vancurl takes its proxy only from --proxy.
    int vancurl(const QString &arguments, QByteArray *out = nullptr, QByteArray *err = nullptr)
    {
        QProcess process;
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        for (const char *name : {"https_proxy", "HTTPS_PROXY", "all_proxy", "ALL_PROXY"})
            env.insert(name, "http://127.0.0.1:9");
        process.setProcessEnvironment(env);
        process.start(Environment::stageDir() + "/bin/vancurl", expand(arguments).split(' '));
        const bool ended = process.waitForFinished(90000) && process.exitStatus() == QProcess::NormalExit;
        if (out)
            *out = process.readAllStandardOutput();
        if (err)
            *err = process.readAllStandardError();
        return ended ? process.exitCode() : -1;
    }

    QString expand(QString text) const
    {
        return text.replace("{LOOKUP}", "{URL}/cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=corvidupload")
            .replace("{MOVED}", m_moved->baseUrl())
            .replace("{MOVEDCA}", m_moved->caFile())
            .replace("{URL}", m_server->baseUrl())
            .replace("{OTHERCA}", m_otherCa.caFile())
            .replace("{CA}", m_server->caFile())
            .replace("{REPORT}", m_report)
            .replace("{DIR}", m_server->scratchDir());
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new Environment);
        m_server.reset(new TestServer);
        QVERIFY2(m_server->start({"--max-bytes", "20000"}), qPrintable(m_server->error()));
        m_moved.reset(new TestServer);
        QVERIFY2(m_moved->start({"--moved", "https://127.0.0.1:9/upload"}), qPrintable(m_moved->error()));
        QVERIFY2(m_otherCa.create(m_server->scratchDir() + "/other", "Other CA"),
                 qPrintable(m_otherCa.error()));
        m_report = m_server->scratchDir() + "/device_usage_statistics.html";
        QVERIFY(writeFile(m_report, QByteArray("<html>\r\n\xc3\xa4\0\xff</html>\n", 20)));
        QVERIFY(writeFile(m_server->scratchDir() + "/big.html", QByteArray(30000, 'x')));
        QVERIFY(writeFile(m_server->scratchDir() + "/secret", "not to be sent"));
    }

    void transfers_data()
    {
        QTest::addColumn<QString>("arguments");
        QTest::addColumn<int>("exitCode");
        QTest::addColumn<QString>("output"); // expected in standard output on success
        QTest::addColumn<int>("stored");     // new uploads on the receiver
        QTest::addColumn<QString>("regid");  // the stored field regid

        const QString form = "-F file_loc=@{REPORT} -F domain=c.d ";
        QTest::newRow("lookup") << "--cacert {CA} {LOOKUP}" << 0 << "URL={URL}/upload\"" << 0 << "";
        QTest::newRow("upload, options in any order")
            << "-F access=v9orn --cacert {CA} " + form + "-F regid=R-1 {URL}/upload" << 0 << "received" << 1
            << "R-1";
        // Only file_loc names a file: the secret stays on the machine.
        for (const QString start : {"@", "<"})
            QTest::newRow(qPrintable("registration text starting with " + start))
                << "--cacert {CA} " + form + "-F regid=" + start + "{DIR}/secret -F access=v9orn {URL}/upload"
                << 0 << "received" << 1 << start + "{DIR}/secret";
        QTest::newRow("upload answered with a redirection")
            << "--cacert {MOVEDCA} " + form + "-F access=v9orn {MOVED}/upload" << 8 << "" << 0 << "";
        QTest::newRow("unreachable proxy")
            << "--proxy 127.0.0.1:9 --cacert {CA} {LOOKUP}" << 4 << "" << 0 << "";
        QTest::newRow("wrong access code")
            << "--cacert {CA} " + form + "-F access=v9orm {URL}/upload" << 6 << "" << 0 << "";
        QTest::newRow("file field not a file")
            << "--cacert {CA} -F file_loc={REPORT} -F access=v9orn {URL}/upload" << 6 << "" << 0 << "";
        QTest::newRow("body over the limit")
            << "--cacert {CA} -F file_loc=@{DIR}/big.html -F access=v9orn {URL}/upload" << 6 << "" << 0 << "";
        QTest::newRow("wrong CA") << "--cacert {OTHERCA} {LOOKUP}" << 5 << "" << 0 << "";
        QTest::newRow("system CAs only") << "{LOOKUP}" << 5 << "" << 0 << "";
        QTest::newRow("CA file missing") << "--cacert {CA}.missing {LOOKUP}" << 5 << "" << 0 << "";
        QTest::newRow("upload file missing")
            << "--cacert {CA} -F file_loc=@{REPORT}.missing -F access=v9orn {URL}/upload" << 3 << "" << 0
            << "";
        QTest::newRow("option without value") << "{LOOKUP} --proxy" << 2 << "" << 0 << "";
        QTest::newRow("unknown option") << "--insecure {LOOKUP}" << 2 << "" << 0 << "";
        QTest::newRow("other scheme") << "file:///etc/hostname" << 2 << "" << 0 << "";
    }

    void transfers()
    {
        QFETCH(QString, arguments);
        QFETCH(int, exitCode);
        QFETCH(QString, output);
        QFETCH(int, stored);
        QFETCH(QString, regid);
        const int before = m_server->uploadFolders().size();
        QByteArray out, err;
        QVERIFY2(vancurl(arguments, &out, &err) == exitCode, err.constData());
        if (exitCode == 0) {
            QVERIFY(err.isEmpty());
            QVERIFY2(out.contains(expand(output).toUtf8()), out.constData());
        } else {
            // Failures: a one-line reason, and nothing a caller could take for an answer.
            QVERIFY(out.isEmpty());
            QVERIFY(err.startsWith("vancurl: "));
            QCOMPARE(err.count('\n'), 1);
        }
        QCOMPARE(m_server->uploadFolders().size(), before + stored);
        if (stored) {
            const TestServer::Upload upload = m_server->upload(before);
            QCOMPARE(upload.file, readFile(m_report));
            QCOMPARE(upload.fields.value("file_loc"), QStringLiteral("device_usage_statistics.html"));
            QCOMPARE(upload.fields.value("access"), QStringLiteral("v9orn"));
            QCOMPARE(upload.fields.value("regid"), expand(regid));
        }
    }

    void uploadsNeverOverwrite()
    {
        // Folders already in the receiver's way (an earlier run, another
        // receiver) are skipped, not reused; numbering goes on after the
        // highest number present.
        const int before = m_server->uploadFolders().size();
        const QString dir = m_server->dataDir() + "/";
        const QString next = dir + QString("%1").arg(before + 1, 6, 10, QLatin1Char('0'));
        QVERIFY(writeFile(next + "/" + TestServer::fieldsFileName(), "earlier\n"));
        QVERIFY(QDir().mkpath(dir + "100000"));
        const QString upload =
            "--cacert {CA} -F file_loc=@{REPORT} -F domain=x.y -F access=v9orn {URL}/upload";
        QCOMPARE(vancurl(upload), 0);
        QCOMPARE(vancurl(upload), 0);
        QCOMPARE(readFile(next + "/" + TestServer::fieldsFileName()), QByteArray("earlier\n"));
        QCOMPARE(m_server->uploadFolders().mid(before),
                 QStringList({next, dir + "100000", dir + "100001", dir + "100002"}));
        QCOMPARE(m_server->upload(before + 3).fields.value("domain"), QStringLiteral("x.y"));
        QCOMPARE(m_server->upload(before + 2).file, readFile(m_report));
    }
};

QTEST_GUILESS_MAIN(TestVancurl)
#include "tst_vancurl.moc"
