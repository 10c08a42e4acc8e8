#pragma once

#include <QString>

// Everything Corvid keeps between runs outside the project: the per-user keys
// of the group "Corvid" in the host settings store, and the install-wide
// file data/reports/corvidsettings an administrator may place in the
// installation. Nothing is cached: every call opens the store afresh.
class CrvC_Settings
{
public:
    static const char *const Group; // "Corvid"

    // Per-user keys.
    static const char *const CollectDeviceUsage;      // bool, default true
    static const char *const CorvidTimeStamp;         // ISO date-time text, default empty
    static const char *const DontShowSendProgressDlg; // bool, default false
    static const char *const UseSSL;                  // bool, default true
    static const char *const DontShowSendToDlg;       // bool, default false
    static const char *const SelectedEmailTool;       // text, default empty
    static const char *const RandomID;                // 32 hex digits, made on first use

    // The effective collection switch: whoever changed it last, the user on
    // the preference page or the administrator in the install-wide file, wins.
    // A user who never applied the page follows the install-wide file, and
    // collection is on when neither says anything.
    static bool isCollectionEnabled();
    // True when the install-wide file's switch is what isCollectionEnabled
    // answers: the file sets it, and the user never applied the preference
    // page or applied it before the file's timestamp.
    static bool collectionSetByInstallation();

    // Reads the install-wide file (the first data/reports/corvidsettings in
    // the installation roots) into `timestamp` and `collect`; leaves both
    // unchanged when there is no readable file or the keys are absent.
    // `collectFound`, when given, tells whether the file set `collect`.
    static void readInstallSettings(QString &timestamp, bool &collect, bool *collectFound = nullptr);

    static bool collectDeviceUsage();
    static QString corvidTimeStamp();
    static bool dontShowSendProgressDlg();
    static bool useSsl();
    static bool dontShowSendToDlg(bool defaultValue = false);
    static QString selectedEmailTool();

    // The user's random identifier; made and returned when the stored one is
    // missing or empty, and then stored unless `keep` is false (a preview).
    static QString randomId(bool keep = true);

    static void setValue(const char *key, const QVariant &value);
    static QVariant value(const char *key, const QVariant &defaultValue);

    // A new identifier: a random UUID as 32 lower-case hexadecimal digits.
    static QString newIdentifier();
};
