#include "PropItem.h"

#include <QMetaMethod>
#include <QWidget>

namespace Gui {
namespace Clip {

PropItem::PropItem(const QString &name, const QString &title, const QString &subTitle,
                   const char *internalName)
    : m_name(name), m_title(title), m_subTitle(subTitle), m_internalName(internalName)
{
}

PropItem::~PropItem() = default;

void PropItem::setPropPageCreator(QObject *creator, const char *slot)
{
    m_creator = creator;
    // SLOT() prefixes the signature with a code digit.
    m_slot = slot && *slot >= '0' && *slot <= '9' ? QByteArray(slot + 1) : QByteArray(slot);
}

void PropItem::setHelpFileNameAndTopic(const QString &fileName, const QString &topic)
{
    m_helpFile = fileName;
    m_helpTopic = topic;
}

QWidget *PropItem::createPage(QWidget *container)
{
    if (m_page || !m_creator || m_slot.isEmpty())
        return m_page;
    const QMetaObject *mo = m_creator->metaObject();
    int index = mo->indexOfMethod(QMetaObject::normalizedSignature(m_slot.constData()));
    if (index < 0) {
        // The slot text may spell the item type without its namespace; take
        // the two-argument method of that name.
        const QByteArray name = m_slot.left(m_slot.indexOf('('));
        for (int i = mo->methodOffset(); i < mo->methodCount() && index < 0; ++i) {
            if (mo->method(i).name() == name && mo->method(i).parameterCount() == 2)
                index = i;
        }
    }
    const QMetaMethod method = index < 0 ? QMetaMethod() : mo->method(index);
    if (method.parameterCount() != 2)
        return nullptr;
    // Pass the arguments under the type names the slot declares, so that a
    // creator may spell the item type with or without its namespace.
    PropItem *self = this;
    const QList<QByteArray> types = method.parameterTypes();
    const int before = container->findChildren<QWidget *>(QString(), Qt::FindDirectChildrenOnly).size();
    method.invoke(m_creator, Qt::DirectConnection, QGenericArgument(types.at(0).constData(), &container),
                  QGenericArgument(types.at(1).constData(), &self));
    const QList<QWidget *> children =
        container->findChildren<QWidget *>(QString(), Qt::FindDirectChildrenOnly);
    if (children.size() > before)
        m_page = children.last();
    return m_page;
}

} // namespace Clip
} // namespace Gui
