#pragma once

#include "project/CorvidSettings.h"
#include "transmit/SendDispatcher.h"

#include <QStringList>
#include <QVariant>

namespace CorvidTest {

// Records what the send step starts instead of starting it.
class SendRecorder
{
public:
    SendRecorder()
    {
        CrvC_SendDispatcher::setStarter(
            [this](CrvC_SendDispatcher::Method method, const QString &tool, const QString &file) {
                sends << (method == CrvC_SendDispatcher::Method::Upload ? QStringLiteral("upload")
                                                                        : QLatin1String("email ") + tool);
                files << file;
            });
    }
    ~SendRecorder() { CrvC_SendDispatcher::setStarter(nullptr); }
    SendRecorder(const SendRecorder &) = delete;
    SendRecorder &operator=(const SendRecorder &) = delete;

    QStringList sends; // "upload" or "email <tool>"
    QStringList files;
};

// A stored setting, or an invalid QVariant when the key was never written.
inline QVariant stored(const char *key)
{
    return CrvC_Settings::value(key, QVariant());
}

// Stores `value` under `key`; an invalid QVariant stores nothing.
inline void store(const char *key, const QVariant &value)
{
    if (value.isValid())
        CrvC_Settings::setValue(key, value);
}

} // namespace CorvidTest
