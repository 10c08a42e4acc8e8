#pragma once

#include "ui_SendToDlg.h"

#include <QWidget>

// The send method dialog's form and the values it opened with, so that OK
// stores only what the user changed.
class CrvC_SendToClipDlgImp : public QWidget, public Ui::SendToDlg
{
    Q_OBJECT
public:
    CrvC_SendToClipDlgImp();
    ~CrvC_SendToClipDlgImp() override;

    bool initialUseSSL = true;
    bool initialDontShow = true;
    QString initialEmailTool;
};
