// The help viewer's usage file, where the reader looks for it (APPDATA
// pointed into the private directory).
#include "FuzzInput.h"

#include "report/HelpViewerData.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    static const QString relativePath = [] {
        const QString appData = CorvidFuzz::workDir() + QLatin1String("/appdata");
        qputenv("APPDATA", QFile::encodeName(appData));
        const QString path = CrvC_HelpViewerData::helpFilePath();
        if (!path.startsWith(appData + QLatin1Char('/')))
            std::abort();
        return QDir(CorvidFuzz::workDir()).relativeFilePath(path);
    }();
    CorvidFuzz::writeInput(relativePath, data, size);
    CrvC_HelpViewerData().sectionText();
    return 0;
}
