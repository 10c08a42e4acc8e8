#pragma once

#include "host/QualityData.h"
#include "host/RefObject.h"

namespace UtilC {

// The run statistics reader object of libUtilC_QualityData: answers
// IRunStatisticsReader from the project's run records.
class CRunStatisticsReader final : public CitP::RefObject, public IRunStatisticsReader
{
public:
    CRunStatisticsReader() = default;

    CitI::IInterface *GetInterface(const Port::XUID &iid) override;
    void readRunStatistics(const Port::StringBase &projectFile, Port::StringBase &html) override;

private:
    ~CRunStatisticsReader() override = default;
};

} // namespace UtilC
