#include "ProxyDiscovery.h"

#include "ProxySource.h"
#include "SystemProxySource.h"

#include "host/MsgManData.h"
#include "host/Settings.h"
#include "host/String.h"

#include <QCoreApplication>
#include <QSet>
#include <QThread>
#include <QTimer>
#include <QUrl>

namespace {

CrvC_ProxySource *installedSource = nullptr;

// The discovery objects alive, all on one thread (the host's GUI thread).
// When the library is unloaded or the process ends, the workers are ended
// before the code they run goes away.
struct LiveDiscoveries
{
    QSet<CrvC_ProxyDiscovery *> objects;
    ~LiveDiscoveries() { CrvC_ProxyDiscovery::stopAll(); }
};
LiveDiscoveries live;

} // namespace

CrvC_ProxyDiscovery::CrvC_ProxyDiscovery(QObject *parent) : QObject(parent)
{
    live.objects.insert(this);
}

CrvC_ProxyDiscovery::~CrvC_ProxyDiscovery()
{
    stop();
    live.objects.remove(this);
}

void CrvC_ProxyDiscovery::start(int limitMs)
{
    if (m_started || m_ended)
        return;
    m_started = true;
    QString proxy;
    if (storedChoice(&proxy)) {
        // Always after start() has returned, as when the system is asked.
        QMetaObject::invokeMethod(
            this, [this, proxy] { finish(proxy, false); }, Qt::QueuedConnection);
        return;
    }

    m_deadline = CrvC_ProxyDeadline(limitMs);
    m_limit = new QTimer(this);
    m_limit->setSingleShot(true);
    m_limit->setTimerType(Qt::PreciseTimer);
    connect(m_limit, &QTimer::timeout, this, [this] { finish(QString(), true); });
    m_limit->start(limitMs);

    const CrvC_ProxyDeadline deadline = m_deadline;
    CrvC_ProxySource *source = installedSource;
    m_worker = QThread::create([this, deadline, source] {
        QString proxy;
        if (source) {
            proxy = detectSystemProxy(*source);
        } else {
            CrvC_SystemProxySource system(deadline);
            proxy = detectSystemProxy(system);
        }
        // Once stopped, the object may be waiting for this thread: nothing
        // more is sent (a late answer is dropped by finish()).
        if (!deadline.isStopped())
            QMetaObject::invokeMethod(
                this, [this, proxy] { finish(proxy, false); }, Qt::QueuedConnection);
    });
    m_worker->start();
}

void CrvC_ProxyDiscovery::finish(const QString &proxy, bool gaveUp)
{
    if (m_ended)
        return;
    m_ended = true;
    if (m_limit)
        m_limit->stop();
    if (gaveUp) {
        // The worker ends its child processes and goes; it is waited for
        // when this object goes.
        m_deadline.stop();
        Port_MsgManData::debugStub("Proxy discovery gave no answer within %d ms: no proxy\n",
                                   int(m_limit->interval()));
    }
    emit finished(proxy);
}

void CrvC_ProxyDiscovery::stop()
{
    // The timer is left alone: this may run after the application object has
    // gone, and a late timeout finds the discovery ended.
    m_ended = true;
    m_deadline.stop();
    if (m_worker) {
        m_worker->wait();
        delete m_worker;
        m_worker = nullptr;
    }
    // An answer already posted would otherwise outlive the library's code.
    QCoreApplication::removePostedEvents(this, QEvent::MetaCall);
}

void CrvC_ProxyDiscovery::stopAll()
{
    for (CrvC_ProxyDiscovery *discovery : std::as_const(live.objects))
        discovery->stop();
}

QString CrvC_ProxyDiscovery::findProxy()
{
    if (installedSource)
        return findProxy(*installedSource);
    CrvC_SystemProxySource system{CrvC_ProxyDeadline(LimitMs)};
    return findProxy(system);
}

QString CrvC_ProxyDiscovery::findProxy(CrvC_ProxySource &source)
{
    QString proxy;
    if (storedChoice(&proxy))
        return proxy;
    return detectSystemProxy(source);
}

bool CrvC_ProxyDiscovery::storedChoice(QString *proxy)
{
    proxy->clear();
    const Gui::Clip::Settings settings(QStringLiteral("WebUpdate"), false, false, true);
    if (!settings.contains(QStringLiteral("ProxyChoice"))) {
        Port_MsgManData::debugStub("Did not get ProxyChoice entry.\n");
        return false;
    }

    bool isNumber = false;
    const int choice = settings.getValue(QStringLiteral("ProxyChoice")).toString().trimmed().toInt(&isNumber);
    // A value that is not a number is no choice of "no proxy": discover.
    if (!isNumber)
        return false;
    Port_MsgManData::debugStub("ProxyChoice: %d\n", choice);

    if (choice == 0)
        return true;
    if (choice == 2 && settings.contains(QStringLiteral("ProxyHost"))) {
        *proxy = settings.getValue(QStringLiteral("ProxyHost")).toString();
        if (settings.contains(QStringLiteral("ProxyPort")))
            *proxy += QLatin1Char(':') + settings.getValue(QStringLiteral("ProxyPort")).toString();
        Port_MsgManData::debugStub("Proxy Setting: %s\n", qUtf8Printable(*proxy));
        return true;
    }
    return false;
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
