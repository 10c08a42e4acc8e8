#include "common/TestEnvironment.h"
#include "report/CoresStatistics.h"

#include <QTemporaryDir>
#include <QtTest>

// The sample page shows the table's mark-up; here which cores and
// parameters a report gives, as the table's cell texts.
namespace {

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
    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;
    int m_files = 0;
};

void tst_CoresStatistics::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    QVERIFY(m_dir.isValid());
}

void tst_CoresStatistics::sectionText_data()
{
    QTest::addColumn<QByteArray>("xml");
    QTest::addColumn<QString>("expected"); // after the table's title "Core Statistics|"

    QTest::newRow("same core twice gives two blocks")
        << report(instance(info("type=\"counter\" depth=\"512\""))
                  + instance(info("type=\"counter\" depth=\"512\"")))
        << "Core Type=counter|depth=512|Core Type=counter|depth=512|";
    QTest::newRow("info and parameters items add to one instance")
        << report(instance(info("type=\"ram\" width=\"8\"")
                           + "<item stringID=\"LNKGEN_CORE_PARAMETERS\" component_name=\"c\" "
                             "depth=\"16\" unregistered=\"no\" value=\"x\" mode=\"a\"/>"))
        << "Core Type=ram|width=8|depth=16|mode=a|";
    QTest::newRow("parameters before info: first pair is the title")
        << report(instance("<item stringID=\"LNKGEN_CORE_PARAMETERS\" depth=\"16\"/>" + info("type=\"ram\"")))
        << "depth=16|Core Type=ram|";
    QTest::newRow("missing type attribute gives an empty type")
        << report(instance(info("width=\"4\""))) << "Core Type=|width=4|";
    QTest::newRow("instance without items")
        << report(instance("<item stringID=\"OTHER\" a=\"1\"/>") + instance(info("type=\"t\"")))
        << "Core Type=t|";
    QTest::newRow("items outside an instance are ignored")
        << report(info("type=\"stray\"") + instance(info("type=\"t\"")) + info("type=\"after\""))
        << "Core Type=t|";
    QTest::newRow("nested scope of another kind ends the instance")
        << report(instance(info("type=\"t\"") + "<scope stringID=\"LNKGEN_OTHER\"/>"
                           + "<item stringID=\"LNKGEN_CORE_PARAMETERS\" late=\"1\"/>"))
        << "Core Type=t|";
    QTest::newRow("element names compared exactly")
        << report("<Scope stringID=\"LNKGEN_CORE_INSTANCE\">" + info("type=\"t\"") + "</Scope>"
                  + instance("<Item stringID=\"LNKGEN_CORE_INFO\" type=\"u\"/>"))
        << "";
    QTest::newRow("attribute names compared exactly; values decoded")
        << report(instance(info("type=\"a&amp;b\" Type=\"T\" StringID=\"s\""))) << "Core Type=a&b|Type=T|StringID=s|";
    QTest::newRow("malformed: instances before the error are kept")
        << QByteArray("<document>") + instance(info("type=\"kept\""))
            + "<scope stringID=\"LNKGEN_CORE_INSTANCE\"><item stringID=\"LNKGEN_CORE_INFO\" "
              "type=\"partial\"/><broken"
        << "Core Type=kept|Core Type=partial|";
    QTest::newRow("no core instances: no table") << report("<scope stringID=\"LNKGEN_SUMMARY\"/>")
                                                 << QString();
    // The depth guard's own tests cover unusable files; this proves the reader goes through it.
    QTest::newRow("50000 levels deep behind an undeclared entity: no table")
        << ("<document>" + instance(info("type=\"t\"")) + "&undeclared;"
            + QByteArray("<d>").repeated(50000) + QByteArray("</d>").repeated(50000))
        << QString();
}

void tst_CoresStatistics::sectionText()
{
    QFETCH(QByteArray, xml);
    QFETCH(QString, expected);
    const QString path = m_dir.filePath(QStringLiteral("design%1_lnkgen.drpt").arg(++m_files));
    QVERIFY(CorvidTest::writeFile(path, xml));
    const QString text = CorvidTest::cellText(QString::fromUtf8(CrvC_CoresStatistics().sectionText(path)));
    QCOMPARE(text, expected.isNull() ? QString() : QLatin1String("Core Statistics|") + expected);
}

QTEST_GUILESS_MAIN(tst_CoresStatistics)
#include "tst_coresstatistics.moc"
