#pragma once

#include <QString>

// The "Software Quality" run statistics of the host and the usage pages that
// place-and-route and the simulator leave in the project directory.
class CrvC_RunStatistics
{
public:
    // The host run statistics reader's table for `projectFile`, framed with the
    // report's "Software Quality" / "Run Statistics" title rows and the
    // "RunStatistics" section mark-up in place of its lower-case <table> tags.
    // Empty when the reader library or object is missing or it has no records.
    static QString runStatisticsSection(const QString &projectFile);

    // "&nbsp;<BR>" followed by each line of the place-and-route usage page at
    // `path` with a "\n" after it; "&nbsp;<BR>" alone when it cannot be read.
    static QString parUsageSection(const QString &path);
    // As parUsageSection, but for the simulator's page, whose lines are joined
    // with nothing between them.
    static QString osimUsageSection(const QString &path);
};
