#include "common/TestEnvironment.h"

#include "host/Factory.h"
#include "host/QualityData.h"
#include "host/RefObject.h"
#include "report/RunStatistics.h"

#include <QDir>
#include <QTemporaryDir>
#include <QtTest>

namespace {

const QString frameOpening = QStringLiteral(
    "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'><dtag-section name=\"RunStatistics\">"
    "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=8><B>Software Quality</B></TD></TR>"
    "<TR ALIGN=LEFT><TD COLSPAN=8><B>Run Statistics</B></TD></TR>");
const QString frameClosing = QStringLiteral("</dtag-section></TABLE>");

// A stand-in reader that answers a fixed text.
class FixedReader final : public CitP::RefObject, public UtilC::IRunStatisticsReader
{
public:
    explicit FixedReader(const QByteArray &answer) : m_answer(answer.toStdString()) { ++alive; }
    CitI::IInterface *GetInterface(const Port::XUID &iid) override
    {
        return iid == UtilC::IRunStatisticsReader::iid() ? static_cast<UtilC::IRunStatisticsReader *>(this)
                                                         : RefObject::GetInterface(iid);
    }
    void readRunStatistics(const Port::StringBase &projectFile, Port::StringBase &html) override
    {
        askedFor = projectFile.str();
        html = Port::StringBase(m_answer);
    }
    static int alive;
    static std::string askedFor;

private:
    ~FixedReader() override { --alive; }
    std::string m_answer;
};
int FixedReader::alive = 0;
std::string FixedReader::askedFor;

// An object without the reader interface.
class NotAReader final : public CitP::RefObject
{
};

} // namespace

class tst_RunStatistics : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void cleanup();
    void readerLibrary_data();
    void readerLibrary();
    void readerLibraryWithoutProject();
    void frame_data();
    void frame();
    void readerMissing();
    void subReports_data();
    void subReports();

private:
    QString path(const QString &name) const { return m_dir.path() + QLatin1Char('/') + name; }

    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;
};

void tst_RunStatistics::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    QVERIFY(m_dir.isValid());
    QVERIFY2(CitP::Factory::LoadLibraryFactory(UtilC::IRunStatisticsReader::libraryName()),
             "the run statistics reader is not in the stage's lib folder");
}

void tst_RunStatistics::cleanup()
{
    CitP::Factory::UnRegisterCreator(UtilC::IRunStatisticsReader::classId());
}

void tst_RunStatistics::readerLibrary_data()
{
    QTest::addColumn<QByteArray>("records");
    QTest::addColumn<QString>("expected"); // the table's rows, as cell texts; null: no table

    QTest::newRow("no records file") << QByteArray() << QString();
    QTest::newRow("comments and blank lines only")
        << QByteArray("# tool start seconds outcome\n\n   \n  # synth 2025-03-03T09:12:40 41 completed\n")
        << QString();
    QTest::newRow("latest start wins, in any order")
        << QByteArray("map 2025-05-01T00:00:00 1 completed\n"
                      "map 2024-12-31T23:59:59 2 completed\n")
        << "map|2|2|0|0|3|1.5|2025-05-01|";
    QTest::newRow("lines that are no record are skipped")
        << QByteArray("map 2025-13-01T00:00:00 5 completed\n"
                      "map 2025-03-03T09:12:40 -5 completed\n"
                      "map 2025-03-03T09:12:40 5.5 completed\n"
                      "map 2025-03-03T09:12:40 99999999999 completed\n"
                      "map 2025-03-03T09:12:40 5 Completed\n"
                      "map 2025-03-03T09:12:40 5 done\n"
                      "map 2025-03-03T09:12:40 5\n"
                      "map yesterday 5 completed\n"
                      "par 2025-03-03T09:12:40 7 failed\n")
        << "par|1|0|1|0|7|7.0|2025-03-03|";
    QTest::newRow("indentation, tabs, CRLF and extra fields")
        << QByteArray("\t par\t2025-03-03T09:12:40Z   7  completed  exit=0\r\n")
        << "par|1|1|0|0|7|7.0|2025-03-03|";
    QTest::newRow("mark-up in tool names is escaped")
        << QByteArray("<b>&x 2025-03-03T09:12:40 0 completed\n")
        << "&lt;b&gt;&amp;x|1|1|0|0|0|0.0|2025-03-03|";
    QTest::newRow("binary file") << QByteArray("\x7f" "ELF\x02\x01\x01\x00\x00\xff\xfe\n\x00\x01", 14)
                                 << QString();
}

