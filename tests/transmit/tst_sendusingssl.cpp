// The upload driver: its two argument lists, the lookup parsing, the domain
// and registration fields, and whole sends through the staged vancurl to
// corvid-receiver on 127.0.0.1.

#include "common/TestEnvironment.h"
#include "common/TestServer.h"
#include "host/Env.h"
#include "host/MsgManData.h"
#include "host/Settings.h"
#include "transmit/SendUsingSSL.h"
#include "transmit/UserNotice.h"

#include <QPointer>
#include <QtTest>

using namespace CorvidTest;

class TestSendUsingSSL : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init();
    void cleanupTestCase();
    void argumentLists_data();
    void argumentLists();
    void redirectUrl_data();
    void redirectUrl();
    void uploadAddress_data();
    void uploadAddress();
    void lastTwoLabels_data();
    void lastTwoLabels();
    void registrationId_data();
    void registrationId();
    void sends_data();
    void sends();
    void oversizedLookupAnswer();

private:
    std::unique_ptr<Environment> m_env;
    std::unique_ptr<TestServer> m_server;
    QStringList m_debug;
    QStringList m_warnings;
    QStringList m_offers;
};

void TestSendUsingSSL::initTestCase()
{
    m_env.reset(new Environment);
    Port_MsgManData::setSink([this](const Port_MsgManData::Message &message) {
        m_debug << QString::fromStdString(message.text);
    });
    CrvC_UserNotice::setHandlers([this](const QString &text) { m_warnings << text; },
                                 [this](const QString &file) { m_offers << file; });
    TestServer::putStageBinFirstInPath();
}

void TestSendUsingSSL::init()
{
    m_debug.clear();
    m_warnings.clear();
    m_offers.clear();
    qunsetenv("CORVID_SERVER");
}

void TestSendUsingSSL::cleanupTestCase()
{
    CrvC_UserNotice::setHandlers(nullptr, nullptr);
    Port_MsgManData::setSink(nullptr);
}

void TestSendUsingSSL::argumentLists_data()
{
    QTest::addColumn<QString>("proxy");
    QTest::newRow("direct") << QString();
    QTest::newRow("proxy") << QStringLiteral("proxy.example:3128");
}

void TestSendUsingSSL::argumentLists()
{
    QFETCH(QString, proxy);
    qputenv("CORVID_SERVER", "https://127.0.0.1:8443");
    m_env->writeDataFile("orb_version", "Registration_ID=RID-1\n");
    const QString bundle = QString::fromUtf8(Port_Env::GetDataFileName("reports/ca-cert-bundle.crt").c_str());
    const QString address = QStringLiteral("https://upload.example/upload");

    // Without vancurl on PATH the lookup cannot start: the driver reports
    // that and deletes itself once control is back in the event loop.
    const QByteArray path = qgetenv("PATH");
    qputenv("PATH", QFile::encodeName(m_env->home()));
    QPointer<CrvC_SendUsingSSL> sender = new CrvC_SendUsingSSL(proxy);
    const QStringList prefix = proxy.isEmpty() ? QStringList{"--cacert", bundle}
                                               : QStringList{"--proxy", proxy, "--cacert", bundle};
    // The lookup carries the CA bundle too: 3 entries direct, 5 with a proxy.
    QCOMPARE(sender->redirectArguments(),
             prefix + QStringList{"https://127.0.0.1:8443/cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=corvidupload"});

    sender->SendFile(QStringLiteral("/no such dir/device_usage_statistics.html"));
    qputenv("PATH", path);
    QVERIFY(sender);
    const QStringList upload = sender->uploadArguments(address);
    QCOMPARE(upload.size(), proxy.isEmpty() ? 11 : 13);
    QCOMPARE(upload.mid(0, prefix.size()), prefix);
    QCOMPARE(upload.mid(prefix.size()),
             (QStringList{"-F", "file_loc=@/no such dir/device_usage_statistics.html", "-F",
                          "domain=" + CrvC_SendUsingSSL::domainName(), "-F", "regid=RID-1", "-F",
                          "access=v9orn", address}));
    QTRY_VERIFY(sender.isNull());
    QCOMPARE(m_offers, QStringList{"/no such dir/device_usage_statistics.html"});
}

void TestSendUsingSSL::redirectUrl_data()
{
    QTest::addColumn<QByteArray>("server");
    QTest::addColumn<QString>("url");
    const QString path = QStringLiteral("/cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=corvidupload");
    QTest::newRow("default") << QByteArray() << "https://www.vantor.example" + path;
    QTest::newRow("override") << QByteArray("https://localhost:9443/") << "https://localhost:9443" + path;
    // Whoever answers the lookup chooses where the report goes.
    QTest::newRow("plain http made https") << QByteArray("http://127.0.0.1:8080") << "https://127.0.0.1:8080" + path;
}

