#pragma once

#include <QByteArray>
#include <QDeadlineTimer>
#include <QStringList>

#include <atomic>
#include <memory>

// The time proxy discovery may still take, and a switch that ends it early.
// Copies share the switch: stopping one stops every deadline derived from it
// with within(), so that the whole discovery, whichever step it is in, ends
// at once (its child processes killed) when the host quits.
//
// Child processes of the discovery are run through run(), which never waits
// past the deadline and never keeps more output than asked for.
class CrvC_ProxyDeadline
{
public:
    // No time limit; stoppable.
    CrvC_ProxyDeadline();
    explicit CrvC_ProxyDeadline(int limitMs);

    // A deadline `limitMs` from now, or this one when that is earlier; it
    // shares this one's switch.
    CrvC_ProxyDeadline within(int limitMs) const;

    void stop() const;
    bool isStopped() const;
    // Stopped, or the time is up.
    bool hasExpired() const;
    // Milliseconds left (0 when expired); -1 for no limit.
    qint64 remainingMs() const;

    // Runs `program` with `arguments` and waits for its end. Its standard
    // output goes to `output` (when not null), at most `maxOutput` bytes;
    // standard error is discarded. The program is killed when the deadline
    // passes, the switch is flipped or it writes more than `maxOutput` bytes.
    // True only when it ended by itself with exit status 0 within all that.
    bool run(const QString &program, const QStringList &arguments, QByteArray *output,
             qint64 maxOutput) const;

private:
    QDeadlineTimer m_deadline;
    std::shared_ptr<std::atomic<bool>> m_stopped;
};
