#include "TestEnvironment.h"

#include "host/Settings.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>
#include <QRegularExpression>
#include <QStandardPaths>

namespace CorvidTest {

Environment::Environment() : m_dir(new QTemporaryDir)
{
    QStandardPaths::setTestModeEnabled(true);
    const QString root = m_dir->path();
    QDir().mkpath(root + QLatin1String("/home"));
    QDir().mkpath(root + QLatin1String("/install/data/reports"));
    qputenv("HOME", QFile::encodeName(root + QLatin1String("/home")));
    qputenv("XDG_CONFIG_HOME", QFile::encodeName(root + QLatin1String("/home/.config")));
    qputenv("XDG_DATA_HOME", QFile::encodeName(root + QLatin1String("/home/.local/share")));
    qputenv("XDG_CACHE_HOME", QFile::encodeName(root + QLatin1String("/home/.cache")));
    qputenv("VANTOR", QFile::encodeName(installRoot()));
    qunsetenv("APPDATA");
    qunsetenv("TEMP");
    clearSettings();
}

Environment::~Environment() = default;

QString Environment::home() const
{
    return m_dir->path() + QLatin1String("/home");
}

QString Environment::installRoot() const
{
    return m_dir->path() + QLatin1String("/install");
}

QString Environment::write(const QString &relativePath, const QByteArray &contents) const
{
    const QString file = path(relativePath);
    if (!writeFile(file, contents))
        qFatal("cannot write %s", qPrintable(file));
    return file;
}

bool Environment::writeDataFile(const QString &relativePath, const QByteArray &contents) const
{
    return writeFile(installRoot() + QLatin1String("/data/") + relativePath, contents);
}

void Environment::clearSettings() const
{
    QFile::remove(Gui::Clip::Settings::userFileName());
}

QStringList Environment::locations()
{
    return {QLatin1String("XDG_CONFIG_HOME=")
                + QFileInfo(Gui::Clip::Settings::userFileName()).absolutePath().chopped(4),
            QLatin1String("XDG_DATA_HOME=")
                + QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation)};
}

ToolRun runStaged(const QString &program, const QStringList &arguments, const QString &workDir,
                  const QStringList &environment)
{
    QProcess tool;
    tool.setWorkingDirectory(workDir);
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    env.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
    for (const QString &entry : environment)
        env.insert(entry.section(QLatin1Char('='), 0, 0), entry.section(QLatin1Char('='), 1));
    tool.setProcessEnvironment(env);
    tool.start(Environment::stageDir() + QLatin1String("/bin/") + program, arguments);
    ToolRun run;
    const bool finished = tool.waitForFinished(60000);
    run.standardOutput = tool.readAllStandardOutput();
    run.output = QString::fromUtf8(run.standardOutput + tool.readAllStandardError());
    if (finished && tool.exitStatus() == QProcess::NormalExit)
        run.exitCode = tool.exitCode();
    return run;
}

bool writeFile(const QString &path, const QByteArray &contents)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    return file.open(QIODevice::WriteOnly) && file.write(contents) == contents.size();
}

QByteArray readFile(const QString &path)
{
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

QString cellText(const QString &html)
{
    static const QRegularExpression cellEnd(QStringLiteral("</TD>"),
                                            QRegularExpression::CaseInsensitiveOption);
    static const QRegularExpression tag(QStringLiteral("<[^>]*>"));
    static const QRegularExpression blanksAround(QStringLiteral(" ?\\| ?"));
    return QString(html)
        .replace(cellEnd, QStringLiteral("|"))
        .remove(tag)
        .replace(QLatin1String("&nbsp;"), QLatin1String(" "))
        .simplified()
        .replace(blanksAround, QStringLiteral("|"));
}

} // namespace CorvidTest
