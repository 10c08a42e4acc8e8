#pragma once

#include "OrbHostExport.h"

#include <functional>
#include <memory>
#include <string>

// The host's message manager: errors for the user's message window and
// diagnostics for the debug output.
//
// Errors go to standard error as "ERROR:<module>:<file>:<line>: <text>".
// Diagnostics (debugStub) go to standard error only when the environment
// variable ORB_DEBUG is set to a non-empty value other than "0".
// A sink installed with setSink sees both instead (used by the host's window
// and by tests).
class ORBHOST_EXPORT Port_MsgManData
{
public:
    enum Kind { Error, Debug };
    struct Message
    {
        Kind kind;
        std::string module;
        std::string file;
        int line;
        std::string revision;
        std::string text;
    };
    using Sink = std::function<void(const Message &)>;

    // A message object carrying the origin of the messages it issues.
    static std::unique_ptr<Port_MsgManData> createObject(const char *module, const char *file, int line,
                                                         const char *revision);

    void issueError(const char *format, ...)
#if defined(__GNUC__)
        __attribute__((format(printf, 2, 3)))
#endif
        ;

    static void debugStub(const char *format, ...)
#if defined(__GNUC__)
        __attribute__((format(printf, 1, 2)))
#endif
        ;

    // Installs a sink for all messages (an empty one restores the default)
    // and returns the previous one.
    static Sink setSink(Sink sink);

private:
    Port_MsgManData() = default;
    std::string m_module;
    std::string m_file;
    int m_line = 0;
    std::string m_revision;
};
