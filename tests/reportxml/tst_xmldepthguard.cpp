#include "common/TestEnvironment.h"
#include "report/XmlDepthGuard.h"

#include <QtCore5Compat/QXmlDefaultHandler>

#include <QTemporaryDir>
#include <QtTest>

Q_DECLARE_METATYPE(CrvC_XmlDepthGuard::Outcome)

namespace {

class CountingHandler : public QXmlDefaultHandler
{
public:
    bool startElement(const QString &, const QString &, const QString &,
                      const QXmlAttributes &) override
    {
        ++elements;
        return true;
    }
    int elements = 0;
};

// `prefix`, then `levels` nested elements, closed again.
QByteArray deep(int levels, const QByteArray &prefix = QByteArray())
{
    return prefix + QByteArray("<d>").repeated(levels) + QByteArray("</d>").repeated(levels);
}

} // namespace

// Files that are not regular or too large are Port::InputFile's and meet
// every reader in tst_hostileinputs; here what the SAX parse is given.
class tst_XmlDepthGuard : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void parseFile_data();
    void parseFile();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;
};

void tst_XmlDepthGuard::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    QVERIFY(m_dir.isValid());
}

void tst_XmlDepthGuard::parseFile_data()
{
    QTest::addColumn<QByteArray>("xml"); // null: no file
    QTest::addColumn<int>("maxDepth");
    QTest::addColumn<CrvC_XmlDepthGuard::Outcome>("outcome");
    QTest::addColumn<int>("maxElementsSeen");

    QByteArray binary;
    for (int i = 0; i < 4096; ++i)
        binary += char((i * 131 + 7) % 256);

    using O = CrvC_XmlDepthGuard::Outcome;
    QTest::newRow("missing file") << QByteArray() << 1000 << O::NotRead << 0;
    QTest::newRow("internal DTD subset")
        << QByteArray("<!DOCTYPE r [<!ENTITY a 'b'>]><r>&a;</r>") << 1000 << O::Refused << 0;
    QTest::newRow("external DTD") << QByteArray("<!DOCTYPE r SYSTEM 'r.dtd'><r><a/></r>") << 1000
                                  << O::Parsed << 2;
    QTest::newRow("depth at the limit") << deep(3) << 3 << O::Parsed << 3;
    QTest::newRow("one level past the limit") << deep(4) << 3 << O::Refused << 0;
    QTest::newRow("truncated") << QByteArray("<r><a/><b>") << 1000 << O::Malformed << 3;
    QTest::newRow("empty file") << QByteArray("") << 1000 << O::Malformed << 0;
    QTest::newRow("binary") << binary << 1000 << O::Malformed << 0;
    // The stream check gives up at the first error; the SAX reader reads
    // past it and must still be stopped before it recurses out of stack.
    QTest::newRow("50000 levels behind an undeclared entity")
        << deep(50000, "<r>&undeclared;") << 1000 << O::Refused << 1000;
    QTest::newRow("50000 levels behind a repeated attribute")
        << deep(50000, "<r a='1' a='2'>") << 1000 << O::Refused << 1000;
}

void tst_XmlDepthGuard::parseFile()
{
    QFETCH(QByteArray, xml);
    QFETCH(int, maxDepth);
    QFETCH(CrvC_XmlDepthGuard::Outcome, outcome);
    QFETCH(int, maxElementsSeen);

    const QString path = m_dir.filePath(QString::fromLatin1(QTest::currentDataTag()));
    if (!xml.isNull())
        QVERIFY(CorvidTest::writeFile(path, xml));

    CountingHandler handler;
    QCOMPARE(CrvC_XmlDepthGuard::parseFile(path, Port::InputFile::CoreReport, handler, maxDepth), outcome);
    QVERIFY(handler.elements <= maxElementsSeen);
    if (outcome == CrvC_XmlDepthGuard::Outcome::Parsed)
        QCOMPARE(handler.elements, maxElementsSeen);
}

QTEST_GUILESS_MAIN(tst_XmlDepthGuard)
#include "tst_xmldepthguard.moc"
