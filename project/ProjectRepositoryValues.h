#pragma once

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

private:
    ProjectRepositoryValues() = default;
};
