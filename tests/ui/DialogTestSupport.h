#pragma once

#include "project/CorvidSettings.h"
#include "transmit/SendDispatcher.h"

#include <QFile>
#include <QStringList>
#include <QVariant>

namespace CorvidTest {

// Records what the send step starts ("upload", "email <tool>") instead of
// starting it.
struct SendRecorder
{
    SendRecorder()
    {
        CrvC_SendDispatcher::setStarter(
            [this](CrvC_SendDispatcher::Method method, const QString &tool, const QString &file) {
                sends << (method == CrvC_SendDispatcher::Method::Upload ? QStringLiteral("upload")
                                                                        : QLatin1String("email ") + tool);
                files << file;
                QFile page(file);
                pages << (page.open(QIODevice::ReadOnly) ? page.readAll() : QByteArray());
            });
    }
    ~SendRecorder() { CrvC_SendDispatcher::setStarter(nullptr); }
    QStringList sends;
    QStringList files;
    QList<QByteArray> pages; // the files' bytes as the send started
};

// A stored setting; invalid when the key was never written.
inline QVariant stored(const char *key)
{
    return CrvC_Settings::value(key, QVariant());
}

// Stores `value`; an invalid one stores nothing.
inline void store(const char *key, const QVariant &value)
{
    if (value.isValid())
        CrvC_Settings::setValue(key, value);
}

} // namespace CorvidTest
