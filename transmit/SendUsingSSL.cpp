#include "SendUsingSSL.h"

#include "transmit/MakerServer.h"
#include "transmit/ProxyDiscovery.h"
#include "transmit/SendFailure.h"
#include "transmit/UserNotice.h"

#include "host/Env.h"
#include "host/MsgManData.h"
#include "host/Version.h"

#include <QBuffer>
#include <QCoreApplication>
#include <QEventLoopLocker>
#include <QFileInfo>
#include <QRegularExpression>
#include <QTimer>
#include <QUrl>

#include <netdb.h>
#include <sys/socket.h>
#include <unistd.h>

const char *const CrvC_SendUsingSSL::ProgramName = "vancurl";
const char *const CrvC_SendUsingSSL::AccessCode = "v9orn";
const char *const CrvC_SendUsingSSL::RedirectPath =
    "/cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=corvidupload";
const char *const CrvC_SendUsingSSL::CaBundle = "reports/ca-cert-bundle.crt";
const char *const CrvC_SendUsingSSL::SystemCaBundle = "/etc/ssl/certs/ca-certificates.crt";
const char *const CrvC_SendUsingSSL::FailureText = QT_TRANSLATE_NOOP(
    "CrvC_SendUsingSSL",
    "Failed to send data through SSL. Please make sure your proxy settings are correct under "
    "Edit->Preferences->VantorUpdate. If your proxy settings are correct, but you still see this "
    "error, please select an e-mail method to send data instead.");

namespace {

QStringList connectionArguments(const QString &proxy)
{
    QStringList arguments;
    if (!proxy.isEmpty())
        arguments << QStringLiteral("--proxy") << proxy;
    const QString bundle = CrvC_SendUsingSSL::caBundlePath();
    if (!bundle.isEmpty())
        arguments << QStringLiteral("--cacert") << bundle;
    return arguments;
}

// One line for the debug output: line ends folded, long answers cut.
QByteArray forDebug(const QByteArray &text)
{
    QByteArray line = text.trimmed().left(500);
    line.replace('\r', ' ').replace('\n', ' ');
    return line;
}

// A redirect page is a few hundred bytes; a lookup that answers more than
// this is stopped rather than buffered in the host's memory.
const qint64 MaxLookupAnswer = 1024 * 1024;
// Of the upload's answer only the start is kept, for the debug output.
const int MaxUploadAnswer = 4096;

// The HTTP status in vancurl's reason line, 0 when it names none.
int httpStatusIn(const QString &reason)
{
    static const QRegularExpression status(QStringLiteral("\\bHTTP status (\\d{3})\\b"));
    return status.match(reason).captured(1).toInt();
}

std::shared_ptr<QEventLoopLocker> keepApplicationAlive()
{
    if (!QCoreApplication::instance())
        return nullptr;
    return std::make_shared<QEventLoopLocker>();
}

} // namespace

CrvC_SendUsingSSL::CrvC_SendUsingSSL() : QObject(nullptr), m_proxyKnown(false)
{
}

CrvC_SendUsingSSL::CrvC_SendUsingSSL(const QString &proxy) : QObject(nullptr), m_proxy(proxy)
{
}

CrvC_SendUsingSSL::~CrvC_SendUsingSSL() = default;

QString CrvC_SendUsingSSL::caBundlePath()
{
    const QString installed = QString::fromUtf8(Port_Env::GetDataFileName(CaBundle).c_str());
    if (QFileInfo(installed).isFile())
        return installed;
    const QString named = qEnvironmentVariable("SSL_CERT_FILE");
    if (!named.isEmpty() && QFileInfo(named).isFile())
        return named;
    return QFileInfo(QLatin1String(SystemCaBundle)).isFile() ? QString::fromLatin1(SystemCaBundle)
                                                             : QString();
}

QString CrvC_SendUsingSSL::redirectUrl()
{
    // Whatever scheme the server setting names, the lookup is made over
    // https: whoever answers it chooses where the report goes.
    QUrl url(CrvC_MakerServer::baseUrl());
    url.setScheme(QStringLiteral("https"));
    return url.toString(QUrl::RemovePath | QUrl::RemoveQuery | QUrl::RemoveFragment)
           + QLatin1String(RedirectPath);
}

