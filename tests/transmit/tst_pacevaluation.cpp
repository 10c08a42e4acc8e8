#include "common/TestEnvironment.h"
#include "common/TestServer.h"

#include "transmit/ProxyDiscovery.h"
#include "transmit/ProxyScript.h"
#include "transmit/SendUsingSSL.h"

#include <QTcpServer>
#include <QTcpSocket>
#include <QtTest>

#include <atomic>
#include <sys/resource.h>

namespace {

// A plain-HTTP server on 127.0.0.1 in a thread of its own (the code under
// test blocks the main thread while its child processes run). It answers GET
// requests for the paths in `files`, 404 otherwise; "/silent..." never
// answers, "/endless..." sends without end.
class ScriptServer : public QThread
{
public:
    QMap<QByteArray, QByteArray> files;
    std::atomic<quint16> port{0};
    std::atomic<bool> stopping{false};
    QSemaphore ready;

    void run() override
    {
        QTcpServer server;
        if (server.listen(QHostAddress::LocalHost, 0))
            port = server.serverPort();
        ready.release();
        std::vector<std::unique_ptr<QTcpSocket>> silent;
        while (!stopping) {
            if (!server.waitForNewConnection(100))
                continue;
            std::unique_ptr<QTcpSocket> socket(server.nextPendingConnection());
            QByteArray request;
            while (!request.contains("\r\n\r\n") && socket->waitForReadyRead(5000))
                request += socket->readAll();
            const QByteArray path = request.split(' ').value(1);
            if (path.startsWith("/silent")) {
                silent.push_back(std::move(socket));
                continue;
            }
            if (path.startsWith("/endless")) {
                socket->write("HTTP/1.0 200 OK\r\n\r\n");
                while (!stopping && socket->write(QByteArray(65536, '/')) > 0
                       && socket->waitForBytesWritten(5000)) {
                }
                continue;
            }
            const bool found = files.contains(path);
            const QByteArray body = found ? files.value(path) : QByteArray("not here");
            socket->write((found ? "HTTP/1.0 200 OK\r\n" : "HTTP/1.0 404 Not Found\r\n")
                          + QByteArray("Content-Length: ") + QByteArray::number(body.size())
                          + "\r\nConnection: close\r\n\r\n" + body);
            socket->waitForBytesWritten(5000);
            socket->disconnectFromHost();
            if (socket->state() != QAbstractSocket::UnconnectedState)
                socket->waitForDisconnected(5000);
        }
    }
};

const QByteArray ProxyScriptText =
    "function FindProxyForURL(url, host) {\n"
    "  if (dnsDomainIs(host, \".vantor.example\") && url.substring(0, 5) == \"http:\")\n"
    "    return \"PROXY h:8080; DIRECT\";\n"
    "  return \"DIRECT\";\n"
    "}\n";

QByteArray script(const QByteArray &body)
{
    return "function FindProxyForURL(url, host) { " + body + " }";
}

// Names of this process's child processes.
QStringList childPrograms()
{
    QStringList names;
    for (const QString &pid : QDir("/proc").entryList(QDir::Dirs)) {
        const QByteArray stat = CorvidTest::readFile("/proc/" + pid + "/stat");
        const qsizetype close = stat.lastIndexOf(')');
        if (close > 0
            && stat.mid(close + 2).split(' ').value(1).toLongLong() == QCoreApplication::applicationPid())
            names << stat.mid(stat.indexOf('(') + 1, close - stat.indexOf('(') - 1);
    }
    return names;
}

// The longest time, in ms, that the event loop did not turn while `until` was
// not yet true (checked every 10 ms, given up after `timeoutMs`).
qint64 longestStall(const std::function<bool()> &until, int timeoutMs)
{
    QElapsedTimer total, sinceTick;
    total.start();
    sinceTick.start();
    qint64 longest = 0;
    QTimer ticker;
    QObject::connect(&ticker, &QTimer::timeout, [&] { longest = qMax(longest, sinceTick.restart()); });
    ticker.start(10);
    while (!until() && total.elapsed() < timeoutMs)
        QCoreApplication::processEvents(QEventLoop::WaitForMoreEvents, 10);
    return qMax(longest, sinceTick.elapsed());
}

} // namespace

