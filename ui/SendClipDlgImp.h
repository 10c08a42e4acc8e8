#pragma once

#include "ui_SendDlgUi.h"

#include <QWidget>

// The send progress dialog's form.
class CrvC_SendClipDlgImp : public QWidget, public Ui::SendDlgUi
{
    Q_OBJECT
public:
    CrvC_SendClipDlgImp();
    ~CrvC_SendClipDlgImp() override;

    bool initialDontShow = true;
};
