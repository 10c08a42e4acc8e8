#include "common/TestEnvironment.h"

#include "report/CommandLog.h"

#include <QDir>
#include <QRandomGenerator>
#include <QRegularExpression>
#include <QTemporaryDir>
#include <QtTest>

class tst_CommandLog : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void anonymized_data();
    void anonymized();
    void sameAsThePatterns();
    void readCommandLog_data();
    void readCommandLog();
    void unreadableLogs();
    void fuseLog();
    void section();
    void pathologicalLines();

private:
    QString path(const QString &name) const { return m_dir.path() + QLatin1Char('/') + name; }

    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;
};

void tst_CommandLog::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    QVERIFY(m_dir.isValid());
}

void tst_CommandLog::anonymized_data()
{
    QTest::addColumn<QString>("line");
    QTest::addColumn<QString>("design");
    QTest::addColumn<QString>("expected");

    QTest::newRow("quoted paths, first to last quote")
        << "synth -ifn \"C:/proj/top.prj\" -ofn \"C:/proj/top.snx\"" << "top"
        << "synth -ifn <orb_file>";
    QTest::newRow("several quotes on one line")
        << "a \"x\" b \"y\" c \"z\" d" << "top" << "a <orb_file> d";
    QTest::newRow("single quote left alone") << "echo \"C:/proj" << "top" << "echo \"C:/proj";
    QTest::newRow("file names keep their extension")
        << "map -o top_map.out top.in" << "top" << "map -o <fname>.out <fname>.in";
    QTest::newRow("runs of white space") << "  par \t  -w  top  " << "top" << "par -w <design>";
    QTest::newRow("design inside a word") << "view topmost" << "top" << "view <design>most";
    QTest::newRow("design case-sensitive") << "TOP Top top" << "top" << "TOP Top <design>";
    QTest::newRow("design before a dot is swallowed")
        << "bitmake top.ncd" << "top" << "bitmake <fname>.ncd";
    QTest::newRow("up to the last dot") << "cp a.b.c.d x" << "top" << "cp <fname>.d x";
    QTest::newRow("trailing dot") << "open a.b." << "top" << "open <fname>.";
    QTest::newRow("two dots") << "cd .." << "top" << "cd <fname>.";
    QTest::newRow("leading dot only") << "ls .hidden" << "top" << "ls .hidden";
    QTest::newRow("dot inside a quote") << "run -f x\"a.b\"y.z" << "top" << "run -f <fname>.z";
    QTest::newRow("redirection kept") << "timing top.ncd > t.txt" << "top"
                                      << "timing <fname>.ncd > <fname>.txt";
    QTest::newRow("no-break space is white space")
        << QString::fromUtf8("par\xc2\xa0-w") << "top" << "par -w";
    QTest::newRow("empty line") << "" << "top" << "";
    QTest::newRow("blank line") << " \t " << "top" << "";
    QTest::newRow("empty design replaces nothing") << "par top" << "" << "par top";
}

void tst_CommandLog::anonymized()
{
    QFETCH(QString, line);
    QFETCH(QString, design);
    QFETCH(QString, expected);
    QCOMPARE(CrvC_CommandLog::anonymized(line, design), expected);
}

// The quoted-argument and file name steps scan by hand; on any line they
// must give what the regular expressions ".*" and \S+[.] give.
void tst_CommandLog::sameAsThePatterns()
{
    static const QRegularExpression quoted(QStringLiteral("\".*\""));
    static const QRegularExpression plain(QStringLiteral("\\S+[\\.]"));
    const QString alphabet = QStringLiteral("ab.. \t\v\r\"_\u00a0");
    QRandomGenerator random(4711);
    for (int n = 0; n < 20000; ++n) {
        QString line;
        const int length = random.bounded(12);
        for (int i = 0; i < length; ++i)
            line += alphabet.at(random.bounded(alphabet.size()));
        QString expected = line.simplified();
        expected.replace(quoted, QStringLiteral("<orb_file>"));
        expected.replace(plain, QStringLiteral("<fname>."));
        QCOMPARE(CrvC_CommandLog::anonymized(line, QString()), expected);
    }
}