QStringList CrvC_SendUsingSSL::redirectArguments() const
{
    return connectionArguments(m_proxy) << redirectUrl();
}

QStringList CrvC_SendUsingSSL::uploadArguments(const QString &url) const
{
    return connectionArguments(m_proxy)
           << QStringLiteral("-F") << QLatin1String("file_loc=@") + m_reportFile << QStringLiteral("-F")
           << QLatin1String("domain=") + domainName() << QStringLiteral("-F")
           << QLatin1String("regid=") + registrationId() << QStringLiteral("-F")
           << QLatin1String("access=") + QLatin1String(AccessCode) << url;
}

void CrvC_SendUsingSSL::SendFile(const QString &file)
{
    // Recorded before anything is looked up or sent.
    if (!m_ticket)
        m_ticket =
            CrvC_SendRecorder::begin(CrvC_SendHistory::Method::Upload, file, CrvC_MakerServer::baseUrl());
    if (!m_proxyKnown) {
        // The proxy is found in the background (it may take seconds); the
        // send goes on with its answer.
        if (m_discovery)
            return;
        m_keepAlive = keepApplicationAlive();
        m_discovery = new CrvC_ProxyDiscovery(this);
        connect(m_discovery, &CrvC_ProxyDiscovery::finished, this, [this, file](const QString &proxy) {
            m_proxy = proxy;
            m_proxyKnown = true;
            SendFile(file);
        });
        m_discovery->start();
        return;
    }
    if (m_lookupProcess) {
        Port_MsgManData::debugStub("Corvid ERROR: a send is already under way for %s\n",
                                   qUtf8Printable(m_reportFile));
        return;
    }
    m_reportFile = file;
    m_keepAlive = keepApplicationAlive();
    const QStringList arguments = redirectArguments();
    for (const QString &argument : arguments)
        Port_MsgManData::debugStub("Redirect Args: %s\n", qUtf8Printable(argument));

    m_lookupProcess = new QProcess(this);
    connect(m_lookupProcess, &QProcess::finished, this, &CrvC_SendUsingSSL::LaunchSSLProcess);
    connect(m_lookupProcess, &QProcess::errorOccurred, this, [this](QProcess::ProcessError error) {
        // A tool that cannot be started sends no finished signal. Report it
        // once control is back in the event loop, as for a failed lookup.
        if (error == QProcess::FailedToStart)
            QTimer::singleShot(0, this, &CrvC_SendUsingSSL::lookupFailedToStart);
    });
    connect(m_lookupProcess, &QProcess::readyReadStandardOutput, this, [this] {
        if (m_lookupProcess->bytesAvailable() > MaxLookupAnswer
            && m_lookupProcess->state() == QProcess::Running) {
            Port_MsgManData::debugStub("Corvid ERROR: the address lookup answered more than %lld bytes.\n",
                                       static_cast<long long>(MaxLookupAnswer));
            m_lookupProcess->kill(); // finished follows, as a failed lookup
        }
    });
    m_lookupProcess->start(QLatin1String(ProgramName), arguments, QIODevice::ReadWrite);
}

void CrvC_SendUsingSSL::lookupFailedToStart()
{
    if (m_ended)
        return;
    m_ended = true;
    Port_MsgManData::debugStub("Corvid ERROR: cannot start %s: %s\n", ProgramName,
                               qUtf8Printable(m_lookupProcess->errorString()));
    Port_MsgManData::debugStub("Corvid ERROR: Redirected URL is empty.\n");
    CrvC_SendFailure::Run run = lookupRun();
    run.started = false;
    run.reason = m_lookupProcess->errorString();
    reportFailure(m_ticket, run);
    m_lookupProcess->deleteLater();
    deleteLater();
}

