#include "common/TestEnvironment.h"

#include "host/AutoRelease.h"
#include "host/DesignData.h"
#include "host/InstanceTable.h"
#include "host/MsgManData.h"
#include "host/ProjectManager.h"
#include "host/String.h"
#include "host/project/HostObject.h"
#include "host/project/OrbProject.h"
#include "project/ProjectDataManager.h"

#include <QRegularExpression>
#include <QtTest>

using Gui::Clip::String;

// The project facts that Corvid gathers from the host's project model, read
// from project files written here and opened as the current project. The
// sample page shows a sound project's facts; here the facts left out, the
// filters it does not reach and a host whose file manager fails.
class TestProjectDataManager : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void init();
    void cleanup();
    void collect_data();
    void collect();
    void noFileManager();

private:
    QStringList collectPairs();
    QStringList errors() const;

    CorvidTest::Environment m_env;
    std::vector<Port_MsgManData::Message> m_messages;
    Port_MsgManData::Sink m_previousSink;
    int m_files = 0;
};

namespace {

QByteArray projectFile(const QByteArray &properties, const QByteArray &sources = QByteArray(),
                       const QByteArray &partitionList = QByteArray(),
                       const QByteArray &processProperties = QByteArray())
{
    return "<project name='blinky'>\n"
           "<target family='Xc6' device='xc6a25' package='csg324' speed='-2'/>\n"
           "<properties>" + properties + "</properties>\n"
           "<sources>" + sources + "</sources>\n"
           "<partitions>" + partitionList + "</partitions>\n"
           "<processProperties>" + processProperties + "</processProperties>\n"
           "</project>\n";
}

// A project that has the real project's design data but no file manager.
class ProjectWithoutFiles : public OrbProject::HostObject<Dpm::IProject>
{
public:
    explicit ProjectWithoutFiles(Dpm::IProject *real) : m_real(real) {}
    CitI::IInterface *getDesignData() override { return m_real->getDesignData(); }
    CitI::IInterface *getFileManager() override { return nullptr; }

private:
    Dpm::IProject *m_real;
};

class ManagerOf : public GuiI::IProjectManager
{
public:
    explicit ManagerOf(ProjectWithoutFiles *project) : m_project(project) {}
    CitI::IInterface *GetInterface(const Port::XUID &iid) override
    {
        return iid == GuiI::IProjectManager::iid() ? this : nullptr;
    }
    Port::StringBase getTargetFamily(CitI::IInterface *) override { return "Xc6"; }
    CitI::IInterface *getCurrentProject() override
    {
        m_project->AddRef();
        return static_cast<Dpm::IProject *>(m_project);
    }

private:
    ProjectWithoutFiles *m_project;
};

} // namespace

void TestProjectDataManager::init()
{
    m_messages.clear();
    m_previousSink =
        Port_MsgManData::setSink([this](const Port_MsgManData::Message &m) { m_messages.push_back(m); });
}

void TestProjectDataManager::cleanup()
{
    Port_MsgManData::setSink(m_previousSink);
    OrbProject::closeCurrentProject();
}

QStringList TestProjectDataManager::collectPairs()
{
    ProjectDataManager::PairList pairs;
    ProjectDataManager::collectProjectProperties(pairs);
    QStringList result;
    static const QRegularExpression tag(QStringLiteral("<[^>]*>"));
    for (const ProjectDataManager::Pair &pair : pairs)
        result << QString(String::convert(pair.first) + QLatin1Char('\t') + String::convert(pair.second))
                      .remove(tag);
    return result;
}

// The internal errors reported, as "<module>: <text>".
QStringList TestProjectDataManager::errors() const
{
    QStringList lines;
    for (const Port_MsgManData::Message &m : m_messages) {
        if (m.kind == Port_MsgManData::Error)
            lines << QString::fromStdString(m.module + ": " + m.text);
    }
    return lines;
}

