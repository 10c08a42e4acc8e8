#include "ConnectionPool.h"

#include <sys/socket.h>

#include <algorithm>

ConnectionPool::ConnectionPool(std::size_t workers, Clock::duration grace, double slowBytesPerSecond)
    : m_grace(grace), m_slowRate(slowBytesPerSecond)
{
    for (std::size_t i = 0; i < std::max<std::size_t>(1, workers); ++i)
        m_workers.emplace_back([this] { work(); });
    m_watchdog = std::thread([this] { watch(); });
}

ConnectionPool::~ConnectionPool()
{
    shutdown();
}

void ConnectionPool::enqueue(std::function<void()> job)
{
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_jobs.push_back(std::move(job));
    }
    m_jobReady.notify_one();
    m_watchWake.notify_one();
}

void ConnectionPool::shutdown()
{
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        if (m_joined)
            return;
        m_joined = true;
        m_stopping = true;
        for (Connection *connection : m_connections)
            if (!connection->finishing)
                cutLocked(*connection);
    }
    m_jobReady.notify_all();
    for (std::thread &worker : m_workers)
        worker.join();
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_workers.clear();
    }
    m_watchWake.notify_all();
    m_watchdog.join();
}

bool ConnectionPool::track(Connection &connection, Clock::time_point deadline)
{
    std::lock_guard<std::mutex> lock(m_mutex);
    if (m_stopping)
        return false;
    connection.start = Clock::now();
    connection.deadline = deadline;
    m_connections.push_back(&connection);
    return true;
}

void ConnectionPool::setDeadline(Connection &connection, Clock::time_point deadline, bool finishing)
{
    std::lock_guard<std::mutex> lock(m_mutex);
    connection.deadline = deadline;
    connection.finishing = finishing;
}

void ConnectionPool::untrack(Connection &connection)
{
    std::lock_guard<std::mutex> lock(m_mutex);
    m_connections.erase(std::remove(m_connections.begin(), m_connections.end(), &connection),
                        m_connections.end());
}

void ConnectionPool::work()
{
    for (;;) {
        std::function<void()> job;
        {
            std::unique_lock<std::mutex> lock(m_mutex);
            ++m_idle;
            m_jobReady.wait(lock, [this] { return !m_jobs.empty() || m_stopping; });
            --m_idle;
            if (m_jobs.empty())
                return;
            job = std::move(m_jobs.front());
            m_jobs.pop_front();
        }
        job();
    }
}

void ConnectionPool::watch()
{
    std::unique_lock<std::mutex> lock(m_mutex);
    // Runs until shutdown() has joined the workers (it clears m_workers).
    while (!(m_stopping && m_workers.empty())) {
        m_watchWake.wait_for(lock, std::chrono::milliseconds(100));
        const Clock::time_point now = Clock::now();
        for (Connection *connection : m_connections)
            if (!connection->finishing && now >= connection->deadline)
                cutLocked(*connection);
        cutSlowestLocked(now);
    }
}

void ConnectionPool::cutLocked(Connection &connection)
{
    if (connection.cut || connection.socket < 0)
        return;
    // The socket stays open until its worker closes it after untrack(), so
    // this never reaches a socket that has been reused for another client.
    ::shutdown(connection.socket, SHUT_RDWR);
    connection.cut = true;
}

void ConnectionPool::cutSlowestLocked(Clock::time_point now)
{
    std::size_t freeing = m_idle;
    for (const Connection *connection : m_connections)
        freeing += connection->cut ? 1 : 0;
    if (m_jobs.size() <= freeing)
        return;
    std::vector<std::pair<double, Connection *>> slow;
    for (Connection *connection : m_connections) {
        const Clock::duration age = now - connection->start;
        if (connection->cut || connection->finishing || age < m_grace)
            continue;
        const double rate = double(connection->bytes) / std::chrono::duration<double>(age).count();
        if (rate < m_slowRate)
            slow.emplace_back(rate, connection);
    }
    std::sort(slow.begin(), slow.end(), [](const auto &a, const auto &b) { return a.first < b.first; });
    const std::size_t wanted = m_jobs.size() - freeing;
    for (std::size_t i = 0; i < slow.size() && i < wanted; ++i)
        cutLocked(*slow[i].second);
}
