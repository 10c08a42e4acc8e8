#pragma once

#include <QString>
#include <QStringList>

// A private PostgreSQL server for one test program: Debian's postgresql-15
// (initdb, pg_ctl) in a folder of its own under /tmp, run as the postgres user
// when the test runs as root, reachable only through a Unix socket in that
// folder. The destructor stops it; should the test die first, a watchdog
// stops it when the test's process is gone.
namespace CorvidTest {

class PostgresServer
{
public:
    static const char *const BinDir; // /usr/lib/postgresql/15/bin

    PostgresServer() = default;
    ~PostgresServer();
    PostgresServer(const PostgresServer &) = delete;
    PostgresServer &operator=(const PostgresServer &) = delete;

    // Makes and starts the server; false with error(), which also says when
    // the server programs are not installed.
    bool start();
    // Makes a new, empty database; false with error().
    bool createDatabase(const QString &name);
    // The connection URI of `database` for corvid-ingest and corvid-stats.
    QString url(const QString &database) const;
    QString error() const { return m_error; }

private:
    bool run(const QString &program, const QStringList &arguments);

    QString m_dir;
    bool m_started = false;
    QString m_error;
};

} // namespace CorvidTest
