#pragma once

#include <httplib.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>
#include <vector>

// The receiver's worker threads: a fixed number of them, each serving one
// connection at a time, and a watchdog that keeps the connections from
// holding on to them. A connection is cut (its socket shut down, so that
// whatever its worker waits for fails at once) when
//   - its deadline passes (set by its worker for each step of a request);
//   - connections wait for a worker while every worker is busy: then the
//     slowest connection that is older than a grace time and averages less
//     than the slow rate goes first, one at a time;
//   - the pool shuts down.
// A connection marked as finishing (its upload being stored, its answer
// being written) is never cut.
class ConnectionPool : public httplib::TaskQueue
{
public:
    using Clock = std::chrono::steady_clock;

    // What the pool knows of one connection. The worker that serves it owns
    // it; the pool reads it under its lock.
    struct Connection
    {
        int socket = -1;
        Clock::time_point start;    // when its worker took it
        Clock::time_point deadline; // cut when this passes
        bool finishing = false;     // never cut
        bool cut = false;
        std::atomic<std::uint64_t> bytes{0}; // bytes received so far
    };

    ConnectionPool(std::size_t workers, Clock::duration grace, double slowBytesPerSecond);
    ~ConnectionPool() override;
    ConnectionPool(const ConnectionPool &) = delete;
    ConnectionPool &operator=(const ConnectionPool &) = delete;

    void enqueue(std::function<void()> job) override;
    // Cuts every connection that is not finishing, runs what is queued (the
    // server's jobs close their sockets at once while the pool stops) and
    // joins the threads.
    void shutdown() override;

    // Called by a worker for the connection it serves. track() is false when
    // the pool is stopping (then the connection is to be closed unserved);
    // untrack() must come before the socket is closed.
    bool track(Connection &connection, Clock::time_point deadline);
    void setDeadline(Connection &connection, Clock::time_point deadline, bool finishing = false);
    void untrack(Connection &connection);

private:
    void work();
    void watch();
    void cutLocked(Connection &connection);
    void cutSlowestLocked(Clock::time_point now);

    const Clock::duration m_grace;
    const double m_slowRate;
    std::mutex m_mutex;
    std::condition_variable m_jobReady;
    std::condition_variable m_watchWake;
    std::deque<std::function<void()>> m_jobs;
    std::vector<Connection *> m_connections;
    std::vector<std::thread> m_workers;
    std::thread m_watchdog;
    std::size_t m_idle = 0;
    bool m_stopping = false;
    bool m_joined = false;
};
