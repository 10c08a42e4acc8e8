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
#include "plugin/CollectionCycle.h"

#include <QDir>
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

void TestCorvidPlugin::designName_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<QString>("contextText"); // null: no context
    QTest::addColumn<QString>("expected");
    QTest::newRow("no context") << "top_usage.xml" << QString() << "top";
    QTest::newRow("no context, cut at the last underscore") << "my_top_usage.xml" << QString() << "my_top";
    QTest::newRow("no context, no underscore") << "usage.xml" << QString() << "usage";
    QTest::newRow("context project|design") << "top_usage.xml" << "proj|blinker" << "blinker";
    QTest::newRow("context single part") << "top_usage.xml" << "blinker" << "";
    QTest::newRow("context empty parts dropped") << "top_usage.xml" << "||proj||des|x" << "des";
}

void TestCorvidPlugin::designName()
{
    QFETCH(QString, fileName);
    QFETCH(QString, contextText);
    const QString dir = m_env->home() + QLatin1String("/designs");
    QDir().mkpath(dir);
    QDir::setCurrent(m_env->home());
    Prjrep::AutoRelease<GuiI::IOpenContext> context(contextText.isNull() ? nullptr : new Context(contextText));
    QTEST(CrvC_CollectionCycle::designName(dir + QLatin1Char('/') + fileName, context.get()), "expected");
    // Without a context the usage file's folder becomes the current one, where the tools' inputs lie.
    QCOMPARE(QDir::currentPath(), contextText.isNull() ? dir : m_env->home());
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
