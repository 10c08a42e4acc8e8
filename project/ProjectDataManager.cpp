#include "ProjectDataManager.h"

#include "host/AutoRelease.h"
#include "host/DesignData.h"
#include "host/Factory.h"
#include "host/InstanceTable.h"
#include "host/MsgManData.h"
#include "host/ProjectManager.h"

#include <map>

namespace {

using Prjrep::AutoRelease;

const char Module[] = "CorvidC";
const char SourceFile[] = "../s/ProjectDataManager";
const char Revision[] = "1.4";
const int FileManagerErrorLine = 187;
const int FileListErrorLine = 194;

const char *const DesignProperties[] = {
    "PROP_Synthesis_Tool",
    "PROP_Simulator",
    "PROP_Top_Level_Module_Type",
    "PROP_PreferredLanguage",
    "PROP_Enable_Message_Filtering",
    "PROP_Enable_Incremental_Messaging",
    "PROP_UseTraceHint",
};

const char SynthesisTool[] = "PROP_Synthesis_Tool";
const char SynthesisToolEnabledKey[] = "SYNTH_TOOL_IS_ENABLED";
const char WorkingDirectory[] = "PROP_WorkingDirectory";

// Project property whose value selects the process properties -> filter key.
const std::pair<const char *, const char *> FilterKeys[] = {
    {"PROP_DevFamilyPMName", "PM"},         {"PROP_DevDevice", "DEVICE"},
    {"PROP_DevPackage", "PACKAGE"},         {"PROP_DevSpeed", "SPEED"},
    {"PROP_Top_Level_Module_Type", "TLMT"}, {"PROP_Synthesis_Tool", "SYNTHESIS_TOOL"},
    {"PROP_Simulator", "SIMULATOR_TOOL"},   {"PROP_PreferredLanguage", "PREFERRED_LANGUAGE"},
};

template<typename T>
T *as(CitI::IInterface *object)
{
    return object ? static_cast<T *>(object->GetInterface(T::iid())) : nullptr;
}

Port::StringBase tagged(const char *tag, const Port::StringBase &text)
{
    Port::StringBase result("<");
    result += tag;
    result += '>';
    result += text;
    result += "</";
    result += tag;
    result += '>';
    return result;
}

void issueError(int line, const char *text)
{
    Port_MsgManData::createObject(Module, SourceFile, line, Revision)->issueError("%s", text);
}

// The data store of the project's design data (one reference), or null.
AutoRelease<CitI::IInterface> dataStoreOf(CitI::IInterface *designData)
{
    auto *data = as<Dpm::IDesignData>(designData);
    return AutoRelease<CitI::IInterface>(data ? data->getDataStore() : nullptr);
}

// A filter holding the values of the project properties that select the
// process properties, or null.
AutoRelease<CitI::IInterface> buildFilter(CitI::IInterface *dataStore)
{
    AutoRelease<CitI::IInterface> object(CitP::Factory::CreateInstanceRef(Dpm::IFilter::objectId()));
    auto *filter = as<Dpm::IFilter>(object.get());
    auto *store = as<Dpm::IDataStore>(dataStore);
    AutoRelease<Dpm::IPropertyInstanceIterator> instances;
    if (!filter || !store || store->getPropertyInstances(instances.out()) != 1 || !instances)
        return AutoRelease<CitI::IInterface>();
    for (instances->first(); !instances->isDone(); instances->next()) {
        AutoRelease<Dpm::IPropertyInstance> instance(instances->current());
        Port::StringBase name;
        if (!instance || instance->getName(name) != 1)
            continue;
        for (const auto &[property, key] : FilterKeys) {
            if (name.str() != property)
                continue;
            Port::StringBase value;
            if (instance->getCurrentValue(value) == 1)
                filter->setValue(key, value);
        }
        if (name.str() == SynthesisTool)
            filter->setValue(SynthesisToolEnabledKey, instance->isEnabled() ? "TRUE" : "FALSE");
    }
    return object;
}

} // namespace

void ProjectDataManager::collectProjectProperties(PairList &pairs)
{
    auto *manager =
        as<GuiI::IProjectManager>(CitP::InstanceTable::GetInstance(GuiI::IProjectManager::serviceId()));
    if (!manager)
        return;
    AutoRelease<CitI::IInterface> current(manager->getCurrentProject());
    auto *project = as<Dpm::IProject>(current.get());
    if (!project)
        return;
    AutoRelease<CitI::IInterface> designData(project->getDesignData());
    if (!designData)
        return;

    for (const char *property : DesignProperties) {
        Port::StringBase value;
        if (getDesignPropertyValue(designData.get(), property, value))
            pairs.emplace_back(tagged("dtag-design-property-name", property),
                               tagged("dtag-design-property-value", value));
    }
    pairs.emplace_back("Partitions count", tagged("dtag-partitions-count", partitionsCount()));
    collectSourceTypes(project, pairs);
    collectProcessProperties(project, pairs);
}

