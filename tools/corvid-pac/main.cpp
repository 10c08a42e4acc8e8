// corvid-pac: evaluates a proxy auto-config script for one address and prints
// the script's answer. Corvid runs it as a child process with a time limit,
// so that a script that loops or crashes never holds or harms the host.

#include <pacparser.h>

#include <csignal>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <unistd.h>

namespace {

const char *const Usage =
    "Usage: corvid-pac SCRIPT URL HOST\n"
    "\n"
    "Evaluates the proxy auto-config script in the file SCRIPT, calling its\n"
    "FindProxyForURL(URL, HOST), and prints the answer on one line, for example\n"
    "\"PROXY proxy.example:8080; DIRECT\".\n"
    "\n"
    "The standard auto-config functions (dnsDomainIs, shExpMatch, isInNet, ...)\n"
    "are available to the script. The program gives up after 30 seconds.\n"
    "\n"
    "Exit status: 0 answer printed, 1 usage error, 2 the script could not be\n"
    "read or run, 3 the script gave no answer.\n";

int printError(const char *format, va_list args)
{
    return std::vfprintf(stderr, format, args);
}

} // namespace

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

    pacparser_set_error_printer(printError);
    if (!pacparser_init())
        return 2;
    if (!pacparser_parse_pac_file(argv[1])) {
        pacparser_cleanup();
        return 2;
    }
    const char *answer = pacparser_find_proxy(argv[2], argv[3]);
    const int status = (answer && *answer) ? 0 : 3;
    if (status == 0)
        std::printf("%s\n", answer);
    pacparser_cleanup();
    return status;
}
