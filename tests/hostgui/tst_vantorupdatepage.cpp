// The host's "VantorUpdate" page, which keeps the proxy choice that the
// transfers read, and the browser seam of the help manager.

#include "common/TestEnvironment.h"

#include "host/Settings.h"
#include "host/gui/Dialog.h"
#include "host/gui/PropItem.h"
#include "host/gui/PropSheet.h"
#include "host/gui/PropSheetEvent.h"
#include "host/gui/VantorUpdatePage.h"

#include <QLineEdit>
#include <QRadioButton>
#include <QtTest>

using namespace Gui::Clip;

namespace {

const QString group = QStringLiteral("WebUpdate");

// The proxy keys as the transfers read them: "<choice>|<host>|<port>", an
// absent key as "-".
QString storedKeys()
{
    const Settings settings(group, false, false, true);
    QStringList keys;
    for (const char *key : {"ProxyChoice", "ProxyHost", "ProxyPort"}) {
        const QString name = QString::fromLatin1(key);
        keys << (settings.contains(name) ? settings.getValue(name).toString() : QStringLiteral("-"));
    }
    return keys.join(QLatin1Char('|'));
}

} // namespace

class TestVantorUpdatePage : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init();
    void sheetMakesAndDrivesThePage();
    void load_data();
    void load();
    void apply_data();
    void apply();
    void browser_data();
    void browser();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestVantorUpdatePage::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
}

void TestVantorUpdatePage::init()
{
    m_env->clearSettings();
}

void TestVantorUpdatePage::sheetMakesAndDrivesThePage()
{
    Settings(group, true, true, true).setValue(QStringLiteral("ProxyChoice"), 0);
    PropSheet sheet;
    VantorUpdatePage::addTo(&sheet);
    PropItem *item = sheet.findItem(QStringLiteral("VantorUpdate"));
    QVERIFY(item);
    QVERIFY(!item->page());
    sheet.showItem(0);
    auto *page = qobject_cast<VantorUpdatePage *>(item->page());
    QVERIFY(page);
    QVERIFY(page->noProxyButton()->isChecked());

    page->manualProxyButton()->setChecked(true);
    page->hostEdit()->setText(QStringLiteral("proxy.lan"));
    page->portEdit()->setText(QStringLiteral("3128"));
    sheet.apply();
    QCOMPARE(storedKeys(), QStringLiteral("2|proxy.lan|3128"));
}

void TestVantorUpdatePage::load_data()
{
    QTest::addColumn<QStringList>("stored"); // choice, host, port; null entries are not stored
    QTest::addColumn<QString>("shown");      // "none", "system", "manual"
    QTest::addColumn<bool>("fieldsEnabled");

    QTest::newRow("nothing stored") << QStringList{QString(), QString(), QString()} << "system" << false;
    QTest::newRow("no proxy") << QStringList{"0", QString(), QString()} << "none" << false;
    QTest::newRow("system") << QStringList{"1", QString(), QString()} << "system" << false;
    QTest::newRow("manual") << QStringList{"2", "h", "8080"} << "manual" << true;
    QTest::newRow("unknown choice") << QStringList{"7", "h", QString()} << "system" << false;
    QTest::newRow("not a number") << QStringList{"abc", QString(), QString()} << "system" << false;
}

void TestVantorUpdatePage::load()
{
    QFETCH(QStringList, stored);
    QFETCH(QString, shown);
    QFETCH(bool, fieldsEnabled);
    Settings settings(group, true, true, true);
    const char *keys[] = {"ProxyChoice", "ProxyHost", "ProxyPort"};
    for (int i = 0; i < 3; ++i) {
        if (!stored.at(i).isNull())
            settings.setValue(QString::fromLatin1(keys[i]), stored.at(i));
    }
    VantorUpdatePage page;
    page.loadPage();
    QCOMPARE(page.noProxyButton()->isChecked(), shown == QLatin1String("none"));
    QCOMPARE(page.systemProxyButton()->isChecked(), shown == QLatin1String("system"));
    QCOMPARE(page.manualProxyButton()->isChecked(), shown == QLatin1String("manual"));
    QCOMPARE(page.hostEdit()->isEnabled(), fieldsEnabled);
    QCOMPARE(page.hostEdit()->text(), stored.at(1));
    QCOMPARE(page.portEdit()->text(), stored.at(2));
}

