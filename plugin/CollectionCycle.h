#pragma once

#include <QString>

namespace CitI {
class IInterface;
}

// The collection cycle: what happens when the host opens a usage file. Finds
// the design and the current project, applies the collection switch and
// starts the report and its send.
class CrvC_CollectionCycle
{
public:
    // The design name of an open request: the second "|"-separated field of
    // the context's design-name text when a context is given; otherwise the
    // file's base name cut at its last "_" (the file's directory becomes the
    // current directory, as the design tools expect).
    static QString designName(const QString &fileName, CitI::IInterface *context);

    // The host's current project: its file and target family, both empty
    // when the host has no project manager or no current project.
    static void currentProject(QString &projectFile, QString &targetFamily);

    // The host's open request for a usage file.
    static void openUsageFile(const QString &fileName, CitI::IInterface *context);

    // Builds the report and announces or performs its send.
    static void startCollection(const QString &projectFile, const QString &designName,
                                const QString &targetFamily);
};
