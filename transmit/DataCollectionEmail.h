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
// A program that cannot be started is reported through onProcessError before
// send() returns, so the object may be dropped right after.
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
    bool send(const QString &tool, const QString &to, const QString &subject,
              const QString &body, const QString &file);

    // The command line `command` with its first "%1" replaced by `argument`
    // ("%1" is matched case-sensitively; a second one stays), split into
    // words. Empty when the command holds no "%1".
    static QStringList commandWords(const QString &command, const QString &argument);

    // Splits a command line into words: a space or tab ends a word; a
    // quotation mark opens a quoted part that keeps spaces and tabs, and its
    // closing mark ends the word. Quotation marks are dropped, empty words
    // skipped, a NUL character ends the text.
    static QStringList splitCommandLine(const QString &command);

public Q_SLOTS:
    void onProcessError(QProcess::ProcessError error);

private:
    std::unique_ptr<CrvC_DataCollectionEmailImpl> m_impl;
};
