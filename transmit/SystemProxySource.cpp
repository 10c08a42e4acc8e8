#include "SystemProxySource.h"

#include "MakerServer.h"
#include "ProxyDiscovery.h"
#include "ProxyScript.h"

#include "host/MsgManData.h"

#include <netdb.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstring>

CrvC_SystemProxySource::CrvC_SystemProxySource() = default;

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
    for (const QString &candidate : wpadCandidates(fullyQualifiedName())) {
        const QString answer = scriptAnswer(candidate);
        if (!answer.isEmpty())
            return answer;
    }
    return QString();
}

QString CrvC_SystemProxySource::configuredScriptProxy()
{
    return scriptAnswer(desktop().scriptUrl);
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
        if (!value.isEmpty())
            return CrvC_ProxyDiscovery::hostAndPort(value);
    }
    return QString();
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

QString CrvC_SystemProxySource::fullyQualifiedName()
{
    char host[256] = {0};
    if (gethostname(host, sizeof host - 1) != 0)
        return QString();
    QString name = QString::fromLocal8Bit(host);
    addrinfo hints;
    std::memset(&hints, 0, sizeof hints);
    hints.ai_family = AF_UNSPEC;
    hints.ai_flags = AI_CANONNAME;
    addrinfo *info = nullptr;
    if (getaddrinfo(host, nullptr, &hints, &info) == 0 && info) {
        if (info->ai_canonname && std::strchr(info->ai_canonname, '.'))
            name = QString::fromLocal8Bit(info->ai_canonname);
        freeaddrinfo(info);
    }
    return name;
}

QString CrvC_SystemProxySource::scriptAnswer(const QString &scriptUrl) const
{
    if (scriptUrl.isEmpty())
        return QString();
    const QString host = CrvC_MakerServer::host();
    const QString answer = CrvC_ProxyScript::run(scriptUrl, QLatin1String("http://") + host, host);
    Port_MsgManData::debugStub("Proxy script %s: %s\n", qUtf8Printable(scriptUrl), qUtf8Printable(answer));
    return answer;
}

const CrvC_DesktopProxySettings &CrvC_SystemProxySource::desktop()
{
    if (!m_desktopRead) {
        m_desktop = CrvC_DesktopProxySettings::current();
        m_desktopRead = true;
    }
    return m_desktop;
}
