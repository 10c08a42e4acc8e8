#include "RegSection.h"

#include "host/String.h"

#include <algorithm>

using Gui::Clip::String;

namespace Prjrep {

RegSection::RegSection(std::shared_ptr<RepositoryStore> store, qint64 id, const Port::StringBase &name,
                       int mode)
    : m_store(std::move(store)), m_id(id), m_name(name), m_mode(mode)
{
}

RegSection::~RegSection() = default;

CitI::IInterface *RegSection::GetInterface(const Port::XUID &iid)
{
    return iid == IRegSection::iid() ? this : nullptr;
}

Port::StringBase RegSection::getName()
{
    return m_name;
}

int RegSection::checkMode(int mode, bool storeWritable)
{
    if (!(mode & (ModeRead | ModeWrite)))
        return StatusDenied;
    if ((mode & ModeCreate) && !(mode & ModeWrite))
        return StatusDenied;
    if ((mode & ModeWrite) && !storeWritable)
        return StatusDenied;
    return StatusOk;
}

int RegSection::openSubSection(const Port::StringBase &name, int mode, IRegSection **subSection)
{
    if (!subSection)
        return StatusFailed;
    *subSection = nullptr;
    if (name.IsEmpty())
        return StatusFailed;
    if ((mode & ModeWrite) && !(m_mode & ModeWrite))
        return StatusDenied;
    int status = checkMode(mode, m_store->writable());
    if (status != StatusOk)
        return status;
    qint64 id = 0;
    status = m_store->findSection(m_id, String::convert(name), mode & ModeCreate, &id);
    if (status != StatusOk)
        return status;
    m_subSections.push_back(std::make_unique<RegSection>(m_store, id, name, mode));
    *subSection = m_subSections.back().get();
    return StatusOk;
}

void RegSection::releaseSubSection(IRegSection *subSection)
{
    const auto it = std::find_if(m_subSections.begin(), m_subSections.end(),
                                 [subSection](const auto &s) { return s.get() == subSection; });
    if (it != m_subSections.end())
        m_subSections.erase(it);
}

int RegSection::getValue(const Port::StringBase &key, Port::StringBase &value)
{
    value = Port::StringBase();
    if (!(m_mode & ModeRead))
        return StatusDenied;
    QString text;
    const int status = m_store->value(m_id, String::convert(key), &text);
    if (status == StatusOk)
        value = String::convert(text);
    return status;
}

int RegSection::setValue(const Port::StringBase &key, const Port::StringBase &value)
{
    return write(key, value, RepositoryStore::Replace, QString());
}

int RegSection::replaceValue(const Port::StringBase &key, const Port::StringBase *expected,
                             const Port::StringBase &value)
{
    if (!expected)
        return write(key, value, RepositoryStore::IfAbsent, QString());
    return write(key, value, RepositoryStore::IfEqual, String::convert(*expected));
}

int RegSection::write(const Port::StringBase &key, const Port::StringBase &value,
                      RepositoryStore::Condition condition, const QString &expected)
{
    if (!(m_mode & ModeWrite))
        return StatusDenied;
    if (key.IsEmpty())
        return StatusFailed;
    return m_store->setValue(m_id, String::convert(key), String::convert(value), condition, expected);
}

} // namespace Prjrep
