#pragma once

#include "OrbHostExport.h"

#include <QByteArray>
#include <QFile>
#include <QString>

#include <functional>

namespace Port {

// The one way to open a file that the design tools, the user or anything else
// may have left where an input is looked up. Only a regular file is opened
// (links are followed): a named pipe, a device, a socket or a directory in
// its place is refused without blocking, and so is a file larger than the
// limit of its kind of input. A refused file counts as missing for its
// reader; the refusal is written to the debug output with the file and the
// reason. The limits are listed in docs/inputs.md.
//
// The size a file shows when it is opened proves nothing (a file in /proc
// shows 0 and reads without end, another process may keep appending), so an
// opened InputFile also counts what is read from it: a read that would go
// past the limit fails, and from then on the file is refused(). A reader that
// finds its file refused after reading treats the input as malformed.
class ORBHOST_EXPORT InputFile : public QFile
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

    // Looks at the bytes read from the file, in file order, before the
    // reader gets them; an answer other than empty refuses the file with
    // that reason (the read fails).
    using Inspector = std::function<QString(const char *data, qint64 size)>;

    // The largest file accepted for `kind`, in bytes.
    static qint64 sizeLimit(Kind kind);
    // Replaces the limit of `kind` in this process (0: back to the one in
    // docs/inputs.md), for tests that must reach it quickly; answers the
    // replacement that was in force before, or 0.
    static qint64 setSizeLimit(Kind kind, qint64 bytes);
    // A short name of the kind for messages ("usage XML").
    static const char *kindName(Kind kind);

    InputFile();
    ~InputFile() override;

    // Opens `path` read-only, positioned at the start (this file must not be
    // open). On any other status the file stays closed; `reason`, when
    // given, receives the problem in a few words ("a named pipe"). Refusals
    // (not Missing) are written to the debug output.
    Status open(const QString &path, Kind kind, QString *reason = nullptr);

    // True once a read went past the limit of the kind or the inspector
    // refused what was read; refusal() says why. Every later read fails.
    bool refused() const { return !m_refusal.isEmpty(); }
    QString refusal() const { return m_refusal; }
    // Refuses the file from now on for `problem`, which is written to the
    // debug output: for what a reader's own checks find.
    void refuse(const QString &problem);

    // Installs `inspector` for the bytes read from now on (none: no
    // inspection). Set it at the start of the file, and do not seek after.
    void setInspector(Inspector inspector) { m_inspector = std::move(inspector); }

    // Reads from the current position to the end into `bytes`; false, with
    // `bytes` empty, when the file is refused on the way or cannot be read.
    bool readRest(QByteArray &bytes);

    bool seek(qint64 pos) override;
    // A refused file is at its end (a stream reader waiting for more of an
    // unfinished document would otherwise ask for ever).
    bool atEnd() const override;

    // Reads the whole file; `bytes` is left empty unless the status is
    // Opened. A file that reads past its limit is refused as TooLarge, one
    // whose reading fails half-way as Unreadable.
    static Status readAll(const QString &path, Kind kind, QByteArray &bytes, QString *reason = nullptr);

    // True when `path` would open; nothing is read.
    static bool isAvailable(const QString &path, Kind kind);

protected:
    qint64 readData(char *data, qint64 maxSize) override;
    qint64 readLineData(char *data, qint64 maxSize) override;

private:
    // Only open(path, kind) opens an input.
    using QFile::open;

    QString m_path;
    Kind m_kind = KindCount;
    qint64 m_limit = 0;
    qint64 m_position = 0; // of the next byte readData() takes
    bool m_pastLimit = false;
    QString m_refusal;
    Inspector m_inspector;
};

} // namespace Port
