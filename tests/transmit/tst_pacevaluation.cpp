#include "common/TestEnvironment.h"

#include "transmit/ProxyDiscovery.h"
#include "transmit/ProxyScript.h"

#include <QtTest>
#include <QTcpServer>
#include <QTcpSocket>

#include <atomic>

namespace {

// A plain-HTTP server on 127.0.0.1 in a thread of its own (the code under
// test blocks the main thread while its child processes run). It answers GET
// requests for the paths in `files`, 404 otherwise.
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
        while (!stopping) {
            if (!server.waitForNewConnection(100))
                continue;
            std::unique_ptr<QTcpSocket> socket(server.nextPendingConnection());
            QByteArray request;
            while (!request.contains("\r\n\r\n") && socket->waitForReadyRead(5000))
                request += socket->readAll();
            const QByteArray path = request.split(' ').value(1);
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

} // namespace

class TestPacEvaluation : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    ScriptServer m_server;
    QString m_temp;

    QString url(const QString &path) const { return QString("http://127.0.0.1:%1%2").arg(m_server.port).arg(path); }
    QStringList leftInTemp() const { return QDir(m_temp).entryList(QDir::Files); }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        for (const char *name : {"https_proxy", "HTTPS_PROXY", "http_proxy", "HTTP_PROXY", "all_proxy", "ALL_PROXY"})
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
        m_server.files.insert("/binary.pac", QByteArray("\x7f" "ELF\0\0\xff\xfe", 8));
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
        QTest::newRow("maker's server") << "/wpad.dat" << "www.vantor.example" << "PROXY h:8080; DIRECT";
        QTest::newRow("other host") << "/wpad.dat" << "elsewhere.example" << "DIRECT";
        QTest::newRow("loops") << "/loop.pac" << "www.vantor.example" << "";
        QTest::newRow("throws") << "/throws.pac" << "www.vantor.example" << "";
        QTest::newRow("syntax error") << "/syntax.pac" << "www.vantor.example" << "";
        QTest::newRow("binary") << "/binary.pac" << "www.vantor.example" << "";
        QTest::newRow("not found") << "/missing.pac" << "www.vantor.example" << "";
    }

    void scripts()
    {
        QFETCH(QString, path);
        QFETCH(QString, host);
        QFETCH(QString, expected);
        QElapsedTimer timer;
        timer.start();
        QCOMPARE(CrvC_ProxyScript::run(url(path), "http://" + host, host), expected);
        QVERIFY2(timer.elapsed() < CrvC_ProxyScript::TimeLimitMs + 3000, qPrintable(QString::number(timer.elapsed())));
        QCOMPARE(leftInTemp(), QStringList());
    }

    void configuredScriptEndToEnd()
    {
        // The desktop names the script; nothing is stored in "WebUpdate".
        QVERIFY(CorvidTest::writeFile(m_env->home() + "/.config/kioslaverc",
                                      "[Proxy Settings]\nProxyType=2\nProxy Config Script=" + url("/wpad.dat").toUtf8()));
        qputenv("XDG_CURRENT_DESKTOP", "KDE");
        QCOMPARE(CrvC_ProxyDiscovery::findProxy(), "h:8080");
        QCOMPARE(leftInTemp(), QStringList());
    }
};

QTEST_GUILESS_MAIN(TestPacEvaluation)
#include "tst_pacevaluation.moc"
