// The back end's page reader and the sorting of its values into rows: a page
// comes from the internet as it is.
#include "FuzzInput.h"

#include "backend/PageReader.h"
#include "backend/ReportRecord.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const CrvB_PageReader::Result result =
        CrvB_PageReader::read(QByteArray::fromRawData(reinterpret_cast<const char *>(data), qsizetype(size)));
    // A page is read whole or turned down with nothing read.
    if (result.ok() == result.values.isEmpty())
        std::abort();
    CrvB_ReportRecord record;
    QString reason;
    CrvB_ReportRecord::fromValues(result.values, record, &reason);
    CrvB_PageReader::toJson(result.values);
    return 0;
}
