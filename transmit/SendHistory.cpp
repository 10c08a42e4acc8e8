#include "SendHistory.h"

#include <QAtomicInteger>
#include <QCoreApplication>
#include <QCryptographicHash>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QSqlDatabase>
#include <QSqlError>
#include <QSqlQuery>
#include <QStandardPaths>
#include <QThread>
#include <QVariant>

#include <algorithm>

namespace {

const int SchemaVersion = 1;
const int BusyTimeoutMs = 5000;
const int MaxBusyRetries = 5;

QString tr(const char *text)
{
    return QCoreApplication::translate("CrvC_SendHistory", text);
}

int sqliteCode(const QSqlError &error)
{
    return error.nativeErrorCode().toInt() & 0xff;
}

bool isBusy(const QSqlError &error)
{
    const int code = sqliteCode(error);
    return code == 5 /* SQLITE_BUSY */ || code == 6 /* SQLITE_LOCKED */;
}

QString reason(const QSqlError &error)
{
    return error.databaseText().isEmpty() ? error.text() : error.databaseText();
}

bool isDamage(const QSqlError &error)
{
    const int code = sqliteCode(error);
    return code == 11 /* SQLITE_CORRUPT */ || code == 26 /* SQLITE_NOTADB */;
}

bool execute(QSqlQuery &query, const QString &sql, const QVariantList &values = QVariantList())
{
    if (!query.prepare(sql))
        return false;
    for (const QVariant &value : values)
        query.addBindValue(value);
    return query.exec();
}

// SQLite takes a null text for NULL.
QString text(const QString &value)
{
    return value.isNull() ? QStringLiteral("") : value;
}

qint64 msecs(const QDateTime &time)
{
    return time.toMSecsSinceEpoch();
}

QDateTime fromMsecs(const QVariant &value)
{
    return value.isNull() ? QDateTime() : QDateTime::fromMSecsSinceEpoch(value.toLongLong(), Qt::UTC);
}

const char *const StateNames[] = {"sending", "sent", "failed", "handed"};

CrvC_SendHistory::State stateFromName(const QString &name)
{
    for (int i = 0; i < 4; ++i) {
        if (name == QLatin1String(StateNames[i]))
            return CrvC_SendHistory::State(i);
    }
    return CrvC_SendHistory::State::Failed;
}

} // namespace

QString CrvC_SendHistory::defaultDirectory()
{
    return QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation)
           + QLatin1String("/orb/corvid");
}

QString CrvC_SendHistory::methodName(Method method)
{
    return method == Method::Upload ? QStringLiteral("upload") : QStringLiteral("e-mail");
}

QString CrvC_SendHistory::stateName(State state)
{
    return QLatin1String(StateNames[int(state)]);
}

CrvC_SendHistory::State CrvC_SendHistory::Entry::state(const QDateTime &now) const
{
    if (attempts.isEmpty())
        return State::Failed;
    const Attempt &last = attempts.last();
    if (last.state == State::Sending && last.started.secsTo(now) > StaleSendingSecs)
        return State::Failed;
    return last.state;
}

QString CrvC_SendHistory::Entry::outcome(const QDateTime &now) const
{
    const State current = state(now);
    const QString detail = attempts.isEmpty() ? QString() : attempts.last().detail;
    switch (current) {
    case State::Sent:
        return QStringLiteral("sent");
    case State::Handed:
        return QLatin1String("handed to ") + detail;
    case State::Sending:
        return QStringLiteral("sending");
    case State::Failed:
        break;
    }
    const bool cutOff = !attempts.isEmpty() && attempts.last().state == State::Sending;
    return QLatin1String("failed: ") + (cutOff ? tr("interrupted") : detail);
}

bool CrvC_SendHistory::Entry::retryable(const QDateTime &now) const
{
    return method == Method::Upload && pageKept && state(now) == State::Failed;
}

bool CrvC_SendHistory::Entry::pending(const QDateTime &now) const
{
    return retryable(now) && attempts.size() <= MaxRetries && time.addDays(RetryDays) > now;
}

CrvC_SendHistory::CrvC_SendHistory(const QString &directory) : CrvC_SendHistory(directory, Limits())
{
}

CrvC_SendHistory::CrvC_SendHistory(const QString &directory, Limits limits)
    : m_directory(directory), m_limits(limits)
{
}

CrvC_SendHistory::~CrvC_SendHistory()
{
    close();
}

QString CrvC_SendHistory::fileName() const
{
    return m_directory + QLatin1String("/history.sqlite");
}

QString CrvC_SendHistory::viewFileName() const
{
    return m_directory + QLatin1String("/view.html");
}

