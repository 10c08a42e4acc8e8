#include "common/TestEnvironment.h"

#include "host/MsgManData.h"
#include "host/Settings.h"
#include "transmit/DesktopProxySettings.h"
#include "transmit/ProxyDiscovery.h"
#include "transmit/ProxySource.h"
#include "transmit/SystemProxySource.h"

#include <QtTest>

namespace {

// Answers from fixed texts and records which steps were asked.
class FakeSource : public CrvC_ProxySource
{
public:
    QString environment, autoDetected, script, manual;
    int flags = 0;
    QStringList asked;

    QString environmentProxy() override { asked << "env"; return environment; }
    int connectionFlags() override { return flags; }
    QString autoDetectedScriptProxy() override { asked << "auto"; return autoDetected; }
    QString configuredScriptProxy() override { asked << "script"; return script; }
    QString manualProxy() override { asked << "manual"; return manual; }
};

const char *const ProxyVariables[] = {"https_proxy", "HTTPS_PROXY", "http_proxy",
                                      "HTTP_PROXY",  "all_proxy",   "ALL_PROXY"};

void clearProxyEnvironment()
{
    for (const char *name : ProxyVariables)
        qunsetenv(name);
}

} // namespace

class TestProxyDiscovery : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void init();
    void storedChoice_data();
    void storedChoice();
    void choiceZeroIgnoresSystemProxy();
    void stepOrder_data();
    void stepOrder();
    void cleanUp_data();
    void cleanUp();
    void environment_data();
    void environment();
    void kioslaverc_data();
    void kioslaverc();
    void gnomeValues_data();
    void gnomeValues();
    void wpadCandidates_data();
    void wpadCandidates();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestProxyDiscovery::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
}

void TestProxyDiscovery::init()
{
    m_env->clearSettings();
    clearProxyEnvironment();
    CrvC_ProxyDiscovery::setSource(nullptr);
}

void TestProxyDiscovery::storedChoice_data()
{
    // An empty QVariant means "not stored".
    QTest::addColumn<QVariant>("choice");
    QTest::addColumn<QVariant>("host");
    QTest::addColumn<QVariant>("port");
    QTest::addColumn<QString>("expected");
    QTest::addColumn<bool>("discovered");
    QTest::addColumn<QString>("debugLine");

    const QVariant none;
    QTest::newRow("0: no proxy") << QVariant(0) << QVariant("h") << QVariant(3128) << "" << false
                                 << "ProxyChoice: 0\n";
    QTest::newRow("2: host and port") << QVariant(2) << QVariant("h") << QVariant(3128) << "h:3128" << false
                                      << "Proxy Setting: h:3128\n";
    QTest::newRow("2: port as text") << QVariant("2") << QVariant("h") << QVariant("8080") << "h:8080"
                                     << false << "ProxyChoice: 2\n";
    QTest::newRow("2: host only") << QVariant(2) << QVariant("h") << none << "h" << false
                                  << "Proxy Setting: h\n";
    QTest::newRow("2: port only") << QVariant(2) << none << QVariant(3128) << "sys:1" << true
                                  << "ProxyChoice: 2\n";
    QTest::newRow("2: neither") << QVariant(2) << none << none << "sys:1" << true << "ProxyChoice: 2\n";
    QTest::newRow("1: discover") << QVariant(1) << QVariant("h") << QVariant(3128) << "sys:1" << true
                                 << "ProxyChoice: 1\n";
    QTest::newRow("other value") << QVariant(7) << none << none << "sys:1" << true << "ProxyChoice: 7\n";
    QTest::newRow("not a number") << QVariant("abc") << none << none << "sys:1" << true << "";
    QTest::newRow("missing") << none << QVariant("h") << QVariant(3128) << "sys:1" << true
                             << "Did not get ProxyChoice entry.\n";
}

