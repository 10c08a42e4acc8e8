#pragma once

#include "ReportRecord.h"
#include "Store.h"

#include <QElapsedTimer>
#include <QString>

#include <functional>
#include <string>

// Reads received pages into the store: a page file, a receiver's upload
// folder, or a folder searched for both (docs/backend.md). A page whose bytes
// are stored already is skipped before it is read further; a page the reader
// turns down is reported with its reason, leaves no rows, and is copied with
// the reason beside it into the rejected folder when one is set.
class CrvB_Ingest
{
public:
    struct Counts
    {
        int ingested = 0;
        int alreadyPresent = 0;
        int rejected = 0;
        int failed = 0; // the database refused: the page is neither stored nor at fault
    };

    // `say` receives one line for every page that is rejected or failed and
    // every folder that is skipped.
    CrvB_Ingest(CrvB_Store &store, std::function<void(const QString &line)> say);

    // Where rejected pages are copied; empty (the default) copies nothing.
    void setRejectedFolder(const QString &folder);
    // Pages stored per transaction (default 200; 1 gives each page a
    // transaction of its own). A batch is also committed after a second,
    // so that a slow stream of pages does not wait in it.
    void setCommitEvery(int pages);
    // Only the uploads whose folder number (or, for other pages, a digest of
    // the file name) modulo `count` is `index`: so that `count` workers can
    // share one folder without doing the same page twice.
    void setShard(int index, int count);

    // A page file, an upload folder, or a folder searched (not through
    // symbolic links, not into dot folders or the rejected folder) for both.
    void ingestPath(const QString &path);
    // One page with what came beside it.
    void ingestPage(const QString &pagePath, const CrvB_Store::Arrival &arrival);

    // Commits the pages stored since the last commit; call before reading
    // the counts. A batch that cannot be committed counts as failed.
    void finish();

    const Counts &counts() const { return m_counts; }
    // "ingested N, already present M, rejected K"
    QString summary() const;

    // The rejected folder beside an SQLite database file; empty for PostgreSQL.
    static QString defaultRejectedFolder(const CrvB_DatabaseUrl &url);

    // For corvid-receiver --ingest: stores the upload numbered `number` in
    // the receiver's `dataDir` into the database at `url`, with a connection
    // of its own (any thread may call it), and answers the receiver's log
    // line: "ingest NNNNNN: " and the outcome. The upload's folder is never
    // changed, so a page that could not be stored stays for a later run.
    static std::string receiverIngest(const std::string &url, const std::string &dataDir, unsigned number);

private:
    void ingestFolder(const QString &folder, int depth);
    bool inShard(const QString &name) const;
    void reject(const QString &pagePath, const QByteArray &sha256, const QString &reason);
    void store(const QString &pagePath, const QByteArray &sha256, qint64 bytes,
               const CrvB_ReportRecord &record, const CrvB_Store::Arrival &arrival);

    CrvB_Store &m_store;
    std::function<void(const QString &)> m_say;
    QString m_rejectedFolder;
    int m_shardIndex = 0;
    int m_shardCount = 1;
    Counts m_counts;
    int m_commitEvery = 200;
    int m_batchPages = 0; // stored in the open batch
    QElapsedTimer m_batchAge;
};
