#pragma once

#include "ProxyDeadline.h"

#include <QObject>
#include <QString>

class CrvC_ProxySource;
class QThread;
class QTimer;

// Finds the proxy for the transfers to the maker's server: the user's stored
// choice in the host's "WebUpdate" settings first, then the system's proxy
// settings. The answer is one proxy entry ("host:port") or empty for none.
//
// The system's settings may mean child processes, DNS and downloads, so an
// object of this class asks them on a worker thread: start() returns at once
// and finished() follows on the object's thread within LimitMs, with an empty
// answer (a direct connection) when the discovery has not ended by then.
// Deleting the object, or stopAll() (run when the library is unloaded or the
// process ends), ends a discovery under way at once: its child processes are
// killed and finished() does not come. The static functions do the same work
// synchronously, for tools and tests.
class CrvC_ProxyDiscovery : public QObject
{
    Q_OBJECT
public:
    // The whole discovery; each system step has a shorter limit of its own
    // (CrvC_SystemProxySource).
    static const int LimitMs = 10000;

    explicit CrvC_ProxyDiscovery(QObject *parent = nullptr);
    ~CrvC_ProxyDiscovery() override;

    // Reads the stored choice on this thread and, when the system is to be
    // asked, starts the worker. Call once; `limitMs` replaces LimitMs.
    void start(int limitMs = LimitMs);
    // Ends a discovery under way and waits for its worker; no finished().
    void stop();
    // stop() for every object of this class.
    static void stopAll();

    // Never fails; empty means a direct connection. Asks the source installed
    // with setSource, or the running system.
    static QString findProxy();
    // The same with an explicit source for the system's settings.
    static QString findProxy(CrvC_ProxySource &source);

    // The user's stored choice: true when it decides (no proxy, or the stored
    // host and port, in `proxy`); false when the system is to be asked.
    static bool storedChoice(QString *proxy);

    // The system steps in order; the first non-empty answer wins and is
    // cleaned up to one entry.
    static QString detectSystemProxy(CrvC_ProxySource &source);

    // One entry of a proxy list or a script answer: "PROXY h:8080; DIRECT"
    // gives "h:8080", "h1:8080;h2:8080" gives "h1:8080". A "DIRECT" answer
    // gives an empty text (no proxy).
    static QString cleanUp(const QString &text);

    // "http://user@h:3128/" gives "h:3128"; text that is not a URL is
    // returned trimmed.
    static QString hostAndPort(const QString &text);

    // Installs the source that findProxy() and start() ask instead of the
    // system (not owned; nullptr restores the system). For tests and
    // embedders; start() asks it on the worker thread.
    static void setSource(CrvC_ProxySource *source);

Q_SIGNALS:
    // The proxy to use ("host:port"), empty for a direct connection.
    void finished(const QString &proxy);

private:
    void finish(const QString &proxy, bool gaveUp);

    CrvC_ProxyDeadline m_deadline;
    QThread *m_worker = nullptr;
    QTimer *m_limit = nullptr;
    bool m_started = false;
    bool m_ended = false;
};
