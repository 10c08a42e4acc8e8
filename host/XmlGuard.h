#pragma once

#include "InputFile.h"
#include "OrbHostExport.h"

#include <QXmlStreamReader>

class QIODevice;

namespace Port {

// The guard in front of every XML input. The design tools write plain
// documents: no internal DTD subset, a modest nesting depth, a bounded size.
// Anything else is a trap for the parsers rather than a report (entities that
// expand exponentially, content models nested tens of thousands deep that
// overflow a recursive parser's stack), so it is refused as malformed:
//
// - the file is opened through InputFile, with the size limit of its kind;
// - the prolog is scanned by hand before any parser sees it: a document type
//   declaration with an internal subset ("[" ... "]"), or any markup
//   declaration other than a comment before the document element, refuses
//   the document; a document type line naming only an external DTD is
//   allowed (no parser here ever fetches it);
// - elements nested deeper than MaxDepth refuse the document: streaming
//   readers count with readNext(), readers that take the whole bytes get
//   them checked by read().
class ORBHOST_EXPORT XmlGuard
{
public:
    // Deeper than this many levels of elements is refused.
    static constexpr int MaxDepth = 1000;

    enum class Outcome {
        NotRead,  // missing, or refused by InputFile: the caller saw nothing
        Accepted, // ready to parse
        Refused,  // an internal DTD subset, or nested too deeply: malformed
    };

    // For streaming readers: opens `path` into `file` (which must not be
    // open) and checks its prolog; on Accepted the file is positioned at its
    // start. The caller reads it with readNext().
    // `reason` receives the problem in a few words, as with InputFile.
    static Outcome open(const QString &path, InputFile::Kind kind, QFile &file,
                        QString *reason = nullptr);

    // The prolog check of open() for a file already opened through
    // InputFile: Accepted with the file rewound, or Refused with it closed.
    static Outcome checkProlog(QFile &file, const QString &path, InputFile::Kind kind,
                               QString *reason = nullptr);

    // For readers that take the whole document: reads it, checks its prolog
    // and its depth (up to the first error the stream reader sees). `xml` is
    // empty unless the outcome is Accepted.
    static Outcome read(const QString &path, InputFile::Kind kind, QByteArray &xml,
                        int maxDepth = MaxDepth, QString *reason = nullptr);

    // True when the prolog of the document holds an internal DTD subset or
    // another markup declaration. Reads `device` from its current position
    // up to the document element at most, and leaves it positioned there.
    // Encodings recognised: UTF-8 and other ASCII-based ones, UTF-16 and
    // UTF-32 with or without a byte-order mark.
    static bool hasDeclarations(QIODevice &device);
    static bool hasDeclarations(const QByteArray &xml);

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
