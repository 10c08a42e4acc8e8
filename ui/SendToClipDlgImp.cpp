#include "SendToClipDlgImp.h"

CrvC_SendToClipDlgImp::CrvC_SendToClipDlgImp() : QWidget(nullptr)
{
    setupUi(this);
}

CrvC_SendToClipDlgImp::~CrvC_SendToClipDlgImp() = default;
