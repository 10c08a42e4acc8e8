#include "ProjectDocument.h"

#include "host/InputFile.h"
#include "host/XmlGuard.h"

#include <QFile>
#include <QFileInfo>
#include <QSaveFile>
#include <QSet>
#include <QXmlStreamReader>
#include <QXmlStreamWriter>

namespace OrbProject {
namespace {

const QString ProjectElement = QStringLiteral("project");

enum class Group { None, Properties, Sources, Partitions, ProcessProperties };

bool fail(QString *error, const QString &message)
{
    if (error)
        *error = message;
    return false;
}

// Reads one element's attributes and reports problems through the reader,
// so that they come with the line and column of the element.
class Attributes
{
public:
    explicit Attributes(QXmlStreamReader &xml) : m_xml(xml), m_attributes(xml.attributes()) {}

    bool has(const QString &name) const { return m_attributes.hasAttribute(name); }
    QString text(const QString &name) const { return m_attributes.value(name).toString(); }

    QString required(const QString &name)
    {
        const QString value = text(name).trimmed();
        if (value.isEmpty() && !m_xml.hasError())
            m_xml.raiseError(
                QStringLiteral("<%1> needs a non-empty \"%2\" attribute").arg(m_xml.name().toString(), name));
        return value;
    }

    bool flag(const QString &name, bool defaultValue)
    {
        if (!has(name))
            return defaultValue;
        const QString value = text(name).trimmed().toLower();
        if (value == QLatin1String("true") || value == QLatin1String("yes") || value == QLatin1String("1"))
            return true;
        if (value == QLatin1String("false") || value == QLatin1String("no") || value == QLatin1String("0"))
            return false;
        if (!m_xml.hasError())
            m_xml.raiseError(QStringLiteral("attribute \"%1\" of <%2> must be true or false, not \"%3\"")
                                 .arg(name, m_xml.name().toString(), text(name)));
        return defaultValue;
    }

private:
    QXmlStreamReader &m_xml;
    QXmlStreamAttributes m_attributes;
};

} // namespace

bool ProjectDocument::read(const QString &path, QString *error)
{
    const QFileInfo info(path);
    Port::InputFile file;
    QString problem;
    switch (file.open(path, Port::InputFile::ProjectFile, &problem)) {
    case Port::InputFile::Status::Opened:
        break;
    case Port::InputFile::Status::Missing:
        return fail(error, QStringLiteral("%1: no such project file").arg(path));
    case Port::InputFile::Status::NotRegular:
    case Port::InputFile::Status::TooLarge:
        return fail(error, QStringLiteral("%1: not a project file (%2)").arg(path, problem));
    case Port::InputFile::Status::Unreadable:
        return fail(error, QStringLiteral("%1: cannot be read: %2").arg(path, problem));
    }
    // The guard also refuses encodings other than Unicode and its subsets:
    // the file is saved as UTF-8, and text from others (UTF-7 can decode to
    // unpaired surrogates) could be read but not saved again.
    if (Port::XmlGuard::guard(file, &problem) != Port::XmlGuard::Outcome::Accepted)
        return fail(error, QStringLiteral("%1: not a well-formed project file: %2").arg(path, problem));

    ProjectDocument document;
    QSet<QString> propertyNames;
    QXmlStreamReader xml(&file);
    // A flat walk over the tokens, keeping only the depth and the group we
    // are in: elements of no interest are passed over with all they contain,
    // however deeply they nest.
    int depth = 0;
    bool sawRoot = false;
    Group group = Group::None;
    ProcessProperty *process = nullptr;
    while (!xml.atEnd() && !xml.hasError()) {
        const QXmlStreamReader::TokenType token = xml.readNext();
        if (token == QXmlStreamReader::EndElement) {
            if (depth == 2)
                group = Group::None;
            else if (depth == 3)
                process = nullptr;
            --depth;
            continue;
        }
        if (token != QXmlStreamReader::StartElement)
            continue;
        ++depth;
        const QStringView element = xml.name();
        Attributes attributes(xml);
        if (depth == 1) {
            if (element != ProjectElement || !xml.namespaceUri().isEmpty()) {
                xml.raiseError(QStringLiteral("the root element is <%1>, not <project>")
                                   .arg(xml.qualifiedName().toString()));
                break;
            }
            sawRoot = true;
            document.name = attributes.text(QStringLiteral("name")).trimmed();
        } else if (depth == 2) {
            if (element == QLatin1String("target")) {
                document.target.family = attributes.text(QStringLiteral("family")).trimmed();
                document.target.device = attributes.text(QStringLiteral("device")).trimmed();
                document.target.package = attributes.text(QStringLiteral("package")).trimmed();
                document.target.speed = attributes.text(QStringLiteral("speed")).trimmed();
            } else if (element == QLatin1String("properties")) {
                group = Group::Properties;
            } else if (element == QLatin1String("sources")) {
                group = Group::Sources;
            } else if (element == QLatin1String("partitions")) {
                group = Group::Partitions;
            } else if (element == QLatin1String("processProperties")) {
                group = Group::ProcessProperties;
            }
        } else if (depth == 3) {
            if (group == Group::Properties && element == QLatin1String("property")) {
                DesignProperty property;
                property.name = attributes.required(QStringLiteral("name"));
                property.hasValue = attributes.has(QStringLiteral("value"));
                property.value = attributes.text(QStringLiteral("value"));
                property.enabled = attributes.flag(QStringLiteral("enabled"), true);
                if (!xml.hasError() && propertyNames.contains(property.name))
                    xml.raiseError(QStringLiteral("property \"%1\" is listed twice").arg(property.name));
                propertyNames.insert(property.name);
                document.properties.append(property);
            } else if (group == Group::Sources && element == QLatin1String("file")) {
                SourceFile source;
                source.path = attributes.required(QStringLiteral("path"));
                source.type = attributes.has(QStringLiteral("type"))
                                  ? attributes.text(QStringLiteral("type")).trimmed()
                                  : typeForFileName(source.path);
                source.association = attributes.text(QStringLiteral("association")).trimmed();
                document.sources.append(source);
            } else if (group == Group::Partitions && element == QLatin1String("partition")) {
                document.partitions.append(attributes.required(QStringLiteral("name")));
            } else if (group == Group::ProcessProperties && element == QLatin1String("processProperty")) {
                ProcessProperty property;
                property.name = attributes.required(QStringLiteral("name"));
                property.id = attributes.text(QStringLiteral("id")).trimmed();
                if (property.id.isEmpty())
                    property.id = property.name;
                property.hasValue = attributes.has(QStringLiteral("value"));
                property.value = attributes.text(QStringLiteral("value"));
                property.excluded = attributes.flag(QStringLiteral("excluded"), false);
                property.hidden = attributes.flag(QStringLiteral("hidden"), false);
                property.fileProperty = attributes.flag(QStringLiteral("file"), false);
                document.processProperties.append(property);
                process = &document.processProperties.last();
            }
        } else if (depth == 4 && process && element == QLatin1String("filter")) {
            Condition condition;
            condition.key = attributes.required(QStringLiteral("key"));
            condition.value = attributes.text(QStringLiteral("value")).trimmed();
            process->conditions.append(condition);
        }
    }
    if (file.refused())
        return fail(error,
                    QStringLiteral("%1: not a well-formed project file: %2").arg(path, file.refusal()));
    if (!xml.hasError() && !sawRoot)
        xml.raiseError(QStringLiteral("no <project> element"));
    if (xml.hasError()) {
        return fail(error, QStringLiteral("%1: not a well-formed project file: line %2, column %3: %4")
                               .arg(path)
                               .arg(xml.lineNumber())
                               .arg(xml.columnNumber())
                               .arg(xml.errorString()));
    }
    if (document.name.isEmpty())
        document.name = info.completeBaseName();
    *this = std::move(document);
    return true;
}

bool ProjectDocument::write(const QString &path, QString *error) const
{
    QSaveFile file(path);
    if (!file.open(QIODevice::WriteOnly))
        return fail(error, QStringLiteral("%1: cannot be written: %2").arg(path, file.errorString()));

    QXmlStreamWriter xml(&file);
    xml.setAutoFormatting(true);
    xml.setAutoFormattingIndent(2);
    xml.writeStartDocument();
    xml.writeStartElement(ProjectElement);
    xml.writeAttribute(QStringLiteral("name"), name);
    xml.writeAttribute(QStringLiteral("version"), QStringLiteral("1"));

    xml.writeEmptyElement(QStringLiteral("target"));
    xml.writeAttribute(QStringLiteral("family"), target.family);
    xml.writeAttribute(QStringLiteral("device"), target.device);
    xml.writeAttribute(QStringLiteral("package"), target.package);
    xml.writeAttribute(QStringLiteral("speed"), target.speed);

    xml.writeStartElement(QStringLiteral("properties"));
    for (const DesignProperty &property : properties) {
        xml.writeEmptyElement(QStringLiteral("property"));
        xml.writeAttribute(QStringLiteral("name"), property.name);
        if (property.hasValue)
            xml.writeAttribute(QStringLiteral("value"), property.value);
        if (!property.enabled)
            xml.writeAttribute(QStringLiteral("enabled"), QStringLiteral("false"));
    }
    xml.writeEndElement();

    xml.writeStartElement(QStringLiteral("sources"));
    for (const SourceFile &source : sources) {
        xml.writeEmptyElement(QStringLiteral("file"));
        xml.writeAttribute(QStringLiteral("path"), source.path);
        if (!source.type.isEmpty())
            xml.writeAttribute(QStringLiteral("type"), source.type);
        if (!source.association.isEmpty())
            xml.writeAttribute(QStringLiteral("association"), source.association);
    }
    xml.writeEndElement();

    xml.writeStartElement(QStringLiteral("partitions"));
    for (const QString &partition : partitions) {
        xml.writeEmptyElement(QStringLiteral("partition"));
        xml.writeAttribute(QStringLiteral("name"), partition);
    }
    xml.writeEndElement();

    xml.writeStartElement(QStringLiteral("processProperties"));
    for (const ProcessProperty &property : processProperties) {
        xml.writeStartElement(QStringLiteral("processProperty"));
        if (property.id != property.name)
            xml.writeAttribute(QStringLiteral("id"), property.id);
        xml.writeAttribute(QStringLiteral("name"), property.name);
        if (property.hasValue)
            xml.writeAttribute(QStringLiteral("value"), property.value);
        if (property.excluded)
            xml.writeAttribute(QStringLiteral("excluded"), QStringLiteral("true"));
        if (property.hidden)
            xml.writeAttribute(QStringLiteral("hidden"), QStringLiteral("true"));
        if (property.fileProperty)
            xml.writeAttribute(QStringLiteral("file"), QStringLiteral("true"));
        for (const Condition &condition : property.conditions) {
            xml.writeEmptyElement(QStringLiteral("filter"));
            xml.writeAttribute(QStringLiteral("key"), condition.key);
            xml.writeAttribute(QStringLiteral("value"), condition.value);
        }
        xml.writeEndElement();
    }
    xml.writeEndElement();

    xml.writeEndElement();
    xml.writeEndDocument();
    if (xml.hasError() || !file.commit())
        return fail(error, QStringLiteral("%1: cannot be written: %2").arg(path, file.errorString()));
    return true;
}

QList<ProjectDocument::DesignProperty> ProjectDocument::effectiveProperties() const
{
    QSet<QString> listed;
    for (const DesignProperty &property : properties)
        listed.insert(property.name);

    const std::pair<const char *, const QString *> derived[] = {
        {"PROP_DevFamily", &target.family}, {"PROP_DevFamilyPMName", &target.family},
        {"PROP_DevDevice", &target.device}, {"PROP_DevPackage", &target.package},
        {"PROP_DevSpeed", &target.speed},
    };
    QList<DesignProperty> result;
    result.reserve(properties.size() + 5);
    for (const auto &[name, value] : derived) {
        const QString propertyName = QString::fromLatin1(name);
        if (value->isEmpty() || listed.contains(propertyName))
            continue;
        DesignProperty property;
        property.name = propertyName;
        property.value = *value;
        property.hasValue = true;
        result.append(property);
    }
    result.append(properties);
    return result;
}

QString ProjectDocument::typeForFileName(const QString &path)
{
    const QString suffix = QFileInfo(path).suffix().toLower();
    if (suffix == QLatin1String("vhd") || suffix == QLatin1String("vhdl"))
        return QStringLiteral("VHDL");
    if (suffix == QLatin1String("v"))
        return QStringLiteral("Verilog");
    if (suffix == QLatin1String("sv"))
        return QStringLiteral("SystemVerilog");
    if (suffix == QLatin1String("ucf"))
        return QStringLiteral("UCF");
    return QString();
}

} // namespace OrbProject
