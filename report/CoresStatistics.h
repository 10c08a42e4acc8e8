#pragma once

#include <QtCore5Compat/QXmlDefaultHandler>

#include <initializer_list>

#include "SectionBuffer.h"

#include <QByteArray>
#include <QString>
#include <QStringView>

// Lists the IP cores of the design from the netlist-build XML report
// (<design>_lnkgen.drpt) as the core statistics section: one block per core
// instance, in file order, with the core's type and parameters. Instances are
// neither counted nor merged.
//
// Content handler of a SAX parse: a "scope" element with stringID
// "LNKGEN_CORE_INSTANCE" starts an instance; its "item" elements with stringID
// "LNKGEN_CORE_INFO" (core type and parameters) and "LNKGEN_CORE_PARAMETERS"
// add (name, value) pairs to it; the end of any "scope" ends it.
class CrvC_CoresStatistics : public QXmlDefaultHandler
{
public:
    CrvC_CoresStatistics();
    ~CrvC_CoresStatistics() override;

    bool startDocument() override;
    bool startElement(const QString &namespaceURI, const QString &localName, const QString &qName,
                      const QXmlAttributes &atts) override;
    bool endElement(const QString &namespaceURI, const QString &localName, const QString &qName) override;
    bool characters(const QString &ch) override;

    // Parses the report at `path` and writes the section to `out`: nothing
    // when the file is missing or holds no core instance, or is refused as
    // too large or too deeply nested. A malformed file gives the instances
    // read before the error.
    void writeSection(const QString &path, CrvC_SectionBuffer &out);
    // The same section in one piece.
    QByteArray sectionText(const QString &path);

private:
    void startInstance();
    void endInstance();
    // Adds a (name, value) pair to the instance being read: its first pair
    // is the instance's title, the others stand four to a row.
    void appendPair(QLatin1String nameTag, QStringView name, QLatin1String valueTag, QStringView value);
    // Appends the attributes of `atts` as parameters, in attribute order,
    // except those named in `skipped`.
    void appendParameters(const QXmlAttributes &atts, std::initializer_list<QLatin1String> skipped);

    CrvC_SectionBuffer *m_text = nullptr;
    bool m_inInstance = false;
    // Pairs of the last instance so far; -1 before the first instance.
    qsizetype m_pairs = -1;
};
