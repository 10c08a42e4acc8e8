// The page reader and the sorting of its values into the store's rows: what
// comes out of a page, and every kind of page that is turned down.

#include "backend/PageReader.h"
#include "backend/ReportRecord.h"
#include "common/TestEnvironment.h"

#include <QtTest>

namespace {

// "tag[name]=value@path" per value, one a line.
QString rendered(const QVector<CrvB_PageReader::Value> &values)
{
    QStringList lines;
    for (const auto &v : values)
        lines.append(v.tag + (v.hasName ? "[" + v.name + "]" : QString()) + "=" + v.value + "@"
                     + v.path.join('/'));
    return lines.join('\n');
}

} // namespace

class TestPageReader : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void values_data()
    {
        QTest::addColumn<QByteArray>("page");
        QTest::addColumn<QString>("expected");
        QTest::newRow("entities") << QByteArray(
            "<dtag-cmdline>a &lt;b&gt; &amp;amp; &#65;&#x42; &nbsp;&bogus; "
            "&#0;&#xD800;</dtag-cmdline>")
                                  << QString::fromUtf8(
                                         "dtag-cmdline=a <b> &amp; AB \u00a0&bogus; \ufffd\ufffd@");
        QTest::newRow("other mark-up dropped, path")
            << QByteArray(
                   "<dtag-section name='S'><TD><dtag-group>x<dtag-group-name name=\"g\">g</dtag-group-name>"
                   "<LI><dtag-item1><B>a</B>=1</dtag-item1></LI>y</dtag-group></TD></dtag-section>")
            << "dtag-group-name[g]=g@dtag-section:S/dtag-group\ndtag-item1=a=1@dtag-section:S/dtag-group";
        QTest::newRow("unescaped < in values")
            << QByteArray("<dtag-item1>a<b=1</dtag-item1><dtag-item1>1 < 2</dtag-item1>")
            << "dtag-item1=a<b=1@\ndtag-item1=1 < 2@";
        QTest::newRow("attribute forms") << QByteArray(
            "<dtag-property name=Foo>v</dtag-property><DTAG-X other='q>' NAME=\"a&amp;b\">w</dtag-x>")
                                         << "dtag-property[Foo]=v@\ndtag-x[a&b]=w@";
        QTest::newRow("comments, byte-order mark, empty element")
            << QByteArray("\xEF\xBB\xBF<!-- <dtag-a>no</dtag-a> --><!DOCTYPE x><dtag-a>yes</dtag-a><dtag-b/>")
            << "dtag-a=yes@\ndtag-b=@";
    }

    void values()
    {
        QFETCH(QByteArray, page);
        QFETCH(QString, expected);
        const CrvB_PageReader::Result result = CrvB_PageReader::read(page);
        QVERIFY2(result.ok(), qPrintable(result.rejection));
        QCOMPARE(rendered(result.values), expected);
    }

    // Turned down by the reader or when sorted into rows; a forged value
    // that closes its element early never reaches a column.
    void rejected_data()
    {
        QTest::addColumn<QByteArray>("page");
        QTest::addColumn<QString>("reason");
        const QByteArray deep = QByteArray("<dtag-a>").repeated(17) + QByteArray("</dtag-a>").repeated(17);
        QTest::newRow("not UTF-8") << QByteArray("<dtag-a>\xff</dtag-a>") << "not UTF-8";
        QTest::newRow("overlong UTF-8") << QByteArray("<dtag-a>\xc0\xbc</dtag-a>") << "not UTF-8";
        QTest::newRow("NUL byte") << QByteArray("<dtag-a>a\0b</dtag-a>", 19) << "not UTF-8";
        QTest::newRow("no dtag values") << QByteArray("<HTML><BODY>text</BODY></HTML>") << "no dtag values";
        QTest::newRow("empty") << QByteArray() << "no dtag values";
        QTest::newRow("element never closed")
            << QByteArray("<dtag-s><dtag-a>x</dtag-a>") << "<dtag-s> is never";
        QTest::newRow("cut in a closing tag") << QByteArray("<dtag-a>x</dtag-a") << "cut off";
        QTest::newRow("cut in an attribute") << QByteArray("<dtag-a>x</dtag-a><dtag-b name=\"T") << "cut off";
        QTest::newRow("comment never closed") << QByteArray("<dtag-a>x</dtag-a><!-- y") << "cut off";
        QTest::newRow("HTML tag cut") << QByteArray("<dtag-a>x</dtag-a><TD") << "cut off";
        QTest::newRow("closes another element")
            << QByteArray("<dtag-a>x</dtag-b>") << "</dtag-b> closes <dtag-a>";
        QTest::newRow("closes nothing") << QByteArray("<dtag-a>x</dtag-a></dtag-a>") << "closes no open";
        QTest::newRow("too deep") << deep << "deeper than 16";
        QTest::newRow("too many values") << QByteArray("<dtag-a/>").repeated(1001) << "more than 1000 values";
        QTest::newRow("forged: value closed early") << QByteArray(
            "<dtag-property name=\"TargetDevice\">xc6</dtag-property><dtag-property name=\"TargetFamily\">"
            "Y</dtag-property></dtag-property>") << "</dtag-property> closes no";
        QTest::newRow("forged: property given again") << QByteArray(
            "<dtag-property name=\"TargetFamily\">Xc6</dtag-property><dtag-property name=\"TargetDevice\">"
            "a</dtag-property><dtag-property name=\"TargetFamily\">Y</dtag-property>")
                                                      << "\"TargetFamily\" is given twice";
        QTest::newRow("forged: parameter name without value") << QByteArray(
            "<dtag-core-param-name>a</dtag-core-param-name><dtag-core-param-name>b</dtag-core-param-name>="
            "<dtag-core-param-value>1</dtag-core-param-value>")
                                                              << "not followed by <dtag-core-param-value>";
        QTest::newRow("forged: count without term")
            << QByteArray("<dtag-count-property>3</dtag-count-property>")
            << "does not follow <dtag-search-item>";
        QTest::newRow("forged: run field twice")
            << QByteArray("<dtag-run-tool>map</dtag-run-tool><dtag-run-count>1</dtag-run-count>"
                          "<dtag-run-count>5</dtag-run-count>")
            << "<dtag-run-count> out of place";
        QTest::newRow("forged: run field before a tool")
            << QByteArray("<dtag-run-failed>1</dtag-run-failed>") << "out of place";
    }

    void rejected()
    {
        QFETCH(QByteArray, page);
        QFETCH(QString, reason);
        CrvB_PageReader::Limits limits;
        limits.maxValues = 1000;
        const CrvB_PageReader::Result result = CrvB_PageReader::read(page, limits);
        QString why = result.rejection;
        CrvB_ReportRecord record;
        if (result.ok())
            QVERIFY(!CrvB_ReportRecord::fromValues(result.values, record, &why));
        QVERIFY2(why.contains(reason), qPrintable(why));
        QVERIFY(result.ok() || result.values.isEmpty());
    }

    // The sample page: every value lands in its table.
    void samplePageRows()
    {
        const CrvB_PageReader::Result result = CrvB_PageReader::read(CorvidTest::readFile(
            CorvidTest::Environment::sourceDir() + "/tests/samplereport/ledctrl_page.html"));
        QVERIFY(result.ok());
        CrvB_ReportRecord r;
        QString why;
        QVERIFY2(CrvB_ReportRecord::fromValues(result.values, r, &why), qPrintable(why));
        QCOMPARE(r.properties.value("target_family"), QStringLiteral("Xc6"));
        QCOMPARE(r.properties.value("product_configuration"), QStringLiteral("(Professional)"));
        QCOMPARE(r.properties.size(), 12);
        const QVector<qsizetype> counts{
            r.groups.size(),      r.items.size(), r.commandLines.size(),   r.runs.size(),
            r.helpEntries.size(), r.cores.size(), r.coreParameters.size(), r.projectProperties.size(),
            r.sourceTypes.size(), r.others.size()};
        QCOMPARE(counts, (QVector<qsizetype>{18, 33, 10, 6, 8, 3, 16, 14, 3, 9}));
        QCOMPARE(r.groups.at(r.items.last().group).name, QStringLiteral("Bank2"));
        QCOMPARE(r.commandLines.at(1).options, QStringList({"-ifn", "-top"}));
        QCOMPARE(r.runs.at(5).averageSeconds.toDouble(), 41.3);
        QCOMPARE(r.helpEntries.at(3).list, QStringLiteral("SearchNotFoundList"));
        QCOMPARE(r.coreParameters.last().core, 2);
    }
};

QTEST_GUILESS_MAIN(TestPageReader)
#include "tst_pagereader.moc"
