#include "PageReader.h"

#include <QHash>

#include <cstring>

// The limits stand well above what the builder writes (docs/backend.md has
// the measurements): the largest reference project gives a page of 21 MB with
// 297,000 values, nested at most three deep.
const qint64 CrvB_PageReader::MaxPageBytes = 64 * 1024 * 1024;

namespace {

bool isNameChar(char c)
{
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-' || c == '_'
        || c == ':' || c == '.';
}

bool isLetter(char c)
{
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

bool isSpace(char c)
{
    return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\f';
}

void appendUtf8(QByteArray &out, uint cp)
{
    if (cp < 0x80) {
        out += char(cp);
    } else if (cp < 0x800) {
        out += char(0xC0 | (cp >> 6));
        out += char(0x80 | (cp & 0x3F));
    } else if (cp < 0x10000) {
        out += char(0xE0 | (cp >> 12));
        out += char(0x80 | ((cp >> 6) & 0x3F));
        out += char(0x80 | (cp & 0x3F));
    } else {
        out += char(0xF0 | (cp >> 18));
        out += char(0x80 | ((cp >> 12) & 0x3F));
        out += char(0x80 | ((cp >> 6) & 0x3F));
        out += char(0x80 | (cp & 0x3F));
    }
}

// The reference at text[at] ("&...;"): appends what it stands for and answers
// its length, or 0 when it is none that is decoded.
int decodeReference(const char *text, qsizetype size, qsizetype at, QByteArray &out)
{
    static const struct
    {
        const char *name;
        const char *utf8;
    } named[] = {{"lt;", "<"},    {"gt;", ">"},   {"amp;", "&"},
                 {"quot;", "\""}, {"apos;", "'"}, {"nbsp;", "\xC2\xA0"}};
    const qsizetype rest = size - at - 1;
    const char *p = text + at + 1;
    for (const auto &entity : named) {
        const qsizetype length = qsizetype(std::strlen(entity.name));
        if (rest >= length && std::memcmp(p, entity.name, size_t(length)) == 0) {
            out += entity.utf8;
            return int(length) + 1;
        }
    }
    if (rest < 3 || p[0] != '#')
        return 0;
    const bool hex = p[1] == 'x' || p[1] == 'X';
    qsizetype i = hex ? 2 : 1;
    uint cp = 0;
    int digits = 0;
    for (; i < rest && digits < 8; ++i, ++digits) {
        const char c = p[i];
        int d = -1;
        if (c >= '0' && c <= '9')
            d = c - '0';
        else if (hex && c >= 'a' && c <= 'f')
            d = c - 'a' + 10;
        else if (hex && c >= 'A' && c <= 'F')
            d = c - 'A' + 10;
        if (d < 0)
            break;
        cp = cp * (hex ? 16 : 10) + uint(d);
    }
    if (digits == 0 || i >= rest || p[i] != ';')
        return 0;
    if (cp == 0 || cp > 0x10FFFF || (cp >= 0xD800 && cp <= 0xDFFF))
        cp = 0xFFFD;
    appendUtf8(out, cp);
    return int(i) + 2;
}

// One pass over the page. Only dtag elements are tracked; every other tag is
// dropped from the text, so the HTML around the values may nest as it likes.
class Parser
{
public:
    Parser(const QByteArray &page, const CrvB_PageReader::Limits &limits)
        : m_data(page.constData()), m_size(page.size()), m_limits(limits)
    {
    }

    CrvB_PageReader::Result run()
    {
        // A value takes some 60 bytes of a page the builder wrote.
        m_result.values.reserve(qMin<qsizetype>(m_size / 64, m_limits.maxValues) + 16);
        qsizetype pos = 0;
        while (pos < m_size && m_result.ok()) {
            const char *lt = static_cast<const char *>(std::memchr(m_data + pos, '<', size_t(m_size - pos)));
            const qsizetype at = lt ? lt - m_data : m_size;
            text(pos, at);
            if (!lt)
                break;
            pos = markup(at);
        }
        if (m_result.ok() && !m_open.isEmpty())
            reject(QStringLiteral("mark-up cut off: <%1> is never closed").arg(m_open.last().tag));
        if (m_result.ok() && m_result.values.isEmpty())
            reject(QStringLiteral("no dtag values"));
        if (!m_result.ok())
            m_result.values.clear();
        return std::move(m_result);
    }

private:
    struct Open
    {
        QString tag;
        QString name;
        bool hasName = false;
        bool leaf = true;
        int number = 0;
    };

    void reject(const QString &reason)
    {
        if (m_result.ok())
            m_result.rejection = reason;
    }

    void text(qsizetype from, qsizetype to)
    {
        if (to > from && !m_open.isEmpty() && m_open.last().leaf)
            m_text.append(m_data + from, to - from);
    }

    qsizetype find(const char *what, qsizetype from) const
    {
        const QByteArray haystack = QByteArray::fromRawData(m_data, m_size);
        return haystack.indexOf(what, from);
    }

    // The mark-up starting at '<' at `at`; answers where the text goes on.
    qsizetype markup(qsizetype at)
    {
        const char next = at + 1 < m_size ? m_data[at + 1] : '\0';
        if (next == '!' || next == '?') {
            const bool comment = m_size - at >= 4 && std::memcmp(m_data + at, "<!--", 4) == 0;
            const qsizetype end = comment ? find("-->", at + 4) : find(">", at + 2);
            if (end < 0) {
                reject(QStringLiteral("mark-up cut off: a comment or declaration is never closed"));
                return m_size;
            }
            return end + (comment ? 3 : 1);
        }
        const bool closing = next == '/';
        const qsizetype nameStart = at + 1 + (closing ? 1 : 0);
        if (nameStart >= m_size || !isLetter(m_data[nameStart])) {
            // A lone "<" is text.
            text(at, at + 1);
            return at + 1;
        }
        qsizetype nameEnd = nameStart;
        while (nameEnd < m_size && isNameChar(m_data[nameEnd]))
            ++nameEnd;
        const bool dtag = nameEnd - nameStart > 5 && qstrnicmp(m_data + nameStart, "dtag-", 5) == 0;
        if (!dtag) {
            // Values are written without escaping: "a<b=1</dtag-item1>" holds
            // a "<" that opens no tag, seen by the next "<" coming before a ">".
            qsizetype end = nameEnd;
            while (end < m_size && m_data[end] != '>' && m_data[end] != '<')
                ++end;
            if (end < m_size && m_data[end] == '<') {
                text(at, at + 1);
                return at + 1;
            }
            if (end >= m_size) {
                reject(QStringLiteral("mark-up cut off: a tag is never closed"));
                return m_size;
            }
            return end + 1;
        }
        // One copy of each element name, shared by all its values.
        const QByteArray key = QByteArray::fromRawData(m_data + nameStart, nameEnd - nameStart);
        auto known = m_tags.constFind(key);
        if (known == m_tags.cend())
            known = m_tags.insert(QByteArray(key), QString::fromLatin1(key).toLower());
        const QString tag = known.value();
        Open element;
        element.tag = tag;
        bool selfClosing = false;
        const qsizetype end = attributes(nameEnd, element, selfClosing);
        if (end < 0) {
            reject(QStringLiteral("mark-up cut off: <%1 is never closed").arg(tag));
            return m_size;
        }
        if (closing)
            close(tag);
        else
            open(element, selfClosing);
        return end;
    }

    // Reads the attributes of a dtag element up to its '>', keeping the name
    // attribute; answers the position after the '>', or -1 when there is none.
    qsizetype attributes(qsizetype pos, Open &element, bool &selfClosing) const
    {
        while (pos < m_size) {
            const char c = m_data[pos];
            if (c == '>')
                return pos + 1;
            if (c == '/' && pos + 1 < m_size && m_data[pos + 1] == '>') {
                selfClosing = true;
                return pos + 2;
            }
            if (isSpace(c) || c == '/' || c == '=' || c == '"' || c == '\'') {
                ++pos;
                continue;
            }
            const qsizetype nameStart = pos;
            while (pos < m_size && !isSpace(m_data[pos]) && !std::strchr("=>/", m_data[pos]))
                ++pos;
            const QByteArray attribute = QByteArray(m_data + nameStart, pos - nameStart).toLower();
            while (pos < m_size && isSpace(m_data[pos]))
                ++pos;
            if (pos >= m_size || m_data[pos] != '=')
                continue;
            ++pos;
            while (pos < m_size && isSpace(m_data[pos]))
                ++pos;
            if (pos >= m_size)
                break;
            qsizetype valueStart = pos, valueEnd;
            if (m_data[pos] == '"' || m_data[pos] == '\'') {
                const char quote[2] = {m_data[pos], '\0'};
                valueStart = pos + 1;
                valueEnd = find(quote, valueStart);
                if (valueEnd < 0)
                    return -1;
                pos = valueEnd + 1;
            } else {
                while (pos < m_size && !isSpace(m_data[pos]) && m_data[pos] != '>')
                    ++pos;
                valueEnd = pos;
            }
            if (attribute == "name" && !element.hasName) {
                element.name = CrvB_PageReader::decodeEntities(
                    QByteArray::fromRawData(m_data + valueStart, valueEnd - valueStart));
                element.hasName = true;
            }
        }
        return -1;
    }

    void open(Open &element, bool selfClosing)
    {
        if (m_open.size() >= m_limits.maxDepth) {
            reject(QStringLiteral("dtag elements nested deeper than %1").arg(m_limits.maxDepth));
            return;
        }
        if (!m_open.isEmpty())
            m_open.last().leaf = false;
        element.number = m_opened++;
        m_path.append(element.hasName ? element.tag + QLatin1Char(':') + element.name : element.tag);
        m_open.append(element);
        m_text.clear();
        if (selfClosing)
            close(element.tag);
    }

    void close(const QString &tag)
    {
        if (m_open.isEmpty() || m_open.last().tag != tag) {
            reject(m_open.isEmpty() ? QStringLiteral("</%1> closes no open element").arg(tag)
                                    : QStringLiteral("</%1> closes <%2>").arg(tag, m_open.last().tag));
            return;
        }
        const Open element = m_open.takeLast();
        m_path.removeLast();
        if (element.leaf)
            emitValue(element);
        m_text.clear();
    }

    void emitValue(const Open &element)
    {
        if (m_result.values.size() >= m_limits.maxValues) {
            reject(QStringLiteral("more than %1 values").arg(m_limits.maxValues));
            return;
        }
        CrvB_PageReader::Value value;
        value.tag = element.tag;
        value.name = element.name;
        value.hasName = element.hasName;
        value.value = CrvB_PageReader::decodeEntities(m_text);
        value.path = m_path;
        value.parent = m_open.isEmpty() ? -1 : m_open.last().number;
        m_result.values.append(std::move(value));
    }

    const char *m_data;
    qsizetype m_size;
    const CrvB_PageReader::Limits m_limits;
    QVector<Open> m_open;
    QByteArray m_text; // the text of the innermost open element while it is a leaf
    QStringList m_path; // the open elements as a value's path shows them
    QHash<QByteArray, QString> m_tags;
    int m_opened = 0;
    CrvB_PageReader::Result m_result;
};

} // namespace

CrvB_PageReader::Result CrvB_PageReader::read(const QByteArray &page)
{
    return read(page, Limits());
}

CrvB_PageReader::Result CrvB_PageReader::read(const QByteArray &page, const Limits &limits)
{
    Result result;
    if (page.size() > limits.maxBytes) {
        result.rejection = QStringLiteral("larger than %1 bytes").arg(limits.maxBytes);
        return result;
    }
    if (!page.isValidUtf8() || page.contains('\0')) {
        result.rejection = QStringLiteral("not UTF-8 text");
        return result;
    }
    return Parser(page.startsWith("\xEF\xBB\xBF") ? page.mid(3) : page, limits).run();
}

QString CrvB_PageReader::decodeEntities(const QByteArray &utf8)
{
    if (!utf8.contains('&'))
        return QString::fromUtf8(utf8);
    QByteArray out;
    out.reserve(utf8.size());
    const char *text = utf8.constData();
    for (qsizetype i = 0; i < utf8.size(); ++i) {
        if (text[i] == '&') {
            const int length = decodeReference(text, utf8.size(), i, out);
            if (length > 0) {
                i += length - 1;
                continue;
            }
        }
        out += text[i];
    }
    return QString::fromUtf8(out);
}

QByteArray CrvB_PageReader::toJson(const QVector<Value> &values)
{
    // Written by hand so that the keys keep their order, one value a line.
    auto string = [](const QString &text) -> QByteArray {
        QByteArray out = "\"";
        for (const char c : text.toUtf8()) {
            if (c == '"' || c == '\\') {
                out += '\\';
                out += c;
            } else if (uchar(c) < 0x20) {
                out += QByteArray("\\u00") + QByteArray::number(uchar(c), 16).rightJustified(2, '0');
            } else {
                out += c;
            }
        }
        return out + '"';
    };
    QByteArray out = "{\"values\": [";
    for (qsizetype i = 0; i < values.size(); ++i) {
        const Value &v = values.at(i);
        QByteArrayList path;
        for (const QString &element : v.path)
            path.append(string(element));
        out += (i ? ",\n  " : "\n  ") + QByteArray("{\"tag\": ") + string(v.tag)
            + ", \"name\": " + (v.hasName ? string(v.name) : QByteArray("null"))
            + ", \"value\": " + string(v.value) + ", \"path\": [" + path.join(", ") + "]}";
    }
    return out + "\n]}\n";
}
