#pragma once

#include "Interface.h"
#include "StringBase.h"

// The host's run statistics reader: the "Software Quality" figures of a
// project's tool runs. The reader, class UtilC::CRunStatisticsReader, lives in
// the component library "libUtilC_QualityData"; load it with
// CitP::Factory::LoadLibraryFactory(IRunStatisticsReader::libraryName()),
// create it with CitP::Factory::CreateInstanceRef(IRunStatisticsReader::classId())
// and ask the object for IRunStatisticsReader::iid(). The object is reference
// counted (CitI::IObject); release it when done.
//
// The run records it reads are described in docs/run-records.md.

namespace UtilC {

class IRunStatisticsReader : public CitI::IInterface
{
public:
    static const char *libraryName() { return "libUtilC_QualityData"; }

    // UtilC::CRunStatisticsReader {9041c6e1-b1d9-490c-a69e-f395c92f1165}
    static const Port::XUID &classId()
    {
        static const Port::XUID id(0x9041c6e1, 0xb1d9490c, 0xa69ef395, 0xc92f1165);
        return id;
    }
    // {b7bb6905-667a-4c42-9b93-ad0a547224ec}
    static const Port::XUID &iid()
    {
        static const Port::XUID id(0xb7bb6905, 0x667a4c42, 0x9b93ad0a, 0x547224ec);
        return id;
    }

    // Replaces `html` by the run statistics of the project file `projectFile`:
    // one table, opened with "<table>" and closed with "</table>" in lower
    // case, one row per tool. `html` is left empty when the project has no
    // usable run records.
    virtual void readRunStatistics(const Port::StringBase &projectFile, Port::StringBase &html) = 0;
};

} // namespace UtilC
