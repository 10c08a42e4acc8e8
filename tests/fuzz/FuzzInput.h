#pragma once

// Shared by the fuzz harnesses (one translation unit each). Every reader under
// test takes a path, so each input goes to a file in a private temporary
// directory, removed at exit. Without libFuzzer, main() below runs each file
// named on the command line through the harness once (run-inputs.sh names
// the seeds and regression cases), so they are checked in every build.

#include <QCoreApplication>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QTemporaryDir>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size);

namespace CorvidFuzz {

// The private directory, made on first use with a QCoreApplication, so the
// readers see the same Qt set-up as in the host.
inline QString workDir()
{
    static int argc = 1;
    static char name[] = "corvid-fuzz";
    static char *argv[] = {name, nullptr};
    static const std::unique_ptr<QCoreApplication> app(
        QCoreApplication::instance() ? nullptr : new QCoreApplication(argc, argv));
    static const QTemporaryDir dir(QDir::tempPath() + QLatin1String("/corvid-fuzz-XXXXXX"));
    if (!dir.isValid())
        std::abort();
    return dir.path();
}

// Writes the input to workDir()/<relativePath> and answers its path. Aborts
// when it cannot: a harness that silently tests nothing would hide every fault.
inline QString writeInput(const QString &relativePath, const uint8_t *data, size_t size)
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

inline QString writeInput(const QString &relativePath, const QByteArray &bytes)
{
    return writeInput(relativePath, reinterpret_cast<const uint8_t *>(bytes.constData()),
                      size_t(bytes.size()));
}

} // namespace CorvidFuzz

#ifdef CORVID_FUZZ_STANDALONE
int main(int argc, char **argv)
{
    for (int i = 1; i < argc; ++i) {
        QFile file(QString::fromLocal8Bit(argv[i]));
        if (!file.open(QIODevice::ReadOnly)) {
            std::fprintf(stderr, "cannot read %s\n", argv[i]);
            return 1;
        }
        const QByteArray data = file.readAll();
        std::printf("Running: %s\n", argv[i]);
        LLVMFuzzerTestOneInput(reinterpret_cast<const uint8_t *>(data.constData()), size_t(data.size()));
    }
    std::printf("Executed %d inputs\n", argc - 1);
    return 0;
}
#endif
