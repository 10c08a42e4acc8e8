#pragma once

#include "Interface.h"
#include "StringBase.h"

#include <vector>

// The design data of a host project: its properties (templates and their
// instances, the process property templates shown in the host's property
// dialogs), its source files and its partitions.
//
// Reach: the current project (GuiI::IProjectManager::getCurrentProject)
// answers Dpm::IProject; IProject gives the design data (IDesignData) and the
// file manager (IFileManager); the design data gives the data store, which
// answers IDataStore, IPropertyTemplateStore and IPropertyUITemplateStore.
// The partition service and the property filter are made by
// CitP::Factory::CreateInstanceRef with their objectId().
//
// References: every operation that hands out an object (a return value or an
// out-parameter, not GetInterface) hands out one reference that the caller
// gives back (Prjrep::AutoRelease). Operations answering a status give 1 on
// success; anything else leaves the out-parameter null or unchanged.
//
// Iterators walk their items with first(), isDone(), next(); current() hands
// out the item at the iterator's position (may be null).

namespace Prjrep {

// The name of a host object, e.g. the object a source file is associated with.
class IName : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{5d0e51a2-7b1f-4c36-9a1e-3f2b8c7d4e60}");
        return id;
    }
    virtual Port::StringBase getName() = 0;
};

} // namespace Prjrep

namespace Dpm {

// A property instance: the value one property has in the project.
class IPropertyInstance : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{2f6c1c0e-83a4-4e1b-b5d2-6a0f9e3c1d47}");
        return id;
    }
    virtual int getName(Port::StringBase &name) = 0;
    virtual int getCurrentValue(Port::StringBase &value) = 0;
    // Whether the property is enabled (takes effect) in the project.
    virtual bool isEnabled() = 0;
    // Whether the host keeps the property out of its property dialogs.
    virtual bool isHidden() = 0;
};

// Answered by property instances whose value names a file.
class IFilePropertyInstance : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{9a3e7d15-0c62-4f8b-a1d4-5e2b7c9f0a36}");
        return id;
    }
    // The file the value names.
    virtual Port::StringBase getFileName() = 0;
};

// A property template: the definition of one property.
class IPropertyTemplate : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{c4b8e2a7-5f19-4d03-8e6a-1b7d3f2c9e58}");
        return id;
    }
    virtual Port::StringBase getName() = 0;
    // The property's instance in the project.
    virtual int getPropertyInstance(IPropertyInstance **instance) = 0;
};

// The project's property instances.
class IPropertyInstanceIterator : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{71e5a9c3-2d84-4b6f-9c1a-8e3f5b2d7a04}");
        return id;
    }
    virtual void first() = 0;
    virtual bool isDone() = 0;
    virtual void next() = 0;
    virtual IPropertyInstance *current() = 0;
};

// Key/value selection of the process properties that apply to a project:
// keys such as "PM", "DEVICE", "SYNTHESIS_TOOL". The property filter object
// (objectId) answers this interface.
class IFilter : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{e8d26f4b-91a3-4c5e-b7f0-2a6c4d8e1b93}");
        return id;
    }
    static const Port::XUID &objectId()
    {
        static const Port::XUID id("{BF714223-9A6B-4924-B6FF-2A1E766569B6}");
        return id;
    }
    // Sets `key` to `value`, replacing an earlier value.
    virtual void setValue(const Port::StringBase &key, const Port::StringBase &value) = 0;
    // The value of `key`; false when it is not set.
    virtual bool getValue(const Port::StringBase &key, Port::StringBase &value) = 0;
};

// The definition data behind a property UI template: leads to the property
// template.
class IDefDataId : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{36b9f0d8-4e2c-4a71-8d5b-c0e7a1f3b629}");
        return id;
    }
    virtual Port::StringBase getId() = 0;
    virtual IPropertyTemplate *getPropertyTemplate() = 0;
};

