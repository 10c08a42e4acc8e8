#include "PageText.h"

#include <QRegularExpression>

#include <cstring>

namespace {

bool isNameStart(QChar c)
{
    return c.unicode() < 128 && c.isLetter();
}

bool isNameChar(QChar c)
{
    return c.unicode() < 128
           && (c.isLetterOrNumber() || c == QLatin1Char('-') || c == QLatin1Char('_') || c == QLatin1Char(':')
               || c == QLatin1Char('.'));
}

bool endsName(QChar c, const char *stops)
{
    return c.isSpace() || (c.unicode() < 128 && std::strchr(stops, c.toLatin1()));
}

// One past the ">" of the tag that starts with the "<" at `at`; -1 when no
// well-formed start or end tag starts there. Quoted attribute values may
// hold any character but their quote.
qsizetype tagEnd(const QString &s, qsizetype at)
{
    const qsizetype n = s.size();
    qsizetype i = at + 1;
    if (i < n && s.at(i) == QLatin1Char('/'))
        ++i;
    if (i >= n || !isNameStart(s.at(i)))
        return -1;
    while (i < n && isNameChar(s.at(i)))
        ++i;
    bool spaced = false;
    for (;;) {
        while (i < n && s.at(i).isSpace()) {
            ++i;
            spaced = true;
        }
        if (i >= n)
            return -1;
        if (s.at(i) == QLatin1Char('>'))
            return i + 1;
        if (s.at(i) == QLatin1Char('/') && i + 1 < n && s.at(i + 1) == QLatin1Char('>'))
            return i + 2;
        if (!spaced)
            return -1;
        spaced = false;
        const qsizetype name = i;
        while (i < n && !endsName(s.at(i), "\"'<>/="))
            ++i;
        if (i == name)
            return -1;
        qsizetype j = i;
        while (j < n && s.at(j).isSpace())
            ++j;
        if (j >= n || s.at(j) != QLatin1Char('='))
            continue;
        i = j + 1;
        while (i < n && s.at(i).isSpace())
            ++i;
        if (i >= n)
            return -1;
        if (s.at(i) == QLatin1Char('"') || s.at(i) == QLatin1Char('\'')) {
            const qsizetype close = s.indexOf(s.at(i), i + 1);
            if (close < 0)
                return -1;
            i = close + 1;
        } else {
            const qsizetype value = i;
            while (i < n && !endsName(s.at(i), "\"'<>=`"))
                ++i;
            if (i == value)
                return -1;
        }
    }
}

// Reads the entity at `at` ("&") into `text`; answers where reading goes on.
qsizetype readEntity(const QString &s, qsizetype at, QString &text)
{
    // Entities are short: looking further would make a page of "&" slow.
    qsizetype semicolon = at + 1;
    while (semicolon < s.size() && semicolon - at <= 10 && s.at(semicolon) != QLatin1Char(';'))
        ++semicolon;
    if (semicolon > at + 1 && semicolon < s.size() && s.at(semicolon) == QLatin1Char(';')) {
        const QString name = s.mid(at + 1, semicolon - at - 1);
        static const struct
        {
            const char *name;
            char16_t code;
        } named[] = {{"nbsp", 0xa0}, {"amp", '&'}, {"lt", '<'}, {"gt", '>'}, {"quot", '"'}, {"apos", '\''}};
        for (const auto &entity : named) {
            if (name == QLatin1String(entity.name)) {
                text += QChar(entity.code);
                return semicolon + 1;
            }
        }
        if (name.startsWith(QLatin1Char('#'))) {
            bool ok = false;
            const bool hex = name.size() > 1 && name.at(1).toLower() == QLatin1Char('x');
            const uint code = name.mid(hex ? 2 : 1).toUInt(&ok, hex ? 16 : 10);
            if (ok && code > 0 && code <= 0x10ffff) {
                const char32_t c = code;
                text += QString::fromUcs4(&c, 1);
                return semicolon + 1;
            }
        }
    }
    text += QLatin1Char('&');
    return at + 1;
}

QString withoutSpace(const QString &text)
{
    QString result;
    result.reserve(text.size());
    for (const QChar c : text) {
        if (!c.isSpace())
            result += c;
    }
    return result;
}

} // namespace

bool CrvC_PageText::visibleText(const QString &html, QString *text)
{
    static const QRegularExpression head(
        QStringLiteral("^\\s*<HTML>\\s*<HEAD>\\s*<TITLE>[^<]*</TITLE>\\s*</HEAD>"),
        QRegularExpression::CaseInsensitiveOption);
    const QRegularExpressionMatch match = head.match(html);
    qsizetype i = match.hasMatch() ? match.capturedEnd() : 0;
    QString result;
    result.reserve(html.size() / 2);
    const qsizetype n = html.size();
    while (i < n) {
        const QChar c = html.at(i);
        if (c == QLatin1Char('<')) {
            i = tagEnd(html, i);
            if (i < 0)
                return false;
        } else if (c == QLatin1Char('&')) {
            i = readEntity(html, i, result);
        } else {
            result += c;
            ++i;
        }
    }
    if (text)
        *text = result;
    return true;
}

bool CrvC_PageText::showsAllText(const QString &html, const QString &shown)
{
    QString text;
    return visibleText(html, &text) && withoutSpace(text) == withoutSpace(shown);
}
