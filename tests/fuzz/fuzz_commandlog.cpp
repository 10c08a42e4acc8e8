// The command log and fuse log readers and the Tool Usage table.
#include "FuzzInput.h"

#include "report/CommandLog.h"
#include "report/SectionBuffer.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const QString log = CorvidFuzz::writeInput(QStringLiteral("design.cmd_log"), data, size);
    const QString fuse = CorvidFuzz::writeInput(QStringLiteral("fuse.log"), data, size);
    CrvC_ReportData report;
    CrvC_CommandLog::readCommandLog(log, report);
    CrvC_CommandLog::checkFuseLog(fuse, report);
    CrvC_SectionBuffer section;
    CrvC_CommandLog::commandLineHistorySection(report, section);
    return 0;
}
