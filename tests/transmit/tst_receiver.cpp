// corvid-receiver's limits, with requests written by hand over TLS on
// 127.0.0.1: what it answers, what it stores, and that slow clients neither
// keep an upload waiting nor the receiver from stopping.

#include "common/TestEnvironment.h"
#include "common/TestServer.h"

#include <QProcess>
#include <QSslConfiguration>
#include <QSslSocket>
#include <QtTest>

using namespace CorvidTest;

namespace {

QByteArray formPart(const QByteArray &name, const QByteArray &fileName, const QByteArray &content)
{
    return "--B0und\r\nContent-Disposition: form-data; name=\"" + name + "\""
           + (fileName.isEmpty() ? QByteArray() : "; filename=\"" + fileName + "\"") + "\r\n\r\n" + content
           + "\r\n";
}

// An upload form with the report `content` named `fileName`, and `access`
// sent before or after it.
QByteArray form(const QByteArray &fileName, const QByteArray &content, const QByteArray &access = "v9orn",
                bool accessFirst = false)
{
    const QByteArray file = formPart("file_loc", fileName, content) + formPart("domain", "", "c.d");
    const QByteArray code = formPart("access", "", access);
    return (accessFirst ? code + file : file + code) + "--B0und--\r\n";
}

QByteArray chunked(const QByteArray &body)
{
    QByteArray out;
    for (int at = 0; at < body.size(); at += 1000)
        out +=
            QByteArray::number(qMin(1000, int(body.size()) - at), 16) + "\r\n" + body.mid(at, 1000) + "\r\n";
    return out + "0\r\n\r\n";
}

const QByteArray uploadHead =
    "POST /upload HTTP/1.1\r\nHost: 127.0.0.1\r\n"
    "Content-Type: multipart/form-data; boundary=B0und\r\n";

} // namespace

class TestReceiver : public QObject
{
    Q_OBJECT
    std::unique_ptr<Environment> m_env;
    std::unique_ptr<TestServer> m_server;

    std::unique_ptr<QSslSocket> connectTls()
    {
        std::unique_ptr<QSslSocket> socket(new QSslSocket);
        QSslConfiguration tls = QSslConfiguration::defaultConfiguration();
        tls.setCaCertificates(QSslCertificate::fromPath(m_server->caFile()));
        socket->setSslConfiguration(tls);
        socket->connectToHostEncrypted("127.0.0.1", quint16(QUrl(m_server->baseUrl()).port()));
        return socket;
    }

    // Sends `request` and reads the answer until the receiver closes the
    // connection (at most 20 s).
    QByteArray exchange(const QByteArray &request)
    {
        std::unique_ptr<QSslSocket> socket = connectTls();
        QDeadlineTimer deadline(20000);
        if (!socket->waitForEncrypted(10000))
            return socket->errorString().toUtf8();
        socket->write(request);
        QByteArray answer;
        while (socket->state() == QAbstractSocket::ConnectedState && !deadline.hasExpired()) {
            socket->waitForReadyRead(int(deadline.remainingTime()));
            answer += socket->readAll();
        }
        return answer + socket->readAll();
    }

