#pragma once

#include "OrbHostExport.h"

#include <string>
#include <vector>

namespace Port {

// The ordered list of installation roots: the directories of the environment
// variable VANTOR (colon-separated, empty entries skipped), then the
// installation the host library belongs to (the parent of its lib/ folder).
// The list is read afresh on every GetInstance call.
class ORBHOST_EXPORT VantorPath
{
public:
    using const_iterator = std::vector<std::string>::const_iterator;

    static VantorPath GetInstance();

    const_iterator begin() const { return m_roots.begin(); }
    const_iterator end() const { return m_roots.end(); }
    const std::vector<std::string> &roots() const { return m_roots; }

    // The installation the host library was loaded from.
    static std::string installationRoot();

private:
    std::vector<std::string> m_roots;
};

// File system queries of the host.
class ORBHOST_EXPORT File
{
public:
    // True when `path` names an existing file or directory.
    static bool exist(const char *path);
    static bool exist(const std::string &path) { return exist(path.c_str()); }
};

} // namespace Port