void TestProxyDiscovery::storedChoice()
{
    QFETCH(QVariant, choice);
    QFETCH(QVariant, host);
    QFETCH(QVariant, port);
    QFETCH(QString, expected);
    QFETCH(bool, discovered);
    QFETCH(QString, debugLine);

    {
        Gui::Clip::Settings webUpdate(QStringLiteral("WebUpdate"), true, true, true);
        if (choice.isValid())
            webUpdate.setValue(QStringLiteral("ProxyChoice"), choice);
        if (host.isValid())
            webUpdate.setValue(QStringLiteral("ProxyHost"), host);
        if (port.isValid())
            webUpdate.setValue(QStringLiteral("ProxyPort"), port);
    }
    FakeSource source;
    source.environment = QStringLiteral("PROXY sys:1; DIRECT");
    source.flags = 0xE;

    QStringList lines;
    const auto previous = Port_MsgManData::setSink(
        [&lines](const Port_MsgManData::Message &m) { lines << QString::fromStdString(m.text); });
    CrvC_ProxyDiscovery::setSource(&source);
    const QString proxy = CrvC_ProxyDiscovery::findProxy();
    CrvC_ProxyDiscovery::setSource(nullptr);
    Port_MsgManData::setSink(previous);

    QCOMPARE(proxy, expected);
    QCOMPARE(!source.asked.isEmpty(), discovered);
    if (!debugLine.isEmpty())
        QVERIFY2(lines.contains(debugLine), qPrintable(lines.join("|")));
}

void TestProxyDiscovery::choiceZeroIgnoresSystemProxy()
{
    qputenv("https_proxy", "http://envproxy:3128/");
    QCOMPARE(CrvC_ProxyDiscovery::findProxy(), QStringLiteral("envproxy:3128"));
    {
        Gui::Clip::Settings webUpdate(QStringLiteral("WebUpdate"), true, true, true);
        webUpdate.setValue(QStringLiteral("ProxyChoice"), 0);
    }
    QCOMPARE(CrvC_ProxyDiscovery::findProxy(), QString());
}

void TestProxyDiscovery::stepOrder_data()
{
    QTest::addColumn<QString>("environment");
    QTest::addColumn<int>("flags");
    QTest::addColumn<QString>("autoDetected");
    QTest::addColumn<QString>("script");
    QTest::addColumn<QString>("manual");
    QTest::addColumn<QString>("expected");
    QTest::addColumn<QStringList>("asked");

    const QStringList envOnly{"env"};
    QTest::newRow("environment first") << "e:1" << 0xE << "PROXY a:1" << "PROXY s:1" << "m:1" << "e:1"
                                       << envOnly;
    QTest::newRow("detection before script") << "" << 0xE << "PROXY a:1; DIRECT" << "PROXY s:1" << "m:1"
                                             << "a:1" << QStringList{"env", "auto"};
    QTest::newRow("empty detection, script") << "" << 0xE << "" << "PROXY s:1" << "m:1" << "s:1"
                                             << QStringList{"env", "auto", "script"};
    QTest::newRow("all empty but manual") << "" << 0xE << "" << "" << "m1:80;m2:80" << "m1:80"
                                          << QStringList{"env", "auto", "script", "manual"};
    QTest::newRow("flag 0x4 only") << "" << 0x4 << "PROXY a:1" << "PROXY s:1" << "m:1" << "s:1"
                                   << QStringList{"env", "script"};
    QTest::newRow("flag 0x2 only") << "" << 0x2 << "PROXY a:1" << "PROXY s:1" << "m:1" << "m:1"
                                   << QStringList{"env", "manual"};
    QTest::newRow("no flags") << "" << 0 << "PROXY a:1" << "PROXY s:1" << "m:1" << "" << envOnly;
    // The script's answer is final even when it says "no proxy".
    QTest::newRow("script says direct") << "" << 0xE << "DIRECT" << "PROXY s:1" << "m:1" << ""
                                        << QStringList{"env", "auto"};
    QTest::newRow("nothing anywhere") << "" << 0xE << "" << "" << "" << ""
                                      << QStringList{"env", "auto", "script", "manual"};
}

