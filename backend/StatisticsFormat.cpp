#include "StatisticsFormat.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>

namespace {

using Kind = CrvB_Statistics::Kind;

QString cell(const QVariant &value, Kind kind)
{
    if (value.isNull())
        return QString();
    return kind == Kind::Decimal ? QString::number(value.toDouble(), 'f', 1) : value.toString();
}

// A row's label in the chart: its texts.
QString label(const CrvB_Statistics::Table &table, const QVariantList &row)
{
    QStringList parts;
    for (int i = 0; i < row.size(); ++i)
        if (table.kinds.at(i) == Kind::Text)
            parts.append(row.at(i).toString().isEmpty() ? QStringLiteral("(none)") : row.at(i).toString());
    return parts.join(QLatin1String(" / "));
}

} // namespace

QStringList CrvB_StatisticsFormat::formats()
{
    return {QStringLiteral("table"), QStringLiteral("csv"), QStringLiteral("json"), QStringLiteral("html")};
}

QByteArray CrvB_StatisticsFormat::write(const CrvB_Statistics::Table &table, const QString &format)
{
    if (format == QLatin1String("csv"))
        return csv(table);
    if (format == QLatin1String("json"))
        return json(table);
    if (format == QLatin1String("html"))
        return html(table);
    return text(table);
}

QByteArray CrvB_StatisticsFormat::text(const CrvB_Statistics::Table &table)
{
    QVector<int> widths;
    for (const QString &column : table.columns)
        widths.append(int(column.size()));
    for (const QVariantList &row : table.rows)
        for (int i = 0; i < row.size(); ++i)
            widths[i] = qMax(widths[i], int(cell(row.at(i), table.kinds.at(i)).size()));
    auto line = [&](const QStringList &cells) -> QString {
        QStringList padded;
        for (int i = 0; i < cells.size(); ++i)
            padded.append(table.kinds.at(i) == Kind::Text ? cells.at(i).leftJustified(widths.at(i))
                                                          : cells.at(i).rightJustified(widths.at(i)));
        return padded.join(QLatin1String("  ")).trimmed() + QLatin1Char('\n');
    };
    QString out = line(table.columns);
    QStringList rules;
    for (int width : widths)
        rules.append(QString(width, QLatin1Char('-')));
    out += line(rules);
    for (const QVariantList &row : table.rows) {
        QStringList cells;
        for (int i = 0; i < row.size(); ++i)
            cells.append(cell(row.at(i), table.kinds.at(i)).replace(QLatin1Char('\n'), QLatin1Char(' ')));
        out += line(cells);
    }
    return out.toUtf8();
}

QByteArray CrvB_StatisticsFormat::csv(const CrvB_Statistics::Table &table)
{
    auto field = [](QString text) -> QString {
        if (text.contains(QLatin1Char(',')) || text.contains(QLatin1Char('"'))
            || text.contains(QLatin1Char('\n')) || text.contains(QLatin1Char('\r')) || text != text.trimmed())
            text =
                QLatin1Char('"') + text.replace(QLatin1Char('"'), QLatin1String("\"\"")) + QLatin1Char('"');
        return text;
    };
    QString out = table.columns.join(QLatin1Char(',')) + QLatin1String("\r\n");
    for (const QVariantList &row : table.rows) {
        QStringList cells;
        for (int i = 0; i < row.size(); ++i)
            cells.append(field(cell(row.at(i), table.kinds.at(i))));
        out += cells.join(QLatin1Char(',')) + QLatin1String("\r\n");
    }
    return out.toUtf8();
}

QByteArray CrvB_StatisticsFormat::json(const CrvB_Statistics::Table &table)
{
    QJsonArray rows;
    for (const QVariantList &row : table.rows) {
        QJsonObject object;
        for (int i = 0; i < row.size(); ++i)
            object.insert(table.columns.at(i), QJsonValue::fromVariant(row.at(i)));
        rows.append(object);
    }
    return QJsonDocument(rows).toJson(QJsonDocument::Indented);
}

QString CrvB_StatisticsFormat::svgChart(const CrvB_Statistics::Table &table)
{
    // The largest rows only: the table below holds them all.
    const int shown = int(qMin<qsizetype>(table.rows.size(), 40));
    const int labelWidth = 320, barWidth = 400, rowHeight = 22;
    qlonglong largest = 1;
    for (int i = 0; i < shown; ++i)
        largest = qMax(largest, table.rows.at(i).at(table.chartColumn).toLongLong());
    QString svg = QStringLiteral("<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"%1\" height=\"%2\" "
                                 "role=\"img\" aria-label=\"%3\">\n")
                      .arg(labelWidth + barWidth + 80)
                      .arg(shown * rowHeight + 10)
                      .arg(table.columns.at(table.chartColumn).toHtmlEscaped());
    for (int i = 0; i < shown; ++i) {
        const QVariantList &row = table.rows.at(i);
        const qlonglong value = row.at(table.chartColumn).toLongLong();
        const int y = 5 + i * rowHeight;
        QString name = label(table, row);
        if (name.size() > 48)
            name = name.left(47) + QChar(0x2026);
        const qlonglong bar = qMax<qlonglong>(1, value * barWidth / largest);
        // One arg() call: a label must not be searched for further markers.
        svg += QStringLiteral("<text x=\"%1\" y=\"%2\" text-anchor=\"end\">%3</text>"
                              "<rect x=\"%4\" y=\"%5\" width=\"%6\" height=\"%7\" fill=\"#3f7fbf\"/>"
                              "<text x=\"%8\" y=\"%2\">%9</text>\n")
                   .arg(QString::number(labelWidth - 8), QString::number(y + 15), name.toHtmlEscaped(),
                        QString::number(labelWidth), QString::number(y + 3), QString::number(bar),
                        QString::number(rowHeight - 6), QString::number(labelWidth + bar + 6),
                        QString::number(value));
    }
    return svg + QLatin1String("</svg>\n");
}

QByteArray CrvB_StatisticsFormat::html(const CrvB_Statistics::Table &table)
{
    const QString title = QStringLiteral("Corvid statistics: %1").arg(table.query).toHtmlEscaped();
    QString out = QStringLiteral("<!DOCTYPE html>\n<html><head><meta charset=\"utf-8\"><title>%1</title>\n"
                                 "<style>body{font-family:sans-serif}table{border-collapse:collapse}"
                                 "td,th{border:1px solid #999;padding:2px 6px}td.n{text-align:right}"
                                 "svg text{font-size:12px}</style></head>\n<body>\n<h1>%1</h1>\n")
                      .arg(title);
    if (table.rows.isEmpty())
        out += QLatin1String("<p>No reports.</p>\n");
    else
        out += svgChart(table);
    out += QLatin1String("<table>\n<tr>");
    for (const QString &column : table.columns)
        out += QLatin1String("<th>") + column.toHtmlEscaped() + QLatin1String("</th>");
    out += QLatin1String("</tr>\n");
    for (const QVariantList &row : table.rows) {
        out += QLatin1String("<tr>");
        for (int i = 0; i < row.size(); ++i)
            out +=
                (table.kinds.at(i) == Kind::Text ? QLatin1String("<td>") : QLatin1String("<td class=\"n\">"))
                + cell(row.at(i), table.kinds.at(i)).toHtmlEscaped() + QLatin1String("</td>");
        out += QLatin1String("</tr>\n");
    }
    return (out + QLatin1String("</table>\n</body></html>\n")).toUtf8();
}
