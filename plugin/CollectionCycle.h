#pragma once

#include <QString>

#include <functional>

namespace CitI {
class IInterface;
}

// The collection cycle: what happens when the host opens a usage file. Finds
// the design and the current project, applies the collection switch and
// starts the report and its send.
//
// The cycle needs no widgets; the windows it starts (the review dialog and
// the countdown) are reached through the Dialogs hooks, which the plug-in
// installs when it loads.
class CrvC_CollectionCycle
{
public:
    // Both get (project file, design name, target family).
    using Starter = std::function<void(const QString &projectFile, const QString &designName,
                                       const QString &targetFamily)>;
    struct Dialogs
    {
        // Builds the report in a review dialog that is never shown and sends
        // it at once.
        Starter sendAtOnce;
        // Shows the countdown window, which builds the report and sends it
        // when the countdown ends unless the user stops it.
        Starter countDown;
    };

    // Replaces the hooks; an unset hook only writes a debug line.
    static void setDialogs(Dialogs dialogs);

    // The design name of an open request: the second "|"-separated field of
    // the context's design-name text when a context is given; otherwise the
    // file's base name cut at its last "_", and the file's directory becomes
    // the current directory, as the design tools expect. `directoryEntered`
    // (when given) tells whether that directory change worked; it is true
    // when there was nothing to change.
    static QString designName(const QString &fileName, CitI::IInterface *context,
                              bool *directoryEntered = nullptr);

    // The host's current project: its file and target family, both empty
    // when the host has no project manager or no current project.
    static void currentProject(QString &projectFile, QString &targetFamily);

    // The host's open request for a usage file. Nothing is built, shown or
    // sent when the name does not end in ".xml", when the file's directory
    // cannot be entered, or when collection is switched off (with or without
    // a current project).
    static void openUsageFile(const QString &fileName, CitI::IInterface *context);

    // Sends at once when the user has turned the countdown off
    // ("DontShowSendProgressDlg"), otherwise starts the countdown.
    static void startCollection(const QString &projectFile, const QString &designName,
                                const QString &targetFamily);
};