void TestSendUsingSSL::redirectUrl()
{
    QFETCH(QByteArray, server);
    QFETCH(QString, url);
    if (!server.isEmpty())
        qputenv("CORVID_SERVER", server);
    QCOMPARE(CrvC_SendUsingSSL::redirectUrl(), url);
}

void TestSendUsingSSL::uploadAddress_data()
{
    QTest::addColumn<QByteArray>("output");
    QTest::addColumn<QString>("address");
    QTest::newRow("third line, later ones ignored")
        << QByteArray("<html>\n\n<meta content=\"0; URL=https://a.example/u\">\nURL=https://b.example/v\"\n")
        << "https://a.example/u";
    QTest::newRow("quotation mark ends it") << QByteArray("x URL=https://h/u\" and more \"text\"\n") << "https://h/u";
    QTest::newRow("no quotation mark") << QByteArray("URL=https://h:8443/upload\r\n") << "https://h:8443/upload";
    QTest::newRow("no line end") << QByteArray("URL=https://h/upload") << "https://h/upload";
    QTest::newRow("plain http") << QByteArray("URL=http://h/u\"\n") << QString();
    QTest::newRow("plain http first, https later") << QByteArray("URL=http://h/u\"\nURL=https://h/u\"\n") << QString();
    QTest::newRow("https without host") << QByteArray("URL=https:///u\"\n") << QString();
    QTest::newRow("space in address") << QByteArray("URL=https://h/u v\"\n") << QString();
    QTest::newRow("empty address") << QByteArray("URL=http\"\n") << QString();
    QTest::newRow("marker case matters") << QByteArray("url=https://h/u\"\nURL=HTTPS://h/u\"\n") << QString();
    QTest::newRow("no marker") << QByteArray("<html><body>moved</body></html>\n") << QString();
    QTest::newRow("nothing") << QByteArray() << QString();
    QTest::newRow("binary") << QByteArray("\0\xff\xfe\n\0", 5) << QString();
}

void TestSendUsingSSL::uploadAddress()
{
    QFETCH(QByteArray, output);
    QFETCH(QString, address);
    QCOMPARE(CrvC_SendUsingSSL::uploadAddress(output), address);
}

void TestSendUsingSSL::lastTwoLabels_data()
{
    QTest::addColumn<QString>("name");
    QTest::addColumn<QString>("labels");
    QTest::newRow("four labels") << "a.b.c.d" << "c.d";
    QTest::newRow("three labels") << "host.corp.example" << "corp.example";
    QTest::newRow("two labels") << "b.c" << "b.c";
    QTest::newRow("no dot") << "workstation" << "workstation";
    QTest::newRow("empty") << QString() << QString();
}

void TestSendUsingSSL::lastTwoLabels()
{
    QFETCH(QString, name);
    QFETCH(QString, labels);
    QCOMPARE(CrvC_SendUsingSSL::lastTwoLabels(name), labels);
}

void TestSendUsingSSL::registrationId_data()
{
    QTest::addColumn<QString>("registration");
    QTest::addColumn<QByteArray>("versionFile");
    QTest::addColumn<QString>("id");
    QTest::newRow("user's text") << "REG-7" << QByteArray("Registration_ID=RID-42\n") << "REG-7";
    QTest::newRow("none stored") << QString() << QByteArray("Registration_ID=RID-42\n") << "RID-42";
    QTest::newRow("the host's no-information text")
        << "No user information available." << QByteArray("Registration_ID=RID-42\n") << "RID-42";
    QTest::newRow("no build value either") << QString() << QByteArray("product=Orb\n") << QString();
}

void TestSendUsingSSL::registrationId()
{
    QFETCH(QString, registration);
    QFETCH(QByteArray, versionFile);
    QFETCH(QString, id);
    m_env->clearSettings();
    if (!registration.isEmpty())
        Gui::Clip::Settings(QStringLiteral("UserInformation"), true, true, true)
            .setValue(QStringLiteral("Registration"), registration);
    QVERIFY(m_env->writeDataFile("orb_version", versionFile));
    QCOMPARE(CrvC_SendUsingSSL::registrationId(), id);
}

