// vancurl: fetches a URL or posts one multipart form, over libcurl. Corvid
// runs it as a child process, so the host never links a network library.
// Whether a proxy is used, and which, is decided by the caller alone: the
// proxy environment variables are ignored.

#include <curl/curl.h>

#include <sys/stat.h>

#include <chrono>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

namespace {

enum ExitStatus {
    Success = 0,
    UsageError = 2,
    UploadFileError = 3, // a "-F name=@FILE" names no readable file
    ConnectionError = 4, // name lookup, proxy, connection, time-out
    TlsError = 5,        // certificate or TLS handshake
    HttpError = 6,       // the server answered with a status of 400 or more
    TransferError = 7,   // anything else (including a failed write of the answer)
    RedirectError = 8,   // the server answered with a redirection (3xx), not followed
    TimeLimitError = 9,  // the whole transfer took longer than its time limit
};

// The whole transfer ends within BaseSeconds plus one second per BytesPerSecond
// of the files it uploads, however slowly the server answers.
const long BaseSeconds = 120;
const long long BytesPerSecond = 100000;

// Only this field may name a file ("@FILE"); every other value is text.
const char fileField[] = "file_loc";

const char usage[] =
    "Usage: vancurl [--proxy HOST:PORT] [--cacert FILE] [-F NAME=VALUE]... URL\n"
    "\n"
    "Without -F, fetches URL (GET) and writes the body to standard output.\n"
    "With -F, posts one multipart form with the given fields, in the given order,\n"
    "and writes the answer to standard output.\n"
    "\n"
    "  --proxy HOST:PORT  Connect through this proxy. Without it the connection is\n"
    "                     direct: the proxy environment variables (http_proxy,\n"
    "                     https_proxy, all_proxy, no_proxy, ...) are ignored.\n"
    "  --cacert FILE      Check the server's certificate against the certificate\n"
    "                     authorities in FILE (PEM) instead of the system's.\n"
    "  -F NAME=VALUE      A form field; VALUE is sent as it is, as text, whatever\n"
    "                     its first character (\"@\" and \"<\" included). May be\n"
    "                     given any number of times.\n"
    "  -F file_loc=@FILE  The one field that names a file: the content of FILE is\n"
    "                     sent as a file upload (its base name as the file name).\n"
    "                     Without the \"@\", file_loc is text like any other field.\n"
    "  --version          Show the versions of vancurl and of its libcurl.\n"
    "  -h, --help         Show this text.\n"
    "\n"
    "Options may come in any order; URL (http:// or https://) comes last.\n"
    "TLS certificates and host names are always verified. Redirections are not\n"
    "followed: an answer with a 3xx status is a failure. The tool gives up when no\n"
    "connection is made within 30 s, when the transfer stalls (less than 1 byte/s)\n"
    "for 60 s, and when the whole transfer takes longer than 120 s plus 1 s for\n"
    "every 100 KB (100000 bytes) of the file uploaded.\n"
    "\n"
    "Exit status:\n"
    "  0  the transfer completed with an HTTP status below 300\n"
    "  2  usage error\n"
    "  3  the file named by -F file_loc=@FILE cannot be read\n"
    "  4  connection failure (name lookup, proxy, refused, no connection within\n"
    "     30 s, transfer stalled for 60 s)\n"
    "  5  TLS failure (certificate not trusted, handshake failed, CA file unusable)\n"
    "  6  the server answered with an HTTP status of 400 or more\n"
    "  7  other transfer failure\n"
    "  8  the server answered with a redirection (HTTP status 300 to 399)\n"
    "  9  the whole transfer took longer than its time limit\n"
    "On failure a one-line reason goes to standard error and nothing to standard\n"
    "output.\n";

int fail(int status, const std::string &reason)
{
    std::fprintf(stderr, "vancurl: %s\n", reason.c_str());
    return status;
}

struct Field
{
    std::string name;
    std::string value;
    bool isFile = false;
};

struct Transfer
{
    CURL *curl = nullptr;
    std::string errorBody; // the start of an error answer, for the reason line
    bool writeFailed = false;
    std::chrono::steady_clock::time_point deadline;
    bool timedOut = false;
};

size_t writeBody(char *data, size_t size, size_t count, void *user)
{
    auto *transfer = static_cast<Transfer *>(user);
    const size_t bytes = size * count;
    long status = 0;
    curl_easy_getinfo(transfer->curl, CURLINFO_RESPONSE_CODE, &status);
    if (status >= 300) {
        // Keep error and redirection pages off standard output: callers treat
        // what is there as the answer.
        if (transfer->errorBody.size() < 200)
            transfer->errorBody.append(data, bytes < 200 ? bytes : 200);
        return bytes;
    }
    if (std::fwrite(data, 1, bytes, stdout) != bytes) {
        transfer->writeFailed = true;
        return 0;
    }
    return bytes;
}

// Ends the transfer once its deadline has passed; libcurl calls it at least
// once a second, also while nothing arrives.
int checkDeadline(void *user, curl_off_t, curl_off_t, curl_off_t, curl_off_t)
{
    auto *transfer = static_cast<Transfer *>(user);
    if (std::chrono::steady_clock::now() < transfer->deadline)
        return 0;
    transfer->timedOut = true;
    return 1;
}

// The size of a readable regular file, or -1.
long long readableFileSize(const std::string &path)
{
    struct stat info;
    if (::stat(path.c_str(), &info) != 0 || !S_ISREG(info.st_mode))
        return -1;
    std::FILE *file = std::fopen(path.c_str(), "rb");
    if (!file)
        return -1;
    std::fclose(file);
    return static_cast<long long>(info.st_size);
}

int classify(CURLcode code)
{
    switch (code) {
    case CURLE_COULDNT_RESOLVE_PROXY:
    case CURLE_COULDNT_RESOLVE_HOST:
    case CURLE_COULDNT_CONNECT:
    case CURLE_OPERATION_TIMEDOUT:
    case CURLE_PROXY:
    case CURLE_GOT_NOTHING:
    case CURLE_SEND_ERROR:
    case CURLE_RECV_ERROR:
        return ConnectionError;
    case CURLE_SSL_CONNECT_ERROR:
    case CURLE_PEER_FAILED_VERIFICATION:
    case CURLE_SSL_CERTPROBLEM:
    case CURLE_SSL_CIPHER:
    case CURLE_SSL_CACERT_BADFILE:
    case CURLE_SSL_ISSUER_ERROR:
    case CURLE_SSL_ENGINE_INITFAILED:
        return TlsError;
    case CURLE_READ_ERROR:
        return UploadFileError;
    default:
        return TransferError;
    }
}

std::string oneLine(std::string text)
{
    for (char &c : text)
        if (c == '\n' || c == '\r' || c == '\t')
            c = ' ';
    while (!text.empty() && text.back() == ' ')
        text.pop_back();
    return text;
}

} // namespace

