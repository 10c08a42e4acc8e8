#include "host/AutoRelease.h"
#include "host/Factory.h"
#include "host/InstanceTable.h"
#include "host/RefObject.h"
#include "host/XUID.h"

#include <QtTest>

using Port::XUID;

Q_DECLARE_METATYPE(Port::XUID)

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

// Identifiers are written both as GUID text and as four words; both must
// name the same interface, and a malformed text none.
void TestXuid::parse_data()
{
    QTest::addColumn<QByteArray>("text");
    QTest::addColumn<Port::XUID>("expected");
    QTest::newRow("braces, mixed case") << QByteArray("{FC1DAF1A-F9F6-4b06-9795-E73615CD96E2}")
                                        << XUID(0xFC1DAF1A, 0xF9F64B06, 0x9795E736, 0x15CD96E2);
    QTest::newRow("no braces") << QByteArray("cd48a8b1-2990-4881-8664-52802c04fdff")
                               << XUID(0xCD48A8B1, 0x29904881, 0x86645280, 0x2C04FDFF);
    QTest::newRow("short group") << QByteArray("{cd48a8b1-299-4881-8664-52802c04fdff}") << XUID();
    QTest::newRow("trailing text") << QByteArray("{cd48a8b1-2990-4881-8664-52802c04fdff}x") << XUID();
    QTest::newRow("missing close brace") << QByteArray("{cd48a8b1-2990-4881-8664-52802c04fdff") << XUID();
    QTest::newRow("not hex") << QByteArray("{zd48a8b1-2990-4881-8664-52802c04fdff}") << XUID();
}

void TestXuid::parse()
{
    QFETCH(QByteArray, text);
    QTEST(XUID(text.constData()), "expected");
}

void TestXuid::referenceCounting()
{
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
