#include "PreferenceValues.h"

#include "CorvidSettings.h"

#include <QVariant>

CrvC_PreferenceValues::Values CrvC_PreferenceValues::load()
{
    Values values;
    values.collect = CrvC_Settings::isCollectionEnabled();
    values.collectSetByInstallation = CrvC_Settings::collectionSetByInstallation();
    values.dontShowProgress = CrvC_Settings::dontShowSendProgressDlg();
    values.useSsl = CrvC_Settings::useSsl();
    values.emailTool = CrvC_Settings::selectedEmailTool();
    return values;
}

void CrvC_PreferenceValues::apply(const Values &loaded, const Values &shown, const QDateTime &now)
{
    CrvC_Settings::setValue(CrvC_Settings::CollectDeviceUsage, shown.collect);
    CrvC_Settings::setValue(CrvC_Settings::CorvidTimeStamp, now.toString(Qt::ISODate));
    CrvC_Settings::setValue(CrvC_Settings::DontShowSendProgressDlg, shown.dontShowProgress);
    if (shown.useSsl != loaded.useSsl)
        CrvC_Settings::setValue(CrvC_Settings::UseSSL, shown.useSsl);
    if (shown.emailTool != loaded.emailTool)
        CrvC_Settings::setValue(CrvC_Settings::SelectedEmailTool, shown.emailTool);
}

QStringList CrvC_PreferenceValues::mailListOrder(const QStringList &tools)
{
    // Each name goes on top of the list, so the preferred program, which
    // comes first, ends up last.
    QStringList order;
    for (const QString &tool : tools) {
        if (!order.contains(tool))
            order.prepend(tool);
    }
    return order;
}