// A property UI template: how one process property appears in the host's
// property dialogs.
class IPropertyUITemplate : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{b05d7e3a-6c18-4f92-a4e9-7d1c2b5f8e30}");
        return id;
    }
    // Whether the host leaves the property out of the project's dialogs.
    virtual bool isExcluded() = 0;
    // The identifying name of the template.
    virtual Port::StringBase getId() = 0;
    // The definition data (answers IDefDataId), or null.
    virtual CitI::IInterface *getDefData() = 0;
};

class IPropertyUITemplateIterator : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{4c8a1f6e-d3b7-4e05-9f2a-b6e0c5d3a718}");
        return id;
    }
    virtual void first() = 0;
    virtual bool isDone() = 0;
    virtual void next() = 0;
    // May be null.
    virtual IPropertyUITemplate *current() = 0;
};

// The data store of the design data.
class IDataStore : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{8e41c7b2-0f5d-4a96-b3e8-5c2a9d1f7e64}");
        return id;
    }
    virtual int getPropertyInstances(IPropertyInstanceIterator **instances) = 0;
};

// The property templates of the data store, by property name.
class IPropertyTemplateStore : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{d7f39a05-b2c6-4e81-a05f-9e4b3d6c2a17}");
        return id;
    }
    virtual int getPropertyTemplate(const Port::StringBase &name, IPropertyTemplate **propertyTemplate) = 0;
};

// The process property UI templates of the data store.
class IPropertyUITemplateStore : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{1a6e8d4f-c95b-4b27-8e03-f4d1a7c6b952}");
        return id;
    }
    // The templates that apply under `filter`, in the host's order.
    virtual int getPropertyUITemplates(IFilter *filter, IPropertyUITemplateIterator **templates) = 0;
};

// The design data of a project.
class IDesignData : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{63c0b5e9-2a7f-4d18-b4c6-0e9d8f1a3b75}");
        return id;
    }
    // The data store, or null.
    virtual CitI::IInterface *getDataStore() = 0;
};

class IFileType : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{f2a74c19-8d3e-4b50-96c7-3b1e0a5d8f26}");
        return id;
    }
    // The type's name, e.g. "VHDL".
    virtual int getName(Port::StringBase &name) = 0;
};

// A source file of the project.
class IFile : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{a95e2d07-4b6c-4f13-8a9d-e1c7b3f5a048}");
        return id;
    }
    virtual Port::StringBase getFileName() = 0;
    // The object the file belongs to (answers Prjrep::IName), or null when
    // it is one of the project's own sources.
    virtual CitI::IInterface *getAssociation() = 0;
    virtual int getFileType(IFileType **type) = 0;
};

class IHdlFileIterator : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{0d3b6f8a-e5c1-4972-b8a4-6f2e9c0d5b81}");
        return id;
    }
    virtual void first() = 0;
    virtual bool isDone() = 0;
    virtual void next() = 0;
    virtual IFile *current() = 0;
};

// The project's source files.
class IFileManager : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{5b7c9e2d-1f4a-4e68-9c3b-a8d0f6e2c157}");
        return id;
    }
    virtual int getFiles(IHdlFileIterator **files) = 0;
};

// The project as a design: reached from the current project.
class IProject : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{e0a6d3c8-7b2f-4195-8d4e-c3f1b9a7e602}");
        return id;
    }
    // The design data (answers IDesignData), or null.
    virtual CitI::IInterface *getDesignData() = 0;
    // The file manager (answers IFileManager), or null.
    virtual CitI::IInterface *getFileManager() = 0;
};

// The partitions of the current project's design, named by instance path
// ("/top/u_core"). The object made by the factory for objectId() answers
// this interface for the project that was current when it was made.
class IPartitionService : public CitI::IInterface
{
public:
    static const Port::XUID &iid()
    {
        static const Port::XUID id("{7f1d4a9c-3e6b-4c82-b5a0-d9e2c8f4a163}");
        return id;
    }
    static const Port::XUID &objectId()
    {
        static const Port::XUID id(0x11964635, 0x7D528480, 0x46E4AA59, 0xABA96394);
        return id;
    }
    // The partitions at or below `partition`; "" (the top) gives every one.
    virtual int getPartitionList(const Port::StringBase &partition,
                                 std::vector<Port::StringBase> &partitions) = 0;
};

} // namespace Dpm
