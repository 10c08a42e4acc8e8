#include "RepositoryStore.h"

#include "host/Repository.h"

#include <QAtomicInteger>
#include <QElapsedTimer>
#include <QFileInfo>
#include <QSqlDatabase>
#include <QSqlError>
#include <QSqlQuery>
#include <QThread>
#include <QVariant>

namespace Prjrep {
namespace {

// How long one statement waits for a lock held by another connection, and
// how long an operation keeps trying again before it fails. The host waits
// meanwhile, so the wait is short: a repository locked for longer reads as
// unreadable, never as empty.
const int BusyTimeoutMs = 250;
const int WaitMs = 2000;

bool isBusy(const QSqlError &error)
{
    const int code = error.nativeErrorCode().toInt() & 0xff;
    return code == 5 /* SQLITE_BUSY */ || code == 6 /* SQLITE_LOCKED */;
}

QString newConnectionName()
{
    static QAtomicInteger<quint64> counter;
    return QStringLiteral("Prjrep_Repository-%1").arg(++counter);
}

// Prepares `sql`, binds `values` in order and runs it.
bool execute(QSqlQuery &query, const QString &sql, const QVariantList &values)
{
    if (!query.prepare(sql))
        return false;
    for (const QVariant &value : values)
        query.addBindValue(value);
    return query.exec();
}

// Runs a query for one value: StatusOk with *result, StatusNotFound when no
// row matches, StatusFailed on an error.
int selectOne(QSqlQuery &query, const QString &sql, const QVariantList &values, QVariant *result)
{
    if (!execute(query, sql, values))
        return StatusFailed;
    if (!query.next())
        return StatusNotFound;
    *result = query.value(0);
    return StatusOk;
}

} // namespace

QString RepositoryStore::fileNameFor(const QString &projectFile)
{
    QString name = projectFile;
    if (name.endsWith(QLatin1String(".orb"), Qt::CaseInsensitive))
        name.chop(4);
    return name + QLatin1String(".orbrepo");
}

std::shared_ptr<RepositoryStore> RepositoryStore::open(const QString &fileName, bool writable, bool create,
                                                       int *status)
{
    *status = StatusFailed;
    if (!QFileInfo::exists(fileName) && !(writable && create)) {
        *status = StatusNotFound;
        return nullptr;
    }
    const QString connectionName = newConnectionName();
    bool opened = false;
    {
        QSqlDatabase db = QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"), connectionName);
        if (db.isValid()) {
            db.setDatabaseName(fileName);
            QString options = QStringLiteral("QSQLITE_BUSY_TIMEOUT=%1").arg(BusyTimeoutMs);
            if (!writable)
                options += QLatin1String(";QSQLITE_OPEN_READONLY");
            db.setConnectOptions(options);
            opened = db.open();
        }
    }
    if (!opened) {
        QSqlDatabase::removeDatabase(connectionName);
        return nullptr;
    }
    std::shared_ptr<RepositoryStore> store(new RepositoryStore(connectionName, writable));
    if (writable && (*status = store->createSchema()) != StatusOk)
        return nullptr;
    *status = StatusOk;
    return store;
}

RepositoryStore::RepositoryStore(const QString &connectionName, bool writable)
    : m_connectionName(connectionName), m_writable(writable)
{
}

RepositoryStore::~RepositoryStore()
{
    {
        QSqlDatabase db = QSqlDatabase::database(m_connectionName, false);
        db.close();
    }
    QSqlDatabase::removeDatabase(m_connectionName);
}

int RepositoryStore::run(bool write, const std::function<int(QSqlQuery &)> &work)
{
    const QSqlDatabase db = QSqlDatabase::database(m_connectionName, false);
    QElapsedTimer waited;
    waited.start();
    for (;;) {
        QSqlQuery query(db);
        query.setForwardOnly(true);
        bool busy = false;
        if (write && !query.exec(QStringLiteral("BEGIN IMMEDIATE"))) {
            busy = isBusy(query.lastError());
        } else {
            const int status = work(query);
            busy = status == StatusFailed && isBusy(query.lastError());
            query.finish();
            if (!write && status != StatusFailed)
                return status;
            if (write) {
                if (status != StatusFailed && query.exec(QStringLiteral("COMMIT")))
                    return status;
                busy = busy || isBusy(query.lastError());
                QSqlQuery rollback(db);
                rollback.exec(QStringLiteral("ROLLBACK"));
            }
        }
        if (!busy || waited.elapsed() >= WaitMs)
            return StatusFailed;
        QThread::msleep(20);
    }
}

int RepositoryStore::createSchema()
{
    // Looked at first, so that opening a repository that has its tables
    // writes nothing (and need not wait for another process's write).
    const int existing = run(false, [](QSqlQuery &query) {
        QVariant version;
        if (selectOne(query, QStringLiteral("PRAGMA user_version"), {}, &version) != StatusOk)
            return int(StatusFailed);
        return version.toInt() >= 1 ? int(StatusOk) : int(StatusNotFound);
    });
    if (existing != StatusNotFound)
        return existing;
    return run(true, [](QSqlQuery &query) {
        const bool ok = query.exec(QStringLiteral("CREATE TABLE IF NOT EXISTS sections("
                                                  "id INTEGER PRIMARY KEY, parent INTEGER NOT NULL, "
                                                  "name TEXT NOT NULL, UNIQUE(parent, name))"))
                        && query.exec(QStringLiteral("CREATE TABLE IF NOT EXISTS entries("
                                                     "section INTEGER NOT NULL, key TEXT NOT NULL, "
                                                     "value TEXT NOT NULL, PRIMARY KEY(section, key))"))
                        && query.exec(QStringLiteral("PRAGMA user_version = 1"));
        return ok ? int(StatusOk) : int(StatusFailed);
    });
}

int RepositoryStore::findSection(qint64 parent, const QString &name, bool create, qint64 *id)
{
    auto select = [&](QSqlQuery &query) {
        QVariant found;
        const int status =
            selectOne(query, QStringLiteral("SELECT id FROM sections WHERE parent = ? AND name = ?"),
                      {parent, name}, &found);
        if (status == StatusOk)
            *id = found.toLongLong();
        return status;
    };
    const int status = run(false, select);
    if (status != StatusNotFound || !create)
        return status;
    if (!m_writable)
        return StatusDenied;
    return run(true, [&](QSqlQuery &query) {
        if (!execute(query, QStringLiteral("INSERT OR IGNORE INTO sections(parent, name) VALUES(?, ?)"),
                     {parent, name}))
            return int(StatusFailed);
        // Another process may have made it first; either way it is there now.
        return select(query);
    });
}

int RepositoryStore::value(qint64 section, const QString &key, QString *value)
{
    return run(false, [&](QSqlQuery &query) {
        QVariant found;
        const int status =
            selectOne(query, QStringLiteral("SELECT value FROM entries WHERE section = ? AND key = ?"),
                      {section, key}, &found);
        if (status == StatusOk)
            *value = found.toString();
        return status;
    });
}

int RepositoryStore::setValue(qint64 section, const QString &key, const QString &value, Condition condition,
                              const QString &expected)
{
    if (!m_writable)
        return StatusDenied;
    return run(true, [&](QSqlQuery &query) {
        if (condition != Replace) {
            QVariant stored;
            const int status =
                selectOne(query, QStringLiteral("SELECT value FROM entries WHERE section = ? AND key = ?"),
                          {section, key}, &stored);
            if (status == StatusFailed)
                return int(StatusFailed);
            const bool holds = condition == IfAbsent ? status == StatusNotFound
                                                     : status == StatusOk && stored.toString() == expected;
            if (!holds)
                return int(StatusConflict);
            query.finish();
        }
        return execute(query,
                       QStringLiteral("INSERT OR REPLACE INTO entries(section, key, value) VALUES(?, ?, ?)"),
                       {section, key, value})
                   ? int(StatusOk)
                   : int(StatusFailed);
    });
}

} // namespace Prjrep
