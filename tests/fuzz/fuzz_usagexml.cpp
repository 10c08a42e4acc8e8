// The usage XML reader and the tables made from what it read.
#include "FuzzInput.h"

#include "report/UsageXml.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const QString path = CorvidFuzz::writeInput(QStringLiteral("design_usage.xml"), data, size);
    CrvC_ReportData report;
    CrvC_UsageXml::readUsageXml(path, report);
    QStringList lines;
    CrvC_UsageXml::appendTables(report, lines);
    return 0;
}
