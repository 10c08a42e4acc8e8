#pragma once

#include <QString>
#include <QStringList>

// What CrvC_DataCollectionEmail needs from a platform: the mail programs it
// can offer and each program's command line. The command line holds "%1"
// where the message (composeArgument) goes.
class CrvC_DataCollectionEmailImpl
{
public:
    virtual ~CrvC_DataCollectionEmailImpl();

    // The mail programs to offer, the preferred one first.
    virtual QStringList emailTools() = 0;
    // The text that replaces "%1" in toolCommand(tool).
    virtual QString composeArgument(const QString &tool, const QString &to, const QString &subject,
                                    const QString &body, const QString &file) = 0;
    // The command line of `tool` with "%1"; empty when there is no such program.
    virtual QString toolCommand(const QString &tool) = 0;
};
