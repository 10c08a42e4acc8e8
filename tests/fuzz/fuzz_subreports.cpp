// The place-and-route and simulator usage pages.
#include "FuzzInput.h"

#include "report/RunStatistics.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const QString path = CorvidFuzz::writeInput(QStringLiteral("par_usage_statistics.html"), data, size);
    CrvC_RunStatistics::parUsageSection(path);
    CrvC_RunStatistics::osimUsageSection(path);
    return 0;
}
