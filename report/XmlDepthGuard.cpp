#include "XmlDepthGuard.h"

#include <QtCore5Compat/QXmlContentHandler>
#include <QtCore5Compat/QXmlInputSource>
#include <QtCore5Compat/QXmlSimpleReader>

namespace {

// Passes every event on to the real handler, but stops the parse when an
// element opens deeper than allowed. The SAX reader reports a start tag
// before it descends into the element's content, so stopping there keeps
// its recursion bounded.
class DepthLimitedHandler : public QXmlContentHandler
{
public:
    DepthLimitedHandler(QXmlContentHandler &target, int maxDepth) : m_target(target), m_maxDepth(maxDepth) {}

    bool tooDeep() const { return m_tooDeep; }

    void setDocumentLocator(QXmlLocator *locator) override { m_target.setDocumentLocator(locator); }
    bool startDocument() override { return m_target.startDocument(); }
    bool endDocument() override { return m_target.endDocument(); }
    bool startPrefixMapping(const QString &prefix, const QString &uri) override
    {
        return m_target.startPrefixMapping(prefix, uri);
    }
    bool endPrefixMapping(const QString &prefix) override { return m_target.endPrefixMapping(prefix); }
    bool startElement(const QString &namespaceURI, const QString &localName, const QString &qName,
                      const QXmlAttributes &atts) override
    {
        if (++m_depth > m_maxDepth) {
            m_tooDeep = true;
            return false;
        }
        return m_target.startElement(namespaceURI, localName, qName, atts);
    }
    bool endElement(const QString &namespaceURI, const QString &localName, const QString &qName) override
    {
        --m_depth;
        return m_target.endElement(namespaceURI, localName, qName);
    }
    bool characters(const QString &ch) override { return m_target.characters(ch); }
    bool ignorableWhitespace(const QString &ch) override { return m_target.ignorableWhitespace(ch); }
    bool processingInstruction(const QString &target, const QString &data) override
    {
        return m_target.processingInstruction(target, data);
    }
    bool skippedEntity(const QString &name) override { return m_target.skippedEntity(name); }
    QString errorString() const override
    {
        return m_tooDeep ? QStringLiteral("elements nested too deeply") : m_target.errorString();
    }

private:
    QXmlContentHandler &m_target;
    const int m_maxDepth;
    int m_depth = 0;
    bool m_tooDeep = false;
};

} // namespace

CrvC_XmlDepthGuard::Outcome CrvC_XmlDepthGuard::parseFile(const QString &path, Port::InputFile::Kind kind,
                                                          QXmlContentHandler &handler, int maxDepth)
{
    QByteArray xml;
    switch (Port::XmlGuard::read(path, kind, xml, maxDepth)) {
    case Port::XmlGuard::Outcome::NotRead:
        return Outcome::NotRead;
    case Port::XmlGuard::Outcome::Refused:
        return Outcome::Refused;
    case Port::XmlGuard::Outcome::Accepted:
        break;
    }

    QXmlInputSource source;
    source.setData(xml);
    // The source holds its own decoded copy; the bytes are no longer needed.
    xml = QByteArray();
    DepthLimitedHandler limited(handler, maxDepth);
    QXmlSimpleReader reader;
    reader.setContentHandler(&limited);
    if (reader.parse(&source, false))
        return Outcome::Parsed;
    return limited.tooDeep() ? Outcome::Refused : Outcome::Malformed;
}
