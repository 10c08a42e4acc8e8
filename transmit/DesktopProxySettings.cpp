#include "DesktopProxySettings.h"

#include "ProxyDiscovery.h"
#include "ProxySource.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStandardPaths>
#include <QTextStream>

namespace {

const char *const GnomeSchema = "org.gnome.system.proxy";
const qint64 MaxKioslavercBytes = 1024 * 1024;

// gsettings prints one value per call; anything longer is not its answer.
const qint64 MaxGsettingsOutput = 64 * 1024;

// Runs gsettings with `arguments`; false when it cannot run, fails or is
// still running at the deadline.
bool runGsettings(const QString &program, const QStringList &arguments, const CrvC_ProxyDeadline &deadline,
                  QString *output)
{
    QByteArray printed;
    if (!deadline.run(program, arguments, &printed, MaxGsettingsOutput))
        return false;
    if (output)
        *output = QString::fromUtf8(printed).trimmed();
    return true;
}

} // namespace

CrvC_DesktopProxySettings CrvC_DesktopProxySettings::current(const CrvC_ProxyDeadline &deadline)
{
    const QString desktop = qEnvironmentVariable("XDG_CURRENT_DESKTOP");
    if (desktop.contains(QLatin1String("KDE"), Qt::CaseInsensitive))
        return fromKioslaverc(kioslavercPath());
    bool gnomeAvailable = false;
    const CrvC_DesktopProxySettings gnome = fromGnome(&gnomeAvailable, deadline);
    if (gnomeAvailable)
        return gnome;
    return fromKioslaverc(kioslavercPath());
}

CrvC_DesktopProxySettings CrvC_DesktopProxySettings::fromGnome(bool *available,
                                                               const CrvC_ProxyDeadline &deadline)
{
    if (available)
        *available = false;
    const QString program = QStandardPaths::findExecutable(QStringLiteral("gsettings"));
    if (program.isEmpty())
        return CrvC_DesktopProxySettings();
    const QString schema = QString::fromLatin1(GnomeSchema);
    const QString httpsSchema = schema + QLatin1String(".https");
    // list-keys fails when the schema is not installed; "get" would abort.
    if (!runGsettings(program, {QStringLiteral("list-keys"), schema}, deadline, nullptr))
        return CrvC_DesktopProxySettings();
    if (available)
        *available = true;

    QString mode, autoconfigUrl, host, port;
    auto get = [&](const QString &group, const char *key, QString *value) {
        runGsettings(program, {QStringLiteral("get"), group, QLatin1String(key)}, deadline, value);
    };
    get(schema, "mode", &mode);
    if (gsettingsValue(mode) == QLatin1String("auto")) {
        get(schema, "autoconfig-url", &autoconfigUrl);
    } else if (gsettingsValue(mode) == QLatin1String("manual")) {
        get(httpsSchema, "host", &host);
        get(httpsSchema, "port", &port);
    }
    return fromGnomeValues(mode, autoconfigUrl, host, port);
}

CrvC_DesktopProxySettings CrvC_DesktopProxySettings::fromGnomeValues(const QString &mode,
                                                                     const QString &autoconfigUrl,
                                                                     const QString &httpsHost,
                                                                     const QString &httpsPort)
{
    CrvC_DesktopProxySettings settings;
    const QString m = gsettingsValue(mode);
    if (m == QLatin1String("auto")) {
        settings.scriptUrl = gsettingsValue(autoconfigUrl);
        settings.flags =
            settings.scriptUrl.isEmpty() ? CrvC_ProxySource::AutoDetect : CrvC_ProxySource::ScriptAddress;
    } else if (m == QLatin1String("manual")) {
        const QString host = CrvC_ProxyDiscovery::hostAndPort(gsettingsValue(httpsHost));
        if (!host.isEmpty()) {
            const QString port = gsettingsValue(httpsPort);
            settings.manualProxy = host;
            // Port 0 is GNOME's "not set".
            if (port.toInt() > 0 && !host.contains(QLatin1Char(':')))
                settings.manualProxy += QLatin1Char(':') + QString::number(port.toInt());
            settings.flags = CrvC_ProxySource::ManualProxy;
        }
    }
    return settings;
}