void TestVantorUpdatePage::apply_data()
{
    QTest::addColumn<QString>("before"); // stored keys before, as storedKeys() shows them
    QTest::addColumn<QString>("choice");
    QTest::addColumn<QString>("host");
    QTest::addColumn<QString>("port");
    QTest::addColumn<QString>("after");

    QTest::newRow("manual host and port") << "-|-|-" << "manual" << " proxy.lan " << "3128" << "2|proxy.lan|3128";
    QTest::newRow("manual without port drops the old port") << "2|old|80" << "manual" << "h" << "" << "2|h|-";
    QTest::newRow("port out of range is not stored") << "-|-|-" << "manual" << "h" << "99999" << "2|h|-";
    QTest::newRow("no proxy keeps the manual entry") << "2|h|80" << "none" << "x" << "1" << "0|h|80";
    QTest::newRow("system") << "0|-|-" << "system" << "" << "" << "1|-|-";
}

void TestVantorUpdatePage::apply()
{
    QFETCH(QString, before);
    QFETCH(QString, choice);
    QFETCH(QString, host);
    QFETCH(QString, port);
    QFETCH(QString, after);
    Settings settings(group, true, true, true);
    const QStringList values = before.split(QLatin1Char('|'));
    const char *keys[] = {"ProxyChoice", "ProxyHost", "ProxyPort"};
    for (int i = 0; i < 3; ++i) {
        if (values.at(i) != QLatin1String("-"))
            settings.setValue(QString::fromLatin1(keys[i]), values.at(i));
    }
    VantorUpdatePage page;
    page.loadPage();
    QRadioButton *button = choice == QLatin1String("manual") ? page.manualProxyButton()
                           : choice == QLatin1String("none") ? page.noProxyButton()
                                                              : page.systemProxyButton();
    button->setChecked(true);
    // Text typed into disabled fields is not what the user chose; set it anyway
    // to show that only the manual choice stores it.
    page.hostEdit()->setText(host);
    page.portEdit()->setText(port);
    PropSheetEvent event(PropSheetEvent::ApplyChanges);
    QCoreApplication::sendEvent(&page, &event);
    QCOMPARE(storedKeys(), after);
}

void TestVantorUpdatePage::browser_data()
{
    QTest::addColumn<QString>("address");
    QTest::addColumn<QString>("opened"); // empty: nothing launched
    QTest::newRow("web address") << "https://www.vantor.example/corvid" << "https://www.vantor.example/corvid";
    QTest::newRow("local page") << "/tmp/x/device_usage_statistics.html" << "file:///tmp/x/device_usage_statistics.html";
    QTest::newRow("empty") << "" << "";
    QTest::newRow("blank") << "  " << "";
}

void TestVantorUpdatePage::browser()
{
    QFETCH(QString, address);
    QFETCH(QString, opened);
    QList<QUrl> launched;
    for (const bool answer : {true, false}) {
        launched.clear();
        HelpManager::setLauncher([&](const QUrl &url) {
            launched << url;
            return answer;
        });
        QCOMPARE(HelpManager::runWebBrowser(address), answer && !opened.isEmpty());
        QCOMPARE(launched.size(), opened.isEmpty() ? 0 : 1);
        if (!opened.isEmpty())
            QCOMPARE(launched.first().toString(), opened);
    }
    // The offscreen platform launches nothing.
    HelpManager::setLauncher({});
    QVERIFY(!HelpManager::runWebBrowser(address));
}

QTEST_MAIN(TestVantorUpdatePage)
#include "tst_vantorupdatepage.moc"
