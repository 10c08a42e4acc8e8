#pragma once

#include <QObject>
#include <QProcess>
#include <QString>
#include <QStringList>

#include "transmit/SendRecorder.h"

#include <memory>

class QEventLoopLocker;
class QIODevice;

// Sends the report to the maker over HTTPS through the transfer tool vancurl:
// a lookup of the current upload address at the maker's redirect service,
// then the form upload. Create it with new, call SendFile once and forget it:
// it deletes itself. Every send is recorded in the send history
// (CrvC_SendRecorder) from before the lookup to its outcome. A lookup or
// upload that fails warns the user and offers the e-mail method
// (CrvC_UserNotice), except when it retried a recorded failure. The
// application is kept running (QEventLoopLocker) until the upload has ended.
class CrvC_SendUsingSSL : public QObject
{
    Q_OBJECT
public:
    static const char *const ProgramName;  // "vancurl", found through PATH
    static const char *const AccessCode;   // the upload form's fixed access code
    static const char *const RedirectPath; // path and query of the redirect service
    static const char *const CaBundle;     // data file with the trusted authorities
    static const char *const FailureText;  // the warning after a failed send

    // Takes the proxy from CrvC_ProxyDiscovery::findProxy().
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
    // The lookup's arguments: [--proxy P] --cacert BUNDLE REDIRECT_URL.
    QStringList redirectArguments() const;
    // The upload's arguments: [--proxy P] --cacert BUNDLE, the four -F fields
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

    // The cause of a failed lookup or upload for the user, from vancurl's
    // exit status (NotStarted: it could not be run) and its error output.
    static QString failureCause(bool lookup, int exitStatus, const QByteArray &errors);

private:
    static constexpr int NotStarted = -2;

    void lookupFailedToStart();
    void startUpload(const QString &address);
    static int exitStatusOf(const QProcess *process);
    // Records the failure; a send the user started also gets the warning
    // and the offer of the e-mail method.
    static void reportFailure(const CrvC_SendRecorder::Ticket &ticket, const QString &cause, int exitStatus,
                              const QByteArray &errors);

    QString m_proxy;
    QString m_reportFile;
    QProcess *m_lookupProcess = nullptr;
    bool m_ended = false;
    std::shared_ptr<QEventLoopLocker> m_keepAlive;
    CrvC_SendRecorder::Ticket m_ticket;
};
