#include "common/TestEnvironment.h"

#include "host/project/ProjectDocument.h"

#include <QtTest>

using OrbProject::ProjectDocument;

// Reading and writing .orb project files.
class TestProjectDocument : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void readsEveryPart();
    void refusesBadFiles_data();
    void refusesBadFiles();
    void deepNestingIsPassedOver_data();
    void deepNestingIsPassedOver();
    void effectiveProperties_data();
    void effectiveProperties();

private:
    QString path(const QString &name) const { return m_env->home() + QLatin1Char('/') + name; }

    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestProjectDocument::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
}

// What the project data tests do not reach: the target, flag spellings,
// ids, and parts of a later format that are passed over.
void TestProjectDocument::readsEveryPart()
{
    const QString file = path(QStringLiteral("parts.orb"));
    QVERIFY(CorvidTest::writeFile(file, R"orb(<?xml version="1.0"?>
<project name="blinky" version="1">
  <target family="Xc6" device="xc6a25" package="csg324" speed="-2"/>
  <properties>
    <future-thing><property name="ignored" value="x"/></future-thing>
    <property name="PROP_UseTraceHint"/>
  </properties>
  <processProperties>
    <processProperty id="synth.goal" name="PROP_Goal" value="Speed" hidden="yes"/>
    <processProperty name="PROP_Constraints" value="top.xcf" file="true" excluded="1"/>
  </processProperties>
</project>
)orb"));
    ProjectDocument document;
    QString error;
    QVERIFY2(document.read(file, &error), qPrintable(error));
    QCOMPARE(document.name, QStringLiteral("blinky"));
    QCOMPARE(document.target.device + document.target.package + document.target.speed,
             QStringLiteral("xc6a25csg324-2"));
    QCOMPARE(document.properties.size(), 1);
    QVERIFY(!document.properties.at(0).hasValue);
    QCOMPARE(document.processProperties.size(), 2);
    const ProjectDocument::ProcessProperty &goal = document.processProperties.at(0);
    QCOMPARE(goal.id, QStringLiteral("synth.goal"));
    QVERIFY(goal.hidden && !goal.excluded && !goal.fileProperty);
    const ProjectDocument::ProcessProperty &constraints = document.processProperties.at(1);
    QCOMPARE(constraints.id, QStringLiteral("PROP_Constraints"));
    QVERIFY(constraints.excluded && constraints.fileProperty);
}

void TestProjectDocument::refusesBadFiles_data()
{
    QTest::addColumn<QByteArray>("contents"); // "-" for no file at all
    QTest::addColumn<QString>("problem");

    QTest::newRow("missing file") << QByteArray("-") << "no such project file";
    QTest::newRow("empty file") << QByteArray() << "not a well-formed project file";
    QTest::newRow("unclosed element") << QByteArray("<project><sources>") << "line 1";
    QTest::newRow("UTF-7")
        << QByteArray("<?xml version='1.0' encoding='UTF-7'?><project name='+2D3d,-'/>")
        << "its encoding \"UTF-7\" is not supported";
    QTest::newRow("internal DTD subset")
        << QByteArray("<!DOCTYPE project [<!ENTITY n 'x'>]><project name='&n;'/>")
        << "not a well-formed project file: DTD declarations";
    QTest::newRow("other root") << QByteArray("<workspace/>") << "the root element is <workspace>";
    QTest::newRow("file without path")
        << QByteArray("<project><sources><file type='VHDL'/></sources></project>")
        << "<file> needs a non-empty \"path\" attribute";
    QTest::newRow("bad flag")
        << QByteArray("<project><properties><property name='P' enabled='maybe'/></properties></project>")
        << "attribute \"enabled\" of <property> must be true or false, not \"maybe\"";
    QTest::newRow("property twice")
        << QByteArray("<project><properties><property name='P' value='1'/>"
                      "<property name='P' value='2'/></properties></project>")
        << "property \"P\" is listed twice";
    QTest::newRow("filter without key")
        << QByteArray("<project><processProperties><processProperty name='P'>"
                      "<filter value='x'/></processProperty></processProperties></project>")
        << "<filter> needs a non-empty \"key\"";
}

void TestProjectDocument::refusesBadFiles()
{
    QFETCH(QByteArray, contents);
    QFETCH(QString, problem);
    const QString file = path(QStringLiteral("bad-%1.orb").arg(QTest::currentDataTag()));
    if (contents != "-")
        QVERIFY(CorvidTest::writeFile(file, contents));

    ProjectDocument document;
    document.name = QStringLiteral("unchanged");
    QString error;
    QVERIFY(!document.read(file, &error));
    QVERIFY2(error.startsWith(file + QLatin1String(": ")), qPrintable(error));
    QVERIFY2(error.contains(problem), qPrintable(error));
    QCOMPARE(document.name, QStringLiteral("unchanged"));
}

void TestProjectDocument::deepNestingIsPassedOver_data()
{
    QTest::addColumn<bool>("closed");
    QTest::newRow("well-formed") << true;
    QTest::newRow("never closed") << false;
}

void TestProjectDocument::deepNestingIsPassedOver()
{
    QFETCH(bool, closed);
    const int depth = 200000;
    QByteArray contents("<project name='deep'><sources><file path='a.vhd'/></sources>");
    contents.reserve(contents.size() + depth * 8 + 20);
    for (int i = 0; i < depth; ++i)
        contents += "<x>";
    if (closed) {
        for (int i = 0; i < depth; ++i)
            contents += "</x>";
        contents += "</project>";
    }
    const QString file = path(QStringLiteral("deep.orb"));
    QVERIFY(CorvidTest::writeFile(file, contents));

    ProjectDocument document;
    QString error;
    QCOMPARE(document.read(file, &error), closed);
    if (closed)
        QCOMPARE(document.sources.size(), 1);
    else
        QVERIFY2(error.contains(QLatin1String("not a well-formed")), qPrintable(error));
}


void TestProjectDocument::effectiveProperties_data()
{
    QTest::addColumn<QString>("device");
    QTest::addColumn<QString>("listedDevice"); // empty: not listed
    QTest::addColumn<QStringList>("expected"); // name=value

    QTest::newRow("derived from the target")
        << "xc6a25" << QString()
        << QStringList{"PROP_DevFamily=Xc6", "PROP_DevFamilyPMName=Xc6", "PROP_DevDevice=xc6a25",
                       "PROP_Simulator=OSim"};
    QTest::newRow("a listed property wins")
        << "xc6a25" << "xc6a50"
        << QStringList{"PROP_DevFamily=Xc6", "PROP_DevFamilyPMName=Xc6", "PROP_Simulator=OSim",
                       "PROP_DevDevice=xc6a50"};
    QTest::newRow("empty target values give nothing")
        << QString() << QString()
        << QStringList{"PROP_DevFamily=Xc6", "PROP_DevFamilyPMName=Xc6", "PROP_Simulator=OSim"};
}

void TestProjectDocument::effectiveProperties()
{
    QFETCH(QString, device);
    QFETCH(QString, listedDevice);
    QFETCH(QStringList, expected);
    ProjectDocument document;
    document.target.family = QStringLiteral("Xc6");
    document.target.device = device;
    document.properties.append({QStringLiteral("PROP_Simulator"), QStringLiteral("OSim"), true, true});
    if (!listedDevice.isEmpty())
        document.properties.append({QStringLiteral("PROP_DevDevice"), listedDevice, true, true});
    QStringList actual;
    for (const ProjectDocument::DesignProperty &property : document.effectiveProperties())
        actual << property.name + QLatin1Char('=') + property.value;
    QCOMPARE(actual, expected);
}

QTEST_GUILESS_MAIN(TestProjectDocument)
#include "tst_projectdocument.moc"
