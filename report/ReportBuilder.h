#pragma once

#include "ReportData.h"

#include <QDateTime>
#include <QString>
#include <QStringList>

#include <functional>

// Builds the usage report page, device_usage_statistics.html, for the host's
// current project: reads the design tools' reports in the project directory
// and host data, assembles the sections in their fixed order and writes the
// page as UTF-8. Needs no window: what would involve the user (asking for a
// design name, the busy cursor) goes through the environment hooks, which
// the review dialog supplies.
//
// A build has two halves. prepare() runs on the host's GUI thread: it asks
// the design-name question and everything that needs the host's project
// manager, the repository or the settings. write() may then run on any
// thread: it reads the design tools' files, side by side on that thread and
// a worker thread or two, each reader on builder data of its own, and writes
// the page; it asks the host nothing. The page goes to the file
// line by line as it is assembled, so a large project never has the whole
// page in memory: the builder keeps only its beginning, for the review.
class CrvC_ReportBuilder
{
public:
    static const char *const ReportFileName; // "device_usage_statistics.html"

    // How much of the page pageText() keeps, in UTF-16 code units: the
    // beginning that the review dialog's Contents tab shows.
    static const qsizetype PageTextLimit;

    // Hooks into the world outside the builder. Unset hooks of the user
    // do nothing (askDesignName answers "cancelled"); unset clock and
    // identifier hooks get their defaults (withDefaults).
    struct Environment
    {
        // Asks the user for a design name; false when cancelled.
        std::function<bool(QString &designName)> askDesignName;
        // Shows (true) or restores (false) the busy cursor.
        std::function<void(bool busy)> setBusy;
        // The current local date and time ("Date Generated", project age).
        std::function<QDateTime()> now;
        // A new random identifier, 32 lower-case hexadecimal digits.
        std::function<QString()> newIdentifier;
        // The user's own random identifier, made and kept on first use.
        std::function<QString()> randomId;
        // A new empty folder for this build's own copy of the page (the copy
        // the send step sends, CrvC_PageStore); empty when none could be made.
        // Unset: the build keeps no copy, the page at reportPath is its page.
        std::function<QString()> pageFolder;
        // A preview: what is stored is read, nothing is stored. The project
        // repository is opened read-only (ProjectRepositoryValues::readOnly)
        // and identifiers that do not exist yet are made for the page only.
        bool preview = false;
    };

    // `environment` with the defaults for its unset clock and identifier
    // hooks: the local clock, Port::Identifier::newIdentifier and
    // CrvC_Settings::randomId (which stores what it makes unless `preview`).
    // The one place these defaults are chosen.
    static Environment withDefaults(Environment environment);

    // reportPath := projectFilePath(ReportFileName), made absolute now: a
    // later change of the working directory does not move the page.
    CrvC_ReportBuilder();
    explicit CrvC_ReportBuilder(Environment environment);

    // targetFamily := targetFamily, then buildReport.
    void createReport(const QString &projectFileArg, const QString &designName, const QString &targetFamily);

    // Builds the page and writes it to reportPath, and the same bytes to the
    // build's own copy when the environment gives a pageFolder. The previous
    // file is replaced only by a complete new one; a symbolic link at
    // reportPath is never written through. Running out of memory ends the
    // build with the page unwritten; the busy cursor is restored on every way
    // out. A design-name prompt that the user cancels ends the build before
    // anything is read or written.
    void buildReport(const QString &projectFileArg, QString designName);

    // The first half of buildReport, on the GUI thread: the project file, the
    // design-name prompt, the folder of the build's own copy, and the
    // sections that ask the host, the repository and the settings. False
    // when there is nothing to build (prompt cancelled, no folder for the
    // copy); write() must then not be called.
    bool prepare(const QString &projectFileArg, QString designName);
    // The second half, on any thread, once after prepare(): reads the files,
    // writes the page. Touches nothing but this builder and its files.
    void write();

    // What the Contents tab shows: the page, or its first PageTextLimit
    // code units when pageCut().
    QString pageText() const { return m_page; }
    bool pageCut() const { return m_pageCut; }
    // True when the last build wrote the file (and its own copy).
    bool written() const { return m_written; }
    QString reportPath() const { return m_data.reportPath; }
    // The design of the last build, as given or entered at the prompt.
    QString designName() const { return m_designName; }
    // The file that holds exactly the bytes of the last build, for the send
    // step: the build's own copy when it keeps one, otherwise reportPath.
    // Absolute; empty when the build wrote nothing.
    QString pagePath() const { return m_pagePath; }
    // Removes the build's own copy (a page that will not be sent); the page
    // at reportPath stays.
    void discardOwnCopy();

    // projectDirectory() + "/" + name, or name when there is no project directory.
    static QString projectFilePath(const QString &name);
    // The current project's directory as the host reports it; empty when there
    // is no project manager, current project or directory.
    static QString projectDirectory();

    // The send iteration of this report (cached after the first call).
    QString projectIteration();

    // The fields of the last build. What only fills the page's tables (the
    // usage XML's tables, the macro statistics, the command history) is let
    // go once written; the target, identifiers and paths stay.
    CrvC_ReportData &data() { return m_data; }
    const CrvC_ReportData &data() const { return m_data; }
    const Environment &environment() const { return m_env; }

    // Replaces where the page goes (command-line use).
    void setReportPath(const QString &path) { m_data.reportPath = path; }

private:
    class PageWriter;
    void assemble(PageWriter &page);
    // `name` in the prepared project directory, after the design name when
    // `designNamed`.
    QString inProject(const QString &name, bool designNamed = false) const;

    Environment m_env;
    CrvC_ReportData m_data;
    QString m_page;
    QString m_pagePath;
    QString m_ownFolder;
    std::function<void()> m_afterPrompt; // buildReport's busy cursor
    // Prepared on the GUI thread for write().
    QString m_designName;
    QString m_directory;
    QStringList m_paths;
    QString m_heading;
    QString m_versionSection;
    QString m_runStatistics;
    QString m_projectStatistics;
    bool m_pageCut = false;
    bool m_written = false;
};