void tst_RunStatistics::readerLibrary()
{
    QFETCH(QByteArray, records);
    QFETCH(QString, expected);

    const QString project = path(QString::fromLatin1(QTest::currentDataTag()).replace(' ', '_') + ".orb");
    if (!records.isEmpty())
        QVERIFY(CorvidTest::writeFile(project + ".runs", records));
    const QString section = CrvC_RunStatistics::runStatisticsSection(project);
    QCOMPARE(section.isEmpty(), expected.isNull());
    if (!section.isEmpty())
        QCOMPARE(CorvidTest::cellText(section),
                 "Software Quality|Run Statistics|Tool|Runs|Completed|Failed|Cancelled|"
                 "Total Time (s)|Average Time (s)|Last Run|" + expected);
}

void tst_RunStatistics::readerLibraryWithoutProject()
{
    // Records of a project called ".orb" in the working directory are not
    // what an unknown project means.
    QVERIFY(CorvidTest::writeFile(path(".orb.runs"), "par 2025-03-03T09:12:40 7 failed\n"));
    const QString previous = QDir::currentPath();
    QVERIFY(QDir::setCurrent(m_dir.path()));
    const QString section = CrvC_RunStatistics::runStatisticsSection(QString());
    QDir::setCurrent(previous);
    QCOMPARE(section, QString());
}

void tst_RunStatistics::frame_data()
{
    QTest::addColumn<QByteArray>("answer");
    QTest::addColumn<QString>("expected");

    QTest::newRow("text around the table kept")
        << QByteArray("before<table>\n<tr></tr>\n</table>after")
        << "before" + frameOpening + "\n<tr></tr>\n" + frameClosing + "after";
    QTest::newRow("upper-case table tag: unchanged")
        << QByteArray("<TABLE><TR></TR></TABLE>") << QStringLiteral("<TABLE><TR></TR></TABLE>");
    QTest::newRow("UTF-8 text") << QByteArray("<table>\xc3\xa4</table>")
                                << frameOpening + QChar(0xe4) + frameClosing;
    QTest::newRow("empty answer") << QByteArray() << QString();
}

void tst_RunStatistics::frame()
{
    QFETCH(QByteArray, answer);
    QFETCH(QString, expected);

    CitP::Factory::RegisterCreator(UtilC::IRunStatisticsReader::classId(), [answer] {
        return static_cast<CitP::RefObject *>(new FixedReader(answer));
    });
    QCOMPARE(CrvC_RunStatistics::runStatisticsSection(QStringLiteral("/p/top.orb")), expected);
    QCOMPARE(FixedReader::askedFor, std::string("/p/top.orb"));
    QCOMPARE(FixedReader::alive, 0); // released after use
}

void tst_RunStatistics::readerMissing()
{
    CitP::Factory::RegisterCreator(UtilC::IRunStatisticsReader::classId(),
                                   []() -> CitI::IInterface * { return nullptr; });
    QCOMPARE(CrvC_RunStatistics::runStatisticsSection(QStringLiteral("/p/top.orb")), QString());

    CitP::Factory::RegisterCreator(UtilC::IRunStatisticsReader::classId(),
                                   [] { return static_cast<CitP::RefObject *>(new NotAReader); });
    QCOMPARE(CrvC_RunStatistics::runStatisticsSection(QStringLiteral("/p/top.orb")), QString());
}

void tst_RunStatistics::subReports_data()
{
    QTest::addColumn<QByteArray>("page"); // null: no file
    QTest::addColumn<QString>("par");
    QTest::addColumn<QString>("osim");

    QTest::newRow("no line end at the end") << QByteArray("a\nb") << "&nbsp;<BR>a\nb\n"
                                            << "&nbsp;<BR>ab";
    QTest::newRow("CRLF line ends") << QByteArray("a\r\nb\r\n") << "&nbsp;<BR>a\nb\n"
                                    << "&nbsp;<BR>ab";
    QTest::newRow("empty lines") << QByteArray("a\n\n\nb\n") << "&nbsp;<BR>a\n\n\nb\n"
                                 << "&nbsp;<BR>ab";
    QTest::newRow("UTF-8") << QByteArray("<TD>\xc3\xa4</TD>\n")
                           << QString("&nbsp;<BR><TD>") + QChar(0xe4) + "</TD>\n"
                           << QString("&nbsp;<BR><TD>") + QChar(0xe4) + "</TD>";
    QTest::newRow("empty page") << QByteArray("") << "&nbsp;<BR>" << "&nbsp;<BR>";
    QTest::newRow("missing page") << QByteArray() << "&nbsp;<BR>" << "&nbsp;<BR>";
}

void tst_RunStatistics::subReports()
{
    QFETCH(QByteArray, page);
    QFETCH(QString, par);
    QFETCH(QString, osim);

    const QString file = path("page.html");
    QFile::remove(file);
    if (!page.isNull())
        QVERIFY(CorvidTest::writeFile(file, page));
    QCOMPARE(CrvC_RunStatistics::parUsageSection(file), par);
    QCOMPARE(CrvC_RunStatistics::osimUsageSection(file), osim);
}

QTEST_GUILESS_MAIN(tst_RunStatistics)
#include "tst_runstatistics.moc"