void TestSendUsingSSL::sends_data()
{
    QTest::addColumn<QStringList>("receiverArguments");
    QTest::addColumn<bool>("stopReceiver");
    QTest::addColumn<bool>("hideVancurl");
    QTest::addColumn<int>("reportSize");
    QTest::addColumn<bool>("delivered");

    QTest::newRow("delivered") << QStringList() << false << false << 70000 << true;
    QTest::newRow("page without an address") << QStringList{"--no-redirect"} << false << false << 100 << false;
    QTest::newRow("receiver stopped") << QStringList() << true << false << 100 << false;
    QTest::newRow("upload refused") << QStringList{"--max-bytes", "2000"} << false << false << 5000 << false;
    QTest::newRow("vancurl not found") << QStringList() << false << true << 100 << false;
}

void TestSendUsingSSL::sends()
{
    QFETCH(QStringList, receiverArguments);
    QFETCH(bool, stopReceiver);
    QFETCH(bool, hideVancurl);
    QFETCH(int, reportSize);
    QFETCH(bool, delivered);

    m_server.reset(new TestServer);
    QVERIFY2(m_server->start(receiverArguments), qPrintable(m_server->error()));
    QVERIFY(m_env->writeDataFile("reports/ca-cert-bundle.crt", readFile(m_server->caFile())));
    qputenv("CORVID_SERVER", m_server->baseUrl().toUtf8());
    m_env->clearSettings();
    Gui::Clip::Settings(QStringLiteral("UserInformation"), true, true, true)
        .setValue(QStringLiteral("Registration"), QStringLiteral("Jürgen Ä, REG-9"));
    if (stopReceiver)
        m_server->stop();

    // Every byte value, a path with a space in it.
    QByteArray report;
    for (int i = 0; i < reportSize; ++i)
        report += char((i * 7 + i / 256) & 0xff);
    const QString file = m_server->scratchDir() + QLatin1String("/my project/device_usage_statistics.html");
    QVERIFY(writeFile(file, report));

    const QByteArray path = qgetenv("PATH");
    if (hideVancurl)
        qputenv("PATH", QFile::encodeName(m_server->scratchDir()));
    QPointer<CrvC_SendUsingSSL> sender = new CrvC_SendUsingSSL(QString());
    sender->SendFile(file);
    qputenv("PATH", path);
    QTRY_VERIFY_WITH_TIMEOUT(sender.isNull(), 30000);

    if (delivered) {
        QTRY_VERIFY_WITH_TIMEOUT(m_debug.join(QString()).contains(QLatin1String("SSL upload ended with exit status 0")),
                                 30000);
        QVERIFY2(m_warnings.isEmpty(), qPrintable(m_debug.join(QString())));
        QVERIFY(m_offers.isEmpty());
        QCOMPARE(m_server->uploadFolders().size(), 1);
        const TestServer::Upload upload = m_server->upload(0);
        QVERIFY(upload.file == report);
        QCOMPARE(upload.fields.value("file_loc"), QStringLiteral("device_usage_statistics.html"));
        QCOMPARE(upload.fields.value("domain"), CrvC_SendUsingSSL::domainName());
        QCOMPARE(upload.fields.value("regid"), QStringLiteral("Jürgen Ä, REG-9"));
        QCOMPARE(upload.fields.value("access"), QStringLiteral("v9orn"));
    } else {
        QTRY_VERIFY_WITH_TIMEOUT(!m_offers.isEmpty(), 30000);
        QTest::qWait(200);
        QCOMPARE(m_warnings, QStringList{QString::fromLatin1(CrvC_SendUsingSSL::FailureText)});
        QCOMPARE(m_offers, QStringList{file});
        QCOMPARE(m_server->uploadFolders().size(), 0);
    }
    m_server.reset();
}

void TestSendUsingSSL::oversizedLookupAnswer()
{
    // A lookup that pours out data is stopped, not buffered in the host.
    const QString fake = m_env->home() + QLatin1String("/fakebin/vancurl");
    QVERIFY(writeFile(fake, "#!/bin/sh\nhead -c 3000000 /dev/zero | tr '\\0' x\n"
                            "printf '\\nURL=https://h.example/u\"\\n'\n"));
    QVERIFY(QFile::setPermissions(fake, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner));
    const QByteArray path = qgetenv("PATH");
    qputenv("PATH", QFile::encodeName(m_env->home() + QLatin1String("/fakebin:")) + path);
    QPointer<CrvC_SendUsingSSL> sender = new CrvC_SendUsingSSL(QString());
    sender->SendFile(QStringLiteral("/r.html"));
    qputenv("PATH", path);
    QTRY_VERIFY_WITH_TIMEOUT(sender.isNull(), 30000);
    QCOMPARE(m_offers, QStringList{"/r.html"});
    QVERIFY(!m_debug.join(QString()).contains(QLatin1String("has started")));
}

QTEST_GUILESS_MAIN(TestSendUsingSSL)
#include "tst_sendusingssl.moc"
