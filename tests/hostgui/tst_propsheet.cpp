#include "host/gui/ApplicationBase.h"
#include "host/gui/DataCollector.h"
#include "host/gui/PropItem.h"
#include "host/gui/PropSheet.h"
#include "host/gui/PropSheetEvent.h"

#include <QtTest>

using namespace Gui::Clip;

namespace {

// A page that records the sheet events it receives.
class Page : public QWidget
{
public:
    using QWidget::QWidget;
    QList<int> events;

protected:
    void customEvent(QEvent *event) override { events << int(event->type()); }
};

class Creator : public QObject
{
    Q_OBJECT
public:
    int calls = 0;
    PropItem *lastItem = nullptr;

public Q_SLOTS:
    void OnCreatePrefPage(QWidget *parent, Gui::Clip::PropItem *item)
    {
        ++calls;
        lastItem = item;
        new Page(parent);
    }
};

// A plug-in stand-in answering the application's data request.
class Contributor : public QObject
{
    Q_OBJECT
public:
    Creator creator;

public Q_SLOTS:
    void onDataRequested(Gui::Clip::DataCollector &collector)
    {
        if (collector.getDesiredDataType() != DataCollector::PreferenceSheet || !collector.getPropSheet())
            return;
        auto *item = new PropItem(QStringLiteral("Corvid"), QStringLiteral("Corvid"),
                                  QStringLiteral("Control"), "corvid-item");
        item->setPropPageCreator(&creator, SLOT(OnCreatePrefPage(QWidget *, PropItem *)));
        collector.getPropSheet()->addItem(item, false, 1);
    }
};

} // namespace

class TestPropSheet : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void pagesAreMadeOnFirstShowAndDriven();
};

void TestPropSheet::pagesAreMadeOnFirstShowAndDriven()
{
    Contributor contributor;
    QVERIFY(QObject::connect(qApp, SIGNAL(dataRequested(Gui::Clip::DataCollector &)), &contributor,
                             SLOT(onDataRequested(Gui::Clip::DataCollector &))));
    PropSheet sheet;
    DataCollector collector(DataCollector::PreferenceSheet, &sheet);
    static_cast<ApplicationBase *>(qApp)->requestData(collector);
    QCOMPARE(sheet.itemCount(), 1);
    PropItem *item = sheet.findItem(QStringLiteral("Corvid"));
    QVERIFY(item);
    QCOMPARE(item->getPropSheet(), &sheet);
    QVERIFY(!item->page());
    QCOMPARE(contributor.creator.calls, 0);

    sheet.showItem(0);
    QCOMPARE(contributor.creator.calls, 1);
    QCOMPARE(contributor.creator.lastItem, item);
    auto *page = dynamic_cast<Page *>(item->page());
    QVERIFY(page);
    sheet.showItem(0); // shown again: same page, not loaded again
    QCOMPARE(contributor.creator.calls, 1);
    sheet.apply();
    QCOMPARE(page->events, (QList<int>{PropSheetEvent::ActivatePage, PropSheetEvent::ReactivatePage,
                                       PropSheetEvent::ValidateChanges, PropSheetEvent::ApplyChanges}));
    QObject::disconnect(qApp, nullptr, &contributor, nullptr);
}

int main(int argc, char **argv)
{
    ApplicationBase app(argc, argv);
    TestPropSheet test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_propsheet.moc"
