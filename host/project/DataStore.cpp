#include "DataStore.h"
#include "HostObject.h"

#include "host/DesignData.h"
#include "host/String.h"

#include <QHash>

#include <vector>

using Gui::Clip::String;

namespace OrbProject {
namespace {

// What a property template and its instance know of one property.
struct PropertyData
{
    QString name;
    QString value;
    bool hasValue = false;
    bool enabled = true;
    bool hidden = false;
    bool fileProperty = false;
};

PropertyData fromDesign(const ProjectDocument::DesignProperty &p)
{
    return {p.name, p.value, p.hasValue, p.enabled, false, false};
}

PropertyData fromProcess(const ProjectDocument::ProcessProperty &p)
{
    return {p.name, p.value, p.hasValue, true, p.hidden, p.fileProperty};
}

class PropertyInstance : public HostObject<Dpm::IPropertyInstance, Dpm::IFilePropertyInstance>
{
public:
    explicit PropertyInstance(PropertyData data) : m_data(std::move(data)) {}

    CitI::IInterface *GetInterface(const Port::XUID &iid) override
    {
        if (iid == Dpm::IFilePropertyInstance::iid() && !m_data.fileProperty)
            return nullptr;
        return HostObject::GetInterface(iid);
    }

    int getName(Port::StringBase &name) override
    {
        name = String::convert(m_data.name);
        return 1;
    }
    int getCurrentValue(Port::StringBase &value) override
    {
        value = String::convert(m_data.value);
        return 1;
    }
    bool isEnabled() override { return m_data.enabled; }
    bool isHidden() override { return m_data.hidden; }
    Port::StringBase getFileName() override { return String::convert(m_data.value); }

private:
    PropertyData m_data;
};

class PropertyTemplate : public HostObject<Dpm::IPropertyTemplate>
{
public:
    explicit PropertyTemplate(PropertyData data) : m_data(std::move(data)) {}

    Port::StringBase getName() override { return String::convert(m_data.name); }
    int getPropertyInstance(Dpm::IPropertyInstance **instance) override
    {
        if (!instance)
            return 0;
        *instance = m_data.hasValue ? new PropertyInstance(m_data) : nullptr;
        return *instance ? 1 : 0;
    }

private:
    PropertyData m_data;
};

class PropertyInstanceIterator : public HostObject<Dpm::IPropertyInstanceIterator>
{
public:
    explicit PropertyInstanceIterator(ModelPointer model) : m_model(std::move(model)) { skip(); }

    void first() override
    {
        m_index = 0;
        skip();
    }
    bool isDone() override { return m_index >= m_model->properties.size(); }
    void next() override
    {
        if (!isDone()) {
            ++m_index;
            skip();
        }
    }
    Dpm::IPropertyInstance *current() override
    {
        return isDone() ? nullptr : new PropertyInstance(fromDesign(m_model->properties.at(m_index)));
    }

private:
    // Properties without a value have no instance.
    void skip()
    {
        while (!isDone() && !m_model->properties.at(m_index).hasValue)
            ++m_index;
    }

    ModelPointer m_model;
    qsizetype m_index = 0;
};

class DefData : public HostObject<Dpm::IDefDataId>
{
public:
    explicit DefData(const ProjectDocument::ProcessProperty &property) : m_property(property) {}

    Port::StringBase getId() override { return String::convert(m_property.id); }
    Dpm::IPropertyTemplate *getPropertyTemplate() override
    {
        return new PropertyTemplate(fromProcess(m_property));
    }

private:
    ProjectDocument::ProcessProperty m_property;
};

class PropertyUITemplate : public HostObject<Dpm::IPropertyUITemplate>
{
public:
    PropertyUITemplate(ModelPointer model, qsizetype index) : m_model(std::move(model)), m_index(index) {}

    bool isExcluded() override { return property().excluded; }
    Port::StringBase getId() override { return String::convert(property().id); }
    CitI::IInterface *getDefData() override
    {
        return static_cast<Dpm::IDefDataId *>(new DefData(property()));
    }

private:
    const ProjectDocument::ProcessProperty &property() const
    {
        return m_model->document.processProperties.at(m_index);
    }

