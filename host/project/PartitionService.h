#pragma once

#include "HostObject.h"
#include "ProjectModel.h"

#include "host/DesignData.h"

namespace OrbProject {

// The partition service: what CitP::Factory makes for
// Dpm::IPartitionService::objectId(). Answers for the project that was
// current when it was made; with none, every query fails.
class PartitionService : public HostObject<Dpm::IPartitionService>
{
public:
    explicit PartitionService(ModelPointer model);

    int getPartitionList(const Port::StringBase &partition,
                         std::vector<Port::StringBase> &partitions) override;

private:
    ModelPointer m_model;
};

} // namespace OrbProject
