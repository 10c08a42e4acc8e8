#include "CommandLog.h"

#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>
#include <QTextStream>

QString CrvC_CommandLog::anonymized(const QString &line, const QString &design)
{
    // Everything from the first to the last double quote: one quoted argument.
    static const QRegularExpression quoted(QStringLiteral("\".*\""));
    // A word up to its last dot, where at least one character precedes that
    // dot: the path and name of a file, keeping its extension. The plain
    // "\S+[.]" would backtrack over the rest of every word from every start
    // position, which is quadratic in a long word; this form matches the
    // same text from the word's start only, and each group stops at the next
    // dot without backtracking.
    static const QRegularExpression fileName(QStringLiteral("(?<!\\S)\\S(?:[^\\s.]*+\\.)+"));

    QString entry = line.simplified();
    if (!design.isEmpty())
        entry.replace(design, QLatin1String("<design>"));
    entry.replace(quoted, QStringLiteral("<orb_file>"));
    entry.replace(fileName, QStringLiteral("<fname>."));
    return entry;
}

bool CrvC_CommandLog::readCommandLog(const QString &path, CrvC_ReportData &data)
{
    const QFileInfo info(path);
    if (!info.isFile())
        return false;
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return false;

    const QString design = info.baseName();
    QTextStream in(&file);
    QString line;
    while (in.readLineInto(&line))
        data.commandHistory.append(anonymized(line, design));
    return true;
}

bool CrvC_CommandLog::checkFuseLog(const QString &path, CrvC_ReportData &data)
{
    if (!QFileInfo(path).isFile())
        return false;
    data.commandHistory.append(QStringLiteral("fuse"));
    return true;
}

QString CrvC_CommandLog::commandLineHistorySection(const CrvC_ReportData &data)
{
    QString text = QStringLiteral(
        "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
        "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD><B>Tool Usage</B></TD></TR>\n"
        "<TR VALIGN=TOP><TD ALIGN=LEFT>Command Line History"
        "<dtag-section name=\"CommandLineLog\"><UL>\n");
    for (const QString &entry : data.commandHistory) {
        QString escaped = entry;
        escaped.replace(QLatin1Char('<'), QLatin1String("&lt;"));
        escaped.replace(QLatin1Char('>'), QLatin1String("&gt;"));
        text += QLatin1String("<LI><dtag-cmdline>") + escaped
                + QLatin1String("</dtag-cmdline></LI>\n");
    }
    text += QLatin1String("</dtag-section></UL></TD></TR>\n</TABLE>");
    return text;
}
