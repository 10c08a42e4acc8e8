#include "Factory.h"
#include "VantorPath.h"

#include <QFileInfo>
#include <QLibrary>
#include <QMutex>
#include <QString>

#include <map>
#include <memory>
#include <vector>

namespace CitP {
namespace {

using CreateFunction = CitI::IInterface *(*)(const Port::XUID &);

struct Registry
{
    QMutex mutex;
    std::map<Port::XUID, Factory::Creator> creators;
    std::map<QString, CreateFunction> libraries; // by library name, in load order of names
    std::vector<CreateFunction> order;
    // The loaded libraries, kept (never unloaded) for the life of the process.
    std::vector<std::unique_ptr<QLibrary>> handles;
};

Registry &registry()
{
    static Registry r;
    return r;
}

QString libraryFileName(const char *name)
{
    QString file = QString::fromUtf8(name);
    if (!file.endsWith(QLatin1String(".so")))
        file += QLatin1String(".so");
    return file;
}

CitI::IInterface *create(const Port::XUID &id)
{
    Registry &r = registry();
    Factory::Creator creator;
    std::vector<CreateFunction> libraries;
    {
        QMutexLocker lock(&r.mutex);
        auto it = r.creators.find(id);
        if (it != r.creators.end())
            creator = it->second;
        libraries = r.order;
    }
    if (creator)
        return creator();
    for (CreateFunction f : libraries) {
        if (CitI::IInterface *object = f(id))
            return object;
    }
    return nullptr;
}

} // namespace

bool Factory::LoadLibraryFactory(const char *name)
{
    if (!name || !*name)
        return false;
    const QString file = libraryFileName(name);
    Registry &r = registry();
    QMutexLocker lock(&r.mutex);
    if (r.libraries.count(file))
        return true;
    for (const std::string &root : Port::VantorPath::GetInstance()) {
        const QString path = QString::fromStdString(root) + QLatin1String("/lib/") + file;
        if (!QFileInfo::exists(path))
            continue;
        // Component libraries stay loaded for the life of the process, like
        // the host's own; objects they created may outlive any caller.
        auto library = std::make_unique<QLibrary>(path);
        auto function = reinterpret_cast<CreateFunction>(library->resolve("CitP_CreateInstance"));
        if (!function)
            continue;
        r.handles.push_back(std::move(library));
        r.libraries.emplace(file, function);
        r.order.push_back(function);
        return true;
    }
    return false;
}

CitI::IInterface *Factory::CreateInstance(const Port::XUID &id)
{
    return create(id);
}

CitI::IInterface *Factory::CreateInstanceRef(const Port::XUID &id)
{
    return create(id);
}

void Factory::RegisterCreator(const Port::XUID &id, Creator creator)
{
    Registry &r = registry();
    QMutexLocker lock(&r.mutex);
    r.creators[id] = std::move(creator);
}

void Factory::UnRegisterCreator(const Port::XUID &id)
{
    Registry &r = registry();
    QMutexLocker lock(&r.mutex);
    r.creators.erase(id);
}

} // namespace CitP
