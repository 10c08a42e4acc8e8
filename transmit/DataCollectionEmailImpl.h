#pragma once

#include <QString>
#include <QStringList>

// What CrvC_DataCollectionEmail needs from a platform: the mail programs it
// can offer and, for one of them, the arguments that compose a message.
class CrvC_DataCollectionEmailImpl
{
public:
    virtual ~CrvC_DataCollectionEmailImpl();

    // The mail programs to offer, the preferred one first.
    virtual QStringList emailTools() = 0;
    // The arguments that make `tool` compose a message to `to` with `subject`
    // and `body`, the file `file` attached. Each entry is one argument as the
    // program receives it: nothing is split or unquoted on the way. Empty
    // when a value cannot be handed to `tool` unchanged.
    virtual QStringList composeArguments(const QString &tool, const QString &to, const QString &subject,
                                         const QString &body, const QString &file) = 0;
};
