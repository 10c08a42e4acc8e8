// orb: the design environment host. Loads the plug-ins, holds the current
// project and the settings, opens files through the plug-ins' file editors.

#include "MainWindow.h"
#include "OpenContext.h"
#include "Orb.h"
#include "PluginManager.h"

#include "host/StatusLine.h"
#include "host/gui/ApplicationBase.h"
#include "host/project/OrbProject.h"

#include <QCoreApplication>
#include <QDir>
#include <QEventLoopLocker>
#include <QFileInfo>
#include <QTimer>

#include <cstdio>
#include <cstring>

namespace {

const char usage[] =
    "Usage: orb [options] [command]\n"
    "\n"
    "The Orb design environment. Without a command it opens the main window\n"
    "(File > Open..., Edit > Preferences..., Help > About) with the current\n"
    "project's name in its title and a status bar.\n"
    "\n"
    "Commands:\n"
    "  open FILE            Open FILE with the file editor that claims it best (the\n"
    "                       editors of the loaded plug-ins are asked for their\n"
    "                       suitability). orb then runs until the editor's work is\n"
    "                       over (its windows closed, its child processes done) and\n"
    "                       exits 0. A file that no editor claims: exit status 1.\n"
    "                       What the status bar would show (such as how a usage\n"
    "                       report was sent) goes to standard output.\n"
    "  new-project FILE.orb [--family F] [--device D] [--package P] [--speed S]\n"
    "                       Create the project file FILE.orb for the given target\n"
    "                       and its project repository (FILE.orbrepo beside it),\n"
    "                       which records the project's creation time. When\n"
    "                       FILE.orb exists already it is kept as it is (it must be\n"
    "                       a well-formed project file, and the target options are\n"
    "                       refused); only a creation time that is missing is added.\n"
    "\n"
    "Options:\n"
    "  --project FILE.orb   Make FILE.orb the current project (for open and the main\n"
    "                       window). A missing or malformed project file: exit\n"
    "                       status 1.\n"
    "  --design NAME        With open: pass an open context naming the design,\n"
    "                       \"<project name>|NAME\" (the project name is the current\n"
    "                       project's, else the name of the file's directory).\n"
    "  -h, --help           Show this text.\n"
    "\n"
    "Environment:\n"
    "  VANTOR               Installation roots searched before orb's own\n"
    "                       (colon-separated): data files, component libraries.\n"
    "  ORB_PLUGIN_PATH      Plug-in directories searched before\n"
    "                       <installation>/lib/orb/plugins (colon-separated).\n"
    "  ORB_DEBUG            When set (not 0), host debug diagnostics go to\n"
    "                       standard error.\n"
    "\n"
    "Settings are kept in $XDG_CONFIG_HOME/orb/orb.ini (~/.config/orb/orb.ini).\n"
    "The project file format is described in docs/project-format.md.\n";

int fail(const char *message, const QString &argument = QString())
{
    std::fprintf(stderr, "orb: %s%s\n", message, qUtf8Printable(argument));
    return 1;
}

// `orb new-project FILE.orb [target options]`.
int newProject(int argc, char **argv, const QString &file, bool haveTarget,
               const OrbProject::ProjectDocument::Target &target)
{
    // The repository library needs Qt's plug-ins (its database driver).
    QCoreApplication app(argc, argv);
    QString error;
    if (QFileInfo::exists(file)) {
        if (haveTarget)
            return fail("", QStringLiteral("%1: exists already; --family, --device, --package and "
                                           "--speed only apply to a new project file")
                                .arg(file));
        if (!OrbProject::initializeRepository(file, &error))
            return fail("", error);
        std::printf("orb: %s: project kept; its repository holds its creation time\n", qUtf8Printable(file));
        return 0;
    }
    if (!OrbProject::createProject(file, target, &error))
        return fail("", error);
    std::printf("orb: %s: project created\n", qUtf8Printable(file));
    return 0;
}

} // namespace

