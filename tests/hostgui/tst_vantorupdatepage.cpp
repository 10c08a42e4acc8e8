// The host's "VantorUpdate" page, which keeps the proxy choice that
// Corvid's transfers read.

#include "common/TestEnvironment.h"

#include "host/Settings.h"
#include "host/gui/Dialog.h"
#include "host/gui/PropSheetEvent.h"
#include "host/gui/VantorUpdatePage.h"

#include <QLineEdit>
#include <QRadioButton>
#include <QtTest>

using namespace Gui::Clip;

namespace {

const char *const keys[] = {"ProxyChoice", "ProxyHost", "ProxyPort"};

// The proxy keys as "<choice>|<host>|<port>", an absent key as "-".
void store(const QString &values)
{
    Settings settings(QStringLiteral("WebUpdate"), true, true, true);
    const QStringList parts = values.split(QLatin1Char('|'));
    for (int i = 0; i < 3; ++i) {
        if (parts.at(i) != QLatin1String("-"))
            settings.setValue(QString::fromLatin1(keys[i]), parts.at(i));
    }
}

// What the transfers read (the group opened as they open it).
QString stored()
{
    const Settings settings(QStringLiteral("WebUpdate"), false, false, true);
    QStringList values;
    for (const char *key : keys) {
        const QString name = QString::fromLatin1(key);
        values << (settings.contains(name) ? settings.getValue(name).toString() : QStringLiteral("-"));
    }
    return values.join(QLatin1Char('|'));
}

QRadioButton *button(const VantorUpdatePage &page, const QString &choice)
{
    return choice == QLatin1String("manual") ? page.manualProxyButton()
           : choice == QLatin1String("none") ? page.noProxyButton()
                                             : page.systemProxyButton();
}

} // namespace

class TestVantorUpdatePage : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }
    void init() { m_env->clearSettings(); }
    void loadAndApply_data();
    void loadAndApply();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestVantorUpdatePage::loadAndApply_data()
{
    QTest::addColumn<QString>("before");
    QTest::addColumn<QString>("shown"); // "none", "system", "manual"
    QTest::addColumn<QString>("choice");
    QTest::addColumn<QString>("host");
    QTest::addColumn<QString>("port");
    QTest::addColumn<QString>("after");

    QTest::newRow("nothing stored; manual host and port") << "-|-|-"
                                                          << "system"
                                                          << "manual"
                                                          << " proxy.lan "
                                                          << "3128"
                                                          << "2|proxy.lan|3128";
    QTest::newRow("no proxy; system") << "0|-|-"
                                      << "none"
                                      << "system"
                                      << ""
                                      << ""
                                      << "1|-|-";
    QTest::newRow("manual; without port drops the old port") << "2|old|80"
                                                             << "manual"
                                                             << "manual"
                                                             << "h"
                                                             << ""
                                                             << "2|h|-";
    QTest::newRow("manual; without host") << "2|old|80"
                                          << "manual"
                                          << "manual"
                                          << " "
                                          << "80"
                                          << "2|-|80";
    // Refused before anything is stored.
    QTest::newRow("unknown choice; port out of range refused") << "7|h|-"
                                                               << "system"
                                                               << "manual"
                                                               << "h"
                                                               << "99999"
                                                               << "7|h|-";
    QTest::newRow("not a number; system") << "abc|-|-"
                                          << "system"
                                          << "system"
                                          << ""
                                          << ""
                                          << "1|-|-";
    QTest::newRow("manual; no proxy keeps the manual entry") << "2|h|80"
                                                             << "manual"
                                                             << "none"
                                                             << "x"
                                                             << "1"
                                                             << "0|h|80";
}

void TestVantorUpdatePage::loadAndApply()
{
    QFETCH(QString, before);
    QFETCH(QString, shown);
    QFETCH(QString, choice);
    store(before);
    VantorUpdatePage page;
    PropSheetEvent activate(PropSheetEvent::ActivatePage);
    QCoreApplication::sendEvent(&page, &activate);
    QVERIFY(button(page, shown)->isChecked());
    const bool manual = shown == QLatin1String("manual");
    QCOMPARE(page.hostEdit()->isEnabled(), manual);
    QCOMPARE(page.portEdit()->isEnabled(), manual);
    const QString storedHost = before.section(QLatin1Char('|'), 1, 1);
    QCOMPARE(page.hostEdit()->text(), storedHost == QLatin1String("-") ? QString() : storedHost);

    button(page, choice)->setChecked(true);
    // Only the manual choice stores what the (otherwise disabled) fields hold.
    QFETCH(QString, host);
    QFETCH(QString, port);
    page.hostEdit()->setText(host);
    page.portEdit()->setText(port);
    PropSheetEvent validate(PropSheetEvent::ValidateChanges);
    QCoreApplication::sendEvent(&page, &validate);
    if (validate.isAccepted()) {
        PropSheetEvent apply(PropSheetEvent::ApplyChanges);
        QCoreApplication::sendEvent(&page, &apply);
    }
    QTEST(stored(), "after");
}

QTEST_MAIN(TestVantorUpdatePage)
#include "tst_vantorupdatepage.moc"
