#pragma once

#include <QtCore5Compat/QXmlDefaultHandler>

#include <QList>
#include <QPair>
#include <QString>

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
    // One (name, value) pair of a core instance, both already in dtag mark-up.
    using Parameter = QPair<QString, QString>;
    using CoreInstance = QList<Parameter>;

    CrvC_CoresStatistics();
    ~CrvC_CoresStatistics() override;

    bool startDocument() override;
    bool startElement(const QString &namespaceURI, const QString &localName, const QString &qName,
                      const QXmlAttributes &atts) override;
    bool endElement(const QString &namespaceURI, const QString &localName,
                    const QString &qName) override;
    bool characters(const QString &ch) override;

    // Parses the report at `path` and answers the section text: empty when
    // the file is missing or holds no core instance, or is refused as too
    // large or too deeply nested. A malformed file gives the instances read
    // before the error.
    QString sectionText(const QString &path);

private:
    void parse();
    QString sectionFromInstances() const;

    QString m_fileName;
    QList<CoreInstance> m_coreInstances;
    // Index into m_coreInstances of the instance being filled; -1 for none.
    qsizetype m_currentInstance = -1;
};