void TestProxyDiscovery::stepOrder()
{
    FakeSource source;
    QFETCH(QString, expected);
    QFETCH(QStringList, asked);
    QFETCH(QString, environment);
    QFETCH(int, flags);
    QFETCH(QString, autoDetected);
    QFETCH(QString, script);
    QFETCH(QString, manual);
    source.environment = environment;
    source.flags = flags;
    source.autoDetected = autoDetected;
    source.script = script;
    source.manual = manual;

    QCOMPARE(CrvC_ProxyDiscovery::detectSystemProxy(source), expected);
    QCOMPARE(source.asked, asked);
}

void TestProxyDiscovery::cleanUp_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<QString>("expected");
    QTest::newRow("script answer") << "PROXY h:8080; DIRECT" << "h:8080";
    QTest::newRow("proxy list") << "h1:8080;h2:8080" << "h1:8080";
    QTest::newRow("plain") << "h:8080" << "h:8080";
    QTest::newRow("spaces and tabs") << " \tPROXY \th:1 \t; PROXY h:2" << "h:1";
    QTest::newRow("direct") << "DIRECT" << "";
    QTest::newRow("direct first") << "DIRECT; PROXY h:1" << "";
    QTest::newRow("empty") << "" << "";
    QTest::newRow("separators only") << ";;" << "";
}

void TestProxyDiscovery::cleanUp()
{
    QFETCH(QString, text);
    QFETCH(QString, expected);
    QCOMPARE(CrvC_ProxyDiscovery::cleanUp(text), expected);
}

void TestProxyDiscovery::environment_data()
{
    QTest::addColumn<QStringList>("variables"); // NAME=value
    QTest::addColumn<QString>("expected");
    QTest::newRow("none") << QStringList() << "";
    QTest::newRow("https lower first") << QStringList{"HTTPS_PROXY=u:2", "https_proxy=l:1"} << "l:1";
    QTest::newRow("https before http") << QStringList{"http_proxy=h:1", "HTTPS_PROXY=s:2"} << "s:2";
    QTest::newRow("http before all") << QStringList{"ALL_PROXY=a:1", "HTTP_PROXY=h:2"} << "h:2";
    QTest::newRow("all only") << QStringList{"all_proxy=a:3"} << "a:3";
    QTest::newRow("empty skipped") << QStringList{"https_proxy=", "http_proxy=h:4"} << "h:4";
    QTest::newRow("url with user") << QStringList{"https_proxy=http://me:pw@p.example:3128/"} << "p.example:3128";
    QTest::newRow("url without port") << QStringList{"https_proxy=http://p.example"} << "p.example";
}

void TestProxyDiscovery::environment()
{
    QFETCH(QStringList, variables);
    QFETCH(QString, expected);
    for (const QString &v : variables)
        qputenv(qPrintable(v.section('=', 0, 0)), v.section('=', 1).toUtf8());
    QCOMPARE(CrvC_SystemProxySource::proxyFromEnvironment(), expected);
}

void TestProxyDiscovery::kioslaverc_data()
{
    QTest::addColumn<QByteArray>("contents");
    QTest::addColumn<int>("flags");
    QTest::addColumn<QString>("scriptUrl");
    QTest::addColumn<QString>("manual");

    QTest::newRow("manual, space form") << QByteArray("[Proxy Settings]\nProxyType=1\nhttpsProxy=http://p 3128\n")
                                        << 0x2 << "" << "p:3128";
    QTest::newRow("manual, http only") << QByteArray("[Proxy Settings]\nProxyType=1\nhttpProxy=http://p:81\n")
                                       << 0x2 << "" << "p:81";
    QTest::newRow("manual without address") << QByteArray("[Proxy Settings]\nProxyType=1\n") << 0 << "" << "";
    QTest::newRow("script") << QByteArray("[Proxy Settings]\nProxy Config Script=http://c/p.pac\nProxyType=2\n")
                            << 0x4 << "http://c/p.pac" << "";
    QTest::newRow("detect") << QByteArray("[Proxy Settings]\nProxyType=3\n") << 0x8 << "" << "";
    QTest::newRow("none") << QByteArray("[Proxy Settings]\nProxyType=0\nhttpsProxy=p:1\n") << 0 << "" << "";
    QTest::newRow("other group") << QByteArray("[Other]\nProxyType=3\n[Proxy Settings]\n") << 0 << "" << "";
    QTest::newRow("binary") << QByteArray("\0\xff[Proxy\0", 8) << 0 << "" << "";
}

