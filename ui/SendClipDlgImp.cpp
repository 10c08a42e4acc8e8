#include "SendClipDlgImp.h"

CrvC_SendClipDlgImp::CrvC_SendClipDlgImp() : QWidget(nullptr)
{
    setupUi(this);
}

CrvC_SendClipDlgImp::~CrvC_SendClipDlgImp() = default;
