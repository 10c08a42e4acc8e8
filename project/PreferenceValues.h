#pragma once

#include <QDateTime>
#include <QString>
#include <QStringList>

// What Corvid's preference page shows and stores, without widgets: the
// collection switch (as the effective decision of the user and the
// installation), the send progress dialog flag, the send method and the mail
// program.
class CrvC_PreferenceValues
{
public:
    struct Values
    {
        bool collect = true;
        bool dontShowProgress = false;
        bool useSsl = true;
        QString emailTool;
        bool collectSetByInstallation = false; // shown, never stored
    };

    // The values the page opens with: isCollectionEnabled (and whether the
    // install-wide file decided it), "DontShowSendProgressDlg", "UseSSL" and
    // "SelectedEmailTool".
    static Values load();

    // What apply stores: "CollectDeviceUsage", "CorvidTimeStamp" (`now`, ISO
    // form, which makes the user's choice newer than the install-wide file)
    // and "DontShowSendProgressDlg" always; "UseSSL" and "SelectedEmailTool"
    // only when they differ from `loaded`.
    static void apply(const Values &loaded, const Values &shown,
                      const QDateTime &now = QDateTime::currentDateTime());

    // The page's list of mail programs for `tools` (the mail sender's list,
    // the preferred program first): the others in reverse order, then the
    // preferred one last, each name once.
    static QStringList mailListOrder(const QStringList &tools);
};
