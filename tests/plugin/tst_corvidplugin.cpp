#include "common/TestEnvironment.h"

#include "host/AutoRelease.h"
#include "host/FileSupervisor.h"
#include "host/InstanceTable.h"
#include "host/RefObject.h"
#include "host/String.h"
#include "host/gui/ApplicationBase.h"
#include "host/gui/DataCollector.h"
#include "host/gui/PropItem.h"
#include "host/gui/PropSheet.h"
#include "host/gui/VantorUpdatePage.h"
#include "plugin/CollectionCycle.h"

#include <QDir>
#include <QLibrary>
#include <QPluginLoader>
#include <QtTest>

namespace {

QString pluginPath()
{
    return CorvidTest::Environment::stageDir() + QLatin1String("/lib/orb/plugins/libCorvid.so");
}

GuiI::IFileEditorManager *registeredEditor()
{
    const auto editors = Gui::Clip::FileSupervisor::getInstance()->editors(
        Gui::Clip::FileSupervisor::fileEditorCategory());
    return editors.empty() ? nullptr : editors.front();
}

// An open context whose design-name text is fixed.
class Context : public CitP::RefObject, public GuiI::IOpenContext, public GuiI::IDesignNameProvider
{
public:
    explicit Context(const QString &text) : m_text(text.toStdString()) {}
    CitI::IInterface *GetInterface(const Port::XUID &iid) override
    {
        if (iid == GuiI::IOpenContext::iid())
            return static_cast<GuiI::IOpenContext *>(this);
        if (iid == GuiI::IDesignNameProvider::iid())
            return static_cast<GuiI::IDesignNameProvider *>(this);
        return RefObject::GetInterface(iid);
    }
    void AddRef() override { RefObject::AddRef(); }
    void Release() override { RefObject::Release(); }
    Port::StringBase getProjectName() override { return Port::StringBase("p"); }
    Port::StringBase getDesignText() override { return m_text; }

private:
    Port::StringBase m_text;
};

} // namespace

class TestCorvidPlugin : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void loadRegistersAndUnloadUndoes();
    void suitability_data();
    void suitability();
    void instanceIsGuardedSingleton();
    void designName_data();
    void designName();
    void preferenceSheet();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestCorvidPlugin::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    QVERIFY2(QFile::exists(pluginPath()), qPrintable(pluginPath()));
}

void TestCorvidPlugin::loadRegistersAndUnloadUndoes()
{
    QPluginLoader loader(pluginPath());
    QObject *plugin = loader.instance();
    QVERIFY2(plugin, qPrintable(loader.errorString()));
    QCOMPARE(plugin->objectName(), QStringLiteral("CrvC_CorvidPlugin"));

    GuiI::IFileEditorManager *editor = registeredEditor();
    QVERIFY(editor);
    QCOMPARE(CitP::InstanceTable::GetInstance(GuiI::IFileEditorManager::iid()),
             static_cast<CitI::IInterface *>(editor));
    QCOMPARE(Gui::Clip::String::convert(editor->getDisplayName()), QStringLiteral("Corvid Plugin"));
    QCOMPARE(editor->GetInterface(GuiI::IFileEditorManager::iid()),
             static_cast<CitI::IInterface *>(editor));
    QCOMPARE(qobject_cast<GuiI::IFileEditorManager *>(plugin), editor);

    QVERIFY(loader.unload());
    QVERIFY(!registeredEditor());
    QVERIFY(!CitP::InstanceTable::GetInstance(GuiI::IFileEditorManager::iid()));
}

void TestCorvidPlugin::suitability_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<int>("expected");
    QTest::newRow("usage file") << "top_usage.xml" << 2;
    QTest::newRow("with directories") << "/work/proj/my_top_usage.xml" << 2;
    QTest::newRow("upper-case suffix") << "top_usage.XML" << 0;
    QTest::newRow("backup copy") << "top_usage.xml.bak" << 0;
    QTest::newRow("other file") << "usage.txt" << 0;
    QTest::newRow("bare suffix") << "_usage.xml" << 2;
    QTest::newRow("empty") << "" << 0;
}