void TestProjectDataManager::collect_data()
{
    QTest::addColumn<QByteArray>("contents");
    QTest::addColumn<QStringList>("expected"); // name<TAB>value, without the mark-up

    // Properties the project does not list, or lists without a value, are left out.
    QTest::newRow("value-less design property, decoded text")
        << projectFile(
               "<property name='PROP_Enable_Incremental_Messaging'/>"
               "<property name='PROP_Synthesis_Tool' value='Synth &amp; Co'/>")
        << QStringList{"PROP_Synthesis_Tool\tSynth & Co", "Partitions count\t0"};
    QTest::newRow("source types from the suffix")
        << projectFile("",
                       "<file path='src/top.vhd'/><file path='src/pwm.v'/>"
                       "<file path='src/debounce.vhdl' type='VHDL'/><file path='doc/notes.txt'/>")
        << QStringList{"Partitions count\t0", "VHDL\t2", "Verilog\t1"};
    const QByteArray filtered =
        "<processProperty name='B' value='b'><filter key='DEVICE' value='xc6a50'/></processProperty>"
        "<processProperty name='D' value='d'><filter key='SYNTH_TOOL_IS_ENABLED' "
        "value='TRUE'/></processProperty>"
        "<processProperty name='E' value='e'><filter key='SYNTH_TOOL_IS_ENABLED' "
        "value='FALSE'/></processProperty>"
        "<processProperty name='F' value='f'><filter key='SYNTHESIS_TOOL' value='Other'/>"
        "<filter key='SYNTHESIS_TOOL' value='Synth'/><filter key='SPEED' value='-2'/></processProperty>"
        "<processProperty name='G' value='g'><filter key='SIMULATOR_TOOL' value='OSim'/>"
        "<filter key='TLMT' value='HDL'/></processProperty>";
    QTest::newRow("filters select the process properties")
        << projectFile(
               "<property name='PROP_Synthesis_Tool' value='Synth' enabled='false'/>"
               "<property name='PROP_Simulator' value='OSim'/>",
               "", "", filtered)
        << QStringList{"PROP_Synthesis_Tool\tSynth", "PROP_Simulator\tOSim", "Partitions count\t0", "E\te",
                       "F\tf"};
    QTest::newRow("entries without an instance or with an empty value")
        << projectFile("", "", "",
                       "<processProperty id='z.id' name='Z'/>"
                       "<processProperty name='W' value=''/>")
        << QStringList{"Partitions count\t0", "W\t"};
}

void TestProjectDataManager::collect()
{
    QFETCH(QByteArray, contents);
    QString error;
    const QString file = m_env.write(QStringLiteral("collect-%1.orb").arg(++m_files), contents);
    QVERIFY2(OrbProject::openCurrentProject(file, &error), qPrintable(error));
    QTEST(collectPairs(), "expected");
    QCOMPARE(errors(), QStringList()); // none for a sound project
}

// A host call that fails costs only the facts that depend on it: here the
// source types.
void TestProjectDataManager::noFileManager()
{
    QVERIFY(OrbProject::openCurrentProject(m_env.write(
        QStringLiteral("broken.orb"), projectFile("<property name='PROP_Simulator' value='OSim'/>",
                                                  "<file path='a.vhd'/>", "<partition name='/blinky/u1'/>",
                                                  "<processProperty name='PROP_MapEffort' value='High'/>"))));

    CitI::IInterface *service = CitP::InstanceTable::GetInstance(GuiI::IProjectManager::serviceId());
    QVERIFY(service);
    Prjrep::AutoRelease<CitI::IInterface> real(
        static_cast<GuiI::IProjectManager *>(service->GetInterface(GuiI::IProjectManager::iid()))
            ->getCurrentProject());
    auto *realProject = static_cast<Dpm::IProject *>(real->GetInterface(Dpm::IProject::iid()));
    QVERIFY(realProject);
    auto *broken = new ProjectWithoutFiles(realProject);
    Prjrep::AutoRelease<Dpm::IProject> brokenReference(broken);
    ManagerOf manager(broken);
    CitP::InstanceTable::RegisterInstance(GuiI::IProjectManager::serviceId(), &manager);
    const QStringList pairs = collectPairs();
    CitP::InstanceTable::RegisterInstance(GuiI::IProjectManager::serviceId(), service);

    QCOMPARE(pairs, (QStringList{"PROP_Simulator\tOSim", "Partitions count\t1", "PROP_MapEffort\tHigh"}));
    QCOMPARE(errors(),
             QStringList("CorvidC: Internal error. Error getting the file manager from theproject\n"));
}

QTEST_GUILESS_MAIN(TestProjectDataManager)
#include "tst_projectdatamanager.moc"
