// corvid-receiver: answers the redirect lookup and stores uploaded usage
// reports, over HTTPS. See docs/receiver.md for the storage layout.

#include "backend/Ingest.h"

#include <httplib.h>

#include <errno.h>
#include <pthread.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fstream>
#include <mutex>
#include <string>
#include <thread>

namespace {

const char accessCode[] = "v9orn";
const char redirectPath[] = "/cgi-bin/SW_Docs_Redirect/sw_docs_redirect";
const char redirectTopic[] = "corvidupload";

const char usage[] =
    "Usage: corvid-receiver --listen ADDRESS --port PORT --data DIR --cert FILE --key FILE\n"
    "                       [--max-bytes N] [--no-redirect] [--ingest URL]\n"
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
    "  --max-bytes N     Largest request body accepted (default 67108864, 64 MiB).\n"
    "  --no-redirect     The redirect page names no upload address (to try out a\n"
    "                    client's failure path).\n"
    "  --ingest URL      After storing an upload, read it into the database URL\n"
    "                    (see corvid-ingest --help); when that fails the upload stays\n"
    "                    stored for a later corvid-ingest run.\n"
    "  -h, --help        Show this text.\n"
    "\n"
    "The first line on standard output is \"listening on https://ADDRESS:PORT\"; then\n"
    "one line per request follows. SIGINT or SIGTERM stops the server cleanly.\n"
    "\n"
    "GET  /cgi-bin/SW_Docs_Redirect/sw_docs_redirect?topic=corvidupload\n"
    "     an HTML page with a line holding URL=https://ADDRESS:PORT/upload\"\n"
    "POST /upload\n"
    "     a multipart form with the fields file_loc (the report, as a file), domain,\n"
    "     regid and access. Refused with a 4xx status, storing nothing, when the\n"
    "     access code is wrong or missing (403), the file is missing (400) or the\n"
    "     body is larger than --max-bytes (413).\n"
    "\n"
    "Exit status: 0 after a clean stop, 1 on bad arguments or when the server cannot\n"
    "start.\n";

int fail(const std::string &reason)
{
    std::fprintf(stderr, "corvid-receiver: %s\n", reason.c_str());
    return 1;
}

std::string utcNow()
{
    char text[32];
    const std::time_t now = std::time(nullptr);
    std::tm parts;
    gmtime_r(&now, &parts);
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts);
    return text;
}

// Field values go one per line into fields.txt: "%", control characters and
// bytes above 0x7e are written as %XX so that a value cannot break the layout.
std::string escaped(const std::string &value)
{
    static const char hex[] = "0123456789ABCDEF";
    std::string out;
    for (unsigned char c : value) {
        if (c < 0x20 || c > 0x7e || c == '%') {
            out += '%';
            out += hex[c >> 4];
            out += hex[c & 15];
        } else {
            out += char(c);
        }
    }
    return out;
}

// The sender's file name, reduced to a harmless base name.
std::string safeFileName(const std::string &name)
{
    std::string base = name.substr(name.find_last_of("/\\") == std::string::npos
                                       ? 0
                                       : name.find_last_of("/\\") + 1);
    std::string out;
    for (char c : base)
        out += (std::isalnum(static_cast<unsigned char>(c)) || c == '.' || c == '_' || c == '-') ? c : '_';
    while (!out.empty() && out[0] == '.')
        out.erase(0, 1);
    if (out.empty() || out.size() > 200)
        out = "report";
    return out;
}

bool writeWhole(const std::string &path, const std::string &data)
{
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out.write(data.data(), std::streamsize(data.size()));
    out.close();
    return !out.fail();
}

void removeFolder(const std::string &folder, const std::string &fileName)
{
    ::unlink((folder + "/" + fileName).c_str());
    ::unlink((folder + "/fields.txt").c_str());
    ::rmdir(folder.c_str());
}

class Store
{
public:
    explicit Store(std::string dir) : m_dir(std::move(dir)) {}

    // Stores one upload in a new numbered folder; returns the folder's
    // number, or 0 when it could not be stored (then nothing is left behind).
    unsigned store(const httplib::MultipartFormData &file, const std::string &fields)
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        // mkdir fails on an existing folder, so an earlier upload (also one of
        // another receiver on the same DIR) is never overwritten.
        for (int attempts = 0; attempts < 100000; ++attempts) {
            const unsigned number = ++m_last;
            char name[16];
            std::snprintf(name, sizeof name, "%06u", number);
            const std::string folder = m_dir + "/" + name;
            if (::mkdir(folder.c_str(), 0755) != 0) {
                if (errno == EEXIST)
                    continue;
                return 0;
            }
            const std::string fileName = safeFileName(file.filename);
            if (!writeWhole(folder + "/" + fileName, file.content)
                || !writeWhole(folder + "/fields.txt", fields + "stored_as=" + fileName + "\n")) {
                removeFolder(folder, fileName);
                return 0;
            }
            return number;
        }
        return 0;
    }

