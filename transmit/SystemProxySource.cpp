#include "SystemProxySource.h"

#include "MakerServer.h"
#include "ProxyDiscovery.h"
#include "ProxyScript.h"

#include "host/MsgManData.h"

#include <QUrl>

#include <netdb.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstring>
#include <string>
#include <vector>

namespace {

// One name lookup through glibc's asynchronous resolver, whose own thread
// does the waiting: the blocking resolver cannot be interrupted, and a DNS
// server that does not answer would hold discovery for its full timeouts.
struct NameLookup
{
    std::string name;
    addrinfo hints = {};
    gaicb request = {};
};

// The canonical name of `host` as the resolver gives it; empty when it gives
// none by the deadline.
QString canonicalName(const char *host, const CrvC_ProxyDeadline &deadline)
{
    auto *lookup = new NameLookup;
    lookup->name = host;
    lookup->hints.ai_family = AF_UNSPEC;
    lookup->hints.ai_flags = AI_CANONNAME;
    lookup->request.ar_name = lookup->name.c_str();
    lookup->request.ar_request = &lookup->hints;
    gaicb *list[] = {&lookup->request};
    if (getaddrinfo_a(GAI_NOWAIT, list, 1, nullptr) != 0) {
        delete lookup;
        return QString();
    }
    while (gai_error(&lookup->request) == EAI_INPROGRESS && !deadline.hasExpired()) {
        const timespec slice = {0, 50 * 1000 * 1000};
        gai_suspend(list, 1, &slice);
    }
    if (gai_error(&lookup->request) == EAI_INPROGRESS && gai_cancel(&lookup->request) != EAI_CANCELED) {
        // Still in the resolver's hands, which will write its answer here:
        // kept for good, reachable, rather than freed under it.
        static auto *abandoned = new std::vector<NameLookup *>;
        abandoned->push_back(lookup);
        return QString();
    }
    QString name;
    if (gai_error(&lookup->request) == 0 && lookup->request.ar_result) {
        const char *canonical = lookup->request.ar_result->ai_canonname;
        if (canonical && std::strchr(canonical, '.'))
            name = QString::fromLocal8Bit(canonical);
        freeaddrinfo(lookup->request.ar_result);
    }
    delete lookup;
    return name;
}

} // namespace

CrvC_SystemProxySource::CrvC_SystemProxySource(const CrvC_ProxyDeadline &deadline) : m_deadline(deadline)
{
}

QString CrvC_SystemProxySource::environmentProxy()
{
    return proxyFromEnvironment();
}

int CrvC_SystemProxySource::connectionFlags()
{
    return desktop().flags;
}

QString CrvC_SystemProxySource::autoDetectedScriptProxy()
{
    const CrvC_ProxyDeadline deadline = m_deadline.within(AutoDetectLimitMs);
    for (const QString &candidate : wpadCandidates(fullyQualifiedName(deadline))) {
        const QString answer = scriptAnswer(candidate, deadline);
        if (!answer.isEmpty())
            return answer;
    }
    return QString();
}

QString CrvC_SystemProxySource::configuredScriptProxy()
{
    return scriptAnswer(desktop().scriptUrl, m_deadline);
}

QString CrvC_SystemProxySource::manualProxy()
{
    return desktop().manualProxy;
}

QString CrvC_SystemProxySource::proxyFromEnvironment()
{
    static const char *const names[] = {"https_proxy", "HTTPS_PROXY", "http_proxy",
                                        "HTTP_PROXY",  "all_proxy",   "ALL_PROXY"};
    for (const char *name : names) {
        const QString value = qEnvironmentVariable(name).trimmed();
        if (value.isEmpty())
            continue;
        QString noProxy = qEnvironmentVariable("no_proxy");
        if (noProxy.trimmed().isEmpty())
            noProxy = qEnvironmentVariable("NO_PROXY");
        const QUrl server(CrvC_MakerServer::baseUrl());
        if (bypassesProxy(noProxy, server.host(), server.port(443)))
            return QStringLiteral("DIRECT"); // decided: no other source is asked
        return CrvC_ProxyDiscovery::hostAndPort(value);
    }
    return QString();
}

bool CrvC_SystemProxySource::bypassesProxy(const QString &noProxy, const QString &host, int port)
{
    const QString name = host.toLower();
    for (const QString &item : noProxy.split(QLatin1Char(','), Qt::SkipEmptyParts)) {
        QString entry = item.trimmed().toLower();
        if (entry == QLatin1String("*"))
            return true;
        QString portText;
        if (entry.startsWith(QLatin1Char('['))) { // [IPv6 address]:port
            const qsizetype close = entry.indexOf(QLatin1Char(']'));
            portText = entry.mid(close + 1);
            entry = entry.mid(1, close - 1);
        } else if (entry.count(QLatin1Char(':')) == 1) { // more than one: an IPv6 address alone
            portText = entry.mid(entry.indexOf(QLatin1Char(':')));
            entry.truncate(entry.indexOf(QLatin1Char(':')));
        }
        if (!portText.isEmpty() && portText != QLatin1Char(':') + QString::number(port))
            continue;
        if (entry.startsWith(QLatin1String("*.")))
            entry.remove(0, 1);
        if (entry.startsWith(QLatin1Char('.')))
            entry.remove(0, 1);
        if (!entry.isEmpty() && (name == entry || name.endsWith(QLatin1Char('.') + entry)))
            return true;
    }
    return false;
}

QStringList CrvC_SystemProxySource::wpadCandidates(const QString &fullyQualifiedName)
{
    QStringList labels = fullyQualifiedName.trimmed().toLower().split(QLatin1Char('.'), Qt::SkipEmptyParts);
    QStringList candidates;
    if (labels.isEmpty())
        return candidates;
    labels.removeFirst(); // the machine's own name
    while (labels.size() >= 2) {
        candidates << QLatin1String("http://wpad.") + labels.join(QLatin1Char('.'))
                          + QLatin1String("/wpad.dat");
        labels.removeFirst();
    }
    return candidates;
}

QString CrvC_SystemProxySource::fullyQualifiedName(const CrvC_ProxyDeadline &deadline)
{
    char host[256] = {0};
    if (gethostname(host, sizeof host - 1) != 0)
        return QString();
    const QString canonical = canonicalName(host, deadline);
    return canonical.isEmpty() ? QString::fromLocal8Bit(host) : canonical;
}

QString CrvC_SystemProxySource::scriptAnswer(const QString &scriptUrl,
                                             const CrvC_ProxyDeadline &deadline) const
{
    if (scriptUrl.isEmpty())
        return QString();
    const QString host = CrvC_MakerServer::host();
    const QString answer = CrvC_ProxyScript::run(scriptUrl, QLatin1String("http://") + host, host, deadline);
    Port_MsgManData::debugStub("Proxy script %s: %s\n", qUtf8Printable(scriptUrl), qUtf8Printable(answer));
    return answer;
}

const CrvC_DesktopProxySettings &CrvC_SystemProxySource::desktop()
{
    if (!m_desktopRead) {
        m_desktop = CrvC_DesktopProxySettings::current(m_deadline.within(DesktopLimitMs));
        m_desktopRead = true;
    }
    return m_desktop;
}
