#include "ProxyDeadline.h"

#include <QElapsedTimer>
#include <QProcess>
#include <QThread>

#include <csignal>
#include <sys/prctl.h>

namespace {

// How often a waiting step looks at the switch.
const int SliceMs = 50;

} // namespace

CrvC_ProxyDeadline::CrvC_ProxyDeadline()
    : m_deadline(QDeadlineTimer::Forever), m_stopped(std::make_shared<std::atomic<bool>>(false))
{
}

CrvC_ProxyDeadline::CrvC_ProxyDeadline(int limitMs)
    : m_deadline(limitMs, Qt::PreciseTimer), m_stopped(std::make_shared<std::atomic<bool>>(false))
{
}

CrvC_ProxyDeadline CrvC_ProxyDeadline::within(int limitMs) const
{
    CrvC_ProxyDeadline shorter = *this;
    const QDeadlineTimer step(limitMs, Qt::PreciseTimer);
    if (m_deadline.isForever() || step < m_deadline)
        shorter.m_deadline = step;
    return shorter;
}

void CrvC_ProxyDeadline::stop() const
{
    *m_stopped = true;
}

bool CrvC_ProxyDeadline::isStopped() const
{
    return *m_stopped;
}

bool CrvC_ProxyDeadline::hasExpired() const
{
    return isStopped() || m_deadline.hasExpired();
}

qint64 CrvC_ProxyDeadline::remainingMs() const
{
    if (isStopped())
        return 0;
    return m_deadline.remainingTime();
}

bool CrvC_ProxyDeadline::run(const QString &program, const QStringList &arguments, QByteArray *output,
                             qint64 maxOutput) const
{
    if (hasExpired())
        return false;
    QProcess process;
    process.setStandardErrorFile(QProcess::nullDevice());
    if (!output)
        process.setStandardOutputFile(QProcess::nullDevice());
    // Should the thread that waits for it end without killing it (the host
    // killed), the child goes too rather than running on unattended.
    process.setChildProcessModifier([] { ::prctl(PR_SET_PDEATHSIG, SIGKILL); });
    process.start(program, arguments, QIODevice::ReadOnly);

    bool cut = false;
    for (;;) {
        if (output) {
            // At most a pipe's worth arrives per wait, so this never holds
            // much more than `maxOutput`.
            output->append(process.read(maxOutput + 1 - output->size()));
            cut = output->size() > maxOutput;
        }
        if (process.state() == QProcess::NotRunning)
            break;
        if (cut || hasExpired()) {
            cut = true;
            process.kill();
            process.waitForFinished(1000);
            break;
        }
        const qint64 left = remainingMs();
        const int slice = left < 0 || left > SliceMs ? SliceMs : int(left);
        if (process.state() == QProcess::Starting) {
            process.waitForStarted(slice);
        } else if (output) {
            QElapsedTimer waited;
            waited.start();
            // A program that closed its output but runs on gives no more
            // read events: only its end is waited for then.
            if (!process.waitForReadyRead(slice) && waited.elapsed() < slice / 2)
                QThread::msleep(slice);
        } else {
            process.waitForFinished(slice);
        }
    }
    return !cut && process.error() != QProcess::FailedToStart && process.exitStatus() == QProcess::NormalExit
           && process.exitCode() == 0;
}