void tst_CommandLog::readCommandLog_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<QByteArray>("contents");
    QTest::addColumn<QStringList>("expected");

    QTest::newRow("design from the file name")
        << "top.cmd_log" << QByteArray("par -w top\nsynth -ifn \"top.prj\"\n")
        << QStringList{"par -w <design>", "synth -ifn <orb_file>"};
    QTest::newRow("design up to the first dot")
        << "top.v2.cmd_log" << QByteArray("par top.v2") << QStringList{"par <fname>.v2"};
    QTest::newRow("empty lines kept")
        << "top.cmd_log" << QByteArray("a\n\nb\n") << QStringList{"a", "", "b"};
    QTest::newRow("CRLF line ends") << "top.cmd_log" << QByteArray("a top\r\nb\r\n")
                                    << QStringList{"a <design>", "b"};
    QTest::newRow("UTF-8") << "top.cmd_log" << QByteArray("echo gr\xc3\xbc\xc3\x9f top")
                           << QStringList{QString::fromUtf8("echo gr\xc3\xbc\xc3\x9f <design>")};
    QTest::newRow("empty file") << "top.cmd_log" << QByteArray() << QStringList();
    QTest::newRow("binary bytes") << "top.cmd_log" << QByteArray("\x01\x00\xff top", 7)
                                  << QStringList{QString(QChar(1)) + QChar(0) + QChar(QChar::ReplacementCharacter)
                                                   + QLatin1String(" <design>")};
}

void tst_CommandLog::readCommandLog()
{
    QFETCH(QString, fileName);
    QFETCH(QByteArray, contents);
    QFETCH(QStringList, expected);

    QVERIFY(CorvidTest::writeFile(path(fileName), contents));
    CrvC_ReportData data;
    data.commandHistory << "earlier";
    QVERIFY(CrvC_CommandLog::readCommandLog(path(fileName), data));
    QCOMPARE(data.commandHistory, QStringList{"earlier"} + expected);
    QFile::remove(path(fileName));
}

void tst_CommandLog::unreadableLogs()
{
    CrvC_ReportData data;
    QVERIFY(!CrvC_CommandLog::readCommandLog(path("missing.cmd_log"), data));
    QVERIFY(QDir().mkpath(path("folder.cmd_log")));
    QVERIFY(!CrvC_CommandLog::readCommandLog(path("folder.cmd_log"), data));
    QVERIFY(data.commandHistory.isEmpty());
}

void tst_CommandLog::fuseLog()
{
    const QString fuse = path("fuse/fuse.log");
    CrvC_ReportData data;
    QVERIFY(!CrvC_CommandLog::checkFuseLog(fuse, data));
    QVERIFY(data.commandHistory.isEmpty());

    // Present, even empty: one entry after the command log's.
    QVERIFY(CorvidTest::writeFile(fuse, QByteArray()));
    QVERIFY(CorvidTest::writeFile(path("fuse/top.cmd_log"), "par top\n"));
    QVERIFY(CrvC_CommandLog::readCommandLog(path("fuse/top.cmd_log"), data));
    QVERIFY(CrvC_CommandLog::checkFuseLog(fuse, data));
    QCOMPARE(data.commandHistory, (QStringList{"par <design>", "fuse"}));

    // Without a command log the table holds "fuse" alone.
    CrvC_ReportData fuseOnly;
    QVERIFY(!CrvC_CommandLog::readCommandLog(path("fuse/none.cmd_log"), fuseOnly));
    QVERIFY(CrvC_CommandLog::checkFuseLog(fuse, fuseOnly));
    QCOMPARE(fuseOnly.commandHistory, QStringList{"fuse"});
}

void tst_CommandLog::section()
{
    CrvC_ReportData data;
    data.commandHistory << "synth -ifn <orb_file>" << "" << "a && b \"c\" 'd' >> <<";
    QCOMPARE(CrvC_CommandLog::commandLineHistorySection(data),
             QStringLiteral(
                 "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
                 "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD><B>Tool Usage</B></TD></TR>\n"
                 "<TR VALIGN=TOP><TD ALIGN=LEFT>Command Line History"
                 "<dtag-section name=\"CommandLineLog\"><UL>\n"
                 "<LI><dtag-cmdline>synth -ifn &lt;orb_file&gt;</dtag-cmdline></LI>\n"
                 "<LI><dtag-cmdline></dtag-cmdline></LI>\n"
                 "<LI><dtag-cmdline>a && b \"c\" 'd' &gt;&gt; &lt;&lt;</dtag-cmdline></LI>\n"
                 "</dtag-section></UL></TD></TR>\n"
                 "</TABLE>"));
}

// Lines made to provoke backtracking: a scan that is quadratic in the
// length of a line would not finish here.
void tst_CommandLog::pathologicalLines()
{
    const QByteArray word(1 << 20, 'w');
    QVERIFY(CorvidTest::writeFile(path("long/top.cmd_log"),
                                  "x " + word + "\nx " + word + ".\n\"" + QByteArray(1 << 20, ' ')
                                      + "a\n"));
    CrvC_ReportData data;
    QVERIFY(CrvC_CommandLog::readCommandLog(path("long/top.cmd_log"), data));
    QCOMPARE(data.commandHistory.size(), 3);
    QCOMPARE(data.commandHistory.at(1), QStringLiteral("x <fname>."));
    QCOMPARE(data.commandHistory.at(2), QStringLiteral("\" a"));
}

QTEST_GUILESS_MAIN(tst_CommandLog)
#include "tst_commandlog.moc"
