#pragma once

#include <QByteArray>

// A cheap check before an XML document is handed to Qt's DOM or SAX parser:
// those recurse per nesting level (the SAX reader overflows the stack some
// ten thousand levels down, the DOM parser slows down quadratically), so a
// document nested deeper than any real report is treated as malformed
// instead. One iterative pass, linear in the input.
class CrvC_XmlDepthGuard
{
public:
    // Deeper than this many levels of elements is refused.
    static constexpr int MaxDepth = 1000;

    // True when `xml` is well-formed and nested no deeper than maxDepth.
    static bool isAcceptable(const QByteArray &xml, int maxDepth = MaxDepth);
};
