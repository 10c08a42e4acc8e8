#include "common/TestEnvironment.h"

#include "host/Settings.h"
#include "transmit/DesktopProxySettings.h"
#include "transmit/ProxyDiscovery.h"
#include "transmit/ProxySource.h"
#include "transmit/SystemProxySource.h"

#include <QtTest>

#include <sys/stat.h>

namespace {

// Answers fixed texts and records which steps were asked.
class FakeSource : public CrvC_ProxySource
{
public:
    QStringList texts{"", "", "", ""}; // environment, detected script, configured script, manual
    int flags = 0;
    QStringList asked;

    QString environmentProxy() override { return ask("env", 0); }
    int connectionFlags() override { return flags; }
    QString autoDetectedScriptProxy() override { return ask("auto", 1); }
    QString configuredScriptProxy() override { return ask("script", 2); }
    QString manualProxy() override { return ask("manual", 3); }

private:
    QString ask(const char *step, int i)
    {
        asked << step;
        return texts.at(i);
    }
};

} // namespace

class TestProxyDiscovery : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;

private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }

    void init()
    {
        m_env->clearSettings();
        for (const char *name : {"https_proxy", "HTTPS_PROXY", "http_proxy", "HTTP_PROXY", "all_proxy",
                                 "ALL_PROXY", "no_proxy", "NO_PROXY", "CORVID_SERVER"})
            qunsetenv(name);
    }

    void storedChoice_data()
    {
        // An invalid QVariant is a key that is not stored; "sys:1" is what
        // discovery finds.
        QTest::addColumn<QVariant>("choice");
        QTest::addColumn<QVariant>("host");
        QTest::addColumn<QVariant>("port");
        QTest::addColumn<QString>("expected");
        const QVariant no;
        QTest::newRow("0") << QVariant(0) << QVariant("h") << QVariant(3128) << "";
        QTest::newRow("2, host and port") << QVariant(2) << QVariant("h") << QVariant(3128) << "h:3128";
        QTest::newRow("2 as text") << QVariant("2") << QVariant("h") << QVariant("81") << "h:81";
        QTest::newRow("2, host only") << QVariant(2) << QVariant("h") << no << "h";
        QTest::newRow("2, port only") << QVariant(2) << no << QVariant(3128) << "sys:1";
        QTest::newRow("1") << QVariant(1) << QVariant("h") << QVariant(3128) << "sys:1";
        QTest::newRow("not a number") << QVariant("abc") << no << no << "sys:1";
        QTest::newRow("missing") << no << QVariant("h") << QVariant(3128) << "sys:1";
    }

    void storedChoice()
    {
        QFETCH(QVariant, choice);
        QFETCH(QVariant, host);
        QFETCH(QVariant, port);
        QFETCH(QString, expected);
        {
            Gui::Clip::Settings webUpdate("WebUpdate", true, true, true);
            for (const auto &[key, value] :
                 {std::pair{"ProxyChoice", choice}, {"ProxyHost", host}, {"ProxyPort", port}})
                if (value.isValid())
                    webUpdate.setValue(key, value);
        }
        FakeSource source;
        source.texts[0] = "PROXY sys:1; DIRECT";
        CrvC_ProxyDiscovery::setSource(&source);
        const QString proxy = CrvC_ProxyDiscovery::findProxy();
        CrvC_ProxyDiscovery::setSource(nullptr);
        QCOMPARE(proxy, expected);
        QCOMPARE(source.asked.isEmpty(), expected != "sys:1");
    }

    void stepOrder_data()
    {
        QTest::addColumn<int>("flags");
        QTest::addColumn<QStringList>("texts"); // environment, detected, configured, manual
        QTest::addColumn<QString>("expected");
        QTest::addColumn<QString>("asked");
        const QStringList all{"", "PROXY a:1; DIRECT", "PROXY s:1", "m1:80;m2:80"};
        QTest::newRow("environment first") << 0xE << QStringList{"e:1", "a", "s", "m"} << "e:1"
                                           << "env";
        QTest::newRow("detection next") << 0xE << all << "a:1"
                                        << "env,auto";
        QTest::newRow("then the script") << 0xE << QStringList{"", "", "PROXY s:1", "m"} << "s:1"
                                         << "env,auto,script";
        QTest::newRow("then manual") << 0xE << QStringList{"", "", "", "m1:80;m2:80"} << "m1:80"
                                     << "env,auto,script,manual";
        QTest::newRow("manual flag only") << 0x2 << all << "m1:80"
                                          << "env,manual";
        QTest::newRow("no flags") << 0 << all << ""
                                  << "env";
        QTest::newRow("script says direct") << 0xE << QStringList{"", "DIRECT", "PROXY s:1", "m"} << ""
                                            << "env,auto";
    }

    void stepOrder()
    {
        FakeSource source;
        QFETCH(int, flags);
        QFETCH(QStringList, texts);
        QFETCH(QString, expected);
        QFETCH(QString, asked);
        source.flags = flags;
        source.texts = texts;
        QCOMPARE(CrvC_ProxyDiscovery::detectSystemProxy(source), expected);
        QCOMPARE(source.asked.join(','), asked);
    }

    void cleanUp_data()
    {
        QTest::addColumn<QString>("text");
        QTest::addColumn<QString>("expected");
        QTest::newRow("script answer") << "PROXY h:8080; DIRECT"
                                       << "h:8080";
        QTest::newRow("proxy list") << "h1:8080;h2:8080"
                                    << "h1:8080";
        QTest::newRow("plain") << "h:8080"
                               << "h:8080";
        QTest::newRow("blanks") << " \tPROXY \th:1 \t; PROXY h:2"
                                << "h:1";
        QTest::newRow("direct first") << "DIRECT; PROXY h:1"
                                      << "";
        QTest::newRow("separators only") << ";;"
                                         << "";
    }

    void cleanUp()
    {
        QFETCH(QString, text);
        QFETCH(QString, expected);
        QCOMPARE(CrvC_ProxyDiscovery::cleanUp(text), expected);
    }

    void environment_data()
    {
        QTest::addColumn<QStringList>("variables");
        QTest::addColumn<QString>("expected");
        QTest::newRow("https lower case first") << QStringList{"HTTPS_PROXY=u:2", "https_proxy=l:1"} << "l:1";
        QTest::newRow("https before http") << QStringList{"http_proxy=h:1", "HTTPS_PROXY=s:2"} << "s:2";
        QTest::newRow("http before all") << QStringList{"ALL_PROXY=a:1", "HTTP_PROXY=h:2"} << "h:2";
        QTest::newRow("empty is unset") << QStringList{"https_proxy=", "all_proxy=a:3"} << "a:3";
        QTest::newRow("URL") << QStringList{"https_proxy=http://me:pw@p.example:3128/"} << "p.example:3128";
        // no_proxy against the maker's server, www.vantor.example:443 unless CORVID_SERVER says otherwise.
        const QString p = "https_proxy=p:1";
        QTest::newRow("no_proxy: the host")
            << QStringList{p, "no_proxy=a.example, WWW.Vantor.Example"} << "DIRECT";
        QTest::newRow("no_proxy: domain, dot") << QStringList{p, "no_proxy=.vantor.example"} << "DIRECT";
        QTest::newRow("no_proxy: domain") << QStringList{p, "no_proxy=vantor.example"} << "DIRECT";
        QTest::newRow("no_proxy: wildcard") << QStringList{p, "NO_PROXY=*"} << "DIRECT";
        QTest::newRow("no_proxy: port") << QStringList{p, "no_proxy=www.vantor.example:443"} << "DIRECT";
        QTest::newRow("no_proxy: other port") << QStringList{p, "no_proxy=www.vantor.example:8443"} << "p:1";
        QTest::newRow("no_proxy: part of a label") << QStringList{p, "no_proxy=antor.example,www"} << "p:1";
        QTest::newRow("no_proxy: lower case first")
            << QStringList{p, "no_proxy=a.example", "NO_PROXY=*"} << "p:1";
        QTest::newRow("no_proxy: IPv6")
            << QStringList{p, "CORVID_SERVER=https://[::1]:8443", "no_proxy=[::1]:8443"} << "DIRECT";
        QTest::newRow("no_proxy without a proxy") << QStringList{"no_proxy=*"} << "";
    }

    void environment()
    {
        QFETCH(QStringList, variables);
        QFETCH(QString, expected);
        for (const QString &v : variables)
            qputenv(qPrintable(v.section('=', 0, 0)), v.section('=', 1).toUtf8());
        QCOMPARE(CrvC_SystemProxySource::proxyFromEnvironment(), expected);
    }

    void desktopSettings_data()
    {
        // KDE rows give kioslaverc; GNOME rows give mode, autoconfig-url,
        // https host and port as gsettings prints them.
        QTest::addColumn<QString>("desktop");
        QTest::addColumn<QStringList>("input");
        QTest::addColumn<QString>("expected"); // flags|script|manual
        const QString head = "[Proxy Settings]\n";
        QTest::newRow("KDE manual") << "KDE" << QStringList{head + "ProxyType=1\nhttpsProxy=http://p 3128"}
                                    << "2||p:3128";
        QTest::newRow("KDE http proxy")
            << "KDE" << QStringList{head + "ProxyType=1\nhttpProxy=http://p:81"} << "2||p:81";
        QTest::newRow("KDE manual, no address") << "KDE" << QStringList{head + "ProxyType=1"} << "0||";
        QTest::newRow("KDE script") << "KDE"
                                    << QStringList{head + "Proxy Config Script=http://c/p.pac\nProxyType=2"}
                                    << "4|http://c/p.pac|";
        QTest::newRow("KDE detect") << "KDE" << QStringList{head + "ProxyType=3"} << "8||";
        QTest::newRow("KDE other group") << "KDE" << QStringList{"[Other]\nProxyType=3\n" + head} << "0||";
        QTest::newRow("KDE named pipe") << "KDE" << QStringList{"FIFO"} << "0||";
        QTest::newRow("KDE binary") << "KDE" << QStringList{QString::fromLatin1("\xff[Proxy\x01=\x02")}
                                    << "0||";
        QTest::newRow("GNOME auto") << "GNOME" << QStringList{"'auto'", "''", "", ""} << "8||";
        QTest::newRow("GNOME script")
            << "GNOME" << QStringList{"'auto'", "'http://c/p.pac'", "", ""} << "4|http://c/p.pac|";
        QTest::newRow("GNOME manual")
            << "GNOME" << QStringList{"'manual'", "", "'p.example'", "3128"} << "2||p.example:3128";
        QTest::newRow("GNOME port unset") << "GNOME" << QStringList{"'manual'", "", "'p'", "0"} << "2||p";
        QTest::newRow("GNOME no host") << "GNOME" << QStringList{"'manual'", "", "''", "3128"} << "0||";
        QTest::newRow("GNOME none") << "GNOME" << QStringList{"'none'", "'http://c/p.pac'", "'p'", "1"}
                                    << "0||";
    }

    void desktopSettings()
    {
        QFETCH(QString, desktop);
        QFETCH(QStringList, input);
        QFETCH(QString, expected);
        CrvC_DesktopProxySettings settings;
        if (desktop == "KDE") {
            const QString path = m_env->home() + "/.config/kioslaverc";
            QFile::remove(path);
            QVERIFY(input.at(0) == "FIFO" ? mkfifo(QFile::encodeName(path), 0600) == 0
                                          : CorvidTest::writeFile(path, input.at(0).toUtf8()));
            qputenv("XDG_CURRENT_DESKTOP", "KDE");
            settings = CrvC_DesktopProxySettings::current();
            qunsetenv("XDG_CURRENT_DESKTOP");
        } else {
            settings = CrvC_DesktopProxySettings::fromGnomeValues(input.at(0), input.at(1), input.at(2),
                                                                  input.at(3));
        }
        QCOMPARE(QString::number(settings.flags) + '|' + settings.scriptUrl + '|' + settings.manualProxy,
                 expected);
    }

    void wpadCandidates_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<QStringList>("expected");
        QTest::newRow("deep") << "pc.dept.corp.example"
                              << QStringList{"http://wpad.dept.corp.example/wpad.dat",
                                             "http://wpad.corp.example/wpad.dat"};
        QTest::newRow("one domain") << "PC.Corp.Example" << QStringList{"http://wpad.corp.example/wpad.dat"};
        QTest::newRow("top-level only") << "pc.example" << QStringList();
    }

    void wpadCandidates()
    {
        QFETCH(QString, name);
        QFETCH(QStringList, expected);
        QCOMPARE(CrvC_SystemProxySource::wpadCandidates(name), expected);
    }
};

QTEST_GUILESS_MAIN(TestProxyDiscovery)
#include "tst_proxydiscovery.moc"
