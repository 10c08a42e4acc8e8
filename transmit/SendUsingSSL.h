#pragma once

#include "transmit/SendFailure.h"
#include "transmit/SendRecorder.h"

#include <QObject>
#include <QProcess>
#include <QString>
#include <QStringList>

#include <memory>

class CrvC_ProxyDiscovery;
class QEventLoopLocker;
class QIODevice;

// Sends the report to the maker over HTTPS through the transfer tool vancurl:
// a lookup of the current upload address at the maker's redirect service,
// then the form upload. Create it with new, call SendFile once and forget it:
// it deletes itself. Every send is recorded in the send history
// (CrvC_SendRecorder) from before the proxy is found to its outcome. A lookup
// or upload that fails warns the user and offers the e-mail method
// (CrvC_UserNotice), with the cause beneath the warning (CrvC_SendFailure),
// unless it was a retry of a recorded failure. The application is kept
// running (QEventLoopLocker) until the upload has ended.
class CrvC_SendUsingSSL : public QObject
{
    Q_OBJECT
public:
    static const char *const ProgramName;    // "vancurl", found through PATH
    static const char *const AccessCode;     // the upload form's fixed access code
    static const char *const RedirectPath;   // path and query of the redirect service
    static const char *const CaBundle;       // data file with the trusted authorities
    static const char *const SystemCaBundle; // the system's trust store (Debian's ca-certificates)
    static const char *const FailureText;    // the warning after a failed send

    // Finds the proxy with CrvC_ProxyDiscovery when SendFile is called, in
    // the background; the lookup starts with its answer.
    CrvC_SendUsingSSL();
    // Uses `proxy` ("host:port", empty for none) without any discovery.
    explicit CrvC_SendUsingSSL(const QString &proxy);
    ~CrvC_SendUsingSSL() override;

    // Makes this send a further attempt of a history entry instead of a new
    // entry (retries); call before SendFile.
    void setTicket(CrvC_SendRecorder::Ticket ticket) { m_ticket = std::move(ticket); }

    // Starts the lookup for the report at the absolute path `file`.
    void SendFile(const QString &file);

    QString proxy() const { return m_proxy; }
    // The authorities the server's certificate is checked against: the
    // installation's CaBundle when it exists, else the system's trust store
    // (the file that SSL_CERT_FILE names, else SystemCaBundle). Empty when
    // there is none of them: vancurl then uses libcurl's built-in default.
    // Verification is never switched off.
    static QString caBundlePath();
    // The lookup's arguments: [--proxy P] [--cacert BUNDLE] REDIRECT_URL.
    QStringList redirectArguments() const;
    // The upload's arguments: [--proxy P] [--cacert BUNDLE], the four -F fields
    // (file_loc, domain, regid, access), then `url`.
    QStringList uploadArguments(const QString &url) const;

    // The redirect service's address: always https, on the maker's server.
    static QString redirectUrl();
    // The upload address in the lookup's output: taken from the first line
    // holding "URL=http", up to the next quotation mark (or the line's end).
    // Empty when there is none or it is not a valid https address, so that a
    // report never travels unencrypted.
    static QString uploadAddress(QIODevice *output);
    static QString uploadAddress(const QByteArray &output);

    // The last two labels of the machine's fully qualified DNS name.
    static QString domainName();
    // The last two labels of `name` ("a.b.c.d" gives "c.d"); the whole name
    // when it has fewer than two dots.
    static QString lastTwoLabels(const QString &name);
    // The host's registration text, else the build value "Registration_ID".
    static QString registrationId();

public Q_SLOTS:
    // Runs when the lookup has finished: starts the upload or reports the
    // failure, then schedules the object's deletion.
    void LaunchSSLProcess();

private:
    void lookupFailedToStart();
    void startUpload(const QString &address);
    CrvC_SendFailure::Run lookupRun() const;
    static int exitStatusOf(const QProcess *process);
    // Records the failure; a send the user started also gets the warning
    // and the offer of the e-mail method.
    static void reportFailure(const CrvC_SendRecorder::Ticket &ticket, const CrvC_SendFailure::Run &run);

    QString m_proxy;
    bool m_proxyKnown = true;
    CrvC_ProxyDiscovery *m_discovery = nullptr;
    QString m_reportFile;
    QProcess *m_lookupProcess = nullptr;
    bool m_ended = false;
    std::shared_ptr<QEventLoopLocker> m_keepAlive;
    CrvC_SendRecorder::Ticket m_ticket;
};
