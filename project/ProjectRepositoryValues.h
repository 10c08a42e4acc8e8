#pragma once

#include <QDate>
#include <QString>

// Corvid's values in the project repository of a project file (section
// "Corvid", sub-section "DesignDataCollection"), and the project's creation
// date that the host keeps there. Stateless: every call opens the repository
// afresh and closes it again; failures read as empty text and write nothing.
class ProjectRepositoryValues
{
public:
    static const char *const ProjectIdKey;     // "Corvid-DataCollection-Project-ID"
    static const char *const SendIterationKey; // "Corvid-DataCollection-Send-Iteration"

    static ProjectRepositoryValues &instance();

    QString getValue(const QString &projectFile, const QString &key) const;
    void setValue(const QString &projectFile, const QString &key, const QString &value) const;
    // Whole days from the project's creation date to today, or empty text
    // when the project has no valid creation date.
    QString projectAgeInDays(const QString &projectFile) const;
    // The same, counted to `today`.
    QString projectAgeInDays(const QString &projectFile, const QDate &today) const;

    // The project identifier a report shows: the stored one; when the
    // project file exists but has none yet, `fresh` (a new identifier of 32
    // lower-case hex digits), which is stored; when the file does not exist,
    // `fresh` unstored (so each such report carries a different identifier).
    QString projectIdentifier(const QString &projectFile, const QString &fresh) const;
    // The send iteration a report shows: the stored counter re-formatted in
    // base 10, or "1" when the file does not exist or holds no counter that
    // parses.
    QString sendIteration(const QString &projectFile) const;
    // Counts a send of a report that showed `shownIteration`: stores that
    // number plus one, when the project file exists, the number parses and
    // the stored counter is either absent or parses too (a counter that
    // does not parse is never overwritten).
    void countSend(const QString &projectFile, const QString &shownIteration) const;

private:
    ProjectRepositoryValues() = default;
};
