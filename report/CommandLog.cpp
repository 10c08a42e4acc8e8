#include "CommandLog.h"
#include "SectionBuffer.h"

#include "host/InputFile.h"

#include <QFile>
#include <QFileInfo>
#include <QStringMatcher>
#include <QTextStream>

namespace {

constexpr QStringView designMark(u"<design>");
constexpr QStringView quotedMark(u"<orb_file>");
constexpr QStringView fileNameMark(u"<fname>.");

// Makes log lines of one design anonymous. Logs run to hundreds of thousands
// of lines, so each step is one scan of the line by hand: matching the
// patterns ".*" and "\S+[.]" as regular expressions took most of the time
// of reading a long log. The results are the same as the patterns'.
class Anonymizer
{
public:
    explicit Anonymizer(const QString &design) : m_design(design), m_matcher(design) {}

    QString operator()(const QString &line) const
    {
        // After simplifying, a blank is the only white space left, and no
        // replacement below brings any back.
        QString text = line.simplified();
        replaceDesign(text);
        replaceQuoted(text);
        return replaceFileNames(text);
    }

private:
    // Every occurrence of the design name, case-sensitive, left to right.
    void replaceDesign(QString &text) const
    {
        if (m_design.isEmpty())
            return;
        qsizetype at = m_matcher.indexIn(text);
        if (at < 0)
            return;
        QString out;
        out.reserve(text.size() + 8);
        qsizetype from = 0;
        for (; at >= 0; at = m_matcher.indexIn(text, from)) {
            out += QStringView(text).mid(from, at - from);
            out += designMark;
            from = at + m_design.size();
        }
        out += QStringView(text).mid(from);
        text = std::move(out);
    }

    // ".*": from the first to the last double quote, when there are two.
    static void replaceQuoted(QString &text)
    {
        const qsizetype first = text.indexOf(QLatin1Char('"'));
        const qsizetype last = text.lastIndexOf(QLatin1Char('"'));
        if (first >= 0 && last > first)
            text.replace(first, last - first + 1, quotedMark.data(), quotedMark.size());
    }

    // \S+[.]: in each word, everything up to its last dot, when at least one
    // character precedes that dot. A word matches from its start or not at
    // all, and nothing after its last dot can match again.
    static QString replaceFileNames(const QString &text)
    {
        if (!text.contains(QLatin1Char('.')))
            return text;
        const QStringView view(text);
        QString out;
        out.reserve(text.size() + 16);
        for (qsizetype start = 0;;) {
            qsizetype end = view.indexOf(QLatin1Char(' '), start);
            if (end < 0)
                end = view.size();
            const QStringView word = view.mid(start, end - start);
            const qsizetype dot = word.lastIndexOf(QLatin1Char('.'));
            if (dot >= 1) {
                out += fileNameMark;
                out += word.mid(dot + 1);
            } else {
                out += word;
            }
            if (end == view.size())
                break;
            out += QLatin1Char(' ');
            start = end + 1;
        }
        return out;
    }

    QString m_design;
    QStringMatcher m_matcher;
};

// `text` with "<" and ">" as "&lt;" and "&gt;" ("&" and quotes stay).
void appendEscaped(CrvC_SectionBuffer &out, QStringView text)
{
    qsizetype from = 0;
    for (qsizetype i = 0; i < text.size(); ++i) {
        const QChar c = text.at(i);
        if (c != QLatin1Char('<') && c != QLatin1Char('>'))
            continue;
        out += text.mid(from, i - from);
        out += QByteArrayView(c == QLatin1Char('<') ? "&lt;" : "&gt;");
        from = i + 1;
    }
    out += text.mid(from);
}

} // namespace

QString CrvC_CommandLog::anonymized(const QString &line, const QString &design)
{
    return Anonymizer(design)(line);
}

bool CrvC_CommandLog::readCommandLog(const QString &path, CrvC_ReportData &data)
{
    Port::InputFile file;
    if (file.open(path, Port::InputFile::CommandLog) != Port::InputFile::Status::Opened)
        return false;

    const Anonymizer anonymize(QFileInfo(path).baseName());
    QTextStream in(&file);
    QStringList history;
    QString line;
    while (in.readLineInto(&line))
        history.append(anonymize(line));
    if (file.refused())
        return false;
    data.commandHistory += history;
    return true;
}

bool CrvC_CommandLog::checkFuseLog(const QString &path, CrvC_ReportData &data)
{
    if (!Port::InputFile::isAvailable(path, Port::InputFile::FuseLog))
        return false;
    data.commandHistory.append(QStringLiteral("fuse"));
    return true;
}

void CrvC_CommandLog::commandLineHistorySection(const CrvC_ReportData &data, CrvC_SectionBuffer &out)
{
    out += QByteArrayView(
        "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
        "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD><B>Tool Usage</B></TD></TR>\n"
        "<TR VALIGN=TOP><TD ALIGN=LEFT>Command Line History"
        "<dtag-section name=\"CommandLineLog\"><UL>\n");
    for (const QString &entry : data.commandHistory) {
        out += QByteArrayView("<LI><dtag-cmdline>");
        appendEscaped(out, entry);
        out += QByteArrayView("</dtag-cmdline></LI>\n");
    }
    out += QByteArrayView("</dtag-section></UL></TD></TR>\n</TABLE>");
}
