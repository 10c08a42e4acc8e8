// The synthesis report and map report readers, fed the same bytes, and the
// macro statistics cell made from them.
#include "FuzzInput.h"

#include "report/SynthesisReport.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const QString path = CorvidFuzz::writeInput(QStringLiteral("design.snx"), data, size);
    CrvC_ReportData report;
    CrvC_SynthesisReport::readTargetInfo(path, report);
    CrvC_SynthesisReport::readMacroStatistics(path, report);
    CrvC_SynthesisReport::macroStatisticsCell(report);
    return 0;
}
