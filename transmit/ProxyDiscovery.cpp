#include "ProxyDiscovery.h"

#include "ProxySource.h"
#include "SystemProxySource.h"

#include "host/MsgManData.h"
#include "host/Settings.h"
#include "host/String.h"

#include <QUrl>

namespace {

CrvC_ProxySource *installedSource = nullptr;

} // namespace

QString CrvC_ProxyDiscovery::findProxy()
{
    if (installedSource)
        return findProxy(*installedSource);
    CrvC_SystemProxySource system;
    return findProxy(system);
}

QString CrvC_ProxyDiscovery::findProxy(CrvC_ProxySource &source)
{
    const Gui::Clip::Settings settings(QStringLiteral("WebUpdate"), false, false, true);
    if (!settings.contains(QStringLiteral("ProxyChoice"))) {
        Port_MsgManData::debugStub("Did not get ProxyChoice entry.\n");
        return detectSystemProxy(source);
    }

    bool isNumber = false;
    const int choice = settings.getValue(QStringLiteral("ProxyChoice")).toString().trimmed().toInt(&isNumber);
    // A value that is not a number is no choice of "no proxy": discover.
    if (!isNumber)
        return detectSystemProxy(source);
    Port_MsgManData::debugStub("ProxyChoice: %d\n", choice);

    if (choice == 0)
        return QString();
    if (choice == 2 && settings.contains(QStringLiteral("ProxyHost"))) {
        QString text = settings.getValue(QStringLiteral("ProxyHost")).toString();
        if (settings.contains(QStringLiteral("ProxyPort")))
            text += QLatin1Char(':') + settings.getValue(QStringLiteral("ProxyPort")).toString();
        Port_MsgManData::debugStub("Proxy Setting: %s\n", qUtf8Printable(text));
        return text;
    }
    return detectSystemProxy(source);
}

QString CrvC_ProxyDiscovery::detectSystemProxy(CrvC_ProxySource &source)
{
    QString text = source.environmentProxy();
    if (text.isEmpty() && (source.connectionFlags() & CrvC_ProxySource::AutoDetect))
        text = source.autoDetectedScriptProxy();
    if (text.isEmpty() && (source.connectionFlags() & CrvC_ProxySource::ScriptAddress))
        text = source.configuredScriptProxy();
    if (text.isEmpty() && (source.connectionFlags() & CrvC_ProxySource::ManualProxy))
        text = source.manualProxy();
    return cleanUp(text);
}

QString CrvC_ProxyDiscovery::cleanUp(const QString &text)
{
    Port::StringBase entry = Gui::Clip::String::convert(text);
    entry.Reduce(";", Port::StringBase::WholeDelimiter);
    // Blanks before the keyword would otherwise be taken for the entry.
    entry.Trim(" \t", Port::StringBase::TrimBoth);
    entry.Reduce("PROXY", Port::StringBase::WholeDelimiter);
    entry.Trim(" \t", Port::StringBase::TrimBoth);
    const QString result = Gui::Clip::String::convert(entry);
    // A script's "DIRECT" means no proxy; passed on it would name a proxy
    // host "DIRECT" and every transfer would fail.
    if (result.compare(QLatin1String("DIRECT"), Qt::CaseInsensitive) == 0)
        return QString();
    return result;
}

QString CrvC_ProxyDiscovery::hostAndPort(const QString &text)
{
    const QString trimmed = text.trimmed();
    if (!trimmed.contains(QLatin1String("://")))
        return trimmed;
    const QUrl url(trimmed);
    if (!url.isValid() || url.host().isEmpty())
        return QString();
    QString host = url.host();
    if (host.contains(QLatin1Char(':')))
        host = QLatin1Char('[') + host + QLatin1Char(']'); // IPv6 literal
    if (url.port() > 0)
        host += QLatin1Char(':') + QString::number(url.port());
    return host;
}

void CrvC_ProxyDiscovery::setSource(CrvC_ProxySource *source)
{
    installedSource = source;
}