int main(int argc, char **argv)
{
    std::string proxy, cacert, url;
    bool haveProxy = false;
    std::vector<Field> fields;
    for (int i = 1; i < argc; ++i) {
        const std::string arg = argv[i];
        const bool last = i + 1 == argc;
        if (arg == "-h" || arg == "--help") {
            std::fputs(usage, stdout);
            return Success;
        }
        if (arg == "--version") {
            std::printf("vancurl 1.0 (libcurl %s)\n", curl_version_info(CURLVERSION_NOW)->version);
            return Success;
        }
        if (arg == "--proxy" || arg == "--cacert" || arg == "-F") {
            if (last)
                return fail(UsageError, arg + " needs a value (see --help)");
            const std::string value = argv[++i];
            if (arg == "--proxy") {
                proxy = value;
                haveProxy = true;
            } else if (arg == "--cacert") {
                cacert = value;
            } else {
                const size_t eq = value.find('=');
                if (eq == std::string::npos || eq == 0)
                    return fail(UsageError, "-F needs NAME=VALUE, got \"" + value + "\"");
                Field field;
                field.name = value.substr(0, eq);
                field.value = value.substr(eq + 1);
                if (field.name == fileField && !field.value.empty() && field.value[0] == '@') {
                    field.isFile = true;
                    field.value.erase(0, 1);
                }
                fields.push_back(field);
            }
            continue;
        }
        if (!last || (!arg.empty() && arg[0] == '-'))
            return fail(UsageError, "unknown argument \"" + arg + "\" (see --help)");
        url = arg;
    }
    if (url.empty())
        return fail(UsageError, "no URL given (see --help)");
    if (url.compare(0, 7, "http://") != 0 && url.compare(0, 8, "https://") != 0)
        return fail(UsageError, "the URL must start with http:// or https://");
    long long uploadBytes = 0;
    for (const Field &field : fields) {
        if (!field.isFile)
            continue;
        const long long size = readableFileSize(field.value);
        if (size < 0)
            return fail(UploadFileError,
                        "cannot read the file \"" + field.value + "\" of field " + field.name);
        uploadBytes += size;
    }
    const long long limitSeconds = BaseSeconds + uploadBytes / BytesPerSecond;
    if (haveProxy && proxy.empty())
        return fail(UsageError, "--proxy needs a proxy (HOST:PORT)");

    if (curl_global_init(CURL_GLOBAL_DEFAULT) != CURLE_OK)
        return fail(TransferError, "cannot initialise libcurl");
    Transfer transfer;
    transfer.curl = curl_easy_init();
    if (!transfer.curl)
        return fail(TransferError, "cannot initialise libcurl");
    CURL *curl = transfer.curl;
    transfer.deadline = std::chrono::steady_clock::now() + std::chrono::seconds(limitSeconds);
    char errorText[CURL_ERROR_SIZE] = {0};

    curl_easy_setopt(curl, CURLOPT_URL, url.c_str());
    curl_easy_setopt(curl, CURLOPT_PROTOCOLS_STR, "http,https");
    curl_easy_setopt(curl, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(curl, CURLOPT_ERRORBUFFER, errorText);
    curl_easy_setopt(curl, CURLOPT_USERAGENT, "vancurl/1.0");
    // An empty proxy switches the environment's proxy off; an empty no-proxy
    // list keeps no_proxy from overriding the caller's proxy.
    curl_easy_setopt(curl, CURLOPT_PROXY, haveProxy ? proxy.c_str() : "");
    curl_easy_setopt(curl, CURLOPT_NOPROXY, "");
    curl_easy_setopt(curl, CURLOPT_SSL_VERIFYPEER, 1L);
    curl_easy_setopt(curl, CURLOPT_SSL_VERIFYHOST, 2L);
    if (!cacert.empty())
        curl_easy_setopt(curl, CURLOPT_CAINFO, cacert.c_str());
    curl_easy_setopt(curl, CURLOPT_CONNECTTIMEOUT, 30L);
    curl_easy_setopt(curl, CURLOPT_LOW_SPEED_LIMIT, 1L);
    curl_easy_setopt(curl, CURLOPT_LOW_SPEED_TIME, 60L);
    curl_easy_setopt(curl, CURLOPT_WRITEFUNCTION, writeBody);
    curl_easy_setopt(curl, CURLOPT_WRITEDATA, &transfer);
    curl_easy_setopt(curl, CURLOPT_XFERINFOFUNCTION, checkDeadline);
    curl_easy_setopt(curl, CURLOPT_XFERINFODATA, &transfer);
    curl_easy_setopt(curl, CURLOPT_NOPROGRESS, 0L);

    curl_mime *form = nullptr;
    if (!fields.empty()) {
        form = curl_mime_init(curl);
        for (const Field &field : fields) {
            curl_mimepart *part = curl_mime_addpart(form);
            curl_mime_name(part, field.name.c_str());
            if (field.isFile)
                curl_mime_filedata(part, field.value.c_str());
            else
                curl_mime_data(part, field.value.data(), field.value.size());
        }
        curl_easy_setopt(curl, CURLOPT_MIMEPOST, form);
    }

    const CURLcode code = curl_easy_perform(curl);
    long status = 0;
    curl_easy_getinfo(curl, CURLINFO_RESPONSE_CODE, &status);
    std::fflush(stdout);
    const bool writeFailed = transfer.writeFailed || std::ferror(stdout);
    const std::string errorBody = oneLine(transfer.errorBody);
    char *location = nullptr;
    curl_easy_getinfo(curl, CURLINFO_REDIRECT_URL, &location);
    const std::string redirectTarget = location ? oneLine(location) : std::string();
    curl_mime_free(form);
    curl_easy_cleanup(curl);
    curl_global_cleanup();

    if (writeFailed)
        return fail(TransferError, "cannot write the answer to standard output");
    if (status >= 400)
        return fail(HttpError, "HTTP status " + std::to_string(status) + " from " + url
                                   + (errorBody.empty() ? std::string() : ": " + errorBody));
    if (status >= 300)
        return fail(RedirectError, "HTTP status " + std::to_string(status) + " from " + url
                                       + ", a redirection, which is not followed"
                                       + (redirectTarget.empty() ? "" : " (to " + redirectTarget + ")"));
    if (transfer.timedOut)
        return fail(TimeLimitError, "the transfer took longer than its limit of "
                                        + std::to_string(limitSeconds) + " s (" + url + ")");
    if (code != CURLE_OK)
        return fail(classify(code),
                    std::string(errorText[0] ? errorText : curl_easy_strerror(code)) + " (" + url + ")");
    return Success;
}
