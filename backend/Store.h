#pragma once

#include "DatabaseUrl.h"
#include "ReportRecord.h"

#include <QSqlDatabase>
#include <QString>

#include <memory>

// The database of received pages (schema.sql, docs/backend.md), on SQLite or
// PostgreSQL through QtSql. Each Store has a connection of its own, so every
// thread that stores pages makes its own Store.
//
// A page is stored whole or not at all: in a transaction of its own, or,
// inside a batch, under a savepoint of its own that is rolled back when any
// of its rows fails. A batch saves the commit per page (most of the cost of a
// small page); a batch that fails to commit stores none of its pages.
class CrvB_Store
{
public:
    // What the receiver kept beside a page.
    struct Arrival
    {
        QString source;     // where the page was read from
        QString receivedAt; // ISO 8601, UTC; empty when unknown
        QString domain;
        QString regid;
    };

    enum class Outcome { Stored, AlreadyPresent, Failed };

    CrvB_Store();
    ~CrvB_Store();
    CrvB_Store(const CrvB_Store &) = delete;
    CrvB_Store &operator=(const CrvB_Store &) = delete;

    // Connects; with `readOnly` nothing is made or changed (an SQLite file must
    // exist), otherwise the tables are made when missing. False with `error`.
    bool open(const QString &url, bool readOnly, QString *error);
    const CrvB_DatabaseUrl &url() const { return m_url; }
    QSqlDatabase database() const;

    // Whether a page with this SHA-256 (hexadecimal) is stored; false also
    // when asking failed (then `error` is set).
    bool contains(const QByteArray &sha256, QString *error);

    // Opens a batch: the pages stored until commitBatch() share one
    // transaction. False with `error` when it cannot be opened.
    bool beginBatch(QString *error);
    bool inBatch() const { return m_inBatch; }
    // Commits the batch; false with `error` when it was rolled back instead.
    bool commitBatch(QString *error);

    // Stores one page's record. AlreadyPresent when a page with the same
    // digest was stored first (also by another process at the same time).
    Outcome store(const QByteArray &sha256, qint64 pageBytes, const CrvB_ReportRecord &record,
                  const Arrival &arrival, QString *error);

    // The schema as it runs on this engine.
    static QString schema(CrvB_DatabaseUrl::Engine engine);

private:
    bool createSchema(QString *error);
    bool exec(const char *sql);
    // Hands the record's rows to the row writers, table by table.
    void addRows(const CrvB_ReportRecord &record);
    class Statements;

    QString m_connection;
    CrvB_DatabaseUrl m_url;
    std::unique_ptr<Statements> m_statements;
    bool m_inBatch = false;
    bool m_batchLost = false; // rolled back: the rest of the batch fails too
};
