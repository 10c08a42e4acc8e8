// The help viewer's usage file, read from where the reader looks for it
// (APPDATA pointed into the private directory).
#include "FuzzInput.h"

#include "report/HelpViewerData.h"

#include <QDir>

#include <cstdlib>

namespace {

QString helpFileInWorkDir()
{
    const QString appData = CorvidFuzz::workDir() + QLatin1String("/appdata");
    qputenv("APPDATA", appData.toLocal8Bit());
    const QString path = CrvC_HelpViewerData::helpFilePath();
    if (!path.startsWith(appData + QLatin1Char('/')))
        std::abort();
    return QDir(CorvidFuzz::workDir()).relativeFilePath(path);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    static const QString relativePath = helpFileInWorkDir();
    CorvidFuzz::writeInput(relativePath, data, size);
    CrvC_HelpViewerData help;
    help.sectionText();
    return 0;
}
