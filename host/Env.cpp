#include "Env.h"
#include "VantorPath.h"

namespace Port_Env {

Port::StringBase GetDataFileName(const char *relativePath)
{
    const std::string relative = std::string("/data/") + (relativePath ? relativePath : "");
    const Port::VantorPath roots = Port::VantorPath::GetInstance();
    std::string candidate;
    for (const std::string &root : roots) {
        candidate = root + relative;
        if (Port::File::exist(candidate))
            return Port::StringBase(candidate);
    }
    return Port::StringBase(candidate); // the last root's path
}

Port::StringBase GetPlatformPath()
{
    return Port::StringBase(sizeof(void *) == 8 ? "lin64" : "lin");
}

} // namespace Port_Env
