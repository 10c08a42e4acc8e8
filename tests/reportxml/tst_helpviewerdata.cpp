#include "common/TestEnvironment.h"
#include "report/HelpViewerData.h"

#include <QDir>
#include <QStandardPaths>
#include <QtTest>

namespace {

QByteArray usage(const QByteArray &body)
{
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<OrbHelpViewerData version=\"9.30\">\n"
        + body + "</OrbHelpViewerData>\n";
}

QByteArray search(const QByteArray &attributes, const QByteArray &text)
{
    return "<SearchString " + attributes + ">" + text + "</SearchString>\n";
}

QByteArray helpFile(const QByteArray &count, const QByteArray &text)
{
    return "<OpenHelpFile count=\"" + count + "\">" + text + "</OpenHelpFile>\n";
}

const QString RelativePath = QStringLiteral("/Vantor/Common/9.30/orbhelpviewerdata.xml");

} // namespace

class tst_HelpViewerData : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void cleanup();
    void fileLocation_data();
    void fileLocation();
    void sectionText_data();
    void sectionText();

private:
    // Places `contents` where the help viewer keeps its file (under APPDATA).
    bool writeUsage(const QByteArray &contents);

    std::unique_ptr<CorvidTest::Environment> m_env;
    QString m_appData;
};

void tst_HelpViewerData::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    // Only the first four characters of the version name the folder.
    QVERIFY(m_env->writeDataFile(QStringLiteral("orb_version"), "version=9.30.1\n"));
    m_appData = m_env->home() + QLatin1String("/AppData");
}

void tst_HelpViewerData::cleanup()
{
    qunsetenv("APPDATA");
    qunsetenv("TEMP");
}

bool tst_HelpViewerData::writeUsage(const QByteArray &contents)
{
    qputenv("APPDATA", QFile::encodeName(m_appData));
    const QString path = m_appData + RelativePath;
    QFile::remove(path);
    return contents.isNull() || CorvidTest::writeFile(path, contents);
}

void tst_HelpViewerData::fileLocation_data()
{
    QTest::addColumn<QString>("appData"); // "-" for unset
    QTest::addColumn<QString>("temp");
    QTest::addColumn<QString>("fileUnder"); // "APPDATA", "TEMP", "user"
    QTest::addColumn<bool>("found");

    QTest::newRow("APPDATA preferred over TEMP") << "app" << "tmp" << "APPDATA" << true;
    QTest::newRow("no fall-back to TEMP when APPDATA is set") << "app" << "tmp" << "TEMP" << false;
    QTest::newRow("TEMP when APPDATA is unset") << "-" << "tmp" << "TEMP" << true;
    QTest::newRow("TEMP when APPDATA is empty") << "" << "tmp" << "TEMP" << true;
    QTest::newRow("per-user location when neither is set") << "-" << "-" << "user" << true;
    QTest::newRow("per-user location when both are empty") << "" << "" << "user" << true;
    QTest::newRow("TEMP preferred over the per-user location") << "-" << "tmp" << "user" << false;
}

void tst_HelpViewerData::fileLocation()
{
    QFETCH(QString, appData);
    QFETCH(QString, temp);
    QFETCH(QString, fileUnder);
    QFETCH(bool, found);

    const QString root = m_env->home() + QLatin1String("/location/")
        + QString::fromLatin1(QTest::currentDataTag());
    const QString appDir = root + QLatin1String("/AppData");
    const QString tempDir = root + QLatin1String("/Temp");
    const QString userDir = QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation);
    QVERIFY(userDir.startsWith(m_env->home()));
    if (appData != QLatin1String("-"))
        qputenv("APPDATA", QFile::encodeName(appData.isEmpty() ? appData : appDir));
    if (temp != QLatin1String("-"))
        qputenv("TEMP", QFile::encodeName(temp.isEmpty() ? temp : tempDir));

    const QString dir = fileUnder == QLatin1String("APPDATA") ? appDir
        : fileUnder == QLatin1String("TEMP")                   ? tempDir
                                                               : userDir;
    const QString path = dir + RelativePath;
    QVERIFY(CorvidTest::writeFile(path, usage(search("found=\"true\" count=\"1\"", "fifo"))));

    const QString text = CrvC_HelpViewerData().sectionText();
    QFile::remove(path);
    QCOMPARE(!text.isEmpty(), found);
    if (found)
        QCOMPARE(CrvC_HelpViewerData::helpFilePath(), path);
}

void tst_HelpViewerData::sectionText_data()
{
    QTest::addColumn<QByteArray>("xml"); // null: no file
    QTest::addColumn<QString>("expected"); // the table's cell texts after "Help Statistics|"

    const QString found = QStringLiteral("Search words with results|");
    const QString notFound = QStringLiteral("Unsuccessful Search words|");
    const QString files = QStringLiteral("Help files|");
    QTest::newRow("found compared exactly: TRUE or none is unsuccessful")
        << usage(search("found=\"TRUE\" count=\"1\"", "w") + search("count=\"4\"", "v"))
        << notFound + "w ( 1 )|v ( 4 )|";
    QTest::newRow("count 007 is 7, many is 0, missing is 0")
        << usage(search("found=\"true\" count=\"007\"", "a")
                 + search("found=\"true\" count=\"many\"", "b") + search("found=\"true\"", "c"))
        << found + "a ( 7 )|b ( 0 )|c ( 0 )|";
    QTest::newRow("help file after a found search is still one; count out of range is 0")
        << usage(search("found=\"true\" count=\"1\"", "w") + helpFile("99999999999", "f"))
        << found + "w ( 1 )|" + files + "f ( 0 )|";
    QTest::newRow("text before a child element is dropped")
        << usage(search("found=\"true\" count=\"1\"", "before<b>bold</b> after"))
        << found + "after ( 1 )|";
    QTest::newRow("entities and CDATA decoded")
        << usage(search("found=\"true\" count=\"1\"", "a &amp; b <![CDATA[c]]>"))
        << found + "a & b c ( 1 )|";
    QTest::newRow("malformed: entries before the error are kept")
        << QByteArray("<OrbHelpViewerData>") + helpFile("1", "kept") + "<OpenHelpFile count="
        << files + "kept ( 1 )|";
    QTest::newRow("no entries: no table") << usage("<Settings zoom=\"2\"/>") << QString();
    QTest::newRow("missing: no table") << QByteArray() << QString();
    // The depth guard's own tests cover unusable files; this proves the reader goes through it.
    QTest::newRow("50000 levels deep behind an undeclared entity: no table")
        << ("<OrbHelpViewerData>" + helpFile("1", "f") + "&undeclared;"
            + QByteArray("<d>").repeated(50000) + QByteArray("</d>").repeated(50000))
        << QString();
}

void tst_HelpViewerData::sectionText()
{
    QFETCH(QByteArray, xml);
    QFETCH(QString, expected);
    QVERIFY(writeUsage(xml));
    QCOMPARE(CorvidTest::cellText(CrvC_HelpViewerData().sectionText()),
             expected.isNull() ? QString() : QLatin1String("Help Statistics|") + expected);
}

QTEST_GUILESS_MAIN(tst_HelpViewerData)
#include "tst_helpviewerdata.moc"
