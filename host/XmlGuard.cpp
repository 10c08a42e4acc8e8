#include "XmlGuard.h"

#include "MsgManData.h"

#include <QBuffer>
#include <QFile>
#include <QStringDecoder>

namespace Port {
namespace {

// Hands out the characters of a document's beginning, decoded just far
// enough to tell markup apart. ASCII-based encodings are taken byte by byte
// (every character of markup is ASCII there); UTF-16 and UTF-32 are decoded.
class PrologSource
{
public:
    explicit PrologSource(QIODevice &device) : m_device(device)
    {
        const QByteArray head = device.peek(4);
        const auto at = [&head](int i) { return i < head.size() ? uchar(head.at(i)) : 0x100; };
        if (at(0) == 0x00 && at(1) == 0x00 && ((at(2) == 0xFE && at(3) == 0xFF) || (at(2) == 0x00 && at(3) == 0x3C)))
            m_decoder = QStringDecoder(QStringDecoder::Utf32BE);
        else if (at(0) == 0xFF && at(1) == 0xFE && at(2) == 0x00 && at(3) == 0x00)
            m_decoder = QStringDecoder(QStringDecoder::Utf32LE);
        else if (at(0) == 0x3C && at(1) == 0x00 && at(2) == 0x00 && at(3) == 0x00)
            m_decoder = QStringDecoder(QStringDecoder::Utf32LE);
        else if ((at(0) == 0xFE && at(1) == 0xFF) || (at(0) == 0x00 && at(1) == 0x3C))
            m_decoder = QStringDecoder(QStringDecoder::Utf16BE);
        else if ((at(0) == 0xFF && at(1) == 0xFE) || (at(0) == 0x3C && at(1) == 0x00))
            m_decoder = QStringDecoder(QStringDecoder::Utf16LE);
    }

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

XmlGuard::Outcome refuse(const QString &path, InputFile::Kind kind, const char *problem, QString *reason)
{
    const QString text = QStringLiteral("%1 %2: %3")
                             .arg(QString::fromLatin1(InputFile::kindName(kind)), path,
                                  QString::fromLatin1(problem));
    Port_MsgManData::debugStub("Input refused: %s\n", text.toLocal8Bit().constData());
    if (reason)
        *reason = QString::fromLatin1(problem);
    return XmlGuard::Outcome::Refused;
}

} // namespace

bool XmlGuard::hasDeclarations(QIODevice &device)
{
    PrologSource in(device);
    if (in.peek() == 0xFEFF)
        in.advance();
    for (;;) {
        while (isSpace(in.peek()))
            in.advance();
        if (in.peek() != '<')
            return false; // text, or the end: the parser calls it malformed
        if (in.lookingAt("<?")) {
            if (!in.skipPast("?>"))
                return false;
        } else if (in.lookingAt("<!--")) {
            if (!in.skipPast("-->"))
                return false;
        } else if (in.lookingAt("<!DOCTYPE")) {
            // Name and external identifier, up to the closing '>'; a '['
            // outside the quoted literals opens an internal subset.
            in.advance(9);
            for (;;) {
                const ushort c = in.peek();
                if (c == 0)
                    return false;
                in.advance();
                if (c == '[')
                    return true;
                if (c == '>')
                    break;
                if (isQuote(c)) {
                    const char quote[2] = {char(c), 0};
                    if (!in.skipPast(quote))
                        return false;
                }
            }
        } else if (in.lookingAt("<!")) {
            return true; // no other declaration belongs before the document element
        } else {
            return false; // the document element
        }
    }
}

bool XmlGuard::hasDeclarations(const QByteArray &xml)
{
    QByteArray copy = xml; // shared, not copied
    QBuffer buffer(&copy);
    buffer.open(QIODevice::ReadOnly);
    return hasDeclarations(buffer);
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

XmlGuard::Outcome XmlGuard::open(const QString &path, InputFile::Kind kind, QFile &file,
                                 QString *reason)
{
    if (InputFile::open(path, kind, file, reason) != InputFile::Status::Opened)
        return Outcome::NotRead;
    return checkProlog(file, path, kind, reason);
}

XmlGuard::Outcome XmlGuard::checkProlog(QFile &file, const QString &path, InputFile::Kind kind,
                                        QString *reason)
{
    const bool declarations = hasDeclarations(file);
    if (declarations || !file.seek(0)) {
        file.close();
        return refuse(path, kind, InternalSubset, reason);
    }
    return Outcome::Accepted;
}

XmlGuard::Outcome XmlGuard::read(const QString &path, InputFile::Kind kind, QByteArray &xml,
                                 int maxDepth, QString *reason)
{
    if (InputFile::readAll(path, kind, xml, reason) != InputFile::Status::Opened)
        return Outcome::NotRead;
    Outcome outcome = Outcome::Accepted;
    if (hasDeclarations(xml))
        outcome = refuse(path, kind, InternalSubset, reason);
    else if (exceedsDepth(xml, maxDepth))
        outcome = refuse(path, kind, "elements nested too deeply", reason);
    if (outcome != Outcome::Accepted)
        xml.clear();
    return outcome;
}

} // namespace Port