private:
    std::string m_dir;
    std::mutex m_mutex;
    unsigned m_last = 0;
};

std::string field(const httplib::Request &request, const char *name)
{
    return request.has_file(name) ? request.get_file_value(name).content : std::string();
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

} // namespace

int main(int argc, char **argv)
{
    std::string address, dataDir, certFile, keyFile, ingestUrl;
    long port = -1;
    unsigned long long maxBytes = 64ull * 1024 * 1024;
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
        char *end = nullptr;
        if (arg == "--listen") {
            address = value;
        } else if (arg == "--port") {
            port = std::strtol(value.c_str(), &end, 10);
            if (value.empty() || *end || port < 0 || port > 65535)
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
            maxBytes = std::strtoull(value.c_str(), &end, 10);
            if (value.empty() || value[0] == '-' || *end || maxBytes == 0)
                return fail("--max-bytes needs a positive number");
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

    httplib::SSLServer server(certFile.c_str(), keyFile.c_str());
    if (!server.is_valid())
        return fail("cannot load the certificate \"" + certFile + "\" or the key \"" + keyFile + "\"");
    server.set_payload_max_length(size_t(maxBytes));

    const int boundPort = port == 0 ? server.bind_to_any_port(address)
                                    : (server.bind_to_port(address, int(port)) ? int(port) : -1);
    if (boundPort <= 0)
        return fail("cannot listen on " + address + " port " + std::to_string(port));
    const std::string authority =
        (address.find(':') != std::string::npos ? "[" + address + "]" : address) + ":"
        + std::to_string(boundPort);

    Store store(dataDir);
    server.Get(redirectPath, [&](const httplib::Request &request, httplib::Response &response) {
        if (request.get_param_value("topic") != redirectTopic) {
            response.status = 404;
            response.set_content("unknown topic\n", "text/plain");
            return;
        }
        std::string page = "<html>\n<head>\n";
        if (redirect)
            page += "<meta http-equiv=\"refresh\" content=\"0; URL=https://" + hostForPage(request, authority)
                    + "/upload\"><title>Moved</title>\n";
        page += "</head>\n<body>\n<p>The upload service has moved.</p>\n</body>\n</html>\n";
        response.set_content(page, "text/html");
    });
    server.Post("/upload", [&](const httplib::Request &request, httplib::Response &response) {
        if (!request.is_multipart_form_data()) {
            response.status = 400;
            response.set_content("refused: not a multipart form\n", "text/plain");
            return;
        }
        if (field(request, "access") != accessCode) {
            response.status = 403;
            response.set_content("refused: wrong access code\n", "text/plain");
            return;
        }
        if (!request.has_file("file_loc") || request.get_file_value("file_loc").filename.empty()) {
            response.status = 400;
            response.set_content("refused: no file in field file_loc\n", "text/plain");
            return;
        }
        const httplib::MultipartFormData file = request.get_file_value("file_loc");
        const std::string fields = "received=" + utcNow() + "\nremote=" + escaped(request.remote_addr)
                                   + "\nfile_loc=" + escaped(file.filename) + "\nsize="
                                   + std::to_string(file.content.size()) + "\ndomain="
                                   + escaped(field(request, "domain")) + "\nregid="
                                   + escaped(field(request, "regid")) + "\naccess="
                                   + escaped(field(request, "access")) + "\n";
        const unsigned number = store.store(file, fields);
        if (!number) {
            response.status = 500;
            response.set_content("error: the report could not be stored\n", "text/plain");
            return;
        }
        if (!ingestUrl.empty())
            std::printf("%s\n", CrvB_Ingest::receiverIngest(ingestUrl, dataDir, number).c_str());
        response.set_content("Thank you: report " + std::to_string(number) + " received.\n", "text/plain");
    });
    server.set_logger([](const httplib::Request &request, const httplib::Response &response) {
        const std::string length = request.get_header_value("Content-Length");
        std::printf("%s %s %s %s %d %s\n", utcNow().c_str(), request.remote_addr.c_str(),
                    request.method.c_str(), escaped(request.path).c_str(), response.status,
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
