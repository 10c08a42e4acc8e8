#include "PostgresServer.h"

#include <QCoreApplication>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>

#include <pwd.h>
#include <stdlib.h>
#include <unistd.h>

namespace CorvidTest {

const char *const PostgresServer::BinDir = "/usr/lib/postgresql/15/bin";

namespace {

bool asRoot()
{
    return ::geteuid() == 0;
}

} // namespace

PostgresServer::~PostgresServer()
{
    if (m_started)
        run(QStringLiteral("pg_ctl"), {"-D", m_dir + "/data", "-m", "immediate", "-w", "stop"});
    if (!m_dir.isEmpty())
        QDir(m_dir).removeRecursively();
}

// The server's programs refuse to run as root: as root they run as postgres.
bool PostgresServer::run(const QString &program, const QStringList &arguments)
{
    QProcess process;
    process.setProcessChannelMode(QProcess::MergedChannels);
    const QString path = QLatin1String(BinDir) + QLatin1Char('/') + program;
    if (asRoot())
        process.start(QStringLiteral("runuser"), QStringList{"-u", "postgres", "--", path} + arguments);
    else
        process.start(path, arguments);
    const bool ok = process.waitForFinished(120000) && process.exitStatus() == QProcess::NormalExit
        && process.exitCode() == 0;
    if (!ok)
        m_error = program + QLatin1String(" failed: ") + QString::fromLocal8Bit(process.readAll())
            + process.errorString();
    return ok;
}

bool PostgresServer::start()
{
    if (!QFileInfo(QLatin1String(BinDir) + QLatin1String("/initdb")).isExecutable()) {
        m_error = QStringLiteral("the PostgreSQL server programs are not in %1: install postgresql-15 "
                                 "(make test and scripts/install-deps.sh do)")
                      .arg(QLatin1String(BinDir));
        return false;
    }
    // Under /tmp: a socket path must stay short.
    QByteArray dir = "/tmp/corvid-pg-XXXXXX";
    if (!::mkdtemp(dir.data())) {
        m_error = QStringLiteral("cannot make a folder under /tmp");
        return false;
    }
    m_dir = QString::fromLocal8Bit(dir);
    if (asRoot()) {
        const passwd *user = ::getpwnam("postgres");
        if (!user || ::chown(dir.constData(), user->pw_uid, user->pw_gid) != 0) {
            m_error = QStringLiteral("no postgres user to run the server as");
            return false;
        }
    }
    // Stops the server and removes the folder should this process end without
    // the destructor.
    const QString stop = (asRoot() ? QStringLiteral("runuser -u postgres -- ") : QString())
        + QLatin1String(BinDir) + QLatin1String("/pg_ctl -D ") + m_dir
        + QLatin1String("/data -m immediate stop");
    const QString watchdog = QStringLiteral("exec </dev/null >/dev/null 2>&1; "
                                            "while kill -0 %1 2>/dev/null; do sleep 1; done; %2; rm -rf %3")
                                 .arg(QString::number(QCoreApplication::applicationPid()), stop, m_dir);
    QProcess::startDetached(QStringLiteral("sh"), {"-c", watchdog});
    if (!run(QStringLiteral("initdb"),
             {"-D", m_dir + "/data", "-A", "trust", "-U", "postgres", "--no-locale", "-E", "UTF8",
              "--no-sync"}))
        return false;
    QFile config(m_dir + QLatin1String("/data/postgresql.conf"));
    if (!config.open(QIODevice::Append)
        || config.write("listen_addresses = ''\nunix_socket_directories = '" + dir
                        + "'\nfsync = off\nsynchronous_commit = off\nfull_page_writes = off\n")
            < 0) {
        m_error = QStringLiteral("cannot configure the server");
        return false;
    }
    config.close();
    if (!run(QStringLiteral("pg_ctl"), {"-D", m_dir + "/data", "-l", m_dir + "/server.log", "-w", "start"}))
        return false;
    m_started = true;
    return true;
}

bool PostgresServer::createDatabase(const QString &name)
{
    return run(QStringLiteral("createdb"), {"-h", m_dir, "-U", "postgres", name});
}

QString PostgresServer::url(const QString &database) const
{
    return QStringLiteral("postgresql://postgres@/%1?host=%2").arg(database, m_dir);
}

} // namespace CorvidTest
