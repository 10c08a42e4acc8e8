#pragma once

#include "OrbHostExport.h"

#include <QByteArray>
#include <QString>

class QFile;

namespace Port {

// The one way to open a file that the design tools, the user or anything else
// may have left where an input is looked up. Only a regular file is opened
// (links are followed): a named pipe, a device, a socket or a directory in
// its place is refused without blocking, and so is a file larger than the
// limit of its kind of input. A refused file counts as missing for its
// reader; the refusal is written to the debug output with the file and the
// reason. The limits are listed in docs/inputs.md.
class ORBHOST_EXPORT InputFile
{
public:
    enum Kind {
        SynthesisReport, // <design>.snx
        MapReport,       // <design>_map.ktp
        UsageXml,        // <design>_usage.xml
        CommandLog,      // <design>.cmd_log
        FuseLog,         // fuse.log (only looked for, never read)
        CoreReport,      // <design>_lnkgen.drpt
        HelpViewerData,  // orbhelpviewerdata.xml
        SubReport,       // par_usage_statistics.html, osim/osim_usage_statistics.html
        RunRecords,      // <project>.orb.runs
        InstallSettings, // data/reports/corvidsettings
        ProjectFile,     // <project>.orb
        KindCount
    };

    enum class Status {
        Opened,     // a regular file within its limit, open for reading
        Missing,    // nothing there (not reported)
        NotRegular, // a pipe, device, socket or directory
        TooLarge,   // above the limit of its kind
        Unreadable, // there, but cannot be opened or examined
    };

    // The largest file accepted for `kind`, in bytes.
    static qint64 sizeLimit(Kind kind);
    // A short name of the kind for messages ("usage XML").
    static const char *kindName(Kind kind);

    // Opens `path` read-only into `file` (which must not be open), positioned
    // at the start. On any other status `file` stays closed; `reason`, when
    // given, receives the problem in a few words ("a named pipe"). Refusals
    // (not Missing) are written to the debug output.
    static Status open(const QString &path, Kind kind, QFile &file, QString *reason = nullptr);

    // Reads the whole file; `bytes` is left empty unless the status is
    // Opened. A file that grows past its limit while it is read is refused.
    static Status readAll(const QString &path, Kind kind, QByteArray &bytes,
                          QString *reason = nullptr);

    // True when `path` would open; nothing is read.
    static bool isAvailable(const QString &path, Kind kind);
};

} // namespace Port
