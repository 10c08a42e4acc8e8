// corvid-receiver: answers the redirect lookup and stores uploaded usage
// reports, over HTTPS. See docs/receiver.md for the storage layout.

#include "ReceiverServer.h"
#include "ReceiverText.h"
#include "UploadForm.h"
#include "UploadStore.h"

#include "backend/Ingest.h"

#include <httplib.h>

#include <pthread.h>
#include <signal.h>
#include <sys/stat.h>

#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <mutex>
#include <string>
#include <thread>

namespace {

const char accessCode[] = "v9orn";
const char redirectPath[] = "/cgi-bin/SW_Docs_Redirect/sw_docs_redirect";
const char redirectTopic[] = "corvidupload";

const char usage[] =
    "Usage: corvid-receiver --listen ADDRESS --port PORT --data DIR --cert FILE --key FILE\n"
    "                       [--max-bytes N] [--threads N] [--timeout S] [--no-redirect]\n"
    "                       [--moved URL] [--ingest URL]\n"
    "\n"
    "Serves, over HTTPS, the redirect page that names the upload address and the\n"
    "upload form that Corvid posts its usage reports to, and stores every accepted\n"
    "report under DIR.\n"
    "\n"
    "  --listen ADDRESS  Address to listen on, e.g. 127.0.0.1.\n"
    "  --port PORT       Port to listen on; 0 takes a free port.\n"
    "  --data DIR        Where reports are stored (created when missing): one new\n"
    "                    numbered folder per upload, never overwriting an earlier one.\n"
    "  --cert FILE       The server certificate (PEM), with any intermediates.\n"
    "  --key FILE        Its private key (PEM).\n"
    "  --max-bytes N     Largest request body accepted, as sent (chunk framing\n"
    "                    included; default 67108864, 64 MiB).\n"
    "  --threads N       Connections served at the same time (default 8, at most\n"
    "                    256); when more wait, the slowest are dropped first.\n"
    "  --timeout S       Seconds for the TLS handshake, request line and headers\n"
    "                    together, and longest wait for the client within a request\n"
    "                    (default 10, 1 to 3600).\n"
    "  --no-redirect     The redirect page names no upload address (to try out a\n"
    "                    client's failure path).\n"
    "  --moved URL       POST /upload answers 307 with Location: URL and stores\n"
    "                    nothing (to try out a client's failure path).\n"
    "  --ingest URL      After storing an upload, read it into the database URL\n"
    "                    (see corvid-ingest --help); when that fails the upload stays\n"
    "                    stored for a later corvid-ingest run.\n"
    "  -h, --help        Show this text.\n"
    "\n"
    "The first line on standard output is \"listening on https://ADDRESS:PORT\"; then\n"
    "one line per request follows. SIGINT or SIGTERM stops the server at once; an\n"
    "upload that is being stored is finished first, others are dropped.\n"
    "\n"
    "GET  /cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=corvidupload\n"
    "     an HTML page with a line holding URL=https://ADDRESS:PORT/upload\"\n"
    "POST /upload\n"
    "     a multipart form with the fields file_loc (the report, as a file), domain,\n"
    "     regid and access. Refused with a 4xx status, storing nothing, when the\n"
    "     access code is wrong or missing (403), the file is missing (400), the\n"
    "     body has no Content-Length and is not chunked (411) or is larger than\n"
    "     --max-bytes (413).\n"
    "Every request: at most 100 header lines (431) and 65536 bytes of request line\n"
    "and headers; a body only on POST /upload (404 elsewhere), sent at 8 KiB/s or\n"
    "more on average after the first --timeout seconds.\n"
    "\n"
    "Exit status: 0 after a clean stop, 1 on bad arguments or when the server cannot\n"
    "start.\n";

int fail(const std::string &reason)
{
    std::fprintf(stderr, "corvid-receiver: %s\n", reason.c_str());
    return 1;
}

// The Host header when it looks like a host name or address with a port, so
// that the upload address matches the name the client trusts.
std::string hostForPage(const httplib::Request &request, const std::string &fallback)
{
    const std::string host = request.get_header_value("Host");
    if (host.empty() || host.size() > 255)
        return fallback;
    for (char c : host)
        if (!std::isalnum(static_cast<unsigned char>(c)) && !std::strchr(".-:[]", c))
            return fallback;
    return host;
}

// A refusal or an error: status and a one-line text.
void answer(httplib::Response &response, int status, const std::string &text)
{
    response.status = status;
    response.set_content(text, "text/plain");
}

// Reads, checks and stores one upload form.
// Where stored uploads are read into the back end's database; empty: nowhere.
struct IngestTarget
{
    std::string url;
    std::string dataDir;
};

void receiveUpload(UploadStore &store, size_t maxBytes, const IngestTarget &ingest,
                   const httplib::Request &request, httplib::Response &response,
                   const httplib::ContentReader &reader)
{
    if (!request.is_multipart_form_data())
        return answer(response, 400, "refused: not a multipart form\n");
    UploadForm form(store, accessCode);
    const bool read = reader(
        [&form](const httplib::MultipartFormData &part) { return form.beginPart(part.name, part.filename); },
        [&form](const char *data, size_t size) { return form.addData(data, size); });
    const bool overLimit = !read && ReceiverServer::bodyOverLimit();
    ReceiverServer::bodyRead();
    if (overLimit)
        return answer(response, 413,
                      "refused: the request body is larger than " + std::to_string(maxBytes) + " bytes\n");
    if (!form.finish(read))
        return answer(response, form.refusalStatus(), form.refusalText());
    const unsigned number = form.store(request.remote_addr);
    if (!number)
        return answer(response, form.refusalStatus(), form.refusalText());
    if (!ingest.url.empty()) {
        // One ingest at a time: the workers would only wait for each other's
        // transactions in the database.
        static std::mutex ingesting;
        const std::lock_guard<std::mutex> lock(ingesting);
        std::printf("%s\n", CrvB_Ingest::receiverIngest(ingest.url, ingest.dataDir, number).c_str());
        std::fflush(stdout);
    }
    response.set_content("Thank you: report " + std::to_string(number) + " received.\n", "text/plain");
}

// A whole number from `min` to `max` in `text`, or -1.
long long numberArgument(const std::string &text, long long min, long long max)
{
    char *end = nullptr;
    errno = 0;
    const long long value = std::strtoll(text.c_str(), &end, 10);
    return text.empty() || !std::isdigit(static_cast<unsigned char>(text[0])) || *end || errno || value < min
                   || value > max
               ? -1
               : value;
}

} // namespace

