#include "HelpViewerData.h"

CrvC_HelpViewerData::CrvC_HelpViewerData() = default;
CrvC_HelpViewerData::~CrvC_HelpViewerData() = default;

QString CrvC_HelpViewerData::sectionText() const
{
    return QString();
}
