#include "common/TestEnvironment.h"
#include "report/CoresStatistics.h"

#include <QTemporaryDir>
#include <QtTest>

namespace {

const QString Head = QStringLiteral(
    "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
    "<dtag-section name=\"CorelibStatistics\">\n"
    "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4><B>Core Statistics</B></TD></TR>\n");
const QString Tail = QStringLiteral("</TR></dtag-section></TABLE>");

QString title(const QString &type)
{
    return QLatin1String("<TR ALIGN=CENTER><TD COLSPAN=4><B>Core Type=<dtag-core-type-name>")
        + type + QLatin1String("</dtag-core-type-name></B></TD></TR>\n<TR>\n");
}

QString cell(const QString &name, const QString &value)
{
    return QLatin1String("<TD><dtag-core-param-name>") + name
        + QLatin1String("</dtag-core-param-name>=<dtag-core-param-value>") + value
        + QLatin1String("</dtag-core-param-value></TD>\n");
}


QByteArray report(const QByteArray &body)
{
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<document stringID=\"LNKGEN\">\n" + body
        + "</document>\n";
}

QByteArray instance(const QByteArray &items)
{
    return "<scope stringID=\"LNKGEN_CORE_INSTANCE\" name=\"u\">" + items + "</scope>\n";
}

QByteArray info(const QByteArray &attributes)
{
    return "<item stringID=\"LNKGEN_CORE_INFO\" " + attributes + "/>";
}

} // namespace

class tst_CoresStatistics : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void sectionText_data();
    void sectionText();

private:
    QString writeReport(const QByteArray &contents);

    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;
    int m_files = 0;
};

void tst_CoresStatistics::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    QVERIFY(m_dir.isValid());
}

QString tst_CoresStatistics::writeReport(const QByteArray &contents)
{
    const QString path = m_dir.filePath(QStringLiteral("design%1_lnkgen.drpt").arg(++m_files));
    if (!CorvidTest::writeFile(path, contents))
        return QString();
    return path;
}

void tst_CoresStatistics::sectionText_data()
{
    QTest::addColumn<QByteArray>("xml");
    QTest::addColumn<QString>("expected");

    QTest::newRow("same core twice gives two blocks")
        << report(instance(info("type=\"counter\" depth=\"512\""))
                  + instance(info("type=\"counter\" depth=\"512\"")))
        << Head + title("counter") + cell("depth", "512") + title("counter") + cell("depth", "512")
            + Tail;

    QTest::newRow("info and parameters items add to one instance")
        << report(instance(info("type=\"ram\" width=\"8\"")
                           + "<item stringID=\"LNKGEN_CORE_PARAMETERS\" component_name=\"c\" "
                             "depth=\"16\" unregistered=\"no\" value=\"x\" mode=\"a\"/>"))
        << Head + title("ram") + cell("width", "8") + cell("depth", "16") + cell("mode", "a")
            + Tail;

    QTest::newRow("parameters before info: first pair is the title")
        << report(instance("<item stringID=\"LNKGEN_CORE_PARAMETERS\" depth=\"16\"/>"
                           + info("type=\"ram\"")))
        << Head
            + "<TR ALIGN=CENTER><TD COLSPAN=4><B><dtag-core-param-name>depth</dtag-core-param-name>"
              "=<dtag-core-param-value>16</dtag-core-param-value></B></TD></TR>\n<TR>\n"
            + "<TD>Core Type=<dtag-core-type-name>ram</dtag-core-type-name></TD>\n" + Tail;


    QTest::newRow("missing type attribute gives an empty type")
        << report(instance(info("width=\"4\""))) << Head + title("") + cell("width", "4") + Tail;

    QTest::newRow("instance without items")
        << report(instance("<item stringID=\"OTHER\" a=\"1\"/>") + instance(info("type=\"t\"")))
        << Head + "<TR>\n" + title("t") + Tail;

    QTest::newRow("items outside an instance are ignored")
        << report(info("type=\"stray\"") + instance(info("type=\"t\"")) + info("type=\"after\""))
        << Head + title("t") + Tail;

    QTest::newRow("nested scope of another kind ends the instance")
        << report(instance(info("type=\"t\"") + "<scope stringID=\"LNKGEN_OTHER\"/>"
                           + "<item stringID=\"LNKGEN_CORE_PARAMETERS\" late=\"1\"/>"))
        << Head + title("t") + Tail;

    QTest::newRow("element names compared exactly")
        << report("<Scope stringID=\"LNKGEN_CORE_INSTANCE\">" + info("type=\"t\"") + "</Scope>"
                  + instance("<Item stringID=\"LNKGEN_CORE_INFO\" type=\"u\"/>"))
        << Head + "<TR>\n" + Tail;

    QTest::newRow("attribute names compared exactly; values decoded, not escaped")
        << report(instance(info("type=\"a&amp;b\" Type=\"T\" StringID=\"x &lt; y\"")))
        << Head + title("a&b") + cell("Type", "T") + cell("StringID", "x < y") + Tail;

    QTest::newRow("malformed: instances before the error are kept")
        << QByteArray("<document>") + instance(info("type=\"kept\""))
            + "<scope stringID=\"LNKGEN_CORE_INSTANCE\"><item stringID=\"LNKGEN_CORE_INFO\" "
              "type=\"partial\"/><broken"
        << Head + title("kept") + title("partial") + Tail;

    QTest::newRow("no core instances") << report("<scope stringID=\"LNKGEN_SUMMARY\"/>")
                                       << QString();
    // The depth guard's own tests cover unusable files; this proves the reader goes through it.
    QTest::newRow("50000 levels deep behind an undeclared entity")
        << ("<document>" + instance(info("type=\"t\"")) + "&undeclared;"
           + QByteArray("<d>").repeated(50000) + QByteArray("</d>").repeated(50000))
        << QString();
}

void tst_CoresStatistics::sectionText()
{
    QFETCH(QByteArray, xml);
    QFETCH(QString, expected);
    const QString path = writeReport(xml);
    QVERIFY(!path.isEmpty());
    QCOMPARE(CrvC_CoresStatistics().sectionText(path), expected);
}

QTEST_GUILESS_MAIN(tst_CoresStatistics)
#include "tst_coresstatistics.moc"