QString CrvC_DesktopProxySettings::gsettingsValue(const QString &printed)
{
    QString value = printed.trimmed();
    // Typed forms such as "uint32 8080" or "@ms nothing".
    if (value.startsWith(QLatin1String("uint32 ")) || value.startsWith(QLatin1String("int32 ")))
        value = value.section(QLatin1Char(' '), 1);
    if (value.size() >= 2 && (value.startsWith(QLatin1Char('\'')) || value.startsWith(QLatin1Char('"')))
        && value.endsWith(value.at(0))) {
        value = value.mid(1, value.size() - 2);
        value.replace(QLatin1String("\\'"), QLatin1String("'"));
        value.replace(QLatin1String("\\\\"), QLatin1String("\\"));
    }
    return value;
}

QString CrvC_DesktopProxySettings::kioslavercPath()
{
    // The desktop's own location, also where Qt's test mode moves Qt's.
    QString config = qEnvironmentVariable("XDG_CONFIG_HOME");
    if (config.isEmpty())
        config = QDir::homePath() + QLatin1String("/.config");
    return config + QLatin1String("/kioslaverc");
}

CrvC_DesktopProxySettings CrvC_DesktopProxySettings::fromKioslaverc(const QString &path)
{
    CrvC_DesktopProxySettings settings;
    // Only a regular file of a sensible size: a pipe in its place would block.
    const QFileInfo info(path);
    if (!info.isFile() || info.size() > MaxKioslavercBytes)
        return settings;
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly | QIODevice::Text))
        return settings;

    QString group, type, script, httpsProxy, httpProxy;
    QTextStream in(&file);
    in.setEncoding(QStringConverter::Utf8);
    QString line;
    while (in.readLineInto(&line)) {
        line = line.trimmed();
        if (line.startsWith(QLatin1Char('['))) {
            group = line.mid(1, line.indexOf(QLatin1Char(']')) - 1);
            continue;
        }
        if (group != QLatin1String("Proxy Settings"))
            continue;
        const int eq = line.indexOf(QLatin1Char('='));
        if (eq <= 0)
            continue;
        QString key = line.left(eq).trimmed();
        // Localised or immutable variants: "key[$i]".
        if (key.contains(QLatin1Char('[')))
            key = key.left(key.indexOf(QLatin1Char('['))).trimmed();
        const QString value = line.mid(eq + 1).trimmed();
        if (key == QLatin1String("ProxyType"))
            type = value;
        else if (key == QLatin1String("Proxy Config Script"))
            script = value;
        else if (key == QLatin1String("httpsProxy"))
            httpsProxy = value;
        else if (key == QLatin1String("httpProxy"))
            httpProxy = value;
    }

    switch (type.toInt()) {
    case 1:
        settings.manualProxy = kdeProxyAddress(httpsProxy);
        if (settings.manualProxy.isEmpty())
            settings.manualProxy = kdeProxyAddress(httpProxy);
        if (!settings.manualProxy.isEmpty())
            settings.flags = CrvC_ProxySource::ManualProxy;
        break;
    case 2:
        settings.scriptUrl = script;
        if (!script.isEmpty())
            settings.flags = CrvC_ProxySource::ScriptAddress;
        break;
    case 3:
        settings.flags = CrvC_ProxySource::AutoDetect;
        break;
    default:
        break;
    }
    return settings;
}

QString CrvC_DesktopProxySettings::kdeProxyAddress(const QString &value)
{
    QString text = value.trimmed();
    // Newer KDE writes "scheme://host port", older "scheme://host:port".
    const int space = text.lastIndexOf(QLatin1Char(' '));
    QString port;
    if (space > 0) {
        port = text.mid(space + 1).trimmed();
        text = text.left(space).trimmed();
    }
    text = CrvC_ProxyDiscovery::hostAndPort(text);
    if (!text.isEmpty() && port.toInt() > 0 && !text.contains(QLatin1Char(':')))
        text += QLatin1Char(':') + QString::number(port.toInt());
    return text;
}
