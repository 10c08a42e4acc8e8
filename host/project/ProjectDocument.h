#pragma once

#include "OrbProjectExport.h"

#include <QList>
#include <QString>
#include <QStringList>

namespace OrbProject {

// The contents of an .orb project file: target device, design properties,
// source files, partitions and process property templates. The file format
// is described in docs/project-format.md.
class ORBPROJECT_EXPORT ProjectDocument
{
public:
    struct Target
    {
        QString family;
        QString device;
        QString package;
        QString speed;
    };

    struct DesignProperty
    {
        QString name;
        QString value;
        bool hasValue = false; // a property without a value has no instance
        bool enabled = true;
    };

    struct SourceFile
    {
        QString path;
        QString type;        // empty when neither given nor known from the suffix
        QString association; // empty for the project's own sources
    };

    // The template applies when the filter holds `key` with `value` (case
    // does not matter). Conditions on one key are alternatives; conditions
    // on different keys must all hold.
    struct Condition
    {
        QString key;
        QString value;
    };

    struct ProcessProperty
    {
        QString id; // identifying name; the property name when not given
        QString name;
        QString value;
        bool hasValue = false;
        bool excluded = false;
        bool hidden = false;
        bool fileProperty = false;
        QList<Condition> conditions;
    };

    QString name; // design name; the file's base name when the file has none
    Target target;
    QList<DesignProperty> properties;
    QList<SourceFile> sources;
    QStringList partitions;
    QList<ProcessProperty> processProperties;

    // Replaces the contents with those of `path`. False, with a message that
    // names the file and the problem, when the file is missing, unreadable or
    // not a well-formed project file (which includes what Port::XmlGuard
    // refuses: an internal DTD subset, an encoding other than UTF-8, UTF-16,
    // UTF-32, ASCII or Latin-1, an element with too many attributes); the
    // contents are then unchanged. The file is opened as Port::InputFile
    // opens inputs (a regular file, read no further than 64 MiB).
    bool read(const QString &path, QString *error);
    // Writes the contents to `path` (replaced as a whole, or left alone on
    // failure).
    bool write(const QString &path, QString *error) const;

    // The design properties as the project holds them: those derived from the
    // target (PROP_DevFamily, PROP_DevFamilyPMName, PROP_DevDevice,
    // PROP_DevPackage, PROP_DevSpeed; only those with a value and not listed
    // explicitly), then the listed ones.
    QList<DesignProperty> effectiveProperties() const;

    // The source file type the host gives a file by its suffix ("VHDL" for
    // .vhd), empty when it knows none.
    static QString typeForFileName(const QString &path);
};

} // namespace OrbProject
