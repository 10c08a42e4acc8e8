#include "host/StringBase.h"

#include <QtTest>

using Port::StringBase;

class TestStringBase : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void proxyCleanUp_data();
    void proxyCleanUp();
    void replace_data();
    void replace();
};

// The clean-up applied to a discovered proxy text: first ";" token, then the
// first token delimited by "PROXY", then blanks trimmed.
void TestStringBase::proxyCleanUp_data()
{
    QTest::addColumn<QString>("input");
    QTest::addColumn<QString>("expected");
    QTest::newRow("script answer") << "PROXY h:8080; DIRECT" << "h:8080";
    QTest::newRow("proxy list") << "h1:8080;h2:8080" << "h1:8080";
    QTest::newRow("plain") << "h:8080" << "h:8080";
    QTest::newRow("tabs and blanks") << "PROXY \t h:3128 \t;x" << "h:3128";
    QTest::newRow("empty") << "" << "";
    QTest::newRow("only delimiters") << ";;;" << "";
}

void TestStringBase::proxyCleanUp()
{
    QFETCH(QString, input);
    StringBase s(input.toStdString());
    s.Reduce(";", StringBase::WholeDelimiter);
    s.Reduce("PROXY", StringBase::WholeDelimiter);
    s.Trim(" \t", StringBase::TrimBoth);
    QFETCH(QString, expected);
    QCOMPARE(QString::fromStdString(s.str()), expected);
}

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
