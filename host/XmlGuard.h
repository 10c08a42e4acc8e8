#pragma once

#include "InputFile.h"
#include "OrbHostExport.h"

#include <QXmlStreamReader>

class QIODevice;

namespace Port {

// The guard in front of every XML input. The design tools write plain
// documents: UTF-8, no internal DTD subset, a handful of attributes per
// element, a modest nesting depth, a bounded size. Anything else is a trap for
// the parsers rather than a report (entities that expand exponentially,
// content models nested tens of thousands deep that overflow a recursive
// parser's stack, attribute lists whose checking costs the square of their
// length), so it is refused as malformed:
//
// - the file is opened through InputFile, with the size limit of its kind;
// - the prolog is scanned by hand before any parser sees it: an encoding
//   declaration naming anything but UTF-8, UTF-16, UTF-32, US-ASCII or
//   ISO-8859-1 (or one that does not fit the document's first bytes) refuses
//   the document, since the parsers would decode the rest in it and the scan
//   would no longer see what they see (in UTF-7 "<!DOCTYPE" is written
//   "+ADw-!DOCTYPE"); so do a document type declaration with an internal
//   subset ("[" ... "]") and any markup declaration other than a comment
//   before the document element; a document type line naming only an
//   external DTD is allowed (no parser here ever fetches it);
// - every byte read is scanned on its way to the parser: an element with
//   more than MaxAttributes attributes refuses the document before the parser
//   reads that far;
// - elements nested deeper than MaxDepth refuse the document: streaming
//   readers count with readNext(), readers that take the whole bytes get
//   them checked by read().
class ORBHOST_EXPORT XmlGuard
{
public:
    // Deeper than this many levels of elements is refused.
    static constexpr int MaxDepth = 1000;
    // More attributes than this on one element are refused.
    static constexpr int MaxAttributes = 256;

    enum class Outcome {
        NotRead,  // missing, or refused by InputFile when opened: the caller saw nothing
        Accepted, // ready to parse
        Refused,  // a DTD trick, an encoding, too many attributes, too deep, too long: malformed
    };

    // For streaming readers: opens `path` into `file` (which must not be
    // open) and guards it (below). The caller reads it with readNext(), and
    // treats the document as malformed when the file is refused() afterwards.
    // `reason` receives the problem in a few words, as with InputFile.
    static Outcome open(const QString &path, InputFile::Kind kind, InputFile &file,
                        QString *reason = nullptr);

    // The checks of open() for a file just opened through InputFile: its
    // prolog is checked, and on Accepted it is rewound with the attribute
    // count installed as its inspector. Refused closes it.
    static Outcome guard(InputFile &file, QString *reason = nullptr);

    // For readers that take the whole document: reads it, checks its prolog,
    // its attributes and its depth (up to the first error the stream reader
    // sees). `xml` is empty unless the outcome is Accepted.
    static Outcome read(const QString &path, InputFile::Kind kind, QByteArray &xml, int maxDepth = MaxDepth,
                        QString *reason = nullptr);

    // Why the prolog of the document is refused (an encoding declaration or
    // a markup declaration, above), or empty text when it is not. Reads
    // `device` from its current position up to the document element at most.
    // Encodings recognised: UTF-8 and other ASCII-based ones, UTF-16 and
    // UTF-32 with or without a byte-order mark.
    static QString prologProblem(QIODevice &device);
    static QString prologProblem(const QByteArray &xml);

    // True when `xml` opens an element deeper than maxDepth before its end or
    // its first error (namespace prefixes are not checked).
    static bool exceedsDepth(const QByteArray &xml, int maxDepth = MaxDepth);

    // QXmlStreamReader::readNext() that keeps the element depth in `depth`
    // (start at 0) and raises an error on the reader, returning Invalid, when
    // an element opens deeper than maxDepth.
    static QXmlStreamReader::TokenType readNext(QXmlStreamReader &reader, int &depth,
                                                int maxDepth = MaxDepth);
};

} // namespace Port
