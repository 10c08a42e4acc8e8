#include "XmlGuard.h"

#include <QBuffer>
#include <QStringDecoder>

#include <array>
#include <cstring>

namespace Port {
namespace {

// How the characters of a document are laid out in its bytes, as the parsers
// tell from the first four: one byte per character of markup (UTF-8 and the
// other ASCII-based encodings) unless a byte-order mark or the zero bytes
// round the first '<' say UTF-16 or UTF-32.
struct Layout
{
    int width = 1; // bytes per code unit
    bool bigEndian = false;
    bool utf8Mark = false; // begins with the UTF-8 byte-order mark
};

Layout layoutOf(const QByteArray &head)
{
    const auto at = [&head](int i) { return i < head.size() ? uchar(head.at(i)) : 0x100; };
    if (at(0) == 0x00 && at(1) == 0x00
        && ((at(2) == 0xFE && at(3) == 0xFF) || (at(2) == 0x00 && at(3) == 0x3C)))
        return {4, true};
    if ((at(0) == 0xFF && at(1) == 0xFE && at(2) == 0x00 && at(3) == 0x00)
        || (at(0) == 0x3C && at(1) == 0x00 && at(2) == 0x00 && at(3) == 0x00))
        return {4, false};
    if ((at(0) == 0xFE && at(1) == 0xFF) || (at(0) == 0x00 && at(1) == 0x3C))
        return {2, true};
    if ((at(0) == 0xFF && at(1) == 0xFE) || (at(0) == 0x3C && at(1) == 0x00))
        return {2, false};
    return {1, false, at(0) == 0xEF && at(1) == 0xBB && at(2) == 0xBF};
}

// Hands out the characters of a document's beginning, decoded just far
// enough to tell markup apart. ASCII-based encodings are taken byte by byte
// (every character of markup is ASCII there); UTF-16 and UTF-32 are decoded.
class PrologSource
{
public:
    explicit PrologSource(QIODevice &device) : m_device(device), m_layout(layoutOf(device.peek(4)))
    {
        if (m_layout.width == 4)
            m_decoder =
                QStringDecoder(m_layout.bigEndian ? QStringDecoder::Utf32BE : QStringDecoder::Utf32LE);
        else if (m_layout.width == 2)
            m_decoder =
                QStringDecoder(m_layout.bigEndian ? QStringDecoder::Utf16BE : QStringDecoder::Utf16LE);
        else if (m_layout.utf8Mark)
            m_decoder = QStringDecoder(QStringDecoder::Utf8);
    }

    const Layout &layout() const { return m_layout; }

    // The character `ahead` places on, or 0 past the end.
    ushort peek(qsizetype ahead = 0)
    {
        while (m_pos + ahead >= m_text.size()) {
            if (!fill())
                return 0;
        }
        return m_text.at(m_pos + ahead).unicode();
    }

    void advance(qsizetype n = 1) { m_pos += n; }

    bool lookingAt(const char *ascii)
    {
        for (qsizetype i = 0; ascii[i]; ++i) {
            if (peek(i) != uchar(ascii[i]))
                return false;
        }
        return true;
    }

    // Moves past the next `terminator`; false at the end of the data.
    bool skipPast(const char *terminator)
    {
        while (peek()) {
            if (lookingAt(terminator)) {
                advance(qsizetype(qstrlen(terminator)));
                return true;
            }
            advance();
        }
        return false;
    }

private:
    bool fill()
    {
        const QByteArray chunk = m_device.read(16 * 1024);
        if (chunk.isEmpty())
            return false;
        if (m_pos > 64 * 1024) {
            m_text.remove(0, m_pos);
            m_pos = 0;
        }
        if (m_decoder.isValid())
            m_text += m_decoder.decode(chunk);
        else
            m_text += QString::fromLatin1(chunk);
        return true;
    }

