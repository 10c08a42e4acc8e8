// The install-wide settings file, found through the installation roots, and
// the collection switch that weighs it against a per-user choice.
#include "FuzzInput.h"

#include "project/CorvidSettings.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    static const bool isolated = [] {
        const QString dir = CorvidFuzz::workDir();
        qputenv("VANTOR", QFile::encodeName(dir + QLatin1String("/root")));
        qputenv("XDG_CONFIG_HOME", QFile::encodeName(dir + QLatin1String("/config")));
        CorvidFuzz::writeInput(QStringLiteral("config/orb/orb.ini"),
                               "[Corvid]\nCorvidTimeStamp=2024-03-01T10:00:00\nCollectDeviceUsage=true\n");
        return true;
    }();
    (void)isolated;
    CorvidFuzz::writeInput(QStringLiteral("root/data/reports/corvidsettings"), data, size);
    QString timestamp;
    bool collect = true;
    CrvC_Settings::readInstallSettings(timestamp, collect);
    CrvC_Settings::isCollectionEnabled();
    return 0;
}
