#include "Version.h"
#include "Env.h"
#include "Settings.h"

#include <QFile>
#include <QString>

namespace Port {
namespace {

// Reads the build values afresh: the file is small and read a few times per report.
std::vector<std::pair<QString, QString>> buildValues()
{
    std::vector<std::pair<QString, QString>> values;
    QFile file(QString::fromUtf8(Port_Env::GetDataFileName("orb_version").c_str()));
    if (!file.open(QIODevice::ReadOnly | QIODevice::Text))
        return values;
    while (!file.atEnd()) {
        const QString line = QString::fromUtf8(file.readLine()).trimmed();
        const qsizetype eq = line.indexOf(QLatin1Char('='));
        if (line.isEmpty() || line.startsWith(QLatin1Char('#')) || eq <= 0)
            continue;
        values.emplace_back(line.left(eq).trimmed(), line.mid(eq + 1).trimmed());
    }
    return values;
}

} // namespace

StringBase Version::getValue(const char *key)
{
    const QString wanted = QString::fromUtf8(key ? key : "");
    QString value;
    for (const auto &kv : buildValues()) {
        if (kv.first == wanted)
            value = kv.second; // a later line wins
    }
    return StringBase(value.toStdString());
}

const char *const UserInformation::NoInformationText = "No user information available.";

StringBase UserInformation::getRegistrationText()
{
    Gui::Clip::Settings settings("UserInformation", false, false, true);
    const QString text = settings.getValue("Registration", QString()).toString();
    return StringBase(text.isEmpty() ? std::string(NoInformationText) : text.toStdString());
}

StringBase UserInformation::getProductConfigurationLabel(const char *targetDevice)
{
    const QString device = QString::fromUtf8(targetDevice ? targetDevice : "");
    static const QLatin1String prefix("configuration.");
    QString label;
    qsizetype best = -1;
    for (const auto &kv : buildValues()) {
        if (!kv.first.startsWith(prefix))
            continue;
        const QString devicePrefix = kv.first.mid(prefix.size());
        if (devicePrefix.size() > best && device.startsWith(devicePrefix, Qt::CaseInsensitive)) {
            best = devicePrefix.size();
            label = kv.second;
        }
    }
    return StringBase(label.toStdString());
}

} // namespace Port
