#pragma once

#include "host/gui/Dialog.h"

class CrvC_DataCollectionEmail;
class CrvC_SendToClipDlgImp;
class QLabel;

// The send method dialog: the user chooses between the HTTPS upload and one
// of the mail programs, and whether to send that way automatically from now
// on. OK stores the choice and sends; Cancel and closing store and send
// nothing. Offered after a failed upload, the choice is for this report only
// unless the user ticks "Send Corvid file automatically". Without any mail
// program the e-mail option is disabled and says why. The decisions
// themselves are CrvC_SendDispatcher's.
class CrvC_SendToClipDlg : public Gui::Clip::Dialog
{
    Q_OBJECT
public:
    CrvC_SendToClipDlg(QWidget *parent, const QString &reportFile);
    ~CrvC_SendToClipDlg() override;

    // The send step: sends `reportFile` with the remembered method, or asks
    // with this dialog (modal) when there is none.
    static void showSendMethodDialog(QWidget *parent, const QString &reportFile);
    // Asks with the e-mail method preselected (after a failed upload) and
    // the check box cleared, so that OK alone stores nothing.
    static void showSendMethodDialogForEmail(QWidget *parent, const QString &reportFile);
    // Starts the remembered method; false when nothing could be started.
    static bool sendReport(const QString &reportFile);

    CrvC_SendToClipDlgImp *imp() const { return m_imp; }
    QString reportFile() const { return m_reportFile; }
    // The explanation shown, instead of the program list, when there is no
    // mail program; null when there are programs.
    QLabel *noEmailToolNote() const { return m_noEmailToolNote; }

    // Makes the dialog the offer after a failed upload: e-mail preselected
    // (when there is a program), the check box cleared, and OK stores the
    // choice only when the user ticks it.
    void offerAfterFailure();

public Q_SLOTS:
    void accept() override;
    void OnSSLButtonStateChanged(bool on);
    // The host's help topic when the host has a help file, else the
    // installed help page in the web browser.
    void help() override;

private:
    CrvC_SendToClipDlgImp *m_imp = nullptr;
    QString m_reportFile;
    CrvC_DataCollectionEmail *m_email = nullptr;
    QLabel *m_noEmailToolNote = nullptr;
    bool m_forThisReportOnly = false;
};