    QIODevice &m_device;
    const Layout m_layout;
    QStringDecoder m_decoder; // invalid: bytes taken one to one
    QString m_text;
    qsizetype m_pos = 0;
};

const char *const InternalSubset = "DTD declarations in the document (an internal subset)";

bool isSpace(ushort c)
{
    return c == ' ' || c == '\t' || c == '\r' || c == '\n';
}

bool isQuote(ushort c)
{
    return c == '"' || c == '\'';
}

// The encodings a document may declare: Unicode and its subsets, each only
// where the first bytes already showed it (a document that looks like UTF-16
// but declares UTF-8 would be read one way here and another by a parser).
bool fitsLayout(const QString &name, const Layout &layout)
{
    struct Known
    {
        const char *name;
        int width;
        int bigEndian; // -1: either
    };
    static const Known known[] = {
        {"UTF-8", 1, -1},      {"UTF8", 1, -1},   {"US-ASCII", 1, -1}, {"ASCII", 1, -1},
        {"ISO-8859-1", 1, -1}, {"Latin1", 1, -1}, {"UTF-16", 2, -1},   {"UTF-16LE", 2, 0},
        {"UTF-16BE", 2, 1},    {"UTF-32", 4, -1}, {"UTF-32LE", 4, 0},  {"UTF-32BE", 4, 1},
    };
    for (const Known &k : known) {
        if (name.compare(QLatin1String(k.name), Qt::CaseInsensitive) == 0)
            return k.width == layout.width && (k.bigEndian < 0 || bool(k.bigEndian) == layout.bigEndian);
    }
    return false;
}

// The encoding a document beginning with "<?xml" declares, checked the way
// the laxest of the parsers finds it: the SAX reader takes the first quoted
// text after "encoding" anywhere before the first '>'. Every "encoding" there
// is looked at, so the stream reader's stricter reading is covered too.
QString encodingProblem(PrologSource &in)
{
    QString declaration;
    for (qsizetype i = 0;; ++i) {
        const ushort c = in.peek(i);
        if (c == 0 || i > 4096)
            return QStringLiteral("an XML declaration without an end");
        if (c == '>')
            break;
        declaration += QChar(c);
    }
    static const QLatin1String keyword("encoding");
    for (qsizetype at = declaration.indexOf(keyword); at >= 0;
         at = declaration.indexOf(keyword, at + keyword.size())) {
        qsizetype open = at + keyword.size();
        while (open < declaration.size() && !isQuote(declaration.at(open).unicode()))
            ++open;
        if (open == declaration.size())
            continue;
        qsizetype close = open + 1;
        while (close < declaration.size() && !isQuote(declaration.at(close).unicode()))
            ++close;
        const QString name = declaration.mid(open + 1, close - open - 1);
        if (!fitsLayout(name, in.layout()))
            return QStringLiteral("its encoding \"%1\" is not supported").arg(name.left(40));
    }
    return QString();
}

// Counts the attributes of every start tag in the bytes it is given, in
// order, and objects to an element with more than XmlGuard::MaxAttributes.
// A linear scan that follows the markup just far enough to know what is a
// start tag: comments, processing instructions, CDATA sections, declarations,
// end tags and quoted values are passed over. Every attribute has exactly one
// '=' outside quotes, so counting those never counts too few.
class AttributeCounter
{
public:
    explicit AttributeCounter(const Layout &layout) : m_layout(layout) {}

