#pragma once

#include <QByteArray>
#include <QString>
#include <QStringList>
#include <QVector>

// Reads the machine-readable values out of a usage page
// (device_usage_statistics.html) as it arrives from a sender: the dtag
// elements that hold no other dtag element, in page order. Everything else on
// the page (the HTML around them, text outside dtag elements) is ignored.
//
// Pages come from the internet, so the reader trusts nothing: it works on a
// copy of the bytes, needs no more memory than a few times the page, and
// turns down (with a reason) every page it cannot read exactly: not UTF-8,
// larger, deeper or with more values than its limits, mark-up cut off (a tag, comment or dtag element that is
// never closed), a closing tag that closes another element than the one open,
// or no values at all.
class CrvB_PageReader
{
public:
    // The limits of a page the reader takes (docs/backend.md tells how they
    // were chosen).
    static const qint64 MaxPageBytes;
    struct Limits
    {
        qint64 maxBytes = MaxPageBytes;
        int maxDepth = 16; // dtag elements within each other
        int maxValues = 2000000;
    };

    struct Value
    {
        QString tag; // element name in lower case, e.g. "dtag-property"
        QString name; // its name attribute (hasName false when it has none)
        bool hasName = false;
        QString value; // the text between its tags, other mark-up removed, entities decoded
        QStringList path; // the enclosing dtag elements, outermost first: "tag" or "tag:name"
        int parent = -1; // which enclosing element: its number in opening order; -1 for none
    };

    struct Result
    {
        QVector<Value> values;
        QString rejection; // why the page was turned down; empty when it was read
        bool ok() const { return rejection.isEmpty(); }
    };

    static Result read(const QByteArray &page); // with the default limits
    static Result read(const QByteArray &page, const Limits &limits);

    // The values as the JSON object corvid-ingest --print shows:
    // {"values": [{"tag", "name" (or null), "value", "path"}, ...]}.
    static QByteArray toJson(const QVector<Value> &values);

    // Text with the HTML character references decoded: the named ones the
    // builder and browsers use most (&lt; &gt; &amp; &quot; &apos; &nbsp;)
    // and every numeric one; a reference to no valid character gives U+FFFD,
    // an unknown name is left as it is.
    static QString decodeEntities(const QByteArray &utf8);
};
