#pragma once

#include "host/InputFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QString>

#include <sys/stat.h>
#include <sys/types.h>

// Puts something that is not a usable input where a reader looks for one.
namespace HostileInputs {

enum class Case {
    Fifo,         // a named pipe with no writer
    DeviceLink,   // a symbolic link to /dev/zero
    Directory,    // a directory of that name
    OverLimit,    // a sparse file one byte above the limit of its kind
    EntityDoubling,     // an internal DTD whose entities double at every level
    NestedContentModel, // an internal DTD with 70,000 nested parentheses
};

inline const char *name(Case c)
{
    static const char *const names[] = {"named pipe", "link to /dev/zero", "directory",
                                        "over the limit", "entity doubling", "nested content model"};
    return names[int(c)];
}

// Plants case `c` at `path`; `reader` names the fuzzers' regression folder
// that holds the DTD samples. False when it could not be made.
inline bool plant(const QString &path, Case c, Port::InputFile::Kind kind,
                  const QString &reader = QString())
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile::remove(path);
    switch (c) {
    case Case::Fifo:
        return ::mkfifo(QFile::encodeName(path).constData(), 0600) == 0;
    case Case::DeviceLink:
        return QFile::link(QStringLiteral("/dev/zero"), path);
    case Case::Directory:
        return QDir().mkpath(path);
    case Case::OverLimit: {
        QFile file(path);
        return file.open(QIODevice::WriteOnly)
            && file.resize(Port::InputFile::sizeLimit(kind) + 1);
    }
    case Case::EntityDoubling:
    case Case::NestedContentModel:
        return QFile::copy(QStringLiteral(CORVID_SOURCE_DIR "/tests/fuzz/regressions/") + reader
                               + (c == Case::EntityDoubling ? QLatin1String("/entity-doubling.xml")
                                                            : QLatin1String("/nested-content-model.xml")),
                           path);
    }
    return false;
}

} // namespace HostileInputs
