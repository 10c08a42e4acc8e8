#include "host/StringBase.h"

#include <QtTest>

using Port::StringBase;

class TestStringBase : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void replace_data();
    void replace();
};

// Replace() frames the run statistics table; a replacement that contains
// the pattern, or an empty pattern, must not loop.
void TestStringBase::replace_data()
{
    QTest::addColumn<QString>("input");
    QTest::addColumn<QString>("from");
    QTest::addColumn<QString>("to");
    QTest::addColumn<QString>("expected");
    QTest::addColumn<int>("count");
    QTest::newRow("several") << "a.b.c" << "." << "::" << "a::b::c" << 2;
    QTest::newRow("replacement contains pattern") << "aa" << "a" << "aa" << "aaaa" << 2;
    QTest::newRow("none") << "abc" << "x" << "y" << "abc" << 0;
    QTest::newRow("empty pattern") << "abc" << "" << "y" << "abc" << 0;
}

void TestStringBase::replace()
{
    QFETCH(QString, input);
    StringBase s(input.toStdString());
    QFETCH(QString, from);
    QFETCH(QString, to);
    QFETCH(QString, expected);
    QFETCH(int, count);
    QCOMPARE(s.Replace(from.toStdString(), to.toStdString()), count);
    QCOMPARE(QString::fromStdString(s.str()), expected);
}

QTEST_GUILESS_MAIN(TestStringBase)
#include "tst_stringbase.moc"
