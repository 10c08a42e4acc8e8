#pragma once

#include "PageReader.h"

#include <QMap>
#include <QString>
#include <QStringList>
#include <QVariant>
#include <QVector>

// The values of one page sorted into the rows the store keeps: the report's
// own properties and one list per kind of row. Every value lands in exactly
// one place; what has no place of its own goes to `others`.
//
// Values come in pairs or rows on the page (a core parameter's name and
// value, a run statistics row, a help term and its count). A page whose
// values do not follow that order, or that gives a report property twice, is
// turned down rather than guessed at: a value that closes its element early
// and forges the next one must not move other values into the wrong column.
class CrvB_ReportRecord
{
public:
    // The report properties kept in columns of their own: page name -> column.
    static const QMap<QString, QString> &propertyColumns();

    struct Group
    {
        QString section; // the enclosing dtag-section's name
        QString name;
    };
    struct Item
    {
        int group; // index into groups
        int level; // 1 to 3 from dtag-item1 to dtag-item3
        QString name, value; // the item text split at its first "="
    };
    struct CommandLine
    {
        QString tool; // the first word
        QString text;
        QStringList options; // distinct words that start with "-" and a letter, in order
    };
    struct Run
    {
        QString tool;
        QVariant runs, completed, failed, cancelled, totalSeconds,
            averageSeconds; // null when absent or no number
        QString lastRun;
    };
    struct HelpEntry
    {
        QString list; // the group: SearchFoundList, SearchNotFoundList or OpenedHelpFiles
        QString term;
        QVariant count;
    };
    struct CoreParameter
    {
        int core; // index into cores
        QString name, value;
    };
    struct ProjectProperty
    {
        QString kind; // "design" or "process"
        QString name, value;
    };
    struct SourceType
    {
        QString type;
        QVariant count;
    };
    struct Other
    {
        QString tag;
        QVariant name; // null when the element has no name attribute
        QString path; // the value's path joined with "/"
        QString value;
    };

    QMap<QString, QString> properties; // column -> value, for the columns of propertyColumns()
    QVector<Group> groups;
    QVector<Item> items;
    QVector<CommandLine> commandLines;
    QVector<Run> runs;
    QVector<HelpEntry> helpEntries;
    QStringList cores; // core type of each instance; empty for parameters before any type
    QVector<CoreParameter> coreParameters;
    QVector<ProjectProperty> projectProperties;
    QVector<SourceType> sourceTypes;
    QVector<Other> others;

    // Sorts `values` into `record`; false with `reason` when the page is
    // turned down.
    static bool fromValues(const QVector<CrvB_PageReader::Value> &values, CrvB_ReportRecord &record,
                           QString *reason);

    // A whole number, or null.
    static QVariant integer(const QString &text);
    // A number, or null.
    static QVariant number(const QString &text);
};
