#pragma once

#include "ReportData.h"

// The design tools' command history (<design>.cmd_log and fuse.log) and the
// "Tool Usage" table made from it.
class CrvC_CommandLog
{
public:
    // Appends one entry per line of the log; false when it is missing or unreadable.
    static bool readCommandLog(const QString &path, CrvC_ReportData &data);
    // Appends "fuse" when a file exists at `path`; false otherwise.
    static bool checkFuseLog(const QString &path, CrvC_ReportData &data);
    // The "Tool Usage" table, its lines joined with "\n".
    static QString commandLineHistorySection(const CrvC_ReportData &data);
};
