#pragma once

#include "ReportData.h"

#include <QDateTime>
#include <QString>

#include <functional>

// Builds the usage report page, device_usage_statistics.html, for the host's
// current project: reads the design tools' reports in the project directory
// and host data, assembles the sections in their fixed order and writes the
// page as UTF-8. Needs no window: what would involve the user (asking for a
// design name, the busy cursor) goes through the environment hooks, which
// the review dialog supplies.
class CrvC_ReportBuilder
{
public:
    static const char *const ReportFileName; // "device_usage_statistics.html"

    // Hooks into the world outside the builder. Unset hooks do nothing
    // (askDesignName answers "cancelled"), and the defaults of now and
    // newIdentifier are the clock and a random UUID.
    struct Environment
    {
        // Asks the user for a design name; false when cancelled.
        std::function<bool(QString &designName)> askDesignName;
        // Shows (true) or restores (false) the busy cursor.
        std::function<void(bool busy)> setBusy;
        // The current local date and time ("Date Generated").
        std::function<QDateTime()> now;
        // A new random identifier, 32 lower-case hexadecimal digits.
        std::function<QString()> newIdentifier;
    };

    // reportPath := projectFilePath(ReportFileName), resolved now.
    explicit CrvC_ReportBuilder(Environment environment = Environment());

    // targetFamily := targetFamily, then buildReport.
    void createReport(const QString &projectFileArg, const QString &designName,
                      const QString &targetFamily);

    // Builds the page, keeps it as pageText() and writes it to reportPath.
    // The previous file is replaced only by a complete new one.
    void buildReport(const QString &projectFileArg, QString designName);

    QString pageText() const { return m_page; }
    // True when the last build wrote the file.
    bool written() const { return m_written; }

    // projectDirectory() + "/" + name, or name when there is no project directory.
    static QString projectFilePath(const QString &name);
    // The current project's directory as the host reports it; empty when there
    // is no project manager, current project or directory.
    static QString projectDirectory();

    // The send iteration of this report (cached after the first call).
    QString projectIteration();

    CrvC_ReportData &data() { return m_data; }
    const CrvC_ReportData &data() const { return m_data; }
    const Environment &environment() const { return m_env; }

    // Replaces where the page goes (command-line use).
    void setReportPath(const QString &path) { m_data.reportPath = path; }

private:
    Environment m_env;
    CrvC_ReportData m_data;
    QString m_page;
    bool m_written = false;
};
