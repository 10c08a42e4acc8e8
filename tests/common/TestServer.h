#pragma once

#include <QMap>
#include <QProcess>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>

#include <memory>

namespace CorvidTest {

// A throwaway certificate authority and a server certificate for 127.0.0.1
// and localhost, made with the openssl command in a folder of their own.
class TestCertificates
{
public:
    // Makes both in `dir`; false (and error()) when openssl fails. `caName`
    // tells two authorities apart.
    bool create(const QString &dir, const QString &caName = QStringLiteral("Corvid Test CA"));

    QString caFile() const { return m_dir + QLatin1String("/ca.crt"); }
    QString certFile() const { return m_dir + QLatin1String("/server.crt"); }
    QString keyFile() const { return m_dir + QLatin1String("/server.key"); }
    QString error() const { return m_error; }

private:
    bool openssl(const QStringList &arguments);
    QString m_dir;
    QString m_error;
};

// The staged corvid-receiver on 127.0.0.1 with a free port, its own
// certificates and its own data folder; stopped by stop() or the destructor.
// Point CORVID_SERVER at baseUrl() and the data file
// reports/ca-cert-bundle.crt at caFile() to send to it.
class TestServer
{
public:
    struct Upload
    {
        QByteArray file;               // the stored report, as received
        QString storedAs;              // its file name in the upload's folder
        QMap<QString, QString> fields; // @fields.txt: received, file_loc, domain, regid, access, ...
    };

    TestServer();
    ~TestServer();
    TestServer(const TestServer &) = delete;
    TestServer &operator=(const TestServer &) = delete;

    // Makes the certificates (first time only), starts the receiver with
    // `extraArguments` and waits for its "listening on" line; false (and
    // error()) when it does not come up.
    bool start(const QStringList &extraArguments = QStringList());
    // SIGTERM, then waits for the receiver to end; true when it ended cleanly.
    bool stop();

    // "https://127.0.0.1:PORT", the value for CORVID_SERVER.
    QString baseUrl() const { return m_baseUrl; }
    QString caFile() const { return m_certificates.caFile(); }
    QString dataDir() const;
    // A folder of the test's own, removed with the server.
    QString scratchDir() const;
    QString error() const { return m_error; }
    // What the receiver wrote so far (the listening line, one line per request).
    QString log();

    // The name of the fields file in each upload's folder.
    static QString fieldsFileName() { return QStringLiteral("@fields.txt"); }
    // The stored uploads, oldest first.
    QStringList uploadFolders() const;
    Upload upload(int index) const;

    // Puts <stage>/bin first in PATH, so that children started by bare name
    // (vancurl) are the staged ones.
    static void putStageBinFirstInPath();

private:
    std::unique_ptr<QTemporaryDir> m_dir;
    TestCertificates m_certificates;
    bool m_haveCertificates = false;
    std::unique_ptr<QProcess> m_process;
    QByteArray m_log;
    QString m_baseUrl;
    QString m_error;
};

} // namespace CorvidTest
