#pragma once

#include "HostObject.h"

#include "host/DesignData.h"

#include <map>

namespace OrbProject {

// The property filter object: what CitP::Factory makes for
// Dpm::IFilter::objectId(). Keys are compared exactly.
class PropertyFilter : public HostObject<Dpm::IFilter>
{
public:
    void setValue(const Port::StringBase &key, const Port::StringBase &value) override;
    bool getValue(const Port::StringBase &key, Port::StringBase &value) override;

private:
    std::map<Port::StringBase, Port::StringBase> m_values;
};

} // namespace OrbProject
