#include "TestServer.h"

#include "TestEnvironment.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QFile>
#include <QRandomGenerator>

namespace CorvidTest {

bool TestCertificates::openssl(const QStringList &arguments)
{
    QProcess process;
    process.setWorkingDirectory(m_dir);
    process.setProcessChannelMode(QProcess::MergedChannels);
    process.start(QStringLiteral("openssl"), arguments);
    if (!process.waitForFinished(60000) || process.exitStatus() != QProcess::NormalExit
        || process.exitCode() != 0) {
        m_error = QLatin1String("openssl ") + arguments.join(QLatin1Char(' ')) + QLatin1String(": ")
                  + (process.error() == QProcess::FailedToStart ? QStringLiteral("cannot start openssl")
                                                                : QString::fromLocal8Bit(process.readAll()));
        return false;
    }
    return true;
}

bool TestCertificates::create(const QString &dir, const QString &caName)
{
    m_dir = dir;
    m_error.clear();
    QDir().mkpath(dir);
    if (!writeFile(dir + QLatin1String("/server.ext"),
                   "subjectAltName=IP:127.0.0.1,DNS:localhost\nbasicConstraints=CA:FALSE\n"
                   "extendedKeyUsage=serverAuth\n")) {
        m_error = QStringLiteral("cannot write in ") + dir;
        return false;
    }
    const QString key = QStringLiteral("-newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes ");
    const QString serial = QString::number(QRandomGenerator::global()->generate64() >> 1, 16);
    auto words = [](const QString &line) { return line.split(QLatin1Char(' ')); };
    return openssl(words(QLatin1String("req -x509 ") + key
                         + QLatin1String(
                             "-days 2 -keyout ca.key -out ca.crt -addext basicConstraints=critical,CA:TRUE "
                             "-addext keyUsage=critical,keyCertSign,cRLSign -subj"))
                   << QLatin1String("/CN=") + caName)
           && openssl(words(QLatin1String("req -new ") + key
                            + QLatin1String("-keyout server.key -out server.csr -subj /CN=127.0.0.1")))
           && openssl(words(QLatin1String("x509 -req -in server.csr -CA ca.crt -CAkey ca.key -days 2 "
                                          "-extfile server.ext -out server.crt -set_serial 0x")
                            + serial));
}

TestServer::TestServer() : m_dir(new QTemporaryDir)
{
}

TestServer::~TestServer()
{
    stop();
}

QString TestServer::dataDir() const
{
    return m_dir->path() + QLatin1String("/received");
}

QString TestServer::scratchDir() const
{
    QDir().mkpath(m_dir->path() + QLatin1String("/scratch"));
    return m_dir->path() + QLatin1String("/scratch");
}

bool TestServer::start(const QStringList &extraArguments)
{
    stop();
    m_error.clear();
    m_log.clear();
    m_baseUrl.clear();
    if (!m_haveCertificates) {
        if (!m_certificates.create(m_dir->path() + QLatin1String("/certs"))) {
            m_error = m_certificates.error();
            return false;
        }
        m_haveCertificates = true;
    }
    m_process.reset(new QProcess);
    m_process->setProcessChannelMode(QProcess::MergedChannels);
    m_process->start(Environment::stageDir() + QLatin1String("/bin/corvid-receiver"),
                     QStringList{"--listen", "127.0.0.1", "--port", "0", "--data", dataDir(), "--cert",
                                 m_certificates.certFile(), "--key", m_certificates.keyFile()}
                         + extraArguments);
    if (!m_process->waitForStarted(10000)) {
        m_error = QStringLiteral("cannot start corvid-receiver: ") + m_process->errorString();
        m_process.reset();
        return false;
    }
    const QDeadlineTimer deadline(20000);
    while (!m_log.contains('\n') && !deadline.hasExpired() && m_process->state() == QProcess::Running) {
        m_process->waitForReadyRead(int(qMax<qint64>(1, deadline.remainingTime())));
        m_log += m_process->readAll();
    }
    const QString first = QString::fromUtf8(m_log.left(m_log.indexOf('\n')));
    static const QLatin1String prefix("listening on ");
    if (!first.startsWith(prefix)) {
        m_error = QStringLiteral("corvid-receiver did not come up: ") + QString::fromUtf8(m_log);
        stop();
        return false;
    }
    m_baseUrl = first.mid(prefix.size()).trimmed();
    return true;
}

bool TestServer::stop()
{
    if (!m_process)
        return false;
    bool clean = false;
    if (m_process->state() != QProcess::NotRunning) {
        m_process->terminate();
        if (!m_process->waitForFinished(10000)) {
            m_process->kill();
            m_process->waitForFinished(5000);
        } else {
            clean = m_process->exitStatus() == QProcess::NormalExit && m_process->exitCode() == 0;
        }
    }
    m_log += m_process->readAll();
    m_process.reset();
    return clean;
}

QString TestServer::log()
{
    // The receiver's lines are only collected when waited for.
    if (m_process) {
        m_log += m_process->readAll();
        while (m_process->waitForReadyRead(200))
            m_log += m_process->readAll();
    }
    return QString::fromUtf8(m_log);
}

QStringList TestServer::uploadFolders() const
{
    QStringList folders;
    const QStringList names = QDir(dataDir()).entryList(QDir::Dirs | QDir::NoDotAndDotDot, QDir::Name);
    for (const QString &name : names)
        folders << dataDir() + QLatin1Char('/') + name;
    return folders;
}

TestServer::Upload TestServer::upload(int index) const
{
    Upload upload;
    const QStringList folders = uploadFolders();
    if (index < 0 || index >= folders.size())
        return upload;
    const QString folder = folders.at(index);
    const QList<QByteArray> lines = readFile(folder + QLatin1Char('/') + fieldsFileName()).split('\n');
    for (const QByteArray &line : lines) {
        const int eq = line.indexOf('=');
        if (eq > 0)
            upload.fields.insert(QString::fromUtf8(line.left(eq)),
                                 QString::fromUtf8(QByteArray::fromPercentEncoding(line.mid(eq + 1))));
    }
    upload.storedAs = upload.fields.value(QStringLiteral("stored_as"));
    if (!upload.storedAs.isEmpty())
        upload.file = readFile(folder + QLatin1Char('/') + upload.storedAs);
    return upload;
}

void TestServer::putStageBinFirstInPath()
{
    const QByteArray bin = QFile::encodeName(Environment::stageDir() + QLatin1String("/bin"));
    const QByteArray path = qgetenv("PATH");
    const QByteArray first = bin + QByteArray(":");
    if (!path.startsWith(first))
        qputenv("PATH", path.isEmpty() ? bin : QByteArray(first + path));
}

} // namespace CorvidTest
