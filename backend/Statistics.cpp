#include "Statistics.h"

#include <QSqlError>
#include <QSqlQuery>

#include <algorithm>
#include <cmath>

namespace {

using Kind = CrvB_Statistics::Kind;

struct Question
{
    const char *name;
    const char *description;
    const char *sql;
    QStringList columns;
    QVector<Kind> kinds;
    int sortColumn; // sorted by this count, largest first, then by the texts
};

const QVector<Question> &questions()
{
    static const QVector<Question> list = {
        {"families",
         "reports per target family",
         "SELECT COALESCE(target_family, ''), COUNT(*) FROM report GROUP BY COALESCE(target_family, '')",
         {"family", "reports"},
         {Kind::Text, Kind::Integer},
         1},
        {"devices",
         "reports and distinct projects per family, device, package and speed",
         "SELECT COALESCE(target_family, ''), COALESCE(target_device, ''), COALESCE(target_package, ''), "
         "COALESCE(target_speed, ''), COUNT(*), COUNT(DISTINCT project_id) FROM report GROUP BY 1, 2, 3, 4",
         {"family", "device", "package", "speed", "reports", "projects"},
         {Kind::Text, Kind::Text, Kind::Text, Kind::Text, Kind::Integer, Kind::Integer},
         4},
        {"tools",
         "runs, failed and cancelled runs, average seconds per run, per tool",
         "SELECT tool, COALESCE(SUM(runs), 0), COALESCE(SUM(failed), 0), COALESCE(SUM(cancelled), 0), "
         "CAST(SUM(total_seconds) AS DOUBLE PRECISION) / NULLIF(SUM(runs), 0) FROM run_statistic GROUP BY "
         "tool",
         {"tool", "runs", "failed", "cancelled", "average_seconds"},
         {Kind::Text, Kind::Integer, Kind::Integer, Kind::Integer, Kind::Decimal},
         1},
        {"options",
         "command lines using each option, per tool",
         "SELECT c.tool, o.option_name, COUNT(*) FROM command_option o JOIN command_line c "
         "ON c.report_id = o.report_id AND c.line_no = o.line_no GROUP BY c.tool, o.option_name",
         {"tool", "option", "command_lines"},
         {Kind::Text, Kind::Text, Kind::Integer},
         2},
        {"help",
         "help searches per search term (with and without results)",
         "SELECT term, COALESCE(SUM(hits), 0) FROM help_entry "
         "WHERE list IN ('SearchFoundList', 'SearchNotFoundList') GROUP BY term",
         {"term", "count"},
         {Kind::Text, Kind::Integer},
         1},
        {"cores",
         "core instances per core type",
         "SELECT core_type, COUNT(*) FROM core GROUP BY core_type",
         {"core_type", "instances"},
         {Kind::Text, Kind::Integer},
         1},
        {"products",
         "reports per product version and OS platform",
         "SELECT COALESCE(product_version, ''), COALESCE(os_platform, ''), COUNT(*) FROM report GROUP BY 1, "
         "2",
         {"product_version", "os", "reports"},
         {Kind::Text, Kind::Text, Kind::Integer},
         2},
    };
    return list;
}

QVariant normalised(const QVariant &value, Kind kind)
{
    switch (kind) {
    case Kind::Text:
        return value.isNull() ? QString() : value.toString();
    case Kind::Integer:
        return value.isNull() ? QVariant() : QVariant(value.toLongLong());
    case Kind::Decimal:
        break;
    }
    bool ok = false;
    const double number = value.toDouble(&ok);
    if (value.isNull() || !ok || !std::isfinite(number))
        return QVariant();
    return std::round(number * 10) / 10;
}

} // namespace

QStringList CrvB_Statistics::queries()
{
    QStringList names;
    for (const Question &q : questions())
        names.append(QLatin1String(q.name));
    return names;
}

QString CrvB_Statistics::describe()
{
    QString text;
    for (const Question &q : questions())
        text += QStringLiteral("  %1  %2 (%3)\n")
                    .arg(QString::fromLatin1(q.name).leftJustified(9), QLatin1String(q.description),
                         q.columns.join(QLatin1String(", ")));
    return text;
}

bool CrvB_Statistics::run(const QSqlDatabase &db, const QString &query, Table &table, QString *error)
{
    const auto question = std::find_if(questions().cbegin(), questions().cend(),
                                       [&](const Question &q) { return query == QLatin1String(q.name); });
    if (question == questions().cend()) {
        *error = QStringLiteral("unknown question \"%1\" (one of: %2)")
                     .arg(query, queries().join(QLatin1String(", ")));
        return false;
    }
    table = Table();
    table.query = query;
    table.columns = question->columns;
    table.kinds = question->kinds;
    table.chartColumn = question->sortColumn;

    QSqlQuery sql(db);
    sql.setForwardOnly(true);
    if (!sql.exec(QLatin1String(question->sql))) {
        *error = QStringLiteral("cannot answer \"%1\": %2").arg(query, sql.lastError().text().trimmed());
        return false;
    }
    while (sql.next()) {
        QVariantList row;
        for (int i = 0; i < table.columns.size(); ++i)
            row.append(normalised(sql.value(i), table.kinds.at(i)));
        table.rows.append(row);
    }
    const int count = question->sortColumn;
    std::sort(table.rows.begin(), table.rows.end(), [&](const QVariantList &a, const QVariantList &b) {
        if (a.at(count).toLongLong() != b.at(count).toLongLong())
            return a.at(count).toLongLong() > b.at(count).toLongLong();
        for (int i = 0; i < a.size(); ++i)
            if (table.kinds.at(i) == Kind::Text && a.at(i).toString() != b.at(i).toString())
                return a.at(i).toString() < b.at(i).toString();
        return false;
    });
    return true;
}
