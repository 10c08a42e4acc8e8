#pragma once

#include <QDate>
#include <QMap>
#include <QString>

namespace UtilC {

// The tool run records that the host keeps for a project (the file
// "<project file>.runs", see docs/run-records.md), summed up per tool and
// written as the run statistics table.
class RunRecords
{
public:
    // Where the records of `projectFile` are kept.
    static QString recordsPath(const QString &projectFile);

    // Adds the records of the file at `path`; lines that are not a valid
    // record are skipped. False when the file is missing or unreadable.
    bool read(const QString &path);
    // Adds one record line; false (nothing added) when it is not a valid record.
    bool addLine(const QString &line);

    bool isEmpty() const { return m_tools.isEmpty(); }
    // One table, "<table>" ... "</table>": a header row, then one row per
    // tool in name order. Empty text when there are no records.
    QString htmlTable() const;

private:
    struct ToolRuns
    {
        qint64 runs = 0;
        qint64 completed = 0;
        qint64 failed = 0;
        qint64 cancelled = 0;
        qint64 seconds = 0;
        QDate lastRun;
    };
    QMap<QString, ToolRuns> m_tools;
};

} // namespace UtilC
