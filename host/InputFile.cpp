#include "InputFile.h"

#include "MsgManData.h"

#include <QFile>
#include <QFileInfo>

#include <limits>

#ifdef Q_OS_UNIX
#  include <cerrno>
#  include <cstring>
#  include <fcntl.h>
#  include <sys/stat.h>
#  include <unistd.h>
#endif

namespace Port {
namespace {

constexpr qint64 KiB = 1024;
constexpr qint64 MiB = 1024 * KiB;

struct KindInfo
{
    const char *name;
    qint64 limit;
};

// Keep in step with docs/inputs.md.
const KindInfo Kinds[InputFile::KindCount] = {
    {"synthesis report", 256 * MiB},
    {"map report", 64 * MiB},
    {"usage XML", 256 * MiB},
    {"command log", 256 * MiB},
    {"fuse log", std::numeric_limits<qint64>::max()},
    {"netlist-build report", 256 * MiB},
    {"help viewer data", 64 * MiB},
    {"sub-report page", 64 * MiB},
    {"run records", 64 * MiB},
    {"install-wide settings", 1 * MiB},
    {"project file", 64 * MiB},
};

const KindInfo &info(InputFile::Kind kind)
{
    return Kinds[kind >= 0 && kind < InputFile::KindCount ? kind : InputFile::ProjectFile];
}

InputFile::Status refuse(InputFile::Status status, const QString &path, InputFile::Kind kind,
                         const QString &problem, QString *reason)
{
    // Nothing there is the ordinary case of an input a project does not have.
    if (status != InputFile::Status::Missing) {
        const QString text = QStringLiteral("%1 %2: %3")
                                 .arg(QString::fromLatin1(info(kind).name), path, problem);
        Port_MsgManData::debugStub("Input refused: %s\n", text.toLocal8Bit().constData());
    }
    if (reason)
        *reason = problem;
    return status;
}

QString tooLarge(qint64 size, qint64 limit)
{
    return QStringLiteral("%1 bytes is larger than the limit of %2 bytes").arg(size).arg(limit);
}

} // namespace

qint64 InputFile::sizeLimit(Kind kind)
{
    return info(kind).limit;
}

const char *InputFile::kindName(Kind kind)
{
    return info(kind).name;
}

InputFile::Status InputFile::open(const QString &path, Kind kind, QFile &file, QString *reason)
{
    if (path.isEmpty())
        return refuse(Status::Missing, path, kind, QStringLiteral("no file name"), reason);
    const qint64 limit = sizeLimit(kind);
#ifdef Q_OS_UNIX
    // Opened without blocking, so that a pipe with no writer or a device does
    // not hold up the caller; what was opened is then examined through the
    // descriptor itself, so that it cannot be swapped between a check and the
    // open.
    const QByteArray name = QFile::encodeName(path);
    int fd;
    do {
        fd = ::open(name.constData(), O_RDONLY | O_NONBLOCK | O_CLOEXEC | O_NOCTTY);
    } while (fd < 0 && errno == EINTR);
    if (fd < 0) {
        const int error = errno;
        if (error == ENOENT || error == ENOTDIR)
            return refuse(Status::Missing, path, kind, QStringLiteral("no such file"), reason);
        return refuse(Status::Unreadable, path, kind,
                      QString::fromLocal8Bit(std::strerror(error)), reason);
    }
    struct stat st;
    if (::fstat(fd, &st) != 0) {
        const int error = errno;
        ::close(fd);
        return refuse(Status::Unreadable, path, kind,
                      QString::fromLocal8Bit(std::strerror(error)), reason);
    }
    if (!S_ISREG(st.st_mode)) {
        ::close(fd);
        const char *what = S_ISDIR(st.st_mode)    ? "a directory"
                           : S_ISFIFO(st.st_mode) ? "a named pipe"
                           : S_ISSOCK(st.st_mode) ? "a socket"
                           : S_ISCHR(st.st_mode) || S_ISBLK(st.st_mode) ? "a device"
                                                                         : "not a regular file";
        return refuse(Status::NotRegular, path, kind, QString::fromLatin1(what), reason);
    }
    if (qint64(st.st_size) > limit) {
        ::close(fd);
        return refuse(Status::TooLarge, path, kind, tooLarge(st.st_size, limit), reason);
    }
    const int flags = ::fcntl(fd, F_GETFL);
    if (flags >= 0)
        ::fcntl(fd, F_SETFL, flags & ~O_NONBLOCK);
    if (!file.open(fd, QIODevice::ReadOnly, QFileDevice::AutoCloseHandle)) {
        ::close(fd);
        return refuse(Status::Unreadable, path, kind, file.errorString(), reason);
    }
    return Status::Opened;
#else
    const QFileInfo fileInfo(path);
    if (!fileInfo.exists())
        return refuse(Status::Missing, path, kind, QStringLiteral("no such file"), reason);
    if (!fileInfo.isFile())
        return refuse(Status::NotRegular, path, kind, QStringLiteral("not a regular file"), reason);
    if (fileInfo.size() > limit)
        return refuse(Status::TooLarge, path, kind, tooLarge(fileInfo.size(), limit), reason);
    file.setFileName(path);
    if (!file.open(QIODevice::ReadOnly))
        return refuse(Status::Unreadable, path, kind, file.errorString(), reason);
    return Status::Opened;
#endif
}

InputFile::Status InputFile::readAll(const QString &path, Kind kind, QByteArray &bytes,
                                     QString *reason)
{
    bytes.clear();
    QFile file;
    const Status status = open(path, kind, file, reason);
    if (status != Status::Opened)
        return status;
    const qint64 limit = sizeLimit(kind);
    // Read no more than one byte past the limit, whatever the size said.
    QByteArray data;
    data.reserve(qsizetype(qMin(file.size(), limit)));
    char buffer[64 * 1024];
    for (;;) {
        const qint64 n = file.read(buffer, sizeof buffer);
        if (n < 0)
            return refuse(Status::Unreadable, path, kind, file.errorString(), reason);
        if (n == 0)
            break;
        if (n > limit - qint64(data.size()))
            return refuse(Status::TooLarge, path, kind,
                          QStringLiteral("it grew past the limit of %1 bytes while being read")
                              .arg(limit),
                          reason);
        data.append(buffer, qsizetype(n));
    }
    bytes = std::move(data);
    return Status::Opened;
}

bool InputFile::isAvailable(const QString &path, Kind kind)
{
    QFile file;
    return open(path, kind, file) == Status::Opened;
}

} // namespace Port
