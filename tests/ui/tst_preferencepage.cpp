#include "DialogTestSupport.h"
#include "common/TestEnvironment.h"
#include "host/gui/DataCollector.h"
#include "host/gui/PropItem.h"
#include "host/gui/PropSheet.h"
#include "host/gui/PropSheetEvent.h"
#include "host/gui/VantorUpdatePage.h"
#include "transmit/DataCollectionEmail.h"
#include "ui/DataCollectionPropPageImpl.h"
#include "ui/PropPageCreator.h"

#include <QLabel>
#include <QtTest>

using CorvidTest::store;
using CorvidTest::stored;
using Gui::Clip::PropSheetEvent;

namespace {

CrvC_DataCollectionPropPageImpl *showCorvidPage(Gui::Clip::PropSheet &sheet)
{
    Gui::Clip::DataCollector collector(32, &sheet);
    CrvC_PropPageCreator::addPreferenceItem(collector);
    sheet.showItem(sheet.itemCount() - 1);
    return qobject_cast<CrvC_DataCollectionPropPageImpl *>(sheet.item(sheet.itemCount() - 1)->page());
}

} // namespace

// Corvid's preference page: what it shows and stores through the sheet's
// events.
class TestPreferencePage : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        // Two mail programs on the path, so that the page has a list to show.
        const QString bin = m_env->home() + QLatin1String("/bin");
        QVERIFY(CorvidTest::writeFile(bin + QLatin1String("/mozilla"), "#!/bin/sh\n"));
        QVERIFY(CorvidTest::writeFile(bin + QLatin1String("/thunderbird"), "#!/bin/sh\n"));
        qputenv("PATH", QFile::encodeName(bin) + ':' + qgetenv("PATH"));
    }
    void init() { m_env->clearSettings(); }

    void pagePerSheet()
    {
        // A preference request without a sheet adds nothing; every sheet gets
        // a page of its own. (The item in the host's sheet: the plug-in's test.)
        Gui::Clip::DataCollector noSheet(Gui::Clip::DataCollector::PreferenceSheet, nullptr);
        CrvC_PropPageCreator::addPreferenceItem(noSheet);
        Gui::Clip::PropSheet first, second;
        CrvC_DataCollectionPropPageImpl *page = showCorvidPage(first);
        QVERIFY(page && page != showCorvidPage(second));
        QCOMPARE(first.itemCount(), 1);
    }

    void loadAndApply_data()
    {
        QTest::addColumn<QVariant>("useSsl");
        QTest::addColumn<QByteArray>("installFile");
        QTest::addColumn<bool>("switchMethod");
        QTest::addColumn<bool>("collectShown");
        QTest::addColumn<QVariant>("useSslAfter"); // invalid: not written
        QTest::addColumn<bool>("savedTool");       // the second program is remembered
        QTest::addColumn<bool>("administrator");   // the note that the installation decides

        const QVariant none;
        QTest::newRow("defaults, unchanged")
            << none << QByteArray() << false << true << none << false << false;
        QTest::newRow("installation switched off") << none << QByteArray("collectusagestatistics=false\n")
                                                   << false << false << none << false << true;
        QTest::newRow("upload to e-mail")
            << QVariant(true) << QByteArray() << true << true << QVariant(false) << false << false;
        QTest::newRow("program remembered")
            << QVariant(false) << QByteArray() << false << true << QVariant(false) << true << false;
    }

    void loadAndApply()
    {
        QFETCH(QVariant, useSsl);
        QFETCH(QByteArray, installFile);
        QFETCH(bool, switchMethod);
        QFETCH(bool, collectShown);
        QFETCH(bool, savedTool);
        store(CrvC_Settings::UseSSL, useSsl);
        const QStringList tools = CrvC_DataCollectionEmail().emailTools();
        QVERIFY(tools.size() >= 2);
        if (savedTool)
            store(CrvC_Settings::SelectedEmailTool, tools.at(1));
        QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), installFile));

        Gui::Clip::PropSheet sheet;
        CrvC_DataCollectionPropPageImpl *page = showCorvidPage(sheet);
        QVERIFY(page);
        const bool ssl = useSsl.isValid() ? useSsl.toBool() : true;
        QCOMPARE(page->collectionCheckBox->isChecked(), collectShown);
        QTEST(!page->administratorNote()->isHidden(), "administrator");
        QCOMPARE(page->sslRadioButton->isChecked(), ssl);
        QCOMPARE(page->emailRadioButton->isChecked(), !ssl);
        QCOMPARE(page->selectEmailTool->isEnabled(), !ssl);
        QVERIFY(!page->selectEmailTool->isEditable());
        // The list as the e-mail sender offers it, the preferred program last and current.
        const QStringList offered = CrvC_PreferenceValues::mailListOrder(page->emailToolNames());
        QCOMPARE(page->selectEmailTool->count(), offered.size());
        QCOMPARE(page->emailToolNames(), tools);
        QCOMPARE(page->selectEmailTool->currentText(), savedTool ? tools.at(1) : tools.first());
        QCOMPARE(page->selectEmailTool->itemText(offered.size() - 1), tools.first());

        // Shown again: the list does not grow.
        sheet.showItem(0);
        QCOMPARE(page->selectEmailTool->count(), offered.size());

        if (switchMethod)
            (ssl ? page->emailRadioButton : page->sslRadioButton)->setChecked(true);
        QCOMPARE(page->selectEmailTool->isEnabled(), ssl == switchMethod);
        sheet.apply();
        QTEST(stored(CrvC_Settings::UseSSL), "useSslAfter");
        // With none remembered, the preferred program shown is stored.
        QCOMPARE(stored(CrvC_Settings::SelectedEmailTool), QVariant(savedTool ? tools.at(1) : tools.first()));
        QCOMPARE(stored(CrvC_Settings::CollectDeviceUsage), QVariant(collectShown));
        QCOMPARE(stored(CrvC_Settings::DontShowSendProgressDlg), QVariant(false));
        QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), QByteArray()));
    }

    void applyKeepsLatestChoice()
    {
        // Apply reaching a page that was never shown keeps the stored choices.
        CorvidTest::store(CrvC_Settings::DontShowSendProgressDlg, true);
        QWidget container;
        CrvC_DataCollectionPropPageImpl unseen(&container, "DataCollectionPage");
        PropSheetEvent applyEvent(PropSheetEvent::ApplyChanges);
        QCoreApplication::sendEvent(&unseen, &applyEvent);
        QCOMPARE(stored(CrvC_Settings::CollectDeviceUsage), QVariant(true));
        QCOMPARE(stored(CrvC_Settings::DontShowSendProgressDlg), QVariant(true));
        QVERIFY(!stored(CrvC_Settings::UseSSL).isValid());

        // Apply a change, change it back, OK: the last choice is what stays.
        Gui::Clip::PropSheet sheet;
        CrvC_DataCollectionPropPageImpl *page = showCorvidPage(sheet);
        page->emailRadioButton->setChecked(true);
        sheet.apply();
        QCOMPARE(stored(CrvC_Settings::UseSSL), QVariant(false));
        page->sslRadioButton->setChecked(true);
        sheet.apply();
        QCOMPARE(stored(CrvC_Settings::UseSSL), QVariant(true));
    }

    void editKeptAcrossPages()
    {
        // Edit, look at another page, come back: OK stores the edit.
        m_env->clearSettings();
        Gui::Clip::PropSheet sheet;
        Gui::Clip::VantorUpdatePage::addTo(&sheet);
        CrvC_DataCollectionPropPageImpl *page = showCorvidPage(sheet);
        page->emailRadioButton->setChecked(true);
        sheet.showItem(0);
        sheet.showItem(1);
        QVERIFY(page->emailRadioButton->isChecked());
        sheet.accept();
        QCOMPARE(stored(CrvC_Settings::UseSSL), QVariant(false));
    }
};

QTEST_MAIN(TestPreferencePage)
#include "tst_preferencepage.moc"
