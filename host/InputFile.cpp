#include "InputFile.h"

#include "MsgManData.h"

#include <QFile>
#include <QFileInfo>

#include <atomic>
#include <limits>

#ifdef Q_OS_UNIX
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
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

InputFile::Kind valid(InputFile::Kind kind)
{
    return kind >= 0 && kind < InputFile::KindCount ? kind : InputFile::ProjectFile;
}

const KindInfo &info(InputFile::Kind kind)
{
    return Kinds[valid(kind)];
}

// Limits replaced by setSizeLimit(), 0 where none is.
std::atomic<qint64> replacedLimits[InputFile::KindCount];

void report(const QString &path, InputFile::Kind kind, const QString &problem)
{
    const QString text = QStringLiteral("%1 %2: %3").arg(QString::fromLatin1(info(kind).name), path, problem);
    Port_MsgManData::debugStub("Input refused: %s\n", text.toLocal8Bit().constData());
}

InputFile::Status refusalOf(InputFile::Status status, const QString &path, InputFile::Kind kind,
                            const QString &problem, QString *reason)
{
    // Nothing there is the ordinary case of an input a project does not have.
    if (status != InputFile::Status::Missing)
        report(path, kind, problem);
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
    const qint64 replaced = replacedLimits[valid(kind)];
    return replaced > 0 ? replaced : info(kind).limit;
}

qint64 InputFile::setSizeLimit(Kind kind, qint64 bytes)
{
    return replacedLimits[valid(kind)].exchange(qMax(bytes, qint64(0)));
}

const char *InputFile::kindName(Kind kind)
{
    return info(kind).name;
}

InputFile::InputFile() = default;

InputFile::~InputFile() = default;

InputFile::Status InputFile::open(const QString &path, Kind kind, QString *reason)
{
    if (path.isEmpty())
        return refusalOf(Status::Missing, path, kind, QStringLiteral("no file name"), reason);
    m_path = path;
    m_kind = kind;
    m_limit = sizeLimit(kind);
    m_position = 0;
    m_pastLimit = false;
    m_refusal.clear();
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
            return refusalOf(Status::Missing, path, kind, QStringLiteral("no such file"), reason);
        return refusalOf(Status::Unreadable, path, kind, QString::fromLocal8Bit(std::strerror(error)),
                         reason);
    }
    struct stat st;
    if (::fstat(fd, &st) != 0) {
        const int error = errno;
        ::close(fd);
        return refusalOf(Status::Unreadable, path, kind, QString::fromLocal8Bit(std::strerror(error)),
                         reason);
    }
    if (!S_ISREG(st.st_mode)) {
        ::close(fd);
        const char *what = S_ISDIR(st.st_mode)                          ? "a directory"
                           : S_ISFIFO(st.st_mode)                       ? "a named pipe"
                           : S_ISSOCK(st.st_mode)                       ? "a socket"
                           : S_ISCHR(st.st_mode) || S_ISBLK(st.st_mode) ? "a device"
                                                                        : "not a regular file";
        return refusalOf(Status::NotRegular, path, kind, QString::fromLatin1(what), reason);
    }
    if (qint64(st.st_size) > m_limit) {
        ::close(fd);
        return refusalOf(Status::TooLarge, path, kind, tooLarge(st.st_size, m_limit), reason);
    }
    const int flags = ::fcntl(fd, F_GETFL);
    if (flags >= 0)
        ::fcntl(fd, F_SETFL, flags & ~O_NONBLOCK);
    if (!QFile::open(fd, QIODevice::ReadOnly, QFileDevice::AutoCloseHandle)) {
        ::close(fd);
        return refusalOf(Status::Unreadable, path, kind, errorString(), reason);
    }
    return Status::Opened;
#else
    const QFileInfo fileInfo(path);
    if (!fileInfo.exists())
        return refusalOf(Status::Missing, path, kind, QStringLiteral("no such file"), reason);
    if (!fileInfo.isFile())
        return refusalOf(Status::NotRegular, path, kind, QStringLiteral("not a regular file"), reason);
    if (fileInfo.size() > m_limit)
        return refusalOf(Status::TooLarge, path, kind, tooLarge(fileInfo.size(), m_limit), reason);
    setFileName(path);
    if (!QFile::open(QIODevice::ReadOnly))
        return refusalOf(Status::Unreadable, path, kind, errorString(), reason);
    return Status::Opened;
#endif
}

void InputFile::refuse(const QString &problem)
{
    m_refusal = problem;
    setErrorString(problem);
    report(m_path, m_kind, problem);
}

qint64 InputFile::readData(char *data, qint64 maxSize)
{
    if (refused())
        return -1;
    if (maxSize <= 0)
        return 0;
    if (m_position >= m_limit) {
        // At the limit: only the true end of the file is acceptable here.
        // (Some files in /proc take only whole entries of 8 bytes.)
        char probe[64];
        const qint64 n = QFile::readData(probe, sizeof probe);
        if (n == 0)
            return 0;
        m_pastLimit = true;
        refuse(QStringLiteral("it reads past the limit of %1 bytes").arg(m_limit));
        return -1;
    }
    const qint64 n = QFile::readData(data, qMin(maxSize, m_limit - m_position));
    if (n == 0)
        return 0;
    if (n < 0) {
        // A reader would take what came before as the whole file.
        refuse(QStringLiteral("a read failed: %1").arg(errorString()));
        return -1;
    }
    m_position += n;
    if (m_inspector) {
        const QString problem = m_inspector(data, n);
        if (!problem.isEmpty()) {
            refuse(problem);
            return -1;
        }
    }
    return n;
}

qint64 InputFile::readLineData(char *data, qint64 maxSize)
{
    // QFile's own line reading would go to the file directly, past the count.
    return QIODevice::readLineData(data, maxSize);
}

bool InputFile::seek(qint64 pos)
{
    if (!QFile::seek(pos))
        return false;
    m_position = pos;
    return true;
}

bool InputFile::atEnd() const
{
    return refused() || QFile::atEnd();
}

bool InputFile::readRest(QByteArray &bytes)
{
    bytes.clear();
    QByteArray data;
    data.reserve(qsizetype(qBound(qint64(0), size() - pos(), m_limit)));
    char buffer[64 * 1024];
    for (;;) {
        const qint64 n = read(buffer, sizeof buffer);
        if (n < 0)
            return false;
        if (n == 0)
            break;
        data.append(buffer, qsizetype(n));
    }
    bytes = std::move(data);
    return true;
}

InputFile::Status InputFile::readAll(const QString &path, Kind kind, QByteArray &bytes, QString *reason)
{
    bytes.clear();
    InputFile file;
    const Status status = file.open(path, kind, reason);
    if (status != Status::Opened)
        return status;
    if (file.readRest(bytes))
        return Status::Opened;
    if (reason)
        *reason = file.refusal();
    return file.m_pastLimit ? Status::TooLarge : Status::Unreadable;
}

bool InputFile::isAvailable(const QString &path, Kind kind)
{
    InputFile file;
    return file.open(path, kind) == Status::Opened;
}

} // namespace Port
