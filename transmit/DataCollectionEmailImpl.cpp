#include "DataCollectionEmailImpl.h"

CrvC_DataCollectionEmailImpl::~CrvC_DataCollectionEmailImpl() = default;
