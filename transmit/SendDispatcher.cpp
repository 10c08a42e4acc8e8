#include "SendDispatcher.h"

#include "DataCollectionEmail.h"
#include "MakerServer.h"
#include "SendRecorder.h"
#include "SendUsingSSL.h"
#include "project/CorvidSettings.h"

#include <QCoreApplication>
#include <QVariant>

namespace {

CrvC_SendDispatcher::Starter &starter()
{
    static CrvC_SendDispatcher::Starter hook;
    return hook;
}

void startMethod(CrvC_SendDispatcher::Method method, const QString &tool, const QString &file)
{
    if (starter()) {
        starter()(method, tool, file);
        return;
    }
    if (method == CrvC_SendDispatcher::Method::Upload) {
        // The upload deletes itself once its work is under way.
        (new CrvC_SendUsingSSL())->SendFile(file);
        return;
    }
    // send() returns once the program has started or its failure has been
    // shown; the program runs on by itself.
    const QString mailbox = CrvC_SendDispatcher::emailRecipient();
    const CrvC_SendRecorder::Ticket ticket =
        CrvC_SendRecorder::begin(CrvC_SendHistory::Method::Email, file, mailbox);
    CrvC_DataCollectionEmail email;
    if (email.send(tool, mailbox, CrvC_SendDispatcher::emailSubject(), QString(), file))
        CrvC_SendRecorder::finish(ticket, CrvC_SendHistory::State::Handed, tool);
    else
        CrvC_SendRecorder::finish(
            ticket, CrvC_SendHistory::State::Failed,
            CrvC_DataCollectionEmail::canPassFile(file)
                ? QCoreApplication::translate("CrvC_SendDispatcher",
                                              "the mail program %1 could not be started")
                      .arg(tool)
                : QCoreApplication::translate("CrvC_SendDispatcher",
                                              "its path cannot be passed to a mail program"));
}

} // namespace

void CrvC_SendDispatcher::setStarter(Starter hook)
{
    starter() = std::move(hook);
}

QString CrvC_SendDispatcher::emailRecipient()
{
    return QString::fromLatin1(CrvC_DataCollectionEmail::CollectionMailbox);
}

QString CrvC_SendDispatcher::emailSubject()
{
    return QStringLiteral("Corvid");
}

bool CrvC_SendDispatcher::sendReport(const QString &reportFile)
{
    return send(storedChoice(), reportFile);
}

bool CrvC_SendDispatcher::send(const Choice &choice, const QString &reportFile)
{
    if (choice.useSsl) {
        startMethod(Method::Upload, QString(), reportFile);
        return true;
    }
    if (choice.emailTool.isEmpty())
        return false;
    startMethod(Method::Email, choice.emailTool, reportFile);
    return true;
}

bool CrvC_SendDispatcher::sendWithoutAsking(const QString &reportFile)
{
    return (CrvC_Settings::dontShowSendToDlg() || CrvC_Settings::useSsl()) && sendReport(reportFile);
}

CrvC_SendDispatcher::Choice CrvC_SendDispatcher::storedChoice()
{
    Choice choice;
    choice.useSsl = CrvC_Settings::useSsl();
    choice.dontShowAgain = CrvC_Settings::dontShowSendToDlg(true);
    choice.emailTool = CrvC_Settings::selectedEmailTool();
    return choice;
}

void CrvC_SendDispatcher::storeChoice(const Choice &initial, const Choice &chosen)
{
    if (chosen.useSsl != initial.useSsl)
        CrvC_Settings::setValue(CrvC_Settings::UseSSL, chosen.useSsl);
    CrvC_Settings::setValue(CrvC_Settings::DontShowSendToDlg, chosen.dontShowAgain);
    if (chosen.emailTool != initial.emailTool)
        CrvC_Settings::setValue(CrvC_Settings::SelectedEmailTool, chosen.emailTool);
}

CrvC_SendDispatcher::Destination CrvC_SendDispatcher::destination()
{
    // The same decisions and values as sendWithoutAsking and the upload's
    // form fields.
    Destination to;
    const bool useSsl = CrvC_Settings::useSsl();
    to.emailTool = CrvC_Settings::selectedEmailTool();
    to.method = useSsl ? Method::Upload : Method::Email;
    to.asks = !useSsl && (!CrvC_Settings::dontShowSendToDlg() || to.emailTool.isEmpty());
    to.server = CrvC_MakerServer::host();
    to.registrationId = CrvC_SendUsingSSL::registrationId();
    to.domain = CrvC_SendUsingSSL::domainName();
    to.mailbox = emailRecipient();
    return to;
}
