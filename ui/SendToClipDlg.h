#pragma once

#include "host/gui/Dialog.h"

class CrvC_DataCollectionEmail;
class CrvC_SendToClipDlgImp;

// The send method dialog: the user chooses between the HTTPS upload and one
// of the mail programs, and whether to send that way automatically from now
// on. OK stores the choice and sends; Cancel and closing store and send
// nothing. The decisions themselves are CrvC_SendDispatcher's.
class CrvC_SendToClipDlg : public Gui::Clip::Dialog
{
    Q_OBJECT
public:
    CrvC_SendToClipDlg(QWidget *parent, const QString &reportFile);
    ~CrvC_SendToClipDlg() override;

    // The send step: sends `reportFile` with the remembered method, or asks
    // with this dialog (modal) when there is none.
    static void showSendMethodDialog(QWidget *parent, const QString &reportFile);
    // Asks with the e-mail method preselected (after a failed upload).
    static void showSendMethodDialogForEmail(QWidget *parent, const QString &reportFile);
    // Starts the remembered method; false when nothing could be started.
    static bool sendReport(const QString &reportFile);

    CrvC_SendToClipDlgImp *imp() const { return m_imp; }
    QString reportFile() const { return m_reportFile; }

public Q_SLOTS:
    void accept() override;
    void OnSSLButtonStateChanged(bool on);

private:
    CrvC_SendToClipDlgImp *m_imp = nullptr;
    QString m_reportFile;
    CrvC_DataCollectionEmail *m_email = nullptr;
};
