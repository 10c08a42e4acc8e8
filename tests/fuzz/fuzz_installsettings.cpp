// The install-wide settings file, found through the installation roots
// (VANTOR pointed into the private directory), and the collection switch
// that weighs it against a per-user choice kept there too.
#include "FuzzInput.h"

#include "project/CorvidSettings.h"

namespace {

bool isolate()
{
    const QString dir = CorvidFuzz::workDir();
    qputenv("VANTOR", (dir + QLatin1String("/root")).toLocal8Bit());
    qputenv("XDG_CONFIG_HOME", (dir + QLatin1String("/config")).toLocal8Bit());
    const QByteArray userChoice("[Corvid]\nCorvidTimeStamp=2024-03-01T10:00:00\nCollectDeviceUsage=true\n");
    CorvidFuzz::writeInput(QStringLiteral("config/orb/orb.ini"),
                           reinterpret_cast<const uint8_t *>(userChoice.constData()), size_t(userChoice.size()));
    return true;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    static const bool isolated = isolate();
    (void)isolated;
    CorvidFuzz::writeInput(QStringLiteral("root/data/reports/corvidsettings"), data, size);
    QString timestamp;
    bool collect = true;
    CrvC_Settings::readInstallSettings(timestamp, collect);
    CrvC_Settings::isCollectionEnabled();
    return 0;
}
