#include "host/AutoRelease.h"
#include "host/Factory.h"
#include "host/InstanceTable.h"
#include "host/RefObject.h"
#include "host/XUID.h"

#include <QtTest>

using Port::XUID;

namespace {

class Counted : public CitP::RefObject
{
public:
    explicit Counted(int *deleted) : m_deleted(deleted) {}
    ~Counted() override { ++*m_deleted; }

private:
    int *m_deleted;
};

} // namespace

class TestXuid : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void parse_data();
    void parse();
    void referenceCounting();
    void handOver_data();
    void handOver();
    void factoryAndInstanceTable();
};

void TestXuid::parse_data()
{
    QTest::addColumn<QString>("text");
    QTest::addColumn<bool>("valid");
    QTest::addColumn<QString>("canonical");
    QTest::newRow("braces, mixed case") << "{FC1DAF1A-F9F6-4b06-9795-E73615CD96E2}" << true
                                        << "{fc1daf1a-f9f6-4b06-9795-e73615cd96e2}";
    QTest::newRow("no braces") << "cd48a8b1-2990-4881-8664-52802c04fdff" << true
                               << "{cd48a8b1-2990-4881-8664-52802c04fdff}";
    QTest::newRow("short group") << "{cd48a8b1-299-4881-8664-52802c04fdff}" << false << "";
    QTest::newRow("trailing text") << "{cd48a8b1-2990-4881-8664-52802c04fdff}x" << false << "";
    QTest::newRow("missing close brace") << "{cd48a8b1-2990-4881-8664-52802c04fdff" << false << "";
    QTest::newRow("not hex") << "{zd48a8b1-2990-4881-8664-52802c04fdff}" << false << "";
    QTest::newRow("empty") << "" << false << "";
}

void TestXuid::parse()
{
    QFETCH(QString, text);
    QFETCH(bool, valid);
    const XUID id(text.toLatin1().constData());
    QCOMPARE(!id.isNull(), valid);
    QFETCH(QString, canonical);
    if (valid)
        QCOMPARE(QString::fromStdString(id.toString()), canonical);
}

void TestXuid::referenceCounting()
{
    // An identifier built from words equals the one parsed from its text.
    QCOMPARE(XUID(0x8AD145AC, 0xEC4FD8EA, 0xBE837BD8, 0xBED09583),
             XUID("{8ad145ac-ec4f-d8ea-be83-7bd8bed09583}"));

    int deleted = 0;
    auto *object = new Counted(&deleted);
    {
        Prjrep::AutoRelease<CitI::IInterface> held(object);
        {
            Prjrep::AutoCast<CitI::IObject> cast(held.get());
            QVERIFY(cast);
            QCOMPARE(object->refCount(), 2);
        }
        QCOMPARE(object->refCount(), 1);
    }
    QCOMPARE(deleted, 1);
}

// What a wrapper holding `first` does with its reference when handed another
// pointer: `first` must live exactly as long as some wrapper still holds it.
void TestXuid::handOver_data()
{
    QTest::addColumn<QString>("step");
    QTest::addColumn<int>("firstDeletedAfterStep");
    QTest::addColumn<int>("secondDeletedAfterStep");

    QTest::newRow("reset to the pointer held") << "reset same" << 0 << 1;
    QTest::newRow("reset to another") << "reset other" << 1 << 0;
    QTest::newRow("reset to null") << "reset null" << 1 << 1;
    QTest::newRow("out parameter") << "out" << 1 << 1;
    QTest::newRow("move over another") << "move other" << 1 << 0;
}

void TestXuid::handOver()
{
    QFETCH(QString, step);
    int firstDeleted = 0;
    int secondDeleted = 0;
    auto *first = new Counted(&firstDeleted);
    auto *second = new Counted(&secondDeleted);
    {
        Prjrep::AutoRelease<CitI::IInterface> held(first);
        if (step == QLatin1String("reset same")) {
            held.reset(first);
            delete second;
        } else if (step == QLatin1String("reset other")) {
            held.reset(second);
        } else if (step == QLatin1String("reset null")) {
            held.reset();
            delete second;
        } else if (step == QLatin1String("out")) {
            QVERIFY(held.out() != nullptr);
            QVERIFY(!held);
            delete second;
        } else {
            Prjrep::AutoRelease<CitI::IInterface> other(second);
            held = std::move(other);
            QVERIFY(!other);
        }
        QTEST(firstDeleted, "firstDeletedAfterStep");
        QTEST(secondDeleted, "secondDeletedAfterStep");
        if (firstDeleted == 0)
            QCOMPARE(held.get(), static_cast<CitI::IInterface *>(first));
    }
    // Whatever the wrapper still held is released exactly once.
    QCOMPARE(firstDeleted, 1);
    QCOMPARE(secondDeleted, 1);
}

void TestXuid::factoryAndInstanceTable()
{
    const XUID id("{11111111-2222-3333-4444-555555555555}");
    QVERIFY(!CitP::Factory::CreateInstance(id));
    QVERIFY(!CitP::Factory::LoadLibraryFactory("libDoesNotExist"));

    int deleted = 0;
    CitP::Factory::RegisterCreator(id, [&deleted] { return new Counted(&deleted); });
    Prjrep::AutoRelease<CitI::IInterface> created(CitP::Factory::CreateInstanceRef(id));
    QVERIFY(created);
    created.reset();
    QCOMPARE(deleted, 1);
    CitP::Factory::UnRegisterCreator(id);
    QVERIFY(!CitP::Factory::CreateInstance(id));

    Counted service(&deleted);
    QVERIFY(CitP::InstanceTable::RegisterInstance(id, &service));
    QCOMPARE(CitP::InstanceTable::GetInstance(id), static_cast<CitI::IInterface *>(&service));
    QVERIFY(CitP::InstanceTable::UnRegisterInstance(&service));
    QVERIFY(!CitP::InstanceTable::GetInstance(id));
    QVERIFY(!CitP::InstanceTable::UnRegisterInstance(&service));
}

QTEST_GUILESS_MAIN(TestXuid)
#include "tst_xuid.moc"
