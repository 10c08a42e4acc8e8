#include "XmlSamples.h"
#include "common/TestEnvironment.h"
#include "report/XmlDepthGuard.h"

#include <QtCore5Compat/QXmlDefaultHandler>

#include <QDir>
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

} // namespace

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
    QTest::addColumn<QByteArray>("xml"); // written to the file unless a null array
    QTest::addColumn<QString>("special"); // "missing", "directory", "huge"
    QTest::addColumn<int>("maxDepth");
    QTest::addColumn<CrvC_XmlDepthGuard::Outcome>("outcome");
    QTest::addColumn<int>("maxElementsSeen");

    using O = CrvC_XmlDepthGuard::Outcome;
    QTest::newRow("missing file") << QByteArray() << "missing" << 1000 << O::NotRead << 0;
    QTest::newRow("directory") << QByteArray() << "directory" << 1000 << O::NotRead << 0;
    // Too large counts as missing, like any file InputFile refuses.
    QTest::newRow("huge file") << QByteArray() << "huge" << 1000 << O::NotRead << 0;
    QTest::newRow("internal DTD subset")
        << QByteArray("<!DOCTYPE r [<!ENTITY a 'b'>]><r>&a;</r>") << QString() << 1000
        << O::Refused << 0;
    QTest::newRow("external DTD") << QByteArray("<!DOCTYPE r SYSTEM 'r.dtd'><r><a/></r>")
                                  << QString() << 1000 << O::Parsed << 2;
    QTest::newRow("well-formed") << QByteArray("<r><a/><b/></r>") << QString() << 1000 << O::Parsed
                                 << 3;
    QTest::newRow("depth at the limit") << XmlSamples::deepDocument(3) << QString() << 3
                                        << O::Parsed << 3;
    QTest::newRow("one level past the limit")
        << XmlSamples::deepDocument(4) << QString() << 3 << O::Refused << 0;
    QTest::newRow("truncated") << QByteArray("<r><a/><b>") << QString() << 1000 << O::Malformed
                               << 3;
    QTest::newRow("empty file") << QByteArray("") << QString() << 1000 << O::Malformed << 0;
    QTest::newRow("binary") << XmlSamples::binaryBytes() << QString() << 1000 << O::Malformed
                            << 0;
    QTest::newRow("50000 levels") << XmlSamples::deepDocument(50000) << QString() << 1000
                                  << O::Refused << 0;
    // The stream check gives up at the entity; the SAX reader must still be
    // stopped before it recurses out of stack.
    QTest::newRow("50000 levels behind an undeclared entity")
        << XmlSamples::deepBehindUndeclaredEntity(50000) << QString() << 1000 << O::Refused
        << 1000;
    QTest::newRow("50000 levels behind a repeated attribute")
        << XmlSamples::deepDocument(50000, "<r a='1' a='2'>") << QString() << 1000 << O::Refused
        << 1000;
}

void tst_XmlDepthGuard::parseFile()
{
    QFETCH(QByteArray, xml);
    QFETCH(QString, special);
    QFETCH(int, maxDepth);
    QFETCH(CrvC_XmlDepthGuard::Outcome, outcome);
    QFETCH(int, maxElementsSeen);

    const QString path = m_dir.filePath(QString::fromLatin1(QTest::currentDataTag()));
    if (special == QLatin1String("directory"))
        QVERIFY(QDir().mkpath(path));
    else if (special == QLatin1String("huge"))
        QVERIFY(XmlSamples::writeHugeFile(path));
    else if (special.isEmpty())
        QVERIFY(CorvidTest::writeFile(path, xml));

    CountingHandler handler;
    QCOMPARE(CrvC_XmlDepthGuard::parseFile(path, Port::InputFile::CoreReport, handler, maxDepth), outcome);
    QVERIFY(handler.elements <= maxElementsSeen);
    if (outcome == CrvC_XmlDepthGuard::Outcome::Parsed)
        QCOMPARE(handler.elements, maxElementsSeen);
}

QTEST_GUILESS_MAIN(tst_XmlDepthGuard)
#include "tst_xmldepthguard.moc"
