#include "PropertyFilter.h"

namespace OrbProject {

void PropertyFilter::setValue(const Port::StringBase &key, const Port::StringBase &value)
{
    m_values[key] = value;
}

bool PropertyFilter::getValue(const Port::StringBase &key, Port::StringBase &value)
{
    const auto it = m_values.find(key);
    if (it == m_values.end())
        return false;
    value = it->second;
    return true;
}

} // namespace OrbProject