void CrvC_SendHistory::close()
{
    if (m_connection.isEmpty())
        return;
    {
        QSqlDatabase db = QSqlDatabase::database(m_connection, false);
        db.close();
    }
    QSqlDatabase::removeDatabase(m_connection);
    m_connection.clear();
}

bool CrvC_SendHistory::fail(const QString &what, const QString &why)
{
    m_error = why.isEmpty() ? what : what + QLatin1String(": ") + why;
    return false;
}

bool CrvC_SendHistory::open(bool create)
{
    m_error.clear();
    m_damaged = false;
    if (!m_connection.isEmpty())
        return true;
    const QString file = fileName();
    if (!QFileInfo::exists(file)) {
        if (!create)
            return true; // nothing was ever recorded
        if (!QDir().mkpath(m_directory))
            return fail(tr("Cannot create the folder of the send history %1").arg(m_directory), QString());
        QFile::setPermissions(m_directory, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);
    } else if (!QFileInfo(file).isFile()) {
        m_damaged = true;
        return fail(tr("The send history %1 is damaged").arg(file), tr("not a file"));
    }

    static QAtomicInteger<quint64> counter;
    const QString name = QStringLiteral("CrvC_SendHistory-%1").arg(++counter);
    bool opened = false;
    QString why;
    {
        QSqlDatabase db = QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"), name);
        db.setDatabaseName(file);
        db.setConnectOptions(QStringLiteral("QSQLITE_BUSY_TIMEOUT=%1").arg(BusyTimeoutMs));
        opened = db.isValid() && db.open();
        why = reason(db.lastError());
    }
    if (!opened) {
        QSqlDatabase::removeDatabase(name);
        return fail(tr("Cannot open the send history %1").arg(file), why);
    }
    m_connection = name;

    QSqlQuery setup(QSqlDatabase::database(m_connection, false));
    int version = -1;
    QStringList tables;
    if (setup.exec(QStringLiteral("PRAGMA user_version")) && setup.next())
        version = setup.value(0).toInt();
    if (version >= 0 && setup.exec(QStringLiteral("SELECT name FROM sqlite_master WHERE type = 'table'"))) {
        while (setup.next())
            tables << setup.value(0).toString();
    } else {
        version = -1;
    }
    QString damage;
    if (version < 0)
        damage = reason(setup.lastError());
    else if (version > SchemaVersion)
        damage = tr("written by a newer version of Corvid");
    else if (version == 0 && !tables.isEmpty())
        damage = tr("not a send history");
    for (const char *table : {"entries", "attempts", "pages"}) {
        if (version == SchemaVersion && !tables.contains(QLatin1String(table)))
            damage = tr("the table %1 is missing").arg(QLatin1String(table));
    }
    if (!damage.isEmpty()) {
        setup.finish();
        close();
        m_damaged = true;
        return fail(tr("The send history %1 is damaged").arg(file), damage);
    }
    // Pages removed by retention give their space back to the file system;
    // set before anything else is written to a new file.
    if (version == 0)
        setup.exec(QStringLiteral("PRAGMA auto_vacuum = INCREMENTAL"));
    // A commit is atomic without waiting for the disk: a crash loses at most
    // the last changes, never leaves half of one.
    setup.exec(QStringLiteral("PRAGMA journal_mode = WAL"));
    setup.exec(QStringLiteral("PRAGMA synchronous = NORMAL"));
    setup.finish();
    if (version == SchemaVersion)
        return true;
    const bool created = run(true, [](QSqlQuery &query) {
        return query.exec(
                   QStringLiteral("CREATE TABLE IF NOT EXISTS entries(id INTEGER PRIMARY KEY AUTOINCREMENT, "
                                  "time INTEGER NOT NULL, project TEXT NOT NULL, design TEXT NOT NULL, "
                                  "method TEXT NOT NULL, destination TEXT NOT NULL, "
                                  "domain TEXT NOT NULL, regid TEXT NOT NULL, bytes INTEGER NOT NULL, "
                                  "sha256 TEXT NOT NULL, stored INTEGER NOT NULL)"))
               && query.exec(
                   QStringLiteral("CREATE TABLE IF NOT EXISTS attempts(id INTEGER PRIMARY KEY AUTOINCREMENT, "
                                  "entry INTEGER NOT NULL, started INTEGER NOT NULL, ended INTEGER, "
                                  "state TEXT NOT NULL, detail TEXT NOT NULL, "
                                  "exit_status INTEGER NOT NULL, http_status INTEGER NOT NULL, "
                                  "automatic INTEGER NOT NULL)"))
               && query.exec(QStringLiteral("CREATE INDEX IF NOT EXISTS attempts_entry ON attempts(entry)"))
               && query.exec(QStringLiteral(
                   "CREATE TABLE IF NOT EXISTS pages(entry INTEGER PRIMARY KEY, data BLOB NOT NULL)"))
               && query.exec(QStringLiteral("PRAGMA user_version = %1").arg(SchemaVersion));
    });
    QFile::setPermissions(file, QFile::ReadOwner | QFile::WriteOwner);
    if (!created)
        close();
    return created;
}

