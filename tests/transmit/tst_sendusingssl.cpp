// The upload driver: its two argument lists, the lookup parsing, the domain
// and registration fields, and whole sends through the staged vancurl to
// corvid-receiver on 127.0.0.1.

#include "common/TestEnvironment.h"
#include "common/TestServer.h"
#include "host/Env.h"
#include "host/MsgManData.h"
#include "host/Settings.h"
#include "host/StatusLine.h"
#include "transmit/SendHistory.h"
#include "transmit/SendUsingSSL.h"
#include "transmit/UserNotice.h"

#include <QPointer>
#include <QUrl>
#include <QtTest>

using namespace CorvidTest;

class TestSendUsingSSL : public QObject
{
    Q_OBJECT
    std::unique_ptr<Environment> m_env;
    QStringList m_debug;
    QStringList m_warnings;
    QStringList m_details;
    QStringList m_offers;
    QStringList m_status;

    // Sends `file` with PATH set to `path` while the lookup starts; waits
    // until the driver has deleted itself.
    void send(const QString &file, const QByteArray &path, const QString &proxy = QString())
    {
        const QByteArray saved = qgetenv("PATH");
        qputenv("PATH", path);
        QPointer<CrvC_SendUsingSSL> sender = new CrvC_SendUsingSSL(proxy);
        sender->SendFile(file);
        qputenv("PATH", saved);
        QTRY_VERIFY_WITH_TIMEOUT(sender.isNull(), 30000);
    }

