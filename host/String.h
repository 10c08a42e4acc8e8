#pragma once

#include "StringBase.h"

#include <QString>

namespace Gui {
namespace Clip {

// Conversion between the host string (UTF-8 bytes) and QString.
class String
{
public:
    static QString convert(const Port::StringBase &s)
    {
        return QString::fromUtf8(s.c_str(), qsizetype(s.Length()));
    }
    static Port::StringBase convert(const QString &s) { return Port::StringBase(s.toStdString()); }
};

} // namespace Clip
} // namespace Gui
