#pragma once

#include <QObject>
#include <QProcess>
#include <QString>
#include <QStringList>

#include <memory>

class CrvC_DataCollectionEmailImpl;

// Sends the report through the user's own mail program: composes a message
// to the collection mailbox with the report attached and starts the program.
// This build uses the Unix implementation (CrvC_DataCollectionUnixImpl).
// The program gets its arguments as a list, each one whole. A report path
// that cannot be passed on unchanged is refused with a warning, and a program
// that cannot be started is reported, with the reason, through onProcessError;
// both before send() returns, so the object may be dropped right after.
class CrvC_DataCollectionEmail : public QObject
{
    Q_OBJECT
public:
    static const char *const CollectionMailbox; // the maker's collection address

    CrvC_DataCollectionEmail();
    ~CrvC_DataCollectionEmail() override;

    // The mail programs to offer, the preferred one first.
    QStringList emailTools();

    // Starts `tool` composing a message; returns once it has started
    // (true) or failed (false, reported through onProcessError when the
    // program could not be run).
    bool send(const QString &tool, const QString &to, const QString &subject, const QString &body,
              const QString &file);

    // False for a report path that no mail program could be given
    // unchanged: not absolute, holding a control character (a line break
    // would end a compose field, NUL an argument), or a name that did not
    // decode (U+FFFD).
    static bool canPassFile(const QString &file);

public Q_SLOTS:
    void onProcessError(QProcess::ProcessError error);

private:
    std::unique_ptr<CrvC_DataCollectionEmailImpl> m_impl;
    QString m_tool;       // the program of the last send
    QString m_startError; // why it could not be started
};