    ModelPointer m_model;
    qsizetype m_index;
};

class PropertyUITemplateIterator : public HostObject<Dpm::IPropertyUITemplateIterator>
{
public:
    PropertyUITemplateIterator(ModelPointer model, std::vector<qsizetype> selection)
        : m_model(std::move(model)), m_selection(std::move(selection))
    {
    }

    void first() override { m_position = 0; }
    bool isDone() override { return m_position >= m_selection.size(); }
    void next() override
    {
        if (!isDone())
            ++m_position;
    }
    Dpm::IPropertyUITemplate *current() override
    {
        return isDone() ? nullptr : new PropertyUITemplate(m_model, m_selection[m_position]);
    }

private:
    ModelPointer m_model;
    std::vector<qsizetype> m_selection; // indexes into the process properties
    std::size_t m_position = 0;
};

// Whether every condition of `property` holds under `filter`.
bool applies(const ProjectDocument::ProcessProperty &property, Dpm::IFilter *filter)
{
    // key -> whether one of its alternatives held
    QHash<QString, bool> keys;
    for (const ProjectDocument::Condition &condition : property.conditions) {
        bool &held = keys[condition.key];
        if (held)
            continue;
        Port::StringBase value;
        held = filter->getValue(String::convert(condition.key), value)
               && String::convert(value).compare(condition.value, Qt::CaseInsensitive) == 0;
    }
    for (auto it = keys.cbegin(); it != keys.cend(); ++it) {
        if (!it.value())
            return false;
    }
    return true;
}

class DataStore
    : public HostObject<Dpm::IDataStore, Dpm::IPropertyTemplateStore, Dpm::IPropertyUITemplateStore>
{
public:
    explicit DataStore(ModelPointer model) : m_model(std::move(model)) {}

    int getPropertyInstances(Dpm::IPropertyInstanceIterator **instances) override
    {
        if (!instances)
            return 0;
        *instances = new PropertyInstanceIterator(m_model);
        return 1;
    }

    int getPropertyTemplate(const Port::StringBase &name, Dpm::IPropertyTemplate **propertyTemplate) override
    {
        if (!propertyTemplate)
            return 0;
        *propertyTemplate = nullptr;
        const QString wanted = String::convert(name);
        for (const ProjectDocument::DesignProperty &property : m_model->properties) {
            if (property.name == wanted) {
                *propertyTemplate = new PropertyTemplate(fromDesign(property));
                return 1;
            }
        }
        for (const ProjectDocument::ProcessProperty &property : m_model->document.processProperties) {
            if (property.name == wanted) {
                *propertyTemplate = new PropertyTemplate(fromProcess(property));
                return 1;
            }
        }
        return 0;
    }

    int getPropertyUITemplates(Dpm::IFilter *filter, Dpm::IPropertyUITemplateIterator **templates) override
    {
        if (!templates)
            return 0;
        *templates = nullptr;
        if (!filter)
            return 0;
        const QList<ProjectDocument::ProcessProperty> &all = m_model->document.processProperties;
        std::vector<qsizetype> selection;
        for (qsizetype i = 0; i < all.size(); ++i) {
            if (applies(all.at(i), filter))
                selection.push_back(i);
        }
        *templates = new PropertyUITemplateIterator(m_model, std::move(selection));
        return 1;
    }

private:
    ModelPointer m_model;
};

class DesignData : public HostObject<Dpm::IDesignData>
{
public:
    explicit DesignData(ModelPointer model) : m_model(std::move(model)) {}

    CitI::IInterface *getDataStore() override
    {
        return static_cast<Dpm::IDataStore *>(new DataStore(m_model));
    }

private:
    ModelPointer m_model;
};

} // namespace

CitI::IInterface *createDesignData(const ModelPointer &model)
{
    return model ? static_cast<Dpm::IDesignData *>(new DesignData(model)) : nullptr;
}

} // namespace OrbProject
