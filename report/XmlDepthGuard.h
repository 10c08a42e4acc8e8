#pragma once

#include <QByteArray>
#include <QString>

class QXmlContentHandler;

// Guards Qt's XML parsers against documents no real report looks like.
// The SAX reader (QXmlSimpleReader) recurses once per level of nesting and
// overflows the stack some ten thousand levels down, taking the host with it;
// the DOM parser slows down quadratically with depth. A document nested
// deeper than any real report is therefore refused, and treated by the
// readers as malformed.
//
// isAcceptable() is the check before a DOM parse. parseFile() is the way into
// a SAX parse: it reads the file once, checks the bytes with one iterative
// pass and hands the same bytes to the SAX reader, which is also stopped the
// moment an element opens deeper than allowed (the cheap check stops at the
// first error it sees, which the SAX reader may not mind).
class CrvC_XmlDepthGuard
{
public:
    // Deeper than this many levels of elements is refused.
    static constexpr int MaxDepth = 1000;
    // A larger file is refused without being read.
    static constexpr qint64 MaxFileSize = qint64(256) * 1024 * 1024;

    // True when `xml` is well-formed and nested no deeper than maxDepth.
    static bool isAcceptable(const QByteArray &xml, int maxDepth = MaxDepth);

    // True when `xml` opens an element deeper than maxDepth before its end
    // or its first error (namespace prefixes are not checked).
    static bool exceedsDepth(const QByteArray &xml, int maxDepth = MaxDepth);

    enum class Outcome {
        NotRead,   // missing or unreadable file: the handler saw nothing
        Parsed,    // parsed to the end without error
        Malformed, // the SAX reader stopped at an error; what came before was reported
        Refused,   // too large or too deep; whatever the handler collected must be dropped
    };

    // Reads the file at `path` and parses it with a QXmlSimpleReader, with
    // `handler` as its only handler. Linear in the size of the file.
    static Outcome parseFile(const QString &path, QXmlContentHandler &handler,
                             int maxDepth = MaxDepth);
};
