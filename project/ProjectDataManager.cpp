#include "ProjectDataManager.h"

void ProjectDataManager::collectProjectProperties(PairList &)
{
}