bool CrvC_SendHistory::run(bool write, const std::function<bool(QSqlQuery &)> &work)
{
    m_error.clear();
    if (m_connection.isEmpty()) {
        if (!open(write))
            return false;
        if (m_connection.isEmpty())
            return true; // no file: an empty history
        m_error.clear();
    }
    const QSqlDatabase db = QSqlDatabase::database(m_connection, false);
    for (int attempt = 1;; ++attempt) {
        QSqlQuery query(db);
        query.setForwardOnly(true);
        QSqlError error;
        if (write && !query.exec(QStringLiteral("BEGIN IMMEDIATE"))) {
            error = query.lastError();
        } else {
            const bool done = work(query);
            error = query.lastError();
            query.finish();
            if (done && (!write || query.exec(QStringLiteral("COMMIT"))))
                return true;
            if (done)
                error = query.lastError();
            if (write) {
                QSqlQuery rollback(db);
                rollback.exec(QStringLiteral("ROLLBACK"));
            }
            if (!error.isValid())
                return false; // refused by `work`, which said why
        }
        if (isBusy(error) && attempt < MaxBusyRetries) {
            QThread::msleep(50 * attempt);
            continue;
        }
        m_damaged = isDamage(error);
        return fail(m_damaged ? tr("The send history %1 is damaged").arg(fileName())
                              : tr("Cannot use the send history %1").arg(fileName()),
                    reason(error));
    }
}

void CrvC_SendHistory::vacuum()
{
    // Steps to the end: each step gives free pages back to the file system.
    QSqlQuery query(QSqlDatabase::database(m_connection, false));
    if (query.exec(QStringLiteral("PRAGMA incremental_vacuum")))
        while (query.next()) {
        }
}

bool CrvC_SendHistory::readEntries(QSqlQuery &query, qint64 onlyId, QList<Entry> *result)
{
    const QString filter = onlyId > 0 ? QStringLiteral(" WHERE id = %1").arg(onlyId) : QString();
    if (!execute(query, QLatin1String("SELECT id, time, project, design, method, destination, domain, regid, "
                                      "bytes, sha256, stored FROM entries")
                            + filter + QLatin1String(" ORDER BY id DESC")))
        return false;
    QHash<qint64, int> index;
    while (query.next()) {
        Entry e;
        e.id = query.value(0).toLongLong();
        e.time = fromMsecs(query.value(1));
        e.project = query.value(2).toString();
        e.design = query.value(3).toString();
        e.method = query.value(4).toString() == QLatin1String("upload") ? Method::Upload : Method::Email;
        e.destination = query.value(5).toString();
        e.domain = query.value(6).toString();
        e.regid = query.value(7).toString();
        e.bytes = query.value(8).toLongLong();
        e.sha256 = query.value(9).toByteArray();
        e.pageKept = query.value(10).toLongLong() > 0;
        index.insert(e.id, result->size());
        result->append(e);
    }
    const QString attemptFilter = onlyId > 0 ? QStringLiteral(" WHERE entry = %1").arg(onlyId) : QString();
    if (!execute(query, QLatin1String("SELECT entry, id, started, ended, state, detail, exit_status, "
                                      "http_status, automatic FROM attempts")
                            + attemptFilter + QLatin1String(" ORDER BY id")))
        return false;
    while (query.next()) {
        const auto found = index.constFind(query.value(0).toLongLong());
        if (found == index.constEnd())
            continue;
        Attempt a;
        a.id = query.value(1).toLongLong();
        a.started = fromMsecs(query.value(2));
        a.ended = fromMsecs(query.value(3));
        a.state = stateFromName(query.value(4).toString());
        a.detail = query.value(5).toString();
        a.exitStatus = query.value(6).toInt();
        a.httpStatus = query.value(7).toInt();
        a.automatic = query.value(8).toBool();
        (*result)[*found].attempts.append(a);
    }
    return true;
}