    QString operator()(const char *data, qint64 size)
    {
        const uchar *p = reinterpret_cast<const uchar *>(data);
        const uchar *const end = p + size;
        if (m_layout.width == 1) {
            // The bulk of a document is text, start tags and values: only the
            // characters that end them are looked at one by one.
            while (p < end) {
                if (m_state == State::Text || m_state == State::Value) {
                    const void *found =
                        std::memchr(p, m_state == State::Text ? '<' : m_quote, size_t(end - p));
                    if (!found)
                        return QString();
                    p = static_cast<const uchar *>(found);
                } else if (m_state == State::StartTag) {
                    while (p < end && !endsTagRun(*p))
                        ++p;
                    if (p == end)
                        return QString();
                }
                if (!step(*p++))
                    return tooMany();
            }
            return QString();
        }
        while (p < end) {
            m_unit[m_unitFill++] = *p++;
            if (m_unitFill < m_layout.width)
                continue;
            m_unitFill = 0;
            char32_t c = 0;
            for (int i = 0; i < m_layout.width; ++i) {
                const int byte = m_layout.bigEndian ? i : m_layout.width - 1 - i;
                c = (c << 8) | m_unit[byte];
            }
            if (!step(c))
                return tooMany();
        }
        return QString();
    }

private:
    enum class State {
        Text,
        Open,     // after '<'
        Bang,     // after "<!"
        BangDash, // after "<!-"
        Comment,
        CData,
        Declaration,
        DeclarationValue,
        Instruction,
        EndTag,
        StartTag,
        Value, // quoted, in a start tag
    };

    // The characters that matter inside a start tag.
    static bool endsTagRun(uchar c)
    {
        static const auto table = [] {
            std::array<bool, 256> t{};
            for (uchar m : {'"', '\'', '>', '='})
                t[m] = true;
            return t;
        }();
        return table[c];
    }

    static QString tooMany()
    {
        return QStringLiteral("an element with more than %1 attributes").arg(XmlGuard::MaxAttributes);
    }

    // Takes one character; false when it ends an element's allowance.
    bool step(char32_t c)
    {
        switch (m_state) {
        case State::Text:
            if (c == '<')
                m_state = State::Open;
            return true;
        case State::Open:
            if (c == '!') {
                m_state = State::Bang;
            } else if (c == '?') {
                m_state = State::Instruction;
                m_run = 0;
            } else if (c == '/') {
                m_state = State::EndTag;
            } else {
                m_state = State::StartTag;
                m_attributes = 0;
                return step(c);
            }
            return true;
        case State::Bang:
            if (c == '-') {
                m_state = State::BangDash;
            } else if (c == '[') {
                m_state = State::CData;
                m_run = 0;
            } else {
                m_state = State::Declaration;
                return step(c);
            }
            return true;
        case State::BangDash:
            m_state = c == '-' ? State::Comment : State::Declaration;
            m_run = 0;
            return true;
        case State::Comment:
        case State::CData:
            // Ends at "-->" or "]]>".
            if (c == (m_state == State::Comment ? '-' : ']'))
                ++m_run;
            else if (c == '>' && m_run >= 2)
                m_state = State::Text;
            else
                m_run = 0;
            return true;
        case State::Instruction:
            if (c == '>' && m_run)
                m_state = State::Text;
            m_run = c == '?';
            return true;
        case State::Declaration:
            if (c == '"' || c == '\'') {
                m_quote = uchar(c);
                m_state = State::DeclarationValue;
            } else if (c == '>') {
                m_state = State::Text;
            }
            return true;
        case State::DeclarationValue:
            if (c == m_quote)
                m_state = State::Declaration;
            return true;
        case State::EndTag:
            if (c == '>')
                m_state = State::Text;
            return true;
        case State::StartTag:
            if (c == '"' || c == '\'') {
                m_quote = uchar(c);
                m_state = State::Value;
            } else if (c == '>') {
                m_state = State::Text;
            } else if (c == '=') {
                return ++m_attributes <= XmlGuard::MaxAttributes;
            }
            return true;
        case State::Value:
            if (c == m_quote)
                m_state = State::StartTag;
            return true;
        }
        return true;
    }

