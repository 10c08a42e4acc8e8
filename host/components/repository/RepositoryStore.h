#pragma once

#include <QString>

#include <functional>
#include <memory>

class QSqlQuery;

namespace Prjrep {

// One SQLite connection to a repository file. Sections form a tree (the
// project's sections have parent 0); values belong to a section.
//
//   sections(id INTEGER PRIMARY KEY, parent INTEGER, name TEXT, UNIQUE(parent, name))
//   entries(section INTEGER, key TEXT, value TEXT, PRIMARY KEY(section, key))
//
// Every write is one "BEGIN IMMEDIATE" transaction. A file locked by another
// connection is waited for, the statement retried in short turns so that
// writers in several processes all get theirs, for two seconds at most per
// operation; then the operation fails. Answers Prjrep::Status values.
class RepositoryStore
{
public:
    // The repository file that belongs to `projectFile`.
    static QString fileNameFor(const QString &projectFile);

    // Opens `fileName`. Without `writable` the file is opened read-only and
    // must exist; with `create` a missing file is created.
    static std::shared_ptr<RepositoryStore> open(const QString &fileName, bool writable, bool create,
                                                 int *status);
    ~RepositoryStore();
    RepositoryStore(const RepositoryStore &) = delete;
    RepositoryStore &operator=(const RepositoryStore &) = delete;

    bool writable() const { return m_writable; }

    // The id of section `name` under `parent` (0 for the top level),
    // created when missing if `create` is set.
    int findSection(qint64 parent, const QString &name, bool create, qint64 *id);
    int value(qint64 section, const QString &key, QString *value);

    enum Condition {
        Replace,  // whatever is stored
        IfAbsent, // only when the key has no value
        IfEqual,  // only when the key holds `expected`
    };
    // Stores `value` under `key` when `condition` holds (else
    // StatusConflict), in one transaction.
    int setValue(qint64 section, const QString &key, const QString &value, Condition condition = Replace,
                 const QString &expected = QString());

private:
    RepositoryStore(const QString &connectionName, bool writable);

    // Runs `work` (answering a status), inside a write transaction when
    // `write` is set, retrying while the file is locked by someone else and
    // time is left. A write transaction is rolled back when `work` fails.
    int run(bool write, const std::function<int(QSqlQuery &)> &work);
    int createSchema();

    QString m_connectionName;
    bool m_writable;
};

} // namespace Prjrep
