#pragma once

#include "host/StringBase.h"

#include <utility>
#include <vector>

namespace CitI {
class IInterface;
}
namespace Dpm {
class IProject;
}

// Gathers the project facts of the report's project statistics from the
// host's project model: design properties, the partition count, the number
// of source files per type and the process properties that apply to the
// project. Each fact is a pair of ready-made cells (name, value) in dtag
// mark-up. Stateless: every host object obtained is released before return.
// Failures end only the item or group concerned; internal errors go to the
// host's message manager, other problems to its debug output.
class ProjectDataManager
{
public:
    using Pair = std::pair<Port::StringBase, Port::StringBase>;
    using PairList = std::vector<Pair>;

    // Appends the facts of the host's current project to `pairs`, in this
    // order: design properties, the partitions count, source types, process
    // properties. Nothing when there is no current project or design data.
    static void collectProjectProperties(PairList &pairs);

    // The current value of the project property `name` from the design data
    // (answers Dpm::IDesignData); false when it cannot be read.
    static bool getDesignPropertyValue(CitI::IInterface *designData, const Port::StringBase &name,
                                       Port::StringBase &value);
    // Number of partitions of the current project, "%d"; "0" when unknown.
    static Port::StringBase partitionsCount();
    // One pair per source file type (files with no associated object only),
    // ascending by type name.
    static void collectSourceTypes(Dpm::IProject *project, PairList &pairs);
    // One pair per process property that applies to the project.
    static void collectProcessProperties(Dpm::IProject *project, PairList &pairs);
};
