#include "report/SectionBuffer.h"

#include <QTemporaryDir>
#include <QTest>

// A large section must come back whole and in order, whether it went to a
// temporary file or, with no usable temporary folder, stayed in memory.
class tst_SectionBuffer : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void roundTrip_data()
    {
        QTest::addColumn<int>("pieces");
        QTest::addColumn<bool>("tempUsable");
        QTest::newRow("small, in memory") << 10 << true;
        QTest::newRow("spilled to a file") << 60000 << true;
        QTest::newRow("no temporary folder") << 60000 << false;
    }

    void roundTrip()
    {
        QFETCH(int, pieces);
        QFETCH(bool, tempUsable);
        QTemporaryDir dir;
        QVERIFY(dir.isValid());
        const QByteArray oldTemp = qgetenv("TMPDIR");
        qputenv("TMPDIR", QFile::encodeName(dir.path() + (tempUsable ? "" : "/missing")));

        QByteArray expected;
        {
            CrvC_SectionBuffer buffer;
            for (int i = 0; i < pieces; ++i) {
                // Text with characters of two, three and four UTF-8 bytes.
                const QString text = QStringLiteral("<LI>cell %1 \u00e9\u20ac\U0001F600</LI>\n").arg(i);
                buffer += QStringView(text);
                expected += text.toUtf8();
                buffer += QByteArrayView("|");
                expected += '|';
            }
            QCOMPARE(buffer.size(), qint64(expected.size()));
            QByteArray drained;
            int slices = 0;
            QVERIFY(buffer.drain([&](const QByteArray &slice) {
                QVERIFY(slice.size() <= 1 << 20);
                drained += slice;
                ++slices;
            }));
            QCOMPARE(drained, expected);
            QVERIFY(buffer.isEmpty());
            QCOMPARE(slices > 1, expected.size() > 1 << 20);
        }
        // Nothing is left behind in the temporary folder.
        QCOMPARE(QDir(dir.path()).entryList(QDir::Files), QStringList());
        qputenv("TMPDIR", oldTemp);
    }
};

QTEST_GUILESS_MAIN(tst_SectionBuffer)
#include "tst_sectionbuffer.moc"
