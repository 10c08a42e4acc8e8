// corvid-pac: evaluates a proxy auto-config script for one address and prints
// the script's answer. Corvid runs it as a child process with a time limit,
// so that a script that loops or crashes never holds or harms the host; the
// program bounds its own memory, the script's size and the answer's length.

#include <pacparser.h>

#include <cerrno>
#include <csignal>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <string>
#include <sys/resource.h>
#include <unistd.h>

#if defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(memory_sanitizer) || __has_feature(thread_sanitizer)
#define CORVID_PAC_SANITIZED 1
#endif
#endif
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define CORVID_PAC_SANITIZED 1
#endif

namespace {

const char *const Usage =
    "Usage: corvid-pac SCRIPT URL HOST\n"
    "\n"
    "Evaluates the proxy auto-config script in the file SCRIPT, calling its\n"
    "FindProxyForURL(URL, HOST), and prints the answer on one line, for example\n"
    "\"PROXY proxy.example:8080; DIRECT\".\n"
    "\n"
    "The standard auto-config functions (dnsDomainIs, shExpMatch, isInNet, ...)\n"
    "are available to the script. Limits: the script file at most 1 MiB, the\n"
    "program's memory 256 MiB, 30 seconds; an answer longer than 1023 bytes is\n"
    "cut after its last whole entry (\";\").\n"
    "\n"
    "Exit status: 0 answer printed, 1 usage error, 2 the script could not be\n"
    "read or parsed (too large, no FindProxyForURL), 3 the script gave no\n"
    "answer: it threw or ran out of memory, or its answer was an empty text or\n"
    "no text at all (undefined, null, a number).\n";

const long MaxScriptBytes = 1024 * 1024;
// With the line end this fits the 1024 bytes Corvid reads.
const size_t MaxAnswerBytes = 1023;

// Anything but a text is no answer: passed on, undefined or null would name
// a proxy host "undefined" or "null".
const char *const TextOnly =
    "\n;(function (find) {\n"
    "  FindProxyForURL = function (url, host) {\n"
    "    var answer = find(url, host);\n"
    "    return typeof answer == 'string' ? answer : '';\n"
    "  };\n"
    "})(FindProxyForURL);\n";

int printError(const char *format, va_list args)
{
    return std::vfprintf(stderr, format, args);
}

// The whole file, or false when it cannot be read or is too large.
bool readScript(const char *path, std::string *script)
{
    std::FILE *file = std::fopen(path, "rb");
    if (!file) {
        std::fprintf(stderr, "corvid-pac: %s: %s\n", path, std::strerror(errno));
        return false;
    }
    char buffer[65536];
    size_t got = 0;
    while ((got = std::fread(buffer, 1, sizeof buffer, file)) > 0 && script->size() <= size_t(MaxScriptBytes))
        script->append(buffer, got);
    const bool failed = std::ferror(file);
    std::fclose(file);
    if (failed || script->size() > size_t(MaxScriptBytes)) {
        std::fprintf(stderr, "corvid-pac: %s: %s\n", path, failed ? "cannot be read" : "larger than 1 MiB");
        return false;
    }
    return true;
}

void limitMemory()
{
#ifndef CORVID_PAC_SANITIZED
    // A sanitizer reserves terabytes of address space up front; those builds
    // bound the program through hard_rss_limit_mb below instead.
    const rlim_t maxBytes = rlim_t(256) * 1024 * 1024;
    const rlimit limit = {maxBytes, maxBytes};
    setrlimit(RLIMIT_AS, &limit);
#endif
}

} // namespace

#ifdef CORVID_PAC_SANITIZED
extern "C" const char *__asan_default_options()
{
    // A small quarantine keeps freed memory from counting against the limit.
    return "hard_rss_limit_mb=512:quarantine_size_mb=32";
}
#endif

int main(int argc, char **argv)
{
    if (argc == 2 && (std::strcmp(argv[1], "--help") == 0 || std::strcmp(argv[1], "-h") == 0)) {
        std::fputs(Usage, stdout);
        return 0;
    }
    if (argc != 4) {
        std::fputs(Usage, stderr);
        return 1;
    }
    // The caller kills a slow script earlier; this bounds an orphaned run.
    alarm(30);
    limitMemory();

    std::string script;
    if (!readScript(argv[1], &script))
        return 2;
    script += TextOnly;
    pacparser_set_error_printer(printError);
    if (!pacparser_init())
        return 2;
    if (!pacparser_parse_pac_string(script.c_str())) {
        pacparser_cleanup();
        return 2;
    }
    const char *found = pacparser_find_proxy(argv[2], argv[3]);
    std::string answer(found ? found : ""); // none: it threw or ran out of memory
    if (answer.size() > MaxAnswerBytes) {
        const size_t end = answer.rfind(';', MaxAnswerBytes);
        answer.resize(end == std::string::npos ? 0 : end);
    }
    const int status = answer.empty() ? 3 : 0;
    if (status == 0)
        std::printf("%s\n", answer.c_str());
    pacparser_cleanup();
    return status;
}
