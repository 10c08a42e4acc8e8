#include "PartitionService.h"

#include "host/String.h"

using Gui::Clip::String;

namespace OrbProject {

PartitionService::PartitionService(ModelPointer model) : m_model(std::move(model))
{
}

int PartitionService::getPartitionList(const Port::StringBase &partition,
                                       std::vector<Port::StringBase> &partitions)
{
    partitions.clear();
    if (!m_model)
        return 0;
    const QString parent = String::convert(partition);
    const QString prefix = parent.endsWith(QLatin1Char('/')) ? parent : parent + QLatin1Char('/');
    for (const QString &name : m_model->document.partitions) {
        if (parent.isEmpty() || name == parent || name.startsWith(prefix))
            partitions.push_back(String::convert(name));
    }
    return 1;
}

} // namespace OrbProject
