// The host's run records reader and the run statistics table.
#include "FuzzInput.h"

#include "host/components/qualitydata/RunRecords.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const QString path = CorvidFuzz::writeInput(QStringLiteral("design.orb.runs"), data, size);
    UtilC::RunRecords records;
    records.read(path);
    records.htmlTable();
    return 0;
}
