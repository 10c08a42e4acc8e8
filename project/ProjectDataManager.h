#pragma once

#include "host/StringBase.h"

#include <utility>
#include <vector>

// Gathers the project facts of the report's project statistics from the
// host's project model: design properties, the partition count, the number
// of source files per type and the process properties that apply to the
// project. Each fact is a pair of ready-made cells (name, value) in dtag
// mark-up. Stateless.
class ProjectDataManager
{
public:
    using Pair = std::pair<Port::StringBase, Port::StringBase>;
    using PairList = std::vector<Pair>;

    // Appends the facts of the host's current project to `pairs`; nothing
    // when there is no current project.
    static void collectProjectProperties(PairList &pairs);
};
