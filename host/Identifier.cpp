#include "Identifier.h"

#include <QUuid>

namespace Port {

QString Identifier::newIdentifier()
{
    return QUuid::createUuid().toString(QUuid::Id128);
}

} // namespace Port
