#include "common/TestEnvironment.h"

#include "report/CommandLog.h"

#include <QRandomGenerator>
#include <QRegularExpression>
#include <QTemporaryDir>
#include <QtTest>

// The sample page shows a whole log made anonymous and its table; here the
// rules it does not reach, and lines made to be slow or odd.
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
    void fuseLogAlone();
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

    QTest::newRow("design case-sensitive") << "TOP Top top" << "top" << "TOP Top <design>";
    QTest::newRow("design before a dot is swallowed")
        << "bitmake top.ncd" << "top" << "bitmake <fname>.ncd";
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

    QTest::newRow("design up to the first dot")
        << "top.v2.cmd_log" << QByteArray("par top.v2") << QStringList{"par <fname>.v2"};
    QTest::newRow("CRLF line ends") << "top.cmd_log" << QByteArray("a top\r\nb\r\n")
                                    << QStringList{"a <design>", "b"};
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

// Without a command log the table holds "fuse" alone; without fuse.log nothing.
void tst_CommandLog::fuseLogAlone()
{
    const QString fuse = path("fuse/fuse.log");
    CrvC_ReportData data;
    QVERIFY(!CrvC_CommandLog::checkFuseLog(fuse, data));
    QVERIFY(CorvidTest::writeFile(fuse, QByteArray()));
    QVERIFY(!CrvC_CommandLog::readCommandLog(path("fuse/none.cmd_log"), data));
    QVERIFY(CrvC_CommandLog::checkFuseLog(fuse, data));
    QCOMPARE(data.commandHistory, QStringList{"fuse"});
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
