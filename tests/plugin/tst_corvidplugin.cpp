// The plug-in library as the host loads it: what it registers and undoes,
// and what it adds to the host's preference sheet.

#include "common/TestEnvironment.h"

#include "host/FileSupervisor.h"
#include "host/InstanceTable.h"
#include "host/gui/ApplicationBase.h"
#include "host/gui/DataCollector.h"
#include "host/gui/PropItem.h"
#include "host/gui/PropSheet.h"

#include <QPluginLoader>
#include <QtTest>

namespace {

QString pluginPath()
{
    return CorvidTest::Environment::stageDir() + QLatin1String("/lib/orb/plugins/libCorvid.so");
}

GuiI::IFileEditorManager *registeredEditor()
{
    const auto editors =
        Gui::Clip::FileSupervisor::getInstance()->editors(Gui::Clip::FileSupervisor::fileEditorCategory());
    return editors.empty() ? nullptr : editors.front();
}

} // namespace

class TestCorvidPlugin : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }
    void loadRegistersAndUnloadUndoes();
    void preferenceSheet();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestCorvidPlugin::loadRegistersAndUnloadUndoes()
{
    QPluginLoader loader(pluginPath());
    QVERIFY2(loader.instance(), qPrintable(loader.errorString()));
    GuiI::IFileEditorManager *editor = registeredEditor();
    QVERIFY(editor);
    QCOMPARE(CitP::InstanceTable::GetInstance(GuiI::IFileEditorManager::iid()),
             static_cast<CitI::IInterface *>(editor));
    // Nothing may keep pointing into the unloaded library.
    QVERIFY(loader.unload());
    QVERIFY(!registeredEditor());
    QVERIFY(!CitP::InstanceTable::GetInstance(GuiI::IFileEditorManager::iid()));
}

void TestCorvidPlugin::preferenceSheet()
{
    // The loaded plug-in answers the host's request for preference pages, and only that one.
    QPluginLoader loader(pluginPath());
    QVERIFY(loader.instance());
    {
        auto *app = static_cast<Gui::Clip::ApplicationBase *>(QCoreApplication::instance());
        Gui::Clip::PropSheet sheet;
        Gui::Clip::DataCollector other(1, &sheet);
        app->requestData(other);
        QCOMPARE(sheet.itemCount(), 0);
        Gui::Clip::DataCollector preferences(Gui::Clip::DataCollector::PreferenceSheet, &sheet);
        app->requestData(preferences);
        QCOMPARE(sheet.itemCount(), 1);
        QCOMPARE(sheet.item(0)->name(), QStringLiteral("Corvid"));
        sheet.showItem(0);
        QCOMPARE(sheet.item(0)->page()->objectName(), QStringLiteral("DataCollectionPage"));
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
