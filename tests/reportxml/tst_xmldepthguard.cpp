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
    void isAcceptable_data();
    void isAcceptable();
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

void tst_XmlDepthGuard::isAcceptable_data()
{
    QTest::addColumn<QByteArray>("xml");
    QTest::addColumn<int>("maxDepth");
    QTest::addColumn<bool>("acceptable");

    QTest::newRow("shallow document") << QByteArray("<r><a x='1'/><b>t</b></r>") << 1000 << true;
    QTest::newRow("depth at the limit") << XmlSamples::deepDocument(5) << 5 << true;
    QTest::newRow("one level past the limit") << XmlSamples::deepDocument(6) << 5 << false;
    QTest::newRow("default limit, 1000 levels") << XmlSamples::deepDocument(1000) << 1000 << true;
    QTest::newRow("50000 levels") << XmlSamples::deepDocument(50000) << 1000 << false;
    QTest::newRow("tag mismatch") << QByteArray("<r><a></b></r>") << 1000 << false;
    QTest::newRow("truncated") << QByteArray("<r><a>") << 1000 << false;
    QTest::newRow("empty") << QByteArray() << 1000 << false;
    QTest::newRow("binary") << XmlSamples::binaryBytes() << 1000 << false;
    QTest::newRow("undeclared prefix, as the DOM reads it")
        << QByteArray("<r><x:a/></r>") << 1000 << true;
}

void tst_XmlDepthGuard::isAcceptable()
{
    QFETCH(QByteArray, xml);
    QFETCH(int, maxDepth);
    QFETCH(bool, acceptable);
    QCOMPARE(CrvC_XmlDepthGuard::isAcceptable(xml, maxDepth), acceptable);
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
    QTest::newRow("huge file") << QByteArray() << "huge" << 1000 << O::Refused << 0;
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
    QCOMPARE(CrvC_XmlDepthGuard::parseFile(path, handler, maxDepth), outcome);
    QVERIFY(handler.elements <= maxElementsSeen);
    if (outcome == CrvC_XmlDepthGuard::Outcome::Parsed)
        QCOMPARE(handler.elements, maxElementsSeen);
}

QTEST_GUILESS_MAIN(tst_XmlDepthGuard)
#include "tst_xmldepthguard.moc"