int main(int argc, char **argv)
{
    QString command;
    QString file;
    QString design;
    QString projectFile;
    bool haveDesign = false;
    OrbProject::ProjectDocument::Target target;
    bool haveTarget = false;
    const std::pair<const char *, QString *> targetOptions[] = {
        {"--family", &target.family},
        {"--device", &target.device},
        {"--package", &target.package},
        {"--speed", &target.speed},
    };
    for (int i = 1; i < argc; ++i) {
        const char *arg = argv[i];
        if (!std::strcmp(arg, "-h") || !std::strcmp(arg, "--help")) {
            std::fputs(usage, stdout);
            return 0;
        }
        QString *targetValue = nullptr;
        for (const auto &[option, value] : targetOptions) {
            if (!std::strcmp(arg, option))
                targetValue = value;
        }
        if (targetValue) {
            if (++i >= argc)
                return fail("", QStringLiteral("%1 needs a value").arg(QLatin1String(arg)));
            *targetValue = QString::fromLocal8Bit(argv[i]);
            haveTarget = true;
        } else if (!std::strcmp(arg, "--design")) {
            if (++i >= argc)
                return fail("--design needs a design name");
            design = QString::fromLocal8Bit(argv[i]);
            haveDesign = true;
        } else if (!std::strcmp(arg, "--project")) {
            if (++i >= argc)
                return fail("--project needs a project file name");
            projectFile = QString::fromLocal8Bit(argv[i]);
        } else if (command.isEmpty() && (!std::strcmp(arg, "open") || !std::strcmp(arg, "new-project"))) {
            command = QString::fromLatin1(arg);
        } else if (!command.isEmpty() && file.isEmpty() && arg[0] != '-') {
            file = QString::fromLocal8Bit(arg);
        } else {
            std::fputs(usage, stderr);
            return fail("unknown argument: ", QString::fromLocal8Bit(arg));
        }
    }
    if (command == QLatin1String("open") && file.isEmpty())
        return fail("open needs a file name");
    if (haveTarget && command != QLatin1String("new-project"))
        return fail("--family, --device, --package and --speed only go with new-project");
    if (command == QLatin1String("new-project")) {
        if (file.isEmpty())
            return fail("new-project needs a project file name");
        if (!projectFile.isEmpty())
            return fail("--project does not go with new-project");
        return newProject(argc, argv, file, haveTarget, target);
    }
    if (!projectFile.isEmpty()) {
        QString error;
        if (!OrbProject::openCurrentProject(projectFile, &error))
            return fail("", error);
    }

    Gui::Clip::ApplicationBase app(argc, argv);
    app.setApplicationName(QStringLiteral("orb"));
    app.setOrganizationName(QStringLiteral("Vantor"));

    PluginManager plugins;
    plugins.loadAll();
    QObject::connect(&app, &QCoreApplication::aboutToQuit, [&plugins] { plugins.unloadAll(); });

    if (command.isEmpty()) {
        MainWindow window;
        window.show();
        return app.exec();
    }

    // Without a window the status line goes to standard output.
    Port::StatusLine::setDisplay([](const QString &text) {
        std::printf("orb: %s\n", qUtf8Printable(text));
        std::fflush(stdout);
    });
    const QString absolute = QFileInfo(file).absoluteFilePath();
    QString projectName = Orb::currentProjectName();
    if (projectName.isEmpty())
        projectName = QFileInfo(absolute).absoluteDir().dirName();
    OpenContext *context = haveDesign ? new OpenContext(projectName, design) : nullptr;

    // The editor keeps the application alive with windows or QEventLoopLockers
    // for as long as its work goes on; ours only covers the open request.
    auto *locker = new QEventLoopLocker;
    const bool opened =
        Orb::openFile(absolute, context ? static_cast<GuiI::IOpenContext *>(context) : nullptr);
    if (context)
        context->Release();
    if (!opened) {
        delete locker;
        plugins.unloadAll();
        return fail("no editor can open ", file);
    }
    QTimer::singleShot(0, &app, [locker] { delete locker; });
    const int status = app.exec();
    return status;
}