    static void storeRegistration(const QString &text)
    {
        Gui::Clip::Settings("UserInformation", true, true, true).setValue("Registration", text);
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new Environment);
        Port_MsgManData::setSink(
            [this](const Port_MsgManData::Message &m) { m_debug << QString::fromStdString(m.text); });
        CrvC_UserNotice::setHandlers(
            [this](const QString &text, const QString &details) {
                m_warnings << text;
                m_details << details;
            },
            [this](const QString &file) { m_offers << file; });
        Port::StatusLine::setDisplay([this](const QString &text) { m_status << text; });
        TestServer::putStageBinFirstInPath();
    }

    void init()
    {
        m_debug.clear();
        m_warnings.clear();
        m_details.clear();
        m_offers.clear();
        CrvC_SendRecorder::waitForDone(); // an earlier test's outcome is not this one's
        QCoreApplication::processEvents();
        m_status.clear();
        m_env->clearSettings();
        qunsetenv("CORVID_SERVER");
        qunsetenv("SSL_CERT_FILE");
        QVERIFY(m_env->writeDataFile("reports/ca-cert-bundle.crt", "not a bundle\n"));
    }

    void cleanupTestCase()
    {
        CrvC_UserNotice::setHandlers(nullptr, nullptr);
        Port_MsgManData::setSink(nullptr);
    }

    void argumentLists_data()
    {
        QTest::addColumn<QByteArray>("server");
        QTest::addColumn<QString>("proxy");
        QTest::addColumn<QString>("lookup");
        const QString path = "/cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=corvidupload";
        QTest::newRow("default server, direct")
            << QByteArray() << QString() << "https://www.vantor.example" + path;
        // Whoever answers the lookup chooses where the report goes: always https.
        QTest::newRow("plain http made https, proxy")
            << QByteArray("http://127.0.0.1:8080/x") << "proxy.example:3128"
            << "https://127.0.0.1:8080" + path;
    }

    void argumentLists()
    {
        QFETCH(QByteArray, server);
        QFETCH(QString, proxy);
        QFETCH(QString, lookup);
        if (!server.isEmpty())
            qputenv("CORVID_SERVER", server);
        m_env->writeDataFile("orb_version", "Registration_ID=RID-1\n");
        const QString bundle =
            QString::fromUtf8(Port_Env::GetDataFileName("reports/ca-cert-bundle.crt").c_str());
        const QStringList prefix = proxy.isEmpty() ? QStringList{"--cacert", bundle}
                                                   : QStringList{"--proxy", proxy, "--cacert", bundle};
        // Without vancurl on PATH the lookup cannot start: the driver reports
        // that and deletes itself once control is back in the event loop.
        QPointer<CrvC_SendUsingSSL> sender = new CrvC_SendUsingSSL(proxy);
        QCOMPARE(sender->redirectArguments(), prefix + QStringList{lookup});
        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", QFile::encodeName(m_env->home()));
        sender->SendFile("/no such dir/device_usage_statistics.html");
        qputenv("PATH", path);
        QVERIFY(sender);
        QCOMPARE(sender->uploadArguments("https://u.example/upload"),
                 prefix
                     + QStringList({"-F", "file_loc=@/no such dir/device_usage_statistics.html", "-F",
                                    "domain=" + CrvC_SendUsingSSL::domainName(), "-F", "regid=RID-1", "-F",
                                    "access=v9orn", "https://u.example/upload"}));
        QTRY_VERIFY(sender.isNull());
        QCOMPARE(m_offers, QStringList{"/no such dir/device_usage_statistics.html"});
    }

    void uploadAddress_data()
    {
        QTest::addColumn<QByteArray>("output");
        QTest::addColumn<QString>("address");
        QTest::newRow("first marked line, later ones ignored") << QByteArray(
            "<html>\n\n<meta content=\"0; URL=https://a.example/u\">\nURL=https://b.example/v\"\n")
                                                               << "https://a.example/u";
        QTest::newRow("no quotation mark")
            << QByteArray("URL=https://h:8443/upload\r\n") << "https://h:8443/upload";
        QTest::newRow("plain http first, https later")
            << QByteArray("URL=http://h/u\"\nURL=https://h/u\"\n") << "";
        QTest::newRow("https without host") << QByteArray("URL=https:///u\"\n") << "";
        QTest::newRow("space in address") << QByteArray("URL=https://h/u v\"\n") << "";
        QTest::newRow("marker case matters") << QByteArray("url=https://h/u\"\nURL=HTTPS://h/u\"\n") << "";
        QTest::newRow("binary") << QByteArray("\0\xff\xfe\n\0", 5) << "";
    }

    void uploadAddress()
    {
        QFETCH(QByteArray, output);
        QTEST(CrvC_SendUsingSSL::uploadAddress(output), "address");
    }

    void lastTwoLabels()
    {
        QCOMPARE(CrvC_SendUsingSSL::lastTwoLabels("a.b.c.d"), QStringLiteral("c.d"));
        QCOMPARE(CrvC_SendUsingSSL::lastTwoLabels("b.c"), QStringLiteral("b.c"));
        QCOMPARE(CrvC_SendUsingSSL::lastTwoLabels("workstation"), QStringLiteral("workstation"));
    }

    void registrationId_data()
    {
        QTest::addColumn<QString>("registration"); // the user's text; empty: none stored
        QTest::addColumn<QByteArray>("versionFile");
        QTest::addColumn<QString>("id");
        QTest::newRow("user's text") << "REG-7" << QByteArray("Registration_ID=RID-42\n") << "REG-7";
        QTest::newRow("none stored") << "" << QByteArray("Registration_ID=RID-42\n") << "RID-42";
        QTest::newRow("the host's no-information text")
            << "No user information available." << QByteArray("Registration_ID=RID-42\n") << "RID-42";
        QTest::newRow("no build value either") << "" << QByteArray("product=Orb\n") << "";
    }

    void registrationId()
    {
        QFETCH(QString, registration);
        QFETCH(QByteArray, versionFile);
        if (!registration.isEmpty())
            storeRegistration(registration);
        QVERIFY(m_env->writeDataFile("orb_version", versionFile));
        QTEST(CrvC_SendUsingSSL::registrationId(), "id");
    }

    void sends_data()
    {
        QTest::addColumn<QStringList>("receiverArguments");
        QTest::addColumn<bool>("stopReceiver");
        QTest::addColumn<QByteArray>("vancurl"); // empty: the staged one; "none": not on PATH; else a script
        QTest::addColumn<QString>("bundle"); // the test CA: "installation", "system" (SSL_CERT_FILE), "none"
        QTest::addColumn<QString>("proxy");
        QTest::addColumn<int>("reportSize");
        QTest::addColumn<QString>("cause"); // beneath the warning, %1 the server; empty: delivered
        const QStringList none;
        const QString inst = "installation";
        QTest::newRow("delivered") << none << false << QByteArray() << inst << "" << 70000 << "";
        QTest::newRow("no bundle installed: the system's store") << none << false << QByteArray() << "system"
                                                                 << "" << 100 << "";
        QTest::newRow("server not trusted")
            << none << false << QByteArray() << "none"
            << "" << 100 << "The certificate of the server %1 could not be verified.";
        QTest::newRow("page without an address")
            << QStringList{"--no-redirect"} << false << QByteArray() << inst << "" << 100
            << "The server %1 named no upload address.";
        // Sent again by corvid-history once the receiver is back.
        QTest::newRow("receiver stopped")
            << none << true << QByteArray() << inst << "" << 100 << "Could not connect to %1.";
        QTest::newRow("proxy refuses")
            << none << false << QByteArray() << inst << "127.0.0.1:1" << 100
            << "The proxy 127.0.0.1:1 could not be reached or refused the connection to %1.";
        QTest::newRow("upload refused") << QStringList{"--max-bytes", "2000"} << false << QByteArray() << inst
                                        << "" << 5000 << "The server %1 refused the report with HTTP 413.";
        QTest::newRow("vancurl not found") << none << false << QByteArray("none") << inst << "" << 100
                                           << "The transfer tool vancurl could not be started: ";
        // Statuses and reasons a later vancurl may give.
        QTest::newRow("timed out") << none << false
                                   << QByteArray("echo 'vancurl: Operation timed out' >&2; exit 4") << inst
                                   << "" << 100 << "The connection to %1 timed out.";
        QTest::newRow("redirect answered")
            << none << false << QByteArray("echo 'vancurl: HTTP status 302' >&2; exit 8") << inst << "" << 100
            << "The server %1 answered the address lookup with HTTP 302.";
        QTest::newRow("time limit") << none << false << QByteArray("echo 'vancurl: took longer' >&2; exit 9")
                                    << inst << "" << 100
                                    << "The transfer to %1 took longer than its time limit.";
        QTest::newRow("unknown status")
            << none << false << QByteArray("echo 'vancurl: odd' >&2; exit 12") << inst << "" << 100
            << "The transfer to %1 failed (exit status 12): odd";
    }

    void sends()
    {
        QFETCH(QStringList, receiverArguments);
        QFETCH(int, reportSize);
        QFETCH(QString, bundle);
        QFETCH(QString, cause);
        TestServer server;
        QVERIFY2(server.start(receiverArguments), qPrintable(server.error()));
        if (bundle == "installation")
            QVERIFY(m_env->writeDataFile("reports/ca-cert-bundle.crt", readFile(server.caFile())));
        else
            QVERIFY(QFile::remove(m_env->installRoot() + "/data/reports/ca-cert-bundle.crt"));
        if (bundle == "system")
            qputenv("SSL_CERT_FILE", QFile::encodeName(server.caFile()));
        qputenv("CORVID_SERVER", server.baseUrl().toUtf8());
        storeRegistration("Jürgen Ä, REG-9");
        QFETCH(bool, stopReceiver);
        if (stopReceiver)
            server.stop();

        // Every byte value, a path with a space in it.
        QByteArray report;
        for (int i = 0; i < reportSize; ++i)
            report += char((i * 7 + i / 256) & 0xff);
        const QString file = server.scratchDir() + "/my project/device_usage_statistics.html";
        QVERIFY(writeFile(file, report));
        QFETCH(QByteArray, vancurl);
        QFETCH(QString, proxy);
        QByteArray path = qgetenv("PATH");
        if (vancurl == "none") {
            path = QFile::encodeName(server.scratchDir());
        } else if (!vancurl.isEmpty()) {
            const QString fake = server.scratchDir() + "/fakebin/vancurl";
            QVERIFY(writeFile(fake, "#!/bin/sh\n" + vancurl + "\n"));
            QVERIFY(QFile::setPermissions(fake, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner));
            path = QFile::encodeName(server.scratchDir() + "/fakebin:") + path;
        }
        send(file, path, proxy);

        // Recorded with its bytes, and said on the status line.
        QTRY_COMPARE_WITH_TIMEOUT(m_status.size(), 1, 30000);
        const QString server127 = QUrl(server.baseUrl()).authority();
        if (cause.isEmpty())
            QVERIFY2(
                m_status.first().startsWith("Usage report sent to 127.0.0.1, ")
                    && m_status.first().endsWith(" KB \u2014 Edit > Preferences > Corvid > Sent reports"),
                qPrintable(m_status.first()));
        else
            QVERIFY2(m_status.first().startsWith("Usage report not sent: "
                                                 + (cause.contains("%1") ? cause.arg(server127) : cause)),
                     qPrintable(m_status.first()));
        CrvC_SendHistory history;
        QList<CrvC_SendHistory::Entry> entries;
        QVERIFY2(history.entries(&entries), qPrintable(history.error()));
        QByteArray stored;
        QVERIFY(!entries.isEmpty() && history.page(entries.first().id, &stored));
        QVERIFY(stored == report);
        QCOMPARE(entries.first().state(),
                 cause.isEmpty() ? CrvC_SendHistory::State::Sent : CrvC_SendHistory::State::Failed);
        QCOMPARE(entries.first().pending(), !cause.isEmpty());

        if (cause.isEmpty()) {
            QTRY_VERIFY_WITH_TIMEOUT(m_debug.join("").contains("SSL upload ended with exit status 0"), 30000);
            QVERIFY2(m_warnings.isEmpty() && m_offers.isEmpty(), qPrintable(m_debug.join("")));
            QCOMPARE(server.uploadFolders().size(), 1);
            const TestServer::Upload upload = server.upload(0);
            QVERIFY(upload.file == report);
            QCOMPARE(upload.fields.value("file_loc"), QStringLiteral("device_usage_statistics.html"));
            QCOMPARE(upload.fields.value("domain"), CrvC_SendUsingSSL::domainName());
            QCOMPARE(upload.fields.value("regid"), QStringLiteral("Jürgen Ä, REG-9"));
            QCOMPARE(upload.fields.value("access"), QStringLiteral("v9orn"));
            QCOMPARE(entries.first().regid, upload.fields.value("regid"));
            QVERIFY(m_status.first().contains(reportSize == 70000 ? ", 68 KB" : ", 1 KB"));
        } else {
            QTRY_VERIFY_WITH_TIMEOUT(!m_offers.isEmpty(), 30000);
            QTest::qWait(200);
            QCOMPARE(m_warnings, QStringList{CrvC_SendUsingSSL::FailureText});
            // The cause, then where the report stays.
            const QString details = m_details.value(0);
            QVERIFY2(details.startsWith(cause.arg(QUrl(server.baseUrl()).authority())), qPrintable(details));
            QVERIFY(details.endsWith("\nThe report was kept at " + file + "."));
            QCOMPARE(m_offers, QStringList{file});
            QCOMPARE(server.uploadFolders().size(), 0);
        }
        if (stopReceiver) {
            // Back, on another port: the retry asks today's server.
            QVERIFY2(server.start(), qPrintable(server.error()));
            Gui::Clip::Settings("WebUpdate", true, true, true).setValue("ProxyChoice", 0);
            const ToolRun retry =
                runStaged("corvid-history", {"retry", QString::number(entries.first().id)}, m_env->home(),
                          Environment::locations() << "CORVID_SERVER=" + server.baseUrl());
            QVERIFY2(retry.exitCode == 0 && retry.output.startsWith("Usage report sent to 127.0.0.1"),
                     qPrintable(QString::number(retry.exitCode) + retry.output));
            QCOMPARE(server.uploadFolders().size(), 1);
            QVERIFY(server.upload(0).file == report);
            QVERIFY(history.entries(&entries));
            QCOMPARE(entries.first().attempts.size(), 2);
            QCOMPARE(entries.first().outcome(), QStringLiteral("sent"));
        }
    }

    void oversizedLookupAnswer()
    {
        // A lookup that pours out data is stopped, not buffered in the host.
        const QString fake = m_env->home() + "/fakebin/vancurl";
        QVERIFY(writeFile(fake,
                          "#!/bin/sh\nhead -c 3000000 /dev/zero | tr '\\0' x\n"
                          "printf '\\nURL=https://h.example/u\"\\n'\n"));
        QVERIFY(QFile::setPermissions(fake, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner));
        send("/r.html", QFile::encodeName(m_env->home() + "/fakebin:") + qgetenv("PATH"));
        QCOMPARE(m_offers, QStringList{"/r.html"});
        QVERIFY(!m_debug.join("").contains("has started"));
    }
};

QTEST_GUILESS_MAIN(TestSendUsingSSL)
#include "tst_sendusingssl.moc"
