#include "RunRecords.h"

#include "host/InputFile.h"

#include <QDateTime>
#include <QFile>
#include <QStringList>
#include <QTextStream>

namespace UtilC {
namespace {

QString escaped(const QString &text)
{
    QString out;
    out.reserve(text.size());
    for (QChar c : text) {
        if (c == QLatin1Char('&'))
            out += QLatin1String("&amp;");
        else if (c == QLatin1Char('<'))
            out += QLatin1String("&lt;");
        else if (c == QLatin1Char('>'))
            out += QLatin1String("&gt;");
        else
            out += c;
    }
    return out;
}

void appendCell(QString &row, const char *tag, const QString &value)
{
    row += QLatin1String("<TD><") + QLatin1String(tag) + QLatin1Char('>') + value + QLatin1String("</")
           + QLatin1String(tag) + QLatin1String("></TD>");
}

} // namespace

QString RunRecords::recordsPath(const QString &projectFile)
{
    return projectFile + QLatin1String(".runs");
}

bool RunRecords::read(const QString &path)
{
    Port::InputFile file;
    if (file.open(path, Port::InputFile::RunRecords) != Port::InputFile::Status::Opened)
        return false;
    const QMap<QString, ToolRuns> before = m_tools;
    QTextStream in(&file);
    QString line;
    while (in.readLineInto(&line))
        addLine(line);
    if (file.refused()) {
        m_tools = before;
        return false;
    }
    return true;
}

bool RunRecords::addLine(const QString &line)
{
    const QString simple = line.simplified();
    if (simple.isEmpty() || simple.startsWith(QLatin1Char('#')))
        return false;
    // tool, start, seconds, outcome; later fields are left for future use.
    const QStringList fields = simple.split(QLatin1Char(' '));
    if (fields.size() < 4)
        return false;
    const QDateTime start = QDateTime::fromString(fields.at(1), Qt::ISODate);
    bool ok = false;
    const uint seconds = fields.at(2).toUInt(&ok);
    const QString &outcome = fields.at(3);
    const bool completed = outcome == QLatin1String("completed");
    const bool failed = outcome == QLatin1String("failed");
    const bool cancelled = outcome == QLatin1String("cancelled");
    if (!start.isValid() || !ok || !(completed || failed || cancelled))
        return false;

    ToolRuns &tool = m_tools[fields.at(0)];
    ++tool.runs;
    tool.completed += completed;
    tool.failed += failed;
    tool.cancelled += cancelled;
    tool.seconds += seconds;
    if (!tool.lastRun.isValid() || start.date() > tool.lastRun)
        tool.lastRun = start.date();
    return true;
}

QString RunRecords::htmlTable() const
{
    if (m_tools.isEmpty())
        return QString();
    QString html = QStringLiteral(
        "<table>\n<TR BGCOLOR='#FFFF99'><TD>Tool</TD><TD>Runs</TD><TD>Completed</TD>"
        "<TD>Failed</TD><TD>Cancelled</TD><TD>Total Time (s)</TD><TD>Average Time (s)</TD>"
        "<TD>Last Run</TD></TR>\n");
    for (auto it = m_tools.cbegin(); it != m_tools.cend(); ++it) {
        const ToolRuns &t = it.value();
        html += QLatin1String("<TR>");
        appendCell(html, "dtag-run-tool", escaped(it.key()));
        appendCell(html, "dtag-run-count", QString::number(t.runs));
        appendCell(html, "dtag-run-completed", QString::number(t.completed));
        appendCell(html, "dtag-run-failed", QString::number(t.failed));
        appendCell(html, "dtag-run-cancelled", QString::number(t.cancelled));
        appendCell(html, "dtag-run-total-seconds", QString::number(t.seconds));
        appendCell(html, "dtag-run-average-seconds",
                   QString::number(double(t.seconds) / double(t.runs), 'f', 1));
        appendCell(html, "dtag-run-last-date", t.lastRun.toString(Qt::ISODate));
        html += QLatin1String("</TR>\n");
    }
    html += QLatin1String("</table>");
    return html;
}

} // namespace UtilC
