#include "ProxySource.h"

CrvC_ProxySource::~CrvC_ProxySource() = default;