void CrvC_SendUsingSSL::LaunchSSLProcess()
{
    if (m_ended || !m_lookupProcess)
        return;
    m_ended = true;
    QString address;
    CrvC_SendFailure::Run run = lookupRun();
    run.exitStatus = exitStatusOf(m_lookupProcess);
    if (run.exitStatus == 0) {
        m_lookupProcess->setReadChannel(QProcess::StandardOutput);
        address = uploadAddress(m_lookupProcess);
    } else {
        // An error page or a half-read answer names no address to trust.
        run.reason = QString::fromUtf8(forDebug(m_lookupProcess->readAllStandardError()));
        Port_MsgManData::debugStub("Corvid ERROR: the address lookup failed (exit status %d): %s\n",
                                   run.exitStatus, qUtf8Printable(run.reason));
    }

    if (address.isEmpty()) {
        Port_MsgManData::debugStub("Corvid ERROR: Redirected URL is empty.\n");
        reportFailure(m_ticket, run);
    } else {
        Port_MsgManData::debugStub("Corvid: SSL process to %s has started.\n", qUtf8Printable(address));
        startUpload(address);
    }
    m_lookupProcess->deleteLater();
    deleteLater();
}

void CrvC_SendUsingSSL::startUpload(const QString &address)
{
    // The upload outlives this object: it owns itself and is released when it
    // ends, holding the application open until then.
    auto *upload = new QProcess;
    const QStringList arguments = uploadArguments(address);
    const auto field = [&arguments](const QString &name) {
        const QString prefix = name + QLatin1Char('=');
        for (const QString &argument : arguments) {
            if (argument.startsWith(prefix))
                return argument.mid(prefix.size());
        }
        return QString();
    };
    CrvC_SendRecorder::uploadStarted(m_ticket, address, field(QStringLiteral("domain")),
                                     field(QStringLiteral("regid")));
    const CrvC_SendRecorder::Ticket ticket = m_ticket;
    CrvC_SendFailure::Run run;
    run.step = CrvC_SendFailure::Step::Upload;
    run.url = address;
    run.proxy = m_proxy;
    std::shared_ptr<QEventLoopLocker> keepAlive = m_keepAlive;
    auto answerStart = std::make_shared<QByteArray>();
    auto keepAnswerStart = [upload, answerStart] {
        const QByteArray chunk = upload->readAllStandardOutput();
        if (answerStart->size() < MaxUploadAnswer)
            answerStart->append(chunk.left(MaxUploadAnswer - answerStart->size()));
    };
    connect(upload, &QProcess::readyReadStandardOutput, upload, keepAnswerStart);
    connect(upload, &QProcess::finished, upload,
            [upload, ticket, run, keepAlive, answerStart, keepAnswerStart] {
                keepAnswerStart();
                const QByteArray answer = forDebug(*answerStart);
                CrvC_SendFailure::Run ended = run;
                ended.exitStatus = exitStatusOf(upload);
                ended.reason = QString::fromUtf8(forDebug(upload->readAllStandardError()));
                Port_MsgManData::debugStub("Corvid: SSL upload ended with exit status %d: %s\n",
                                           ended.exitStatus, answer.constData());
                if (ended.exitStatus == 0) {
                    CrvC_SendRecorder::finish(ticket, CrvC_SendHistory::State::Sent,
                                              QString::fromUtf8(answer), 0);
                } else {
                    Port_MsgManData::debugStub("Corvid ERROR: SSL upload failed: %s\n",
                                               qUtf8Printable(ended.reason));
                    reportFailure(ticket, ended);
                }
                upload->deleteLater();
            });
    connect(upload, &QProcess::errorOccurred, upload,
            [upload, ticket, run, keepAlive](QProcess::ProcessError error) {
                if (error != QProcess::FailedToStart)
                    return; // the finished signal follows
                Port_MsgManData::debugStub("Corvid ERROR: cannot start %s: %s\n", ProgramName,
                                           qUtf8Printable(upload->errorString()));
                CrvC_SendFailure::Run notStarted = run;
                notStarted.started = false;
                notStarted.reason = upload->errorString();
                upload->deleteLater();
                QTimer::singleShot(0, [ticket, notStarted, keepAlive] { reportFailure(ticket, notStarted); });
            });
    upload->start(QLatin1String(ProgramName), arguments, QIODevice::ReadWrite);
}

