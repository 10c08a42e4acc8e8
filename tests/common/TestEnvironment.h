#pragma once

#include <QString>
#include <QStringList>
#include <QTemporaryDir>

#include <memory>

// Test isolation: every test process gets a private home, configuration and
// data location (QStandardPaths test mode plus HOME and XDG_* pointing into a
// temporary directory) and a private installation root in VANTOR, so that
// settings, help viewer files and install-wide files of one test never leak
// into another or into the user's own.
namespace CorvidTest {

class Environment
{
public:
    // Make it first thing in the test object (a member) or in initTestCase().
    Environment();
    ~Environment();

    // The private home directory.
    QString home() const;
    // home()/<relativePath>; write() also writes `contents` there, making
    // folders as needed (a file that cannot be written ends the test program).
    QString path(const QString &relativePath) const { return home() + QLatin1Char('/') + relativePath; }
    QString write(const QString &relativePath, const QByteArray &contents) const;
    // A private installation root, searched first (VANTOR); data files of a
    // test go to installRoot() + "/data/...".
    QString installRoot() const;
    // Writes `contents` to installRoot()/data/<relativePath>, creating folders.
    bool writeDataFile(const QString &relativePath, const QByteArray &contents) const;
    // Removes the per-user settings file (all groups).
    void clearSettings() const;
    // The test's own settings and data locations (QStandardPaths' test
    // mode) as "XDG_...=" entries, for staged programs that are to share them.
    static QStringList locations();

    // The staged build: orb, plug-ins, component libraries, data.
    static QString stageDir() { return QStringLiteral(ORB_STAGE_DIR); }
    static QString sourceDir() { return QStringLiteral(CORVID_SOURCE_DIR); }

private:
    std::unique_ptr<QTemporaryDir> m_dir;
};

// What a program of the staged installation did.
struct ToolRun
{
    int exitCode = -1; // -1 when it crashed or did not finish within a minute
    QString output;    // standard output followed by standard error
    QByteArray standardOutput;
};

// Runs <stage>/bin/<program> with `arguments` in `workDir` on the offscreen
// platform, with the extra environment `environment` ("NAME=value" entries).
ToolRun runStaged(const QString &program, const QStringList &arguments, const QString &workDir,
                  const QStringList &environment = QStringList());

// Writes `contents` to `path`, creating parent folders; false on failure.
bool writeFile(const QString &path, const QByteArray &contents);
// Reads a whole file; empty when it cannot be read.
QByteArray readFile(const QString &path);
// The text of a piece of the page without its mark-up: tags dropped, white
// space (and &nbsp;) simplified, "|" where a table cell ends.
QString cellText(const QString &html);

} // namespace CorvidTest
