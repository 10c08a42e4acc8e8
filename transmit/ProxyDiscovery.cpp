#include "ProxyDiscovery.h"

QString CrvC_ProxyDiscovery::findProxy()
{
    return QString();
}