CrvC_SendFailure::Run CrvC_SendUsingSSL::lookupRun() const
{
    CrvC_SendFailure::Run run;
    run.step = CrvC_SendFailure::Step::Lookup;
    run.url = redirectUrl();
    run.proxy = m_proxy;
    return run;
}

int CrvC_SendUsingSSL::exitStatusOf(const QProcess *process)
{
    return process->exitStatus() == QProcess::NormalExit ? process->exitCode() : -1;
}

void CrvC_SendUsingSSL::reportFailure(const CrvC_SendRecorder::Ticket &ticket,
                                      const CrvC_SendFailure::Run &run)
{
    CrvC_SendRecorder::finish(ticket, CrvC_SendHistory::State::Failed, CrvC_SendFailure::cause(run),
                              run.started ? run.exitStatus : -1, httpStatusIn(run.reason));
    // A retry's failure is in the history and on the status line; only a
    // send the user started gets the warning and the other method offered.
    if (ticket->interactive) {
        CrvC_UserNotice::warning(tr(FailureText), CrvC_SendFailure::details(run, ticket->reportFile));
        CrvC_UserNotice::offerEmail(ticket->reportFile);
    }
}

QString CrvC_SendUsingSSL::uploadAddress(QIODevice *output)
{
    static const QLatin1String marker("URL=http");
    for (QByteArray bytes = output->readLine(); !bytes.isEmpty(); bytes = output->readLine()) {
        const QString line = QString::fromUtf8(bytes);
        const qsizetype p = line.indexOf(marker);
        if (p < 0)
            continue;
        const qsizetype q = line.indexOf(QLatin1Char('"'), p + 3);
        QString address = q < 0 ? line.mid(p + 4) : line.mid(p + 4, q - (p + 4));
        while (address.endsWith(QLatin1Char('\n')) || address.endsWith(QLatin1Char('\r')))
            address.chop(1);
        const QUrl url(address, QUrl::StrictMode);
        if (!url.isValid() || url.scheme() != QLatin1String("https") || url.host().isEmpty()) {
            Port_MsgManData::debugStub("Corvid ERROR: not an https upload address: %s\n",
                                       qUtf8Printable(address));
            return QString();
        }
        return address;
    }
    return QString();
}

QString CrvC_SendUsingSSL::uploadAddress(const QByteArray &output)
{
    QBuffer buffer;
    buffer.setData(output);
    buffer.open(QIODevice::ReadOnly);
    return uploadAddress(&buffer);
}

QString CrvC_SendUsingSSL::domainName()
{
    char name[4096] = {0};
    if (::gethostname(name, sizeof name - 1) != 0 || !name[0])
        return QString();
    QString fqdn = QString::fromLocal8Bit(name);
    if (!fqdn.contains(QLatin1Char('.'))) {
        // The canonical name of the machine's own name, as the resolver
        // configuration gives it (normally /etc/hosts).
        addrinfo hints = {};
        hints.ai_flags = AI_CANONNAME;
        hints.ai_family = AF_UNSPEC;
        hints.ai_socktype = SOCK_STREAM;
        addrinfo *result = nullptr;
        if (::getaddrinfo(name, nullptr, &hints, &result) == 0 && result) {
            if (result->ai_canonname && result->ai_canonname[0])
                fqdn = QString::fromLocal8Bit(result->ai_canonname);
            ::freeaddrinfo(result);
        }
    }
    if (fqdn.endsWith(QLatin1Char('.')))
        fqdn.chop(1);
    return lastTwoLabels(fqdn);
}

QString CrvC_SendUsingSSL::lastTwoLabels(const QString &name)
{
    int dots = 0;
    for (qsizetype i = name.size() - 1; i >= 0; --i) {
        if (name.at(i) == QLatin1Char('.') && ++dots == 2)
            return name.mid(i + 1);
    }
    return name;
}

QString CrvC_SendUsingSSL::registrationId()
{
    const Port::StringBase text = Port::UserInformation::getRegistrationText();
    if (!text.IsEmpty() && text.Compare(Port::UserInformation::NoInformationText, true) != 0)
        return QString::fromUtf8(text.c_str());
    return QString::fromUtf8(Port::Version::getValue("Registration_ID").c_str());
}