void TestCorvidPlugin::suitability()
{
    QPluginLoader loader(pluginPath());
    QVERIFY(loader.instance());
    GuiI::IFileEditorManager *editor = registeredEditor();
    QVERIFY(editor);
    QFETCH(QString, fileName);
    QFETCH(int, expected);
    QCOMPARE(editor->getFileSuitability(Gui::Clip::String::convert(fileName)), expected);
    loader.unload();
}

void TestCorvidPlugin::instanceIsGuardedSingleton()
{
    QLibrary library(pluginPath());
    QVERIFY2(library.load(), qPrintable(library.errorString()));
    using InstanceFunction = QObject *(*)();
    auto instance = reinterpret_cast<InstanceFunction>(library.resolve("qt_plugin_instance"));
    QVERIFY(instance);

    QObject *first = instance();
    QVERIFY(first);
    QCOMPARE(instance(), first);
    QVERIFY(registeredEditor());

    delete first;
    QVERIFY(!registeredEditor());
    QObject *second = instance();
    QVERIFY(second);
    QVERIFY(registeredEditor());
    delete second;
    QVERIFY(!registeredEditor());
    library.unload();
}

void TestCorvidPlugin::designName_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<QString>("contextText"); // null: no context
    QTest::addColumn<QString>("expected");
    QTest::newRow("no context") << "top_usage.xml" << QString() << "top";
    QTest::newRow("no context, underscores") << "my_top_usage.xml" << QString() << "my_top";
    QTest::newRow("no context, no underscore") << "usage.xml" << QString() << "usage";
    QTest::newRow("no context, dots cut at the first") << "a.b_usage.xml" << QString() << "a";
    QTest::newRow("context project|design") << "top_usage.xml" << "proj|blinker" << "blinker";
    QTest::newRow("context single part") << "top_usage.xml" << "blinker" << "";
    QTest::newRow("context empty parts dropped") << "top_usage.xml" << "||proj||des|x" << "des";
    QTest::newRow("context empty text") << "top_usage.xml" << "" << "";
}

void TestCorvidPlugin::designName()
{
    QFETCH(QString, fileName);
    QFETCH(QString, contextText);
    QFETCH(QString, expected);
    const QString dir = m_env->home() + QLatin1String("/designs");
    QDir().mkpath(dir);
    QDir::setCurrent(m_env->home());
    const QString path = dir + QLatin1Char('/') + fileName;
    if (contextText.isNull()) {
        QCOMPARE(CrvC_CollectionCycle::designName(path, nullptr), expected);
        // The usage file's directory becomes the working directory of the tools' inputs.
        QCOMPARE(QDir::currentPath(), dir);
    } else {
        Prjrep::AutoRelease<GuiI::IOpenContext> context(new Context(contextText));
        QCOMPARE(CrvC_CollectionCycle::designName(path, context.get()),
                 expected);
        QCOMPARE(QDir::currentPath(), m_env->home());
    }
}

void TestCorvidPlugin::preferenceSheet()
{
    // Edit > Preferences...: the host's own page, then what the plug-ins add.
    QPluginLoader loader(pluginPath());
    QVERIFY(loader.instance());
    {
        auto *app = static_cast<Gui::Clip::ApplicationBase *>(QCoreApplication::instance());
        Gui::Clip::PropSheet sheet;
        Gui::Clip::VantorUpdatePage::addTo(&sheet);
        Gui::Clip::DataCollector other(1, &sheet);
        app->requestData(other);
        QCOMPARE(sheet.itemCount(), 1);
        Gui::Clip::DataCollector preferences(Gui::Clip::DataCollector::PreferenceSheet, &sheet);
        app->requestData(preferences);
        QCOMPARE(sheet.itemCount(), 2);
        QCOMPARE(sheet.item(0)->name(), QStringLiteral("VantorUpdate"));
        QCOMPARE(sheet.item(1)->name(), QStringLiteral("Corvid"));
        for (int i = 0; i < 2; ++i) {
            sheet.showItem(i);
            QVERIFY(sheet.item(i)->page());
        }
        QCOMPARE(sheet.item(1)->page()->objectName(), QStringLiteral("DataCollectionPage"));
    }
    QVERIFY(loader.unload());
}

int main(int argc, char **argv)
{
    // The plug-in connects to the host application's signals.
    Gui::Clip::ApplicationBase app(argc, argv);
    TestCorvidPlugin test;
    return QTest::qExec(&test, argc, argv);
}

#include "tst_corvidplugin.moc"
