#include "InstanceTable.h"

#include <QMutex>

#include <map>

namespace CitP {
namespace {

struct Table
{
    QMutex mutex;
    std::map<Port::XUID, CitI::IInterface *> entries;
};

Table &table()
{
    static Table t;
    return t;
}

} // namespace

CitI::IInterface *InstanceTable::GetInstance(const Port::XUID &id)
{
    Table &t = table();
    QMutexLocker lock(&t.mutex);
    auto it = t.entries.find(id);
    return it == t.entries.end() ? nullptr : it->second;
}

bool InstanceTable::RegisterInstance(const Port::XUID &id, CitI::IInterface *instance)
{
    if (!instance)
        return false;
    Table &t = table();
    QMutexLocker lock(&t.mutex);
    t.entries[id] = instance;
    return true;
}

bool InstanceTable::UnRegisterInstance(CitI::IInterface *instance)
{
    Table &t = table();
    QMutexLocker lock(&t.mutex);
    bool found = false;
    for (auto it = t.entries.begin(); it != t.entries.end();) {
        if (it->second == instance) {
            it = t.entries.erase(it);
            found = true;
        } else {
            ++it;
        }
    }
    return found;
}

} // namespace CitP