bool ProjectDataManager::getDesignPropertyValue(CitI::IInterface *designData, const Port::StringBase &name,
                                                Port::StringBase &value)
{
    const AutoRelease<CitI::IInterface> dataStore = dataStoreOf(designData);
    if (!dataStore) {
        Port_MsgManData::debugStub("Failed to get DataStore\n");
        return false;
    }
    auto *templates = as<Dpm::IPropertyTemplateStore>(dataStore.get());
    AutoRelease<Dpm::IPropertyTemplate> propertyTemplate;
    if (!templates || templates->getPropertyTemplate(name, propertyTemplate.out()) != 1
        || !propertyTemplate) {
        Port_MsgManData::debugStub("Failed to get template for Property %s\n", name.c_str());
        return false;
    }
    AutoRelease<Dpm::IPropertyInstance> instance;
    if (propertyTemplate->getPropertyInstance(instance.out()) != 1 || !instance) {
        Port_MsgManData::debugStub("Failed to get Property Instance for %s\n", name.c_str());
        return false;
    }
    return instance->getCurrentValue(value) == 1;
}

Port::StringBase ProjectDataManager::partitionsCount()
{
    int count = 0;
    AutoRelease<CitI::IInterface> object(
        CitP::Factory::CreateInstanceRef(Dpm::IPartitionService::objectId()));
    if (auto *service = as<Dpm::IPartitionService>(object.get())) {
        std::vector<Port::StringBase> partitions;
        if (service->getPartitionList(Port::StringBase(), partitions) == 1)
            count = int(partitions.size());
    }
    Port::StringBase text;
    text.Format("%d", count);
    return text;
}

void ProjectDataManager::collectSourceTypes(Dpm::IProject *project, PairList &pairs)
{
    AutoRelease<CitI::IInterface> object(project ? project->getFileManager() : nullptr);
    auto *fileManager = as<Dpm::IFileManager>(object.get());
    if (!fileManager) {
        issueError(FileManagerErrorLine, "Internal error. Error getting the file manager from theproject\n");
        return;
    }
    AutoRelease<Dpm::IHdlFileIterator> files;
    if (fileManager->getFiles(files.out()) != 1 || !files) {
        issueError(FileListErrorLine, "Internal error. Error getting the files from the file manager\n");
        return;
    }

    std::map<Port::StringBase, int> counts; // byte-wise order of the type names
    for (files->first(); !files->isDone(); files->next()) {
        AutoRelease<Dpm::IFile> file(files->current());
        if (!file)
            continue;
        if (AutoRelease<CitI::IInterface>(file->getAssociation()))
            continue;
        AutoRelease<Dpm::IFileType> type;
        Port::StringBase typeName;
        if (file->getFileType(type.out()) != 1 || !type || type->getName(typeName) != 1)
            continue;
        ++counts[typeName];
    }
    for (const auto &[typeName, count] : counts) {
        Port::StringBase number;
        number.Format("%d", count);
        pairs.emplace_back(tagged("dtag-design-source-type-name", typeName),
                           tagged("dtag-design-source-type-count", number));
    }
}

void ProjectDataManager::collectProcessProperties(Dpm::IProject *project, PairList &pairs)
{
    AutoRelease<CitI::IInterface> designData(project ? project->getDesignData() : nullptr);
    const AutoRelease<CitI::IInterface> dataStore = dataStoreOf(designData.get());
    if (!dataStore) {
        Port_MsgManData::debugStub("Failed to get DataStore\n");
        return;
    }
    const AutoRelease<CitI::IInterface> filter = buildFilter(dataStore.get());
    if (!filter)
        return;
    auto *uiStore = as<Dpm::IPropertyUITemplateStore>(dataStore.get());
    AutoRelease<Dpm::IPropertyUITemplateIterator> templates;
    if (!uiStore || uiStore->getPropertyUITemplates(as<Dpm::IFilter>(filter.get()), templates.out()) != 1
        || !templates)
        return;

    for (templates->first(); !templates->isDone(); templates->next()) {
        AutoRelease<Dpm::IPropertyUITemplate> entry(templates->current());
        if (!entry || entry->isExcluded())
            continue;
        const Port::StringBase id = entry->getId();
        AutoRelease<CitI::IInterface> defDataObject(entry->getDefData());
        auto *defData = as<Dpm::IDefDataId>(defDataObject.get());
        if (!defData) {
            Port_MsgManData::debugStub("NULL iDefData: %s\n", id.c_str());
            continue;
        }
        AutoRelease<Dpm::IPropertyTemplate> propertyTemplate(defData->getPropertyTemplate());
        if (!propertyTemplate) {
            Port_MsgManData::debugStub("NULL iPropTemplate: %s\n", id.c_str());
            continue;
        }
        AutoRelease<Dpm::IPropertyInstance> instance;
        if (propertyTemplate->getPropertyInstance(instance.out()) != 1 || !instance) {
            Port_MsgManData::debugStub("NULL iPropInstance: %s\n", id.c_str());
            continue;
        }
        if (instance->isHidden())
            continue;
        Port::StringBase name;
        if (instance->getName(name) != 1) {
            Port_MsgManData::debugStub("NULL sPropName: %s\n", id.c_str());
            continue;
        }
        Port::StringBase value;
        if (instance->getCurrentValue(value) != 1) {
            Port_MsgManData::debugStub("NULL sCurrentValue: %s\n", id.c_str());
            continue;
        }
        if (as<Dpm::IFilePropertyInstance>(instance.get()))
            value = "changed";
        if (name.str() == WorkingDirectory)
            continue;
        pairs.emplace_back(tagged("dtag-process-property-name", name),
                           tagged("dtag-process-property-value", value));
    }
}
