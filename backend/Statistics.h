#pragma once

#include <QSqlDatabase>
#include <QString>
#include <QStringList>
#include <QVariant>
#include <QVector>

// The maker's questions to the store of received pages, answered the same on
// SQLite and PostgreSQL: the rows are normalised (texts, whole numbers,
// numbers to one decimal) and sorted here, not by the engine's collation.
class CrvB_Statistics
{
public:
    enum class Kind { Text, Integer, Decimal };

    struct Table
    {
        QString query;
        QStringList columns;
        QVector<Kind> kinds;
        QVector<QVariantList> rows; // QString, qlonglong or double (null when unknown)
        int chartColumn = -1; // the count the bar chart shows
    };

    // families, devices, tools, options, help, cores, products
    static QStringList queries();
    // One line per query, for --help.
    static QString describe();

    // Asks `db`; false with `error` for an unknown query or a failing database.
    static bool run(const QSqlDatabase &db, const QString &query, Table &table, QString *error);
};