class TestPacEvaluation : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    ScriptServer m_server;
    QString m_temp;

    QString url(const QString &path) const
    {
        return QString("http://127.0.0.1:%1%2").arg(m_server.port).arg(path);
    }
    QStringList leftInTemp() const { return QDir(m_temp).entryList(QDir::Files); }

    // The desktop names the script at `path`; nothing is stored in "WebUpdate".
    void configureScript(const QString &path)
    {
        QVERIFY(CorvidTest::writeFile(m_env->home() + "/.config/kioslaverc",
                                      "[Proxy Settings]\nProxyType=2\nProxy Config Script="
                                          + url(path).toUtf8()));
        qputenv("XDG_CURRENT_DESKTOP", "KDE");
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        for (const char *name :
             {"https_proxy", "HTTPS_PROXY", "http_proxy", "HTTP_PROXY", "all_proxy", "ALL_PROXY"})
            qunsetenv(name);
        qputenv("CORVID_SERVER", "https://www.vantor.example");
        // The staged vancurl first on PATH; a private folder for temporary files.
        m_temp = m_env->home() + "/tmp";
        QVERIFY(QDir().mkpath(m_temp));
        qputenv("PATH", QFile::encodeName(CorvidTest::Environment::stageDir()) + "/bin:" + qgetenv("PATH"));
        qputenv("TMPDIR", QFile::encodeName(m_temp));
        QVERIFY(!CrvC_ProxyScript::evaluatorProgram().isEmpty());

        m_server.files.insert("/wpad.dat", ProxyScriptText);
        m_server.files.insert("/loop.pac", "function FindProxyForURL(url, host) { while (true) {} }");
        m_server.files.insert("/throws.pac", "function FindProxyForURL(url, host) { throw 'no'; }");
        m_server.files.insert("/syntax.pac", "function FindProxyForURL(url, host) { return \"PROXY");
        m_server.files.insert("/binary.pac", QByteArray("\x7f"
                                                        "ELF\0\0\xff\xfe",
                                                        8));
        m_server.files.insert("/undefined.pac", script("return;"));
        m_server.files.insert("/null.pac", script("return null;"));
        m_server.files.insert("/number.pac", script("return 8080;"));
        m_server.files.insert("/greedy.pac", script("var s = 'x'; while (true) s = s + s;"));
        m_server.files.insert("/long.pac",
                              script("var a = []; for (var i = 0; i < 1000; i++) a.push('PROXY h:1');"
                                     "return a.join('; ');"));
        m_server.files.insert("/longhost.pac", script("return 'PROXY ' + new Array(2000).join('h');"));
        m_server.start();
        m_server.ready.acquire();
        QVERIFY(m_server.port != 0);
    }

    void cleanupTestCase()
    {
        m_server.stopping = true;
        m_server.wait();
    }

    void scripts_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("host");
        QTest::addColumn<QString>("expected");
        QTest::newRow("maker's server") << "/wpad.dat"
                                        << "www.vantor.example"
                                        << "PROXY h:8080; DIRECT";
        QTest::newRow("other host") << "/wpad.dat"
                                    << "elsewhere.example"
                                    << "DIRECT";
        QTest::newRow("loops") << "/loop.pac"
                               << "www.vantor.example"
                               << "";
        QTest::newRow("throws") << "/throws.pac"
                                << "www.vantor.example"
                                << "";
        QTest::newRow("syntax error") << "/syntax.pac"
                                      << "www.vantor.example"
                                      << "";
        QTest::newRow("binary") << "/binary.pac"
                                << "www.vantor.example"
                                << "";
        QTest::newRow("not found") << "/missing.pac"
                                   << "www.vantor.example"
                                   << "";
        QTest::newRow("oversized download") << "/endless.pac"
                                            << "www.vantor.example"
                                            << "";
        QTest::newRow("allocates without end") << "/greedy.pac"
                                               << "www.vantor.example"
                                               << "";
        QTest::newRow("undefined") << "/undefined.pac"
                                   << "www.vantor.example"
                                   << "";
        QTest::newRow("null") << "/null.pac"
                              << "www.vantor.example"
                              << "";
        QTest::newRow("number") << "/number.pac"
                                << "www.vantor.example"
                                << "";
        // Cut after the last whole entry within 1023 bytes: 93 entries.
        QTest::newRow("long answer") << "/long.pac"
                                     << "www.vantor.example" << QStringList(93, "PROXY h:1").join("; ");
        QTest::newRow("long first entry") << "/longhost.pac"
                                          << "www.vantor.example"
                                          << "";
    }

    void scripts()
    {
        QFETCH(QString, path);
        QFETCH(QString, host);
        QFETCH(QString, expected);
        QElapsedTimer timer;
        timer.start();
        QCOMPARE(CrvC_ProxyScript::run(url(path), "http://" + host, host), expected);
        QVERIFY2(timer.elapsed() < CrvC_ProxyScript::TimeLimitMs + 3000,
                 qPrintable(QString::number(timer.elapsed())));
        QCOMPARE(leftInTemp(), QStringList());
        // No child (vancurl, corvid-pac) grew anywhere near the gigabytes an
        // unbounded script takes in these seconds.
        rusage usage;
        QCOMPARE(getrusage(RUSAGE_CHILDREN, &usage), 0);
        QVERIFY2(usage.ru_maxrss < 1024 * 1024, qPrintable(QString::number(usage.ru_maxrss)));
    }

    void discovery_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<int>("limitMs");
        QTest::addColumn<QString>("expected");
        QTest::newRow("configured script") << "/wpad.dat" << 10000 << "h:8080";
        QTest::newRow("script never answers") << "/silent.pac" << 2000 << "";
        QTest::newRow("script without end") << "/endless.pac" << 10000 << "";
    }

    void discovery()
    {
        QFETCH(QString, path);
        QFETCH(int, limitMs);
        configureScript(path);
        CrvC_ProxyDiscovery discovery;
        QSignalSpy answers(&discovery, &CrvC_ProxyDiscovery::finished);
        QElapsedTimer timer;
        timer.start();
        discovery.start(limitMs);
        const qint64 stall = longestStall([&] { return !answers.isEmpty(); }, limitMs + 5000);
        QVERIFY2(timer.elapsed() < limitMs + 500, qPrintable(QString::number(timer.elapsed())));
        QVERIFY2(stall < 250, qPrintable(QString::number(stall)));
        QCOMPARE(answers.size(), 1);
        QTEST(answers.at(0).at(0).toString(), "expected");
    }

    void quitDuringDiscovery()
    {
        configureScript("/silent.pac");
        CrvC_ProxyDiscovery discovery;
        QSignalSpy answers(&discovery, &CrvC_ProxyDiscovery::finished);
        discovery.start();
        QTRY_COMPARE(childPrograms(), QStringList{"vancurl"});
        QElapsedTimer timer;
        timer.start();
        CrvC_ProxyDiscovery::stopAll(); // what unloading the plug-in does
        QVERIFY2(timer.elapsed() < 500, qPrintable(QString::number(timer.elapsed())));
        QCOMPARE(childPrograms(), QStringList());
        QTest::qWait(100);
        QCOMPARE(answers.size(), 0);
    }

    void uploadGoesDirectWhenDiscoveryGivesUp()
    {
        configureScript("/silent.pac");
        CorvidTest::TestServer receiver;
        QVERIFY2(receiver.start(), qPrintable(receiver.error()));
        QVERIFY(m_env->writeDataFile("reports/ca-cert-bundle.crt", CorvidTest::readFile(receiver.caFile())));
        qputenv("CORVID_SERVER", receiver.baseUrl().toUtf8());
        const QString report = receiver.scratchDir() + "/device_usage_statistics.html";
        QVERIFY(CorvidTest::writeFile(report, "<html>report</html>"));
        QElapsedTimer timer;
        timer.start();
        QPointer<CrvC_SendUsingSSL> sender = new CrvC_SendUsingSSL;
        sender->SendFile(report);
        const qint64 stall = longestStall([&] { return sender.isNull(); }, 30000);
        const qint64 driverGone = timer.elapsed();
        qputenv("CORVID_SERVER", "https://www.vantor.example");
        QVERIFY2(stall < 250, qPrintable(QString::number(stall)));
        QVERIFY2(driverGone >= CrvC_ProxyDiscovery::LimitMs
                     && driverGone < CrvC_ProxyDiscovery::LimitMs + 5000,
                 qPrintable(QString::number(driverGone)));
        QTRY_COMPARE_WITH_TIMEOUT(receiver.uploadFolders().size(), 1, 30000);
        QCOMPARE(receiver.upload(0).file, QByteArray("<html>report</html>"));
        QTRY_VERIFY(!childPrograms().contains("vancurl")); // the upload releases itself
        QTest::qWait(100);
    }
};

QTEST_GUILESS_MAIN(TestPacEvaluation)
#include "tst_pacevaluation.moc"
