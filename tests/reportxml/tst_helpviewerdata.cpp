#include "common/TestEnvironment.h"
#include "report/HelpViewerData.h"

#include <QDir>
#include <QStandardPaths>
#include <QtTest>

namespace {

const QString Head = QStringLiteral(
    "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
    "<dtag-section name=\"OrbHelpViewerData\">\n"
    "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=2><B>Help Statistics</B></TD></TR>\n");
const QString Tail = QStringLiteral("</dtag-section></TABLE>");
const QString FoundHead = QStringLiteral(
    "<TR ALIGN=LEFT><TD COLSPAN=2><dtag-group><B><dtag-group-name name=\"SearchFoundList\">\n"
    "Search words with results</dtag-group-name></B></TD></TR>\n<TR>");
const QString NotFoundHead = QStringLiteral(
    "<TR ALIGN=LEFT><TD COLSPAN=2><dtag-group><B><dtag-group-name name=\"SearchNotFoundList\">\n"
    "Unsuccessful Search words</dtag-group-name></B></TD></TR>\n<TR>");
const QString FilesHead = QStringLiteral(
    "<TR VALIGN=TOP><TD COLSPAN=2><dtag-group><B><dtag-group-name name=\"OpenedHelpFiles\">\n"
    "Help files</dtag-group-name></B></TD></TR>\n<TR>");
const QString GroupEnd = QStringLiteral("</TR></dtag-group>");
const QString RowBreak = QStringLiteral("\n</TR><TR>");

// A cell of the successful searches (a blank after the word), or of the
// unsuccessful searches and the help files.
QString cell(const QString &text, int count, bool found = false)
{
    return QLatin1String("<TD><dtag-search-item>") + text + QLatin1String(found ? " " : "")
        + QLatin1String("</dtag-search-item> ( <dtag-count-property>") + QString::number(count)
        + QLatin1String("</dtag-count-property> )</TD>\n");
}

QString foundCell(const QString &text, int count)
{
    return cell(text, count, true);
}

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
    QTest::addColumn<QString>("expected");

    QTest::newRow("found compared exactly: TRUE or none is unsuccessful")
        << usage(search("found=\"TRUE\" count=\"1\"", "w") + search("count=\"4\"", "v"))
        << Head + NotFoundHead + cell("w", 1) + cell("v", 4) + GroupEnd + Tail;

    QTest::newRow("count 007 is 7, many is 0, missing is 0")
        << usage(search("found=\"true\" count=\"007\"", "a")
                 + search("found=\"true\" count=\"many\"", "b") + search("found=\"true\"", "c"))
        << Head + FoundHead + foundCell("a", 7) + foundCell("b", 0) + RowBreak + foundCell("c", 0)
            + GroupEnd + Tail;

    QTest::newRow("help file after a found search is still one; count out of range is 0")
        << usage(search("found=\"true\" count=\"1\"", "w") + helpFile("99999999999", "f"))
        << Head + FoundHead + foundCell("w", 1) + GroupEnd + FilesHead + cell("f", 0) + GroupEnd
            + Tail;

    QTest::newRow("text before a child element is dropped")
        << usage(search("found=\"true\" count=\"1\"", "before<b>bold</b> after"))
        << Head + FoundHead + foundCell("after", 1) + GroupEnd + Tail;

    QTest::newRow("entities and CDATA decoded, not escaped")
        << usage(search("found=\"true\" count=\"1\"", "a &amp; b <![CDATA[<c>]]>"))
        << Head + FoundHead + foundCell("a & b <c>", 1) + GroupEnd + Tail;

    QTest::newRow("malformed: entries before the error are kept")
        << QByteArray("<OrbHelpViewerData>") + helpFile("1", "kept") + "<OpenHelpFile count="
        << Head + FilesHead + cell("kept", 1) + GroupEnd + Tail;

    QTest::newRow("no entries") << usage("<Settings zoom=\"2\"/>") << QString();
    QTest::newRow("missing") << QByteArray() << QString();
    // The depth guard's own tests cover unusable files; this proves the reader goes through it.
    QTest::newRow("50000 levels deep behind an undeclared entity")
        << ("<OrbHelpViewerData>" + helpFile("1", "f") + "&undeclared;"
           + QByteArray("<d>").repeated(50000) + QByteArray("</d>").repeated(50000))
        << QString();
}

void tst_HelpViewerData::sectionText()
{
    QFETCH(QByteArray, xml);
    QFETCH(QString, expected);
    QVERIFY(writeUsage(xml));
    QCOMPARE(CrvC_HelpViewerData().sectionText(), expected);
}

QTEST_GUILESS_MAIN(tst_HelpViewerData)
#include "tst_helpviewerdata.moc"
