#include "FuzzInput.h"

#include <QCoreApplication>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QTemporaryDir>

#include <cstdio>
#include <cstdlib>
#include <memory>

namespace CorvidFuzz {
namespace {

struct State
{
    State()
    {
        static int argc = 1;
        static char name[] = "corvid-fuzz";
        static char *argv[] = {name, nullptr};
        if (!QCoreApplication::instance())
            app = std::make_unique<QCoreApplication>(argc, argv);
        if (!dir.isValid()) {
            std::fprintf(stderr, "corvid-fuzz: no temporary directory\n");
            std::abort();
        }
    }
    std::unique_ptr<QCoreApplication> app;
    QTemporaryDir dir{QDir::tempPath() + QLatin1String("/corvid-fuzz-XXXXXX")};
};

State &state()
{
    static State s;
    return s;
}

} // namespace

QString workDir()
{
    return state().dir.path();
}

QString writeInput(const QString &relativePath, const uint8_t *data, size_t size)
{
    const QString path = workDir() + QLatin1Char('/') + relativePath;
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate)
        || file.write(reinterpret_cast<const char *>(data), qint64(size)) != qint64(size)) {
        std::fprintf(stderr, "corvid-fuzz: cannot write %s\n", qPrintable(path));
        std::abort();
    }
    return path;
}

} // namespace CorvidFuzz