int main(int argc, char **argv)
{
    std::string address, dataDir, certFile, keyFile, movedTo, ingestUrl;
    long long port = -1;
    ReceiverServer::Limits limits;
    bool redirect = true;
    for (int i = 1; i < argc; ++i) {
        const std::string arg = argv[i];
        if (arg == "-h" || arg == "--help") {
            std::fputs(usage, stdout);
            return 0;
        }
        if (arg == "--no-redirect") {
            redirect = false;
            continue;
        }
        if (i + 1 >= argc)
            return fail("unknown argument or missing value: \"" + arg + "\" (see --help)");
        const std::string value = argv[++i];
        if (arg == "--listen") {
            address = value;
        } else if (arg == "--port") {
            if ((port = numberArgument(value, 0, 65535)) < 0)
                return fail("--port needs a number from 0 to 65535");
        } else if (arg == "--data") {
            dataDir = value;
        } else if (arg == "--cert") {
            certFile = value;
        } else if (arg == "--key") {
            keyFile = value;
        } else if (arg == "--ingest") {
            ingestUrl = value;
        } else if (arg == "--max-bytes") {
            const long long bytes = numberArgument(value, 1, 1ll << 50);
            if (bytes < 0)
                return fail("--max-bytes needs a positive number");
            limits.maxBodyBytes = size_t(bytes);
        } else if (arg == "--moved") {
            movedTo = value;
        } else if (arg == "--threads") {
            const long long threads = numberArgument(value, 1, 256);
            if (threads < 0)
                return fail("--threads needs a number from 1 to 256");
            limits.workers = size_t(threads);
        } else if (arg == "--timeout") {
            const long long seconds = numberArgument(value, 1, 3600);
            if (seconds < 0)
                return fail("--timeout needs a number of seconds from 1 to 3600");
            limits.timeout = std::chrono::seconds(seconds);
        } else {
            return fail("unknown argument \"" + arg + "\" (see --help)");
        }
    }
    if (address.empty() || port < 0 || dataDir.empty() || certFile.empty() || keyFile.empty())
        return fail("--listen, --port, --data, --cert and --key are required (see --help)");
    ::mkdir(dataDir.c_str(), 0755);
    struct stat info;
    if (::stat(dataDir.c_str(), &info) != 0 || !S_ISDIR(info.st_mode))
        return fail("cannot use the data folder \"" + dataDir + "\"");

    // SIGINT and SIGTERM are taken by one thread with sigwait; every other
    // thread inherits the blocked mask.
    sigset_t stopSignals;
    sigemptyset(&stopSignals);
    sigaddset(&stopSignals, SIGINT);
    sigaddset(&stopSignals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &stopSignals, nullptr);
    ::signal(SIGPIPE, SIG_IGN);

    ReceiverServer server(certFile, keyFile, "/upload", limits);
    if (!server.is_valid())
        return fail("cannot load the certificate \"" + certFile + "\" or the key \"" + keyFile + "\"");

    const int boundPort = port == 0 ? server.bind_to_any_port(address)
                                    : (server.bind_to_port(address, int(port)) ? int(port) : -1);
    if (boundPort <= 0)
        return fail("cannot listen on " + address + " port " + std::to_string(port));
    const std::string authority = (address.find(':') != std::string::npos ? "[" + address + "]" : address)
                                  + ":" + std::to_string(boundPort);

    UploadStore store(dataDir);
    const IngestTarget ingest{ingestUrl, dataDir};
    server.Get(redirectPath, [&](const httplib::Request &request, httplib::Response &response) {
        if (request.get_param_value("topic") != redirectTopic)
            return answer(response, 404, "unknown topic\n");
        std::string page = "<html>\n<head>\n";
        if (redirect)
            page += "<meta http-equiv=\"refresh\" content=\"0; URL=https://" + hostForPage(request, authority)
                    + "/upload\"><title>Moved</title>\n";
        page += "</head>\n<body>\n<p>The upload service has moved.</p>\n</body>\n</html>\n";
        response.set_content(page, "text/html");
    });
    server.Post("/upload", [&](const httplib::Request &request, httplib::Response &response,
                               const httplib::ContentReader &reader) {
        if (movedTo.empty())
            return receiveUpload(store, limits.maxBodyBytes, ingest, request, response, reader);
        response.set_redirect(movedTo, 307);
        response.set_content("moved\n", "text/plain");
    });
    server.set_logger([](const httplib::Request &request, const httplib::Response &response) {
        using ReceiverText::escaped;
        const std::string length = request.get_header_value("Content-Length");
        std::printf("%s %s %s %s %d %s\n", ReceiverText::utcNow().c_str(), request.remote_addr.c_str(),
                    escaped(request.method).c_str(), escaped(request.path).c_str(), response.status,
                    length.empty() ? "0" : escaped(length).c_str());
        std::fflush(stdout);
    });

    std::thread signalWaiter([&server, stopSignals] {
        int signal = 0;
        sigwait(&stopSignals, &signal);
        server.stop();
    });
    signalWaiter.detach();

    std::printf("listening on https://%s\n", authority.c_str());
    std::fflush(stdout);
    const bool clean = server.listen_after_bind();
    std::printf("stopped\n");
    std::fflush(stdout);
    return clean ? 0 : 1;
}