void TestProxyDiscovery::kioslaverc()
{
    QFETCH(QByteArray, contents);
    QFETCH(int, flags);
    QFETCH(QString, scriptUrl);
    QFETCH(QString, manual);
    const QString path = CrvC_DesktopProxySettings::kioslavercPath();
    QVERIFY(path.startsWith(m_env->home()));
    QVERIFY(CorvidTest::writeFile(path, contents));
    qputenv("XDG_CURRENT_DESKTOP", "KDE");
    const CrvC_DesktopProxySettings settings = CrvC_DesktopProxySettings::current();
    qunsetenv("XDG_CURRENT_DESKTOP");
    QFile::remove(path);
    QCOMPARE(settings.flags, flags);
    QCOMPARE(settings.scriptUrl, scriptUrl);
    QCOMPARE(settings.manualProxy, manual);
}

void TestProxyDiscovery::gnomeValues_data()
{
    QTest::addColumn<QString>("mode");
    QTest::addColumn<QString>("url");
    QTest::addColumn<QString>("host");
    QTest::addColumn<QString>("port");
    QTest::addColumn<int>("flags");
    QTest::addColumn<QString>("scriptUrl");
    QTest::addColumn<QString>("manual");

    QTest::newRow("auto without url") << "'auto'" << "''" << "" << "" << 0x8 << "" << "";
    QTest::newRow("auto with url") << "'auto'" << "'http://c/p.pac'" << "" << "" << 0x4 << "http://c/p.pac" << "";
    QTest::newRow("manual") << "'manual'" << "" << "'p.example'" << "3128" << 0x2 << "" << "p.example:3128";
    QTest::newRow("manual, port unset") << "'manual'" << "" << "'p'" << "0" << 0x2 << "" << "p";
    QTest::newRow("manual, no host") << "'manual'" << "" << "''" << "3128" << 0 << "" << "";
    QTest::newRow("none") << "'none'" << "'http://c/p.pac'" << "'p'" << "1" << 0 << "" << "";
    QTest::newRow("nothing read") << "" << "" << "" << "" << 0 << "" << "";
}

void TestProxyDiscovery::gnomeValues()
{
    QFETCH(QString, mode);
    QFETCH(QString, url);
    QFETCH(QString, host);
    QFETCH(QString, port);
    QFETCH(int, flags);
    QFETCH(QString, scriptUrl);
    QFETCH(QString, manual);
    const CrvC_DesktopProxySettings settings = CrvC_DesktopProxySettings::fromGnomeValues(mode, url, host, port);
    QCOMPARE(settings.flags, flags);
    QCOMPARE(settings.scriptUrl, scriptUrl);
    QCOMPARE(settings.manualProxy, manual);
}

void TestProxyDiscovery::wpadCandidates_data()
{
    QTest::addColumn<QString>("name");
    QTest::addColumn<QStringList>("expected");
    QTest::newRow("deep") << "pc.dept.corp.example"
                          << QStringList{"http://wpad.dept.corp.example/wpad.dat", "http://wpad.corp.example/wpad.dat"};
    QTest::newRow("one domain") << "PC.Corp.Example" << QStringList{"http://wpad.corp.example/wpad.dat"};
    QTest::newRow("top-level only") << "pc.example" << QStringList();
    QTest::newRow("no dot") << "pc" << QStringList();
    QTest::newRow("empty") << "" << QStringList();
}

void TestProxyDiscovery::wpadCandidates()
{
    QFETCH(QString, name);
    QFETCH(QStringList, expected);
    QCOMPARE(CrvC_SystemProxySource::wpadCandidates(name), expected);
}

QTEST_GUILESS_MAIN(TestProxyDiscovery)
#include "tst_proxydiscovery.moc"
