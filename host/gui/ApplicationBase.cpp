#include "ApplicationBase.h"
#include "DataCollector.h"

#include "host/Env.h"
#include "host/String.h"

namespace Gui {
namespace Clip {

ApplicationBase::ApplicationBase(int &argc, char **argv) : QApplication(argc, argv)
{
}

ApplicationBase::~ApplicationBase() = default;

QString ApplicationBase::getHelpFileName()
{
    return String::convert(Port_Env::GetDataFileName("help/orb_help.html"));
}

void ApplicationBase::requestData(DataCollector &collector)
{
    Q_EMIT dataRequested(collector);
}

} // namespace Clip
} // namespace Gui
