#pragma once

#include "project/PreferenceValues.h"
#include "ui_PrefPage.h"

#include <QStringList>
#include <QWidget>

class QLabel;

// Corvid's preference page: collection on or off, whether the send progress
// dialog is shown, and how reports are sent (HTTPS upload or a mail program).
// The host's sheet drives it with its page events: the first show loads the
// settings (a later show keeps what the user changed), Apply and OK store
// them.
class CrvC_DataCollectionPropPageImpl : public QWidget, public Ui::CrvC_PrefPage
{
    Q_OBJECT
public:
    CrvC_DataCollectionPropPageImpl(QWidget *parent, const char *name);
    ~CrvC_DataCollectionPropPageImpl() override;

    virtual void loadPage();
    virtual void applyPage();

    // The mail programs the page offers, the preferred one first (the e-mail
    // sender's list, asked once per page).
    QStringList emailToolNames();

    // The note that the installation's administrator set the collection
    // switch; shown only while the install-wide file decides it.
    QLabel *administratorNote() const { return m_administratorNote; }

public Q_SLOTS:
    void OnSSLButtonStateChanged(bool on);
    // Opens the send history ("Sent reports...").
    void showSentReports();

protected:
    void customEvent(QEvent *event) override;

private:
    CrvC_PreferenceValues::Values m_loaded;
    bool m_pageLoaded = false;
    QStringList m_mailPrograms;
    bool m_mailProgramsRead = false;
    QLabel *m_administratorNote = nullptr;
};
