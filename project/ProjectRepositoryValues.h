#pragma once

#include <QDate>
#include <QString>

// Corvid's values in the project repository of a project file (section
// "Corvid", sub-section "DesignDataCollection"), and the project's creation
// date that the host keeps there. Stateless: every call opens the repository
// afresh and closes it again.
//
// A repository that cannot be read (locked by another process for longer
// than the repository waits, damaged, not readable) is not an empty one:
// its values then read as empty text and nothing is written back, so that a
// stored project identifier is never replaced and the send counter never
// goes down.
class ProjectRepositoryValues
{
public:
    static const char *const ProjectIdKey;     // "Corvid-DataCollection-Project-ID"
    static const char *const SendIterationKey; // "Corvid-DataCollection-Send-Iteration"

    // The accessor that reads and writes.
    static ProjectRepositoryValues &instance();
    // The accessor of a preview: it opens repositories read-only (creating
    // nothing) and never writes; a missing identifier is shown, not stored.
    static const ProjectRepositoryValues &readOnly();

    // The stored value, or empty text when there is none or the repository
    // cannot be read.
    QString getValue(const QString &projectFile, const QString &key) const;
    void setValue(const QString &projectFile, const QString &key, const QString &value) const;
    // Whole days from the project's creation date to today, or empty text
    // when the project has no valid creation date.
    QString projectAgeInDays(const QString &projectFile) const;
    // The same, counted to `today`.
    QString projectAgeInDays(const QString &projectFile, const QDate &today) const;

    // The project identifier a report shows: the stored one; when the
    // project file exists but has none yet, `fresh` (a new identifier of 32
    // lower-case hex digits), which is stored unless another process stored
    // one first (that one is shown then); when the file does not exist,
    // `fresh` unstored (so each such report carries a different identifier).
    // Empty when the repository cannot be read or the new identifier cannot
    // be stored.
    QString projectIdentifier(const QString &projectFile, const QString &fresh) const;
    // The send iteration a report shows: the stored counter re-formatted in
    // base 10, or "1" when the file does not exist or holds no counter that
    // parses; empty when the repository cannot be read.
    QString sendIteration(const QString &projectFile) const;
    // Counts a send of a report that showed `shownIteration`: stores the
    // larger of that number and the stored counter, plus one, when the
    // project file exists, the number parses and the stored counter is
    // either absent or parses too (a counter that does not parse is never
    // overwritten). Sends counted at the same time by other processes are
    // never undone: the counter only grows.
    void countSend(const QString &projectFile, const QString &shownIteration) const;

private:
    explicit ProjectRepositoryValues(bool writes) : m_writes(writes) {}

    enum class Lookup { Found, Absent, Failed };
    Lookup lookup(const QString &projectFile, const QString &key, QString *value) const;
    // Stores `value` if the key still holds `expected` (absent: `found`
    // false); answers the repository's status (Prjrep::Status).
    int replace(const QString &projectFile, const QString &key, bool found, const QString &expected,
                const QString &value) const;

    const bool m_writes;
};
