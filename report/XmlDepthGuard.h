#pragma once

#include "host/InputFile.h"
#include "host/XmlGuard.h"

#include <QString>

class QXmlContentHandler;

// The way into a SAX parse of an XML input. Qt's SAX reader
// (QXmlSimpleReader) recurses once per level of nesting and overflows the
// stack some ten thousand levels down, taking the host with it, and it would
// expand whatever entities an internal DTD declares. parseFile() therefore
// hands it only what Port::XmlGuard accepted (a regular file within the size
// limit of its kind, no internal DTD subset, no deeper than the limit as far
// as the stream reader sees), and also stops it the moment an element opens
// deeper than allowed, since the stream check stops at the first error it
// meets, which the SAX reader may read past.
class CrvC_XmlDepthGuard
{
public:
    enum class Outcome {
        NotRead,   // missing or unreadable file: the handler saw nothing
        Parsed,    // parsed to the end without error
        Malformed, // the SAX reader stopped at an error; what came before was reported
        Refused,   // too large, a DTD trick or too deep; whatever the handler collected must be dropped
    };

    // Reads the file at `path`, an input of the given kind, and parses it
    // with a QXmlSimpleReader, with `handler` as its only handler. Linear in
    // the size of the file.
    static Outcome parseFile(const QString &path, Port::InputFile::Kind kind, QXmlContentHandler &handler,
                             int maxDepth = Port::XmlGuard::MaxDepth);
};