bool CrvC_SendHistory::prune(QSqlQuery &query)
{
    if (!execute(query, QStringLiteral("SELECT id, stored FROM entries ORDER BY id DESC")))
        return false;
    QVariantList drop;
    qint64 total = 0;
    int kept = 0;
    while (query.next()) {
        total += query.value(1).toLongLong();
        if (kept > 0 && (kept >= m_limits.maxEntries || total > m_limits.maxBytes))
            drop << query.value(0);
        else
            ++kept;
    }
    for (const QVariant &id : drop) {
        if (!execute(query, QStringLiteral("DELETE FROM pages WHERE entry = ?"), {id})
            || !execute(query, QStringLiteral("DELETE FROM attempts WHERE entry = ?"), {id})
            || !execute(query, QStringLiteral("DELETE FROM entries WHERE id = ?"), {id}))
            return false;
    }
    return true;
}

qint64 CrvC_SendHistory::addEntry(const Entry &entry, const QByteArray &page, qint64 *attemptId)
{
    QByteArray stored = page.size() <= m_limits.maxBytes ? qCompress(page) : QByteArray();
    if (stored.size() > m_limits.maxBytes)
        stored.clear(); // recorded, but too large to keep
    return insert(entry, page.size(), QCryptographicHash::hash(page, QCryptographicHash::Sha256).toHex(),
                  stored, attemptId);
}

qint64 CrvC_SendHistory::addEntry(const Entry &entry, const QString &path, qint64 *attemptId)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return addEntry(entry, QByteArray(), attemptId); // the send fails too; its try is recorded
    if (file.size() <= m_limits.maxBytes)
        return addEntry(entry, file.readAll(), attemptId);
    QCryptographicHash sha(QCryptographicHash::Sha256);
    sha.addData(&file);
    return insert(entry, file.size(), sha.result().toHex(), QByteArray(), attemptId);
}

qint64 CrvC_SendHistory::insert(const Entry &entry, qint64 bytes, const QByteArray &sha,
                                const QByteArray &stored, qint64 *attemptId)
{
    qint64 id = 0;
    const qint64 now = msecs(entry.time.isValid() ? entry.time : QDateTime::currentDateTimeUtc());
    const bool done = run(true, [&](QSqlQuery &query) {
        if (!execute(query,
                     QStringLiteral("INSERT INTO entries(time, project, design, method, destination, domain, "
                                    "regid, bytes, sha256, stored) VALUES(?, ?, ?, ?, ?, ?, ?, ?, ?, ?)"),
                     {now, text(entry.project), text(entry.design), methodName(entry.method),
                      text(entry.destination), text(entry.domain), text(entry.regid), bytes,
                      QString::fromLatin1(sha), qint64(stored.size())}))
            return false;
        id = query.lastInsertId().toLongLong();
        if (!stored.isEmpty()
            && !execute(query, QStringLiteral("INSERT INTO pages(entry, data) VALUES(?, ?)"), {id, stored}))
            return false;
        if (!execute(query,
                     QStringLiteral("INSERT INTO attempts(entry, started, state, detail, exit_status, "
                                    "http_status, automatic) VALUES(?, ?, 'sending', '', -1, 0, 0)"),
                     {id, now}))
            return false;
        *attemptId = query.lastInsertId().toLongLong();
        return prune(query);
    });
    if (!done)
        return 0;
    vacuum();
    return id;
}

qint64 CrvC_SendHistory::addAttempt(qint64 id, bool automatic)
{
    qint64 attempt = 0;
    const bool done = run(true, [&](QSqlQuery &query) {
        if (!execute(query, QStringLiteral("SELECT id FROM entries WHERE id = ?"), {id}))
            return false;
        if (!query.next())
            return fail(tr("The send history has no entry %1").arg(id), QString());
        if (!execute(query,
                     QStringLiteral("INSERT INTO attempts(entry, started, state, detail, exit_status, "
                                    "http_status, automatic) VALUES(?, ?, 'sending', '', -1, 0, ?)"),
                     {id, msecs(QDateTime::currentDateTimeUtc()), automatic ? 1 : 0}))
            return false;
        attempt = query.lastInsertId().toLongLong();
        return true;
    });
    return done ? attempt : 0;
}

bool CrvC_SendHistory::finishAttempt(qint64 attemptId, State state, const QString &detail, int exitStatus,
                                     int httpStatus)
{
    return run(true, [&](QSqlQuery &query) {
        return execute(
                   query,
                   QStringLiteral("UPDATE attempts SET ended = ?, state = ?, detail = ?, exit_status = ?, "
                                  "http_status = ? WHERE id = ?"),
                   {msecs(QDateTime::currentDateTimeUtc()), stateName(state), text(detail), exitStatus,
                    httpStatus, attemptId})
               && (query.numRowsAffected() == 1
                   || fail(tr("The send history has no attempt %1").arg(attemptId), QString()));
    });
}

