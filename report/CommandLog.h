#pragma once

#include "ReportData.h"

class CrvC_SectionBuffer;

// The design tools' command history (<design>.cmd_log and fuse.log) and the
// "Tool Usage" table made from it. Entries are made anonymous on reading: the
// design name, quoted arguments and file names give way to placeholders.
class CrvC_CommandLog
{
public:
    // Appends one entry per line of the log; false when it is missing or unreadable.
    static bool readCommandLog(const QString &path, CrvC_ReportData &data);
    // Appends "fuse" when a regular file is at `path` (it is not read); false otherwise.
    static bool checkFuseLog(const QString &path, CrvC_ReportData &data);
    // Writes the "Tool Usage" table, its lines joined with "\n", to `out`.
    static void commandLineHistorySection(const CrvC_ReportData &data, CrvC_SectionBuffer &out);

    // One log line as it is reported, for a log whose file base name is `design`.
    static QString anonymized(const QString &line, const QString &design);
};
