#include "CorvidSettings.h"

#include "host/Identifier.h"
#include "host/InputFile.h"
#include "host/Settings.h"
#include "host/VantorPath.h"

#include <QDateTime>
#include <QFile>
#include <QTextStream>
#include <QUuid>

const char *const CrvC_Settings::Group = "Corvid";
const char *const CrvC_Settings::CollectDeviceUsage = "CollectDeviceUsage";
const char *const CrvC_Settings::CorvidTimeStamp = "CorvidTimeStamp";
const char *const CrvC_Settings::DontShowSendProgressDlg = "DontShowSendProgressDlg";
const char *const CrvC_Settings::UseSSL = "UseSSL";
const char *const CrvC_Settings::DontShowSendToDlg = "DontShowSendToDlg";
const char *const CrvC_Settings::SelectedEmailTool = "SelectedEmailTool";
const char *const CrvC_Settings::RandomID = "RandomID";

QVariant CrvC_Settings::value(const char *key, const QVariant &defaultValue)
{
    const Gui::Clip::Settings settings(QString::fromLatin1(Group), true, true, true);
    return settings.getValue(QString::fromLatin1(key), defaultValue);
}

void CrvC_Settings::setValue(const char *key, const QVariant &value)
{
    Gui::Clip::Settings settings(QString::fromLatin1(Group), true, true, true);
    settings.setValue(QString::fromLatin1(key), value);
}

void CrvC_Settings::readInstallSettings(QString &timestamp, bool &collect, bool *collectFound)
{
    QString path;
    for (const std::string &root : Port::VantorPath::GetInstance()) {
        const std::string candidate = root + "/data/reports/corvidsettings";
        if (Port::File::exist(candidate)) {
            path = QString::fromStdString(candidate);
            break;
        }
    }
    if (path.isEmpty())
        return;
    Port::InputFile file;
    if (file.open(path, Port::InputFile::InstallSettings) != Port::InputFile::Status::Opened)
        return;
    QString fileStamp = timestamp;
    bool fileCollect = collect;
    bool fileSetsCollect = false;
    QTextStream in(&file);
    in.setEncoding(QStringConverter::Utf8);
    QString line;
    while (in.readLineInto(&line)) {
        const QStringList parts = line.split(QLatin1Char('='));
        if (parts.size() < 2)
            continue;
        // An administrator's "CollectUsageStatistics = false" must not be
        // lost to a capital or a blank: keys are trimmed and compared without
        // regard to case, and so is the stamp. The switch itself stays on
        // only for the exact value "true", so a doubtful value turns it off.
        const QString key = parts.at(0).trimmed();
        if (key.compare(QLatin1String("collectusagestatistics"), Qt::CaseInsensitive) == 0) {
            fileCollect = parts.at(1) == QLatin1String("true");
            fileSetsCollect = true;
        } else if (key.compare(QLatin1String("timestamp"), Qt::CaseInsensitive) == 0) {
            fileStamp = parts.at(1).trimmed();
        }
    }
    if (!file.refused()) {
        timestamp = fileStamp;
        collect = fileCollect;
        if (collectFound && fileSetsCollect)
            *collectFound = true;
    }
}

namespace {

// The effective collection switch; `byInstallation` tells whether the
// install-wide file's switch decided it.
bool collectionDecision(bool &byInstallation)
{
    bool installCollect = true;
    bool installSetsCollect = false;
    QString installStamp;
    CrvC_Settings::readInstallSettings(installStamp, installCollect, &installSetsCollect);

    const QString userStamp = CrvC_Settings::corvidTimeStamp();
    bool installWins = userStamp.isEmpty();
    if (!installWins && !installStamp.isEmpty()) {
        const QDateTime install = QDateTime::fromString(installStamp, Qt::ISODate);
        const QDateTime user = QDateTime::fromString(userStamp, Qt::ISODate);
        installWins = !(install < user);
    }
    byInstallation = installWins && installSetsCollect;
    return installWins ? installCollect : CrvC_Settings::collectDeviceUsage();
}

} // namespace

bool CrvC_Settings::isCollectionEnabled()
{
    bool byInstallation = false;
    return collectionDecision(byInstallation);
}

bool CrvC_Settings::collectionSetByInstallation()
{
    bool byInstallation = false;
    collectionDecision(byInstallation);
    return byInstallation;
}

bool CrvC_Settings::collectDeviceUsage()
{
    return value(CollectDeviceUsage, true).toBool();
}

QString CrvC_Settings::corvidTimeStamp()
{
    return value(CorvidTimeStamp, QString()).toString();
}

bool CrvC_Settings::dontShowSendProgressDlg()
{
    return value(DontShowSendProgressDlg, false).toBool();
}

bool CrvC_Settings::useSsl()
{
    return value(UseSSL, true).toBool();
}

bool CrvC_Settings::dontShowSendToDlg(bool defaultValue)
{
    return value(DontShowSendToDlg, defaultValue).toBool();
}

QString CrvC_Settings::selectedEmailTool()
{
    return value(SelectedEmailTool, QString()).toString();
}

QString CrvC_Settings::newIdentifier()
{
    return Port::Identifier::newIdentifier();
}

QString CrvC_Settings::randomId(bool keep)
{
    QString id = value(RandomID, QString()).toString();
    if (id.isEmpty()) {
        id = newIdentifier();
        if (keep)
            setValue(RandomID, id);
    }
    return id;
}
