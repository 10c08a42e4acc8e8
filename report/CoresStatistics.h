#pragma once

#include <QtCore5Compat/QXmlDefaultHandler>

#include <QList>
#include <QPair>
#include <QString>

// Lists the IP cores of the design from the netlist-build XML report
// (<design>_lnkgen.drpt) as the core statistics section.
class CrvC_CoresStatistics : public QXmlDefaultHandler
{
public:
    CrvC_CoresStatistics();
    ~CrvC_CoresStatistics() override;

    // Parses the report at `path` and answers the section text (empty when
    // there is nothing to show).
    QString sectionText(const QString &path);
};
