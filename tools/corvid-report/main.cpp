// corvid-report: builds device_usage_statistics.html exactly as the collection
// cycle would, without showing or sending anything, so that a user or an
// administrator can see what would be sent. A preview: it stores nothing but
// the page (no project identifier, no user identifier, no repository).

#include "host/project/OrbProject.h"
#include "plugin/CollectionCycle.h"
#include "report/ReportBuilder.h"

#include <QCoreApplication>
#include <QDir>
#include <QFileInfo>

#include <cstdio>
#include <cstring>

namespace {

const char usage[] =
    "Usage: corvid-report [--project FILE.orb] [--design NAME] [--family TEXT]\n"
    "                     [--out PATH] USAGE_XML\n"
    "\n"
    "Builds the usage report page (device_usage_statistics.html) that Corvid would\n"
    "send for the usage file USAGE_XML, without showing or sending it, and prints\n"
    "the page's path.\n"
    "\n"
    "  --project FILE.orb  Make FILE.orb the current project: its directory holds\n"
    "                      the inputs and receives the page, its repository gives\n"
    "                      the project identifier, send counter and age (read\n"
    "                      only).\n"
    "  --design NAME       The design name (default: the usage file's name up to\n"
    "                      its last \"_\", e.g. top_usage.xml gives top).\n"
    "  --family TEXT       The target family (default: the project's).\n"
    "  --out PATH          Write the page to PATH instead of the project directory.\n"
    "  -h, --help          Show this text.\n"
    "\n"
    "Without a project the inputs are read from, and the page written to, the usage\n"
    "file's directory. Missing inputs give empty sections, not errors. Nothing but\n"
    "the page is written: identifiers not stored yet are made for this page only.\n"
    "Exit status: 0 when the page was written, 1 otherwise.\n";

int fail(const QString &message)
{
    std::fprintf(stderr, "corvid-report: %s\n", qUtf8Printable(message));
    return 1;
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    app.setApplicationName(QStringLiteral("corvid-report"));

    QString projectFileArg, design, family, out, usageFile;
    bool haveDesign = false, haveFamily = false;
    const QStringList args = app.arguments();
    for (int i = 1; i < args.size(); ++i) {
        const QString &arg = args.at(i);
        auto value = [&](QString &target) {
            if (i + 1 >= args.size())
                return false;
            target = args.at(++i);
            return true;
        };
        if (arg == QLatin1String("-h") || arg == QLatin1String("--help")) {
            std::fputs(usage, stdout);
            return 0;
        } else if (arg == QLatin1String("--project")) {
            if (!value(projectFileArg))
                return fail(QStringLiteral("--project needs a project file"));
        } else if (arg == QLatin1String("--design")) {
            if (!value(design))
                return fail(QStringLiteral("--design needs a design name"));
            haveDesign = true;
        } else if (arg == QLatin1String("--family")) {
            if (!value(family))
                return fail(QStringLiteral("--family needs a text"));
            haveFamily = true;
        } else if (arg == QLatin1String("--out")) {
            if (!value(out))
                return fail(QStringLiteral("--out needs a path"));
        } else if (arg.startsWith(QLatin1Char('-')) || !usageFile.isEmpty()) {
            std::fputs(usage, stderr);
            return fail(QStringLiteral("unknown argument: ") + arg);
        } else {
            usageFile = arg;
        }
    }
    if (usageFile.isEmpty()) {
        std::fputs(usage, stderr);
        return fail(QStringLiteral("no usage file given"));
    }
    if (!out.isEmpty())
        out = QFileInfo(out).absoluteFilePath();

    QString error;
    if (!projectFileArg.isEmpty() && !OrbProject::openCurrentProject(projectFileArg, &error))
        return fail(error);

    // As the collection cycle: the design name from the file name makes the
    // file's directory the working directory.
    bool entered = true;
    const QString derived =
        CrvC_CollectionCycle::designName(QFileInfo(usageFile).absoluteFilePath(), nullptr, &entered);
    if (!entered)
        return fail(QStringLiteral("cannot enter the folder of %1").arg(usageFile));
    if (!haveDesign)
        design = derived;

    QString projectFile, projectFamily;
    CrvC_CollectionCycle::currentProject(projectFile, projectFamily);
    if (!haveFamily)
        family = projectFamily;

    CrvC_ReportBuilder::Environment environment;
    environment.preview = true;
    CrvC_ReportBuilder builder(environment);
    if (!out.isEmpty())
        builder.setReportPath(out);
    builder.createReport(projectFile, design, family);
    const QString path = QFileInfo(builder.data().reportPath).absoluteFilePath();
    if (!builder.written())
        return fail(QStringLiteral("cannot write %1").arg(QDir::toNativeSeparators(path)));
    std::printf("%s\n", qUtf8Printable(QDir::toNativeSeparators(path)));
    return 0;
}