bool CrvC_SendHistory::setDestination(qint64 id, const QString &destination, const QString &domain,
                                      const QString &regid)
{
    return run(true, [&](QSqlQuery &query) {
        return execute(
                   query,
                   QStringLiteral("UPDATE entries SET destination = ?, domain = ?, regid = ? WHERE id = ?"),
                   {text(destination), text(domain), text(regid), id})
               && (query.numRowsAffected() == 1
                   || fail(tr("The send history has no entry %1").arg(id), QString()));
    });
}

bool CrvC_SendHistory::entries(QList<Entry> *result)
{
    result->clear();
    return run(false, [&](QSqlQuery &query) { return readEntries(query, 0, result); });
}

bool CrvC_SendHistory::entry(qint64 id, Entry *result)
{
    QList<Entry> found;
    if (!run(false, [&](QSqlQuery &query) { return readEntries(query, id, &found); }))
        return false;
    if (found.isEmpty())
        return fail(tr("The send history has no entry %1").arg(id), QString());
    *result = found.first();
    return true;
}

bool CrvC_SendHistory::page(qint64 id, QByteArray *result)
{
    Entry e;
    if (!entry(id, &e))
        return false;
    if (!e.pageKept)
        return fail(tr("The page of entry %1 was too large to be kept").arg(id), QString());
    QByteArray stored;
    if (!run(false, [&](QSqlQuery &query) {
            if (!execute(query, QStringLiteral("SELECT data FROM pages WHERE entry = ?"), {id}))
                return false;
            if (query.next())
                stored = query.value(0).toByteArray();
            return true;
        }))
        return false;
    *result = qUncompress(stored);
    if (stored.isEmpty()
        || QCryptographicHash::hash(*result, QCryptographicHash::Sha256).toHex() != e.sha256) {
        result->clear();
        m_damaged = true;
        return fail(tr("The send history %1 is damaged").arg(fileName()),
                    tr("the page of entry %1 does not match its SHA-256").arg(id));
    }
    return true;
}

bool CrvC_SendHistory::remove(qint64 id)
{
    Entry e;
    if (!entry(id, &e))
        return false;
    const bool removed = run(true, [&](QSqlQuery &query) {
        return execute(query, QStringLiteral("DELETE FROM pages WHERE entry = ?"), {id})
               && execute(query, QStringLiteral("DELETE FROM attempts WHERE entry = ?"), {id})
               && execute(query, QStringLiteral("DELETE FROM entries WHERE id = ?"), {id});
    });
    if (removed)
        vacuum();
    return removed;
}

bool CrvC_SendHistory::clear()
{
    QFile::remove(viewFileName());
    if (!open(false) && !m_damaged)
        return false;
    if (m_damaged) {
        close();
        const QString file = fileName();
        for (const char *suffix : {"", "-journal", "-wal", "-shm"}) {
            const QString path = file + QLatin1String(suffix);
            if (QFileInfo::exists(path) && !QFile::remove(path))
                return fail(tr("Cannot remove the send history %1").arg(path), QString());
        }
        m_damaged = false;
        m_error.clear();
        return true;
    }
    if (m_connection.isEmpty())
        return true; // nothing was ever recorded
    const bool cleared = run(true, [](QSqlQuery &query) {
        return query.exec(QStringLiteral("DELETE FROM pages"))
               && query.exec(QStringLiteral("DELETE FROM attempts"))
               && query.exec(QStringLiteral("DELETE FROM entries"));
    });
    if (cleared)
        vacuum();
    return cleared;
}

bool CrvC_SendHistory::claimPending(const QDateTime &now, QList<QPair<qint64, qint64>> *claimed)
{
    claimed->clear();
    if (!open(false) || m_connection.isEmpty())
        return m_error.isEmpty();
    return run(true, [&](QSqlQuery &query) {
        claimed->clear();
        QList<Entry> all;
        if (!readEntries(query, 0, &all))
            return false;
        std::reverse(all.begin(), all.end());
        for (const Entry &e : all) {
            if (!e.pending(now))
                continue;
            if (!execute(query,
                         QStringLiteral("INSERT INTO attempts(entry, started, state, detail, exit_status, "
                                        "http_status, automatic) VALUES(?, ?, 'sending', '', -1, 0, 1)"),
                         {e.id, msecs(now)}))
                return false;
            claimed->append({e.id, query.lastInsertId().toLongLong()});
        }
        return true;
    });
}