    // Names in the data folder other than numbered upload folders: what a
    // refused or cut upload would leave behind.
    QStringList leftovers() const
    {
        const QRegularExpression number("^\\d{6,}$");
        QStringList names =
            QDir(m_server->dataDir()).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot);
        names.removeIf([&number](const QString &name) { return number.match(name).hasMatch(); });
        return names;
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new Environment);
        m_server.reset(new TestServer);
        QVERIFY2(m_server->start({"--max-bytes", "20000", "--threads", "2", "--timeout", "8"}),
                 qPrintable(m_server->error()));
    }

    void requests_data()
    {
        QTest::addColumn<QByteArray>("request");
        QTest::addColumn<QByteArray>("status");   // the answer's status line
        QTest::addColumn<QByteArray>("storedAs"); // the file's name when stored

        const QByteArray report = "<html>\xc3\xa4</html>\n";
        const QByteArray upload = form("device_usage_statistics.html", report);
        const QByteArray big = form("big.html", QByteArray(30000, 'x'));
        QTest::newRow("chunked") << uploadHead + "Transfer-Encoding: chunked\r\n\r\n" + chunked(upload)
                                 << QByteArray("200 OK") << QByteArray("device_usage_statistics.html");
        QTest::newRow("chunked over the limit")
            << uploadHead + "Transfer-Encoding: chunked\r\n\r\n" + chunked(big) << QByteArray("413 ")
            << QByteArray();
        QTest::newRow("no length") << uploadHead + "\r\n" + upload << QByteArray("411 ") << QByteArray();
        QTest::newRow("length and chunked")
            << uploadHead + "Content-Length: 10\r\nTransfer-Encoding: chunked\r\n\r\n" + chunked(upload)
            << QByteArray("400 ") << QByteArray();
        const QByteArray sized = "Content-Length: " + QByteArray::number(upload.size()) + "\r\n";
        QByteArray lines;
        for (int i = 0; i < 150; ++i)
            lines += "X-Line-" + QByteArray::number(i) + ": " + QByteArray(i < 101 ? 1 : 2000, 'y') + "\r\n";
        QTest::newRow("too many header lines")
            << uploadHead + sized + lines.left(lines.indexOf("X-Line-101")) + "\r\n" + upload
            << QByteArray("431 ") << QByteArray();
        QTest::newRow("header flood")
            << uploadHead + sized + lines + "\r\n" + upload << QByteArray("400 ") << QByteArray();
        const QByteArray named = form("fields.txt", report);
        QTest::newRow("upload named fields.txt")
            << uploadHead + "Content-Length: " + QByteArray::number(named.size()) + "\r\n\r\n" + named
            << QByteArray("200 OK") << QByteArray("fields.txt");
        const QByteArray wrongFirst = form("big.html", QByteArray(15000, 'x'), "v9orm", true);
        QTest::newRow("wrong access code before the file")
            << uploadHead + "Content-Length: " + QByteArray::number(wrongFirst.size()) + "\r\n\r\n"
                   + wrongFirst
            << QByteArray("403 ") << QByteArray();
    }

    void requests()
    {
        QFETCH(QByteArray, request);
        QFETCH(QByteArray, status);
        QFETCH(QByteArray, storedAs);
        const int before = m_server->uploadFolders().size();
        const QByteArray answer = exchange(request);
        const QByteArray statusLine = "HTTP/1.1 " + status;
        QVERIFY2(answer.startsWith(statusLine), answer.constData());
        QCOMPARE(m_server->uploadFolders().size(), before + (storedAs.isEmpty() ? 0 : 1));
        QCOMPARE(leftovers(), QStringList());
        if (!storedAs.isEmpty()) {
            const TestServer::Upload upload = m_server->upload(before);
            QCOMPARE(upload.storedAs, QString(storedAs));
            QCOMPARE(upload.file, QByteArray("<html>\xc3\xa4</html>\n"));
            QCOMPARE(upload.fields.value("domain"), QStringLiteral("c.d"));
        }
    }

    void slowClients()
    {
        // Four clients trickling their headers (more than the two workers)
        // beside a real upload; then the receiver stops while they go on.
        std::vector<std::unique_ptr<QSslSocket>> slow;
        for (int i = 0; i < 4; ++i)
            slow.push_back(connectTls());
        QTest::qWait(300);
        const QString report = m_server->scratchDir() + "/device_usage_statistics.html";
        QVERIFY(writeFile(report, "<html></html>\n"));
        QProcess vancurl;
        vancurl.start(Environment::stageDir() + "/bin/vancurl",
                      {"--cacert", m_server->caFile(), "-F", "file_loc=@" + report, "-F", "access=v9orn",
                       m_server->baseUrl() + "/upload"});
        QElapsedTimer timer;
        timer.start();
        for (int tick = 0; tick < 60 && vancurl.state() != QProcess::NotRunning; ++tick) {
            for (const auto &socket : slow)
                socket->write("P");
            QTest::qWait(200);
        }
        QVERIFY2(vancurl.exitCode() == 0, vancurl.readAllStandardError().constData());
        // Waiting for the slow clients' time-outs would take 8 s.
        QVERIFY2(timer.elapsed() < 5000, qPrintable(QString::number(timer.elapsed())));

        for (int i = 0; i < 4; ++i)
            slow.push_back(connectTls());
        QTest::qWait(500);
        timer.restart();
        QVERIFY(m_server->stop());
        QVERIFY2(timer.elapsed() < 3000, qPrintable(QString::number(timer.elapsed())));
    }
};

QTEST_GUILESS_MAIN(TestReceiver)
#include "tst_receiver.moc"
