// The host's project file: read, and when it reads, written and read back;
// the second reading must write the same file as the first (nothing lost or
// altered on a save).
#include "FuzzInput.h"

#include "host/project/ProjectDocument.h"

namespace {

QByteArray contents(const QString &path)
{
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const QString path = CorvidFuzz::writeInput(QStringLiteral("design.orb"), data, size);
    OrbProject::ProjectDocument document;
    QString error;
    if (!document.read(path, &error))
        return 0;
    document.effectiveProperties();
    for (const auto &source : document.sources)
        OrbProject::ProjectDocument::typeForFileName(source.path);

    const QString first = CorvidFuzz::workDir() + QLatin1String("/first.orb");
    const QString second = CorvidFuzz::workDir() + QLatin1String("/second.orb");
    OrbProject::ProjectDocument reread;
    if (!document.write(first, &error) || !reread.read(first, &error) || !reread.write(second, &error)) {
        std::fprintf(stderr, "a project that was read does not save and read back: %s\n", qPrintable(error));
        std::abort();
    }
    if (contents(first) != contents(second)) {
        std::fprintf(stderr, "a saved project reads back differently\n");
        std::abort();
    }
    return 0;
}
