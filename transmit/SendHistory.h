#pragma once

#include <QByteArray>
#include <QDateTime>
#include <QList>
#include <QPair>
#include <QString>

#include <functional>

class QSqlQuery;

// The send history: every report that left (or was meant to leave) the
// machine, with its exact bytes and what became of each try. One SQLite file
// per user, history.sqlite in defaultDirectory(); every change is one
// transaction, so a crash leaves either the whole change or none of it.
//
// An entry is one report: where it went, the form fields sent beside it, its
// size and SHA-256, and its page (stored compressed). Each try to send it is
// an attempt; the first is made with the entry, retries add more. Retention
// keeps the newest MaxEntries entries within MaxBytes of stored pages; a page
// that alone exceeds MaxBytes (as it is or compressed) is recorded without
// its bytes.
//
// A file that is not a readable history (not SQLite, damaged, written by a
// newer version) is reported through error() and left untouched, except by
// clear(), which then removes it.
//
// Not thread-safe: use an object from one thread only. Several objects and
// processes may use the same file; SQLite's locking keeps them apart.
class CrvC_SendHistory
{
public:
    enum class Method { Upload, Email };
    enum class State { Sending, Sent, Failed, Handed };

    static constexpr int MaxEntries = 100;
    static constexpr qint64 MaxBytes = 200 * 1024 * 1024;
    // Automatic retries of a failed upload: at most this many, only while
    // the report is younger than RetryDays.
    static constexpr int MaxRetries = 3;
    static constexpr int RetryDays = 14;
    // An attempt still marked as sending after this long was cut off (the
    // host ended during the transfer) and counts as failed.
    static constexpr int StaleSendingSecs = 3600;

    struct Attempt
    {
        qint64 id = 0;
        QDateTime started;
        QDateTime ended; // invalid while sending
        State state = State::Sending;
        QString detail;      // the server's answer, the cause of a failure, or the mail program
        int exitStatus = -1; // vancurl's, -1 when it did not run to an end
        int httpStatus = 0;  // 0 when no HTTP status is known
        bool automatic = false;
    };

    struct Entry
    {
        qint64 id = 0;
        QDateTime time; // of the first attempt
        QString project;
        QString design;
        Method method = Method::Upload;
        QString destination; // upload address, or mailbox
        QString domain;      // the form fields sent beside the page
        QString regid;
        qint64 bytes = 0;
        QByteArray sha256; // hex
        bool pageKept = false;
        QList<Attempt> attempts; // oldest first

        // The last attempt's state; a stale sending counts as failed.
        State state(const QDateTime &now = QDateTime::currentDateTimeUtc()) const;
        // "sending", "sent", "failed: <cause>" or "handed to <mail program>".
        QString outcome(const QDateTime &now = QDateTime::currentDateTimeUtc()) const;
        // A failed upload that the start of a later cycle tries again.
        bool pending(const QDateTime &now = QDateTime::currentDateTimeUtc()) const;
        // A failed upload whose page is kept: what retry() accepts.
        bool retryable(const QDateTime &now = QDateTime::currentDateTimeUtc()) const;
    };

    struct Limits
    {
        int maxEntries = MaxEntries;
        qint64 maxBytes = MaxBytes;
    };

    // The folder of the user's history: $XDG_DATA_HOME/orb/corvid.
    static QString defaultDirectory();
    static QString methodName(Method method);
    static QString stateName(State state);

    explicit CrvC_SendHistory(const QString &directory = defaultDirectory());
    CrvC_SendHistory(const QString &directory, Limits limits);
    ~CrvC_SendHistory();
    CrvC_SendHistory(const CrvC_SendHistory &) = delete;
    CrvC_SendHistory &operator=(const CrvC_SendHistory &) = delete;

    QString fileName() const;
    // Where a page goes for the web browser; clear() removes it.
    QString viewFileName() const;
    // Why the last call failed, as a sentence for the user.
    QString error() const { return m_error; }
    // True when the file exists but is not a history this version can use.
    bool damaged() const { return m_damaged; }

    // Opens the file; creates it (and its folder) when `create`, otherwise a
    // missing file is an empty history. False with error() when the file is
    // not a usable history.
    bool open(bool create = true);

    // Records a new entry for `page` with its first attempt (sending); fills
    // in bytes and sha256. Returns the entry's id and the attempt's in
    // `attemptId`; 0 on failure.
    qint64 addEntry(const Entry &entry, const QByteArray &page, qint64 *attemptId);
    // The same for the page in the file `path`. A file larger than the
    // history keeps is hashed as it is read, never held in memory whole,
    // and recorded without its bytes.
    qint64 addEntry(const Entry &entry, const QString &path, qint64 *attemptId);
    // A further try of entry `id`; returns the attempt's id, 0 on failure.
    qint64 addAttempt(qint64 id, bool automatic);
    bool finishAttempt(qint64 attemptId, State state, const QString &detail, int exitStatus = -1,
                       int httpStatus = 0);
    bool setDestination(qint64 id, const QString &destination, const QString &domain, const QString &regid);

    // Every entry, newest first, with its attempts.
    bool entries(QList<Entry> *result);
    bool entry(qint64 id, Entry *result);
    // The exact bytes of entry `id`, checked against their SHA-256.
    bool page(qint64 id, QByteArray *result);
    bool remove(qint64 id);
    // Removes every entry and page; a damaged file is removed whole.
    bool clear();

    // Claims the pending uploads for automatic retries, oldest first: each
    // gets a new automatic attempt in one transaction, so that two hosts
    // never send the same report twice. Fills (entry, attempt) pairs.
    bool claimPending(const QDateTime &now, QList<QPair<qint64, qint64>> *claimed);

private:
    bool run(bool write, const std::function<bool(QSqlQuery &)> &work);
    bool readEntries(QSqlQuery &query, qint64 onlyId, QList<Entry> *result);
    bool prune(QSqlQuery &query);
    qint64 insert(const Entry &entry, qint64 bytes, const QByteArray &sha, const QByteArray &stored,
                  qint64 *attemptId);
    bool fail(const QString &what, const QString &why);
    void vacuum();
    void close();

    QString m_directory;
    Limits m_limits;
    QString m_connection;
    QString m_error;
    bool m_damaged = false;
};
