// The netlist-build report's core instances.
#include "FuzzInput.h"

#include "report/CoresStatistics.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const QString path = CorvidFuzz::writeInput(QStringLiteral("design_lnkgen.drpt"), data, size);
    CrvC_CoresStatistics().sectionText(path);
    return 0;
}
