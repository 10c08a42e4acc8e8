#pragma once

#include <QObject>
#include <QProcess>
#include <QString>
#include <QStringList>

// Sends the report through the user's own mail program: composes a message
// to the collection mailbox with the report attached and starts the program.
class CrvC_DataCollectionEmail : public QObject
{
    Q_OBJECT
public:
    static const char *const CollectionMailbox; // the maker's collection address

    CrvC_DataCollectionEmail();

    // The mail programs to offer, the preferred one first.
    QStringList emailTools();

    // Starts `tool` composing a message; returns at once.
    void send(const QString &tool, const QString &to, const QString &subject,
              const QString &body, const QString &file);

public Q_SLOTS:
    void onProcessError(QProcess::ProcessError error);
};