    const Layout m_layout;
    State m_state = State::Text;
    uchar m_quote = 0;
    int m_run = 0;
    int m_attributes = 0;
    uchar m_unit[4] = {};
    int m_unitFill = 0;
};

} // namespace

QString XmlGuard::prologProblem(QIODevice &device)
{
    PrologSource in(device);
    if (in.peek() == 0xFEFF)
        in.advance();
    if (in.lookingAt("<?xml")) {
        const QString problem = encodingProblem(in);
        if (!problem.isEmpty())
            return problem;
    }
    const QString internalSubset = QString::fromLatin1(InternalSubset);
    for (;;) {
        while (isSpace(in.peek()))
            in.advance();
        if (in.peek() != '<')
            return QString(); // text, or the end: the parser calls it malformed
        if (in.lookingAt("<?")) {
            if (!in.skipPast("?>"))
                return QString();
        } else if (in.lookingAt("<!--")) {
            if (!in.skipPast("-->"))
                return QString();
        } else if (in.lookingAt("<!DOCTYPE")) {
            // Name and external identifier, up to the closing '>'; a '['
            // outside the quoted literals opens an internal subset.
            in.advance(9);
            for (;;) {
                const ushort c = in.peek();
                if (c == 0)
                    return QString();
                in.advance();
                if (c == '[')
                    return internalSubset;
                if (c == '>')
                    break;
                if (isQuote(c)) {
                    const char quote[2] = {char(c), 0};
                    if (!in.skipPast(quote))
                        return QString();
                }
            }
        } else if (in.lookingAt("<!")) {
            return internalSubset; // no other declaration belongs before the document element
        } else {
            return QString(); // the document element
        }
    }
}

QString XmlGuard::prologProblem(const QByteArray &xml)
{
    QByteArray copy = xml; // shared, not copied
    QBuffer buffer(&copy);
    buffer.open(QIODevice::ReadOnly);
    return prologProblem(buffer);
}

bool XmlGuard::exceedsDepth(const QByteArray &xml, int maxDepth)
{
    QXmlStreamReader reader(xml);
    // Prefixes are left alone so that an undeclared one does not end the
    // scan early; the SAX reader does not mind them.
    reader.setNamespaceProcessing(false);
    int depth = 0;
    while (!reader.atEnd()) {
        readNext(reader, depth, maxDepth);
        if (depth > maxDepth)
            return true;
    }
    return false;
}

QXmlStreamReader::TokenType XmlGuard::readNext(QXmlStreamReader &reader, int &depth, int maxDepth)
{
    const QXmlStreamReader::TokenType token = reader.readNext();
    if (token == QXmlStreamReader::StartElement) {
        if (++depth > maxDepth) {
            reader.raiseError(QStringLiteral("elements nested deeper than %1 levels").arg(maxDepth));
            return QXmlStreamReader::Invalid;
        }
    } else if (token == QXmlStreamReader::EndElement) {
        --depth;
    }
    return token;
}

XmlGuard::Outcome XmlGuard::open(const QString &path, InputFile::Kind kind, InputFile &file, QString *reason)
{
    if (file.open(path, kind, reason) != InputFile::Status::Opened)
        return Outcome::NotRead;
    return guard(file, reason);
}

XmlGuard::Outcome XmlGuard::guard(InputFile &file, QString *reason)
{
    const Layout layout = layoutOf(file.peek(4));
    QString problem = prologProblem(file);
    if (file.refused())
        problem = file.refusal(); // a prolog that reads past the limit
    else if (problem.isEmpty() && !file.seek(0))
        problem = file.errorString();
    if (!problem.isEmpty()) {
        if (!file.refused())
            file.refuse(problem);
        file.close();
        if (reason)
            *reason = problem;
        return Outcome::Refused;
    }
    file.setInspector(AttributeCounter(layout));
    return Outcome::Accepted;
}

XmlGuard::Outcome XmlGuard::read(const QString &path, InputFile::Kind kind, QByteArray &xml, int maxDepth,
                                 QString *reason)
{
    xml.clear();
    InputFile file;
    const Outcome outcome = open(path, kind, file, reason);
    if (outcome != Outcome::Accepted)
        return outcome;
    if (!file.readRest(xml)) {
        if (reason)
            *reason = file.refusal();
        return Outcome::Refused;
    }
    if (exceedsDepth(xml, maxDepth)) {
        file.refuse(QStringLiteral("elements nested too deeply"));
        if (reason)
            *reason = file.refusal();
        xml.clear();
        return Outcome::Refused;
    }
    return Outcome::Accepted;
}

} // namespace Port
