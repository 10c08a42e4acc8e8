#pragma once

#include "ReportData.h"

// Reader of the usage XML (<design>_usage.xml) and writer of the tables made
// from it: Device Usage Statistics (with the macro statistics cell),
// Configuration Data and Pin Data.
class CrvC_UsageXml
{
public:
    // Fills the four section tables and the item counters; false when the file
    // is missing, unreadable or malformed, or refused by Port::XmlGuard (not
    // a regular file, too large, an internal DTD subset, nested too deeply);
    // the tables are then left as they were.
    // Reads the file as a stream, in one pass. Groups inside groups are
    // stored under their own names, each with its own items.
    static bool readUsageXml(const QString &path, CrvC_ReportData &data);
    // Hands on the report lines of the three tables (the last two only when
    // they have groups), one line at a time.
    static void appendTables(const CrvC_ReportData &data, CrvC_Lines &lines);
    static void appendTables(const CrvC_ReportData &data, QStringList &lines);
};
