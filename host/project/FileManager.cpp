#include "FileManager.h"
#include "HostObject.h"

#include "host/DesignData.h"
#include "host/String.h"

using Gui::Clip::String;

namespace OrbProject {
namespace {

class Association : public HostObject<Prjrep::IName>
{
public:
    explicit Association(const QString &name) : m_name(String::convert(name)) {}
    Port::StringBase getName() override { return m_name; }

private:
    Port::StringBase m_name;
};

class FileType : public HostObject<Dpm::IFileType>
{
public:
    explicit FileType(const QString &name) : m_name(String::convert(name)) {}
    int getName(Port::StringBase &name) override
    {
        name = m_name;
        return 1;
    }

private:
    Port::StringBase m_name;
};

class File : public HostObject<Dpm::IFile>
{
public:
    explicit File(const ProjectDocument::SourceFile &source) : m_source(source) {}

    Port::StringBase getFileName() override { return String::convert(m_source.path); }
    CitI::IInterface *getAssociation() override
    {
        if (m_source.association.isEmpty())
            return nullptr;
        return static_cast<Prjrep::IName *>(new Association(m_source.association));
    }
    int getFileType(Dpm::IFileType **type) override
    {
        if (!type)
            return 0;
        *type = m_source.type.isEmpty() ? nullptr : new FileType(m_source.type);
        return *type ? 1 : 0;
    }

private:
    ProjectDocument::SourceFile m_source;
};

class FileIterator : public HostObject<Dpm::IHdlFileIterator>
{
public:
    explicit FileIterator(ModelPointer model) : m_model(std::move(model)) {}

    void first() override { m_index = 0; }
    bool isDone() override { return m_index >= m_model->document.sources.size(); }
    void next() override
    {
        if (!isDone())
            ++m_index;
    }
    Dpm::IFile *current() override
    {
        return isDone() ? nullptr : new File(m_model->document.sources.at(m_index));
    }

private:
    ModelPointer m_model;
    qsizetype m_index = 0;
};

class FileManager : public HostObject<Dpm::IFileManager>
{
public:
    explicit FileManager(ModelPointer model) : m_model(std::move(model)) {}

    int getFiles(Dpm::IHdlFileIterator **files) override
    {
        if (!files)
            return 0;
        *files = new FileIterator(m_model);
        return 1;
    }

private:
    ModelPointer m_model;
};

} // namespace

CitI::IInterface *createFileManager(const ModelPointer &model)
{
    return model ? static_cast<Dpm::IFileManager *>(new FileManager(model)) : nullptr;
}

} // namespace OrbProject
