#pragma once

#include <QString>

#include <functional>

// The send step's decisions, without widgets: whether a report goes out with
// the remembered method or the send method dialog has to ask first, what that
// dialog's OK stores, and starting the chosen method (the HTTPS upload or the
// user's mail program). The send method dialog and the review dialog are thin
// shells over this.
class CrvC_SendDispatcher
{
public:
    enum class Method { Upload, Email };

    // The choices of the send method dialog: the send method, whether to send
    // automatically from now on, and the mail program.
    struct Choice
    {
        bool useSsl = true;
        bool dontShowAgain = true;
        QString emailTool;
    };

    // Starts `method` for the report `file` (`tool` is the mail program of
    // the e-mail method). The default starts CrvC_SendUsingSSL or
    // CrvC_DataCollectionEmail.
    using Starter = std::function<void(Method method, const QString &tool, const QString &file)>;

    // Replaces how methods are started (tests); an empty function restores
    // the default.
    static void setStarter(Starter starter);

    // Starts the remembered method for `reportFile`: the upload when "UseSSL"
    // is on (also when nothing is stored), otherwise the e-mail through the
    // remembered mail program. False when the e-mail method is chosen and no
    // program is remembered: then nothing is started.
    static bool sendReport(const QString &reportFile);

    // Starts the method of `choice` for `reportFile` and stores nothing: the
    // upload when `useSsl`, otherwise the e-mail through `emailTool`. False
    // when that is empty: then nothing is started.
    static bool send(const Choice &choice, const QString &reportFile);

    // Sends without asking when the user asked for automatic sending
    // ("DontShowSendToDlg") or the upload is the method, and sendReport
    // started something. False means the send method dialog must ask.
    static bool sendWithoutAsking(const QString &reportFile);

    // What the send method dialog starts with: "UseSSL", "DontShowSendToDlg"
    // (true when nothing is stored) and "SelectedEmailTool".
    static Choice storedChoice();

    // What OK stores: "DontShowSendToDlg" always; "UseSSL" and
    // "SelectedEmailTool" only when they differ from what the dialog
    // started with.
    static void storeChoice(const Choice &initial, const Choice &chosen);

    // The e-mail's recipient and subject.
    static QString emailRecipient();
    static QString emailSubject();

    // Where the send step takes a report with the stored settings, and what
    // travels with it: what the user is told before consenting.
    struct Destination
    {
        Method method = Method::Upload;
        bool asks = false;      // the send method dialog asks first
        QString server;         // the maker's server (host name) of the upload
        QString registrationId; // sent beside the page as "regid="
        QString domain;         // sent beside the page as "domain="
        QString mailbox;        // the e-mail's recipient
        QString emailTool;      // the remembered mail program
    };
    static Destination destination();
};
