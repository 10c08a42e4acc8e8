#pragma once

#include "OrbProjectExport.h"

#include <QString>

// Host-side access to single values of a project repository through the
// component library "libPrjrep_Repository" (see host/Repository.h). Each call
// opens the repository, the section and the sub-section, does its one read
// or write and closes everything again.
class ORBPROJECT_EXPORT RepositoryAccess
{
public:
    static const char *const CreationSection;    // "ProjectConsole"
    static const char *const CreationSubSection; // "/_ProjRepoInternal_"
    static const char *const CreationKey;        // "PROJECT_CREATION_TIMESTAMP"

    // Reads `key` (the repository must exist; nothing is created). True with
    // the value when the key is stored; false when it is not or on failure,
    // with a message in `error` in both cases.
    static bool read(const QString &projectFile, const QString &section, const QString &subSection,
                     const QString &key, QString *value, QString *error = nullptr);
    // Stores `value` under `key`, creating the repository, section and
    // sub-section when missing. False with a message on failure.
    static bool write(const QString &projectFile, const QString &section, const QString &subSection,
                      const QString &key, const QString &value, QString *error = nullptr);
};
