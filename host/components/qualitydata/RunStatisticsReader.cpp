#include "RunStatisticsReader.h"
#include "RunRecords.h"

#include <QString>

namespace UtilC {

CitI::IInterface *CRunStatisticsReader::GetInterface(const Port::XUID &iid)
{
    if (iid == IRunStatisticsReader::iid())
        return static_cast<IRunStatisticsReader *>(this);
    return RefObject::GetInterface(iid);
}

void CRunStatisticsReader::readRunStatistics(const Port::StringBase &projectFile, Port::StringBase &html)
{
    html = "";
    if (projectFile.IsEmpty())
        return;
    RunRecords records;
    records.read(RunRecords::recordsPath(QString::fromUtf8(projectFile.c_str())));
    html = Port::StringBase(records.htmlTable().toStdString());
}

} // namespace UtilC

extern "C" Q_DECL_EXPORT CitI::IInterface *CitP_CreateInstance(const Port::XUID &id)
{
    if (id == UtilC::IRunStatisticsReader::classId())
        return static_cast<CitP::RefObject *>(new UtilC::CRunStatisticsReader);
    return nullptr;
}
