#pragma once

#include <QString>

#include <functional>

// How the sending classes, which have no widgets, reach the user. The plug-in
// installs the real handlers when it loads (the host's warning box and the
// send method dialog); until then a warning goes to the debug output and an
// offer of the e-mail method is dropped.
class CrvC_UserNotice
{
public:
    // `details` says what happened beneath the warning itself; may be empty.
    using Warning = std::function<void(const QString &text, const QString &details)>;
    using EmailOffer = std::function<void(const QString &reportFile)>;

    // Replaces both handlers; an empty function restores its default.
    static void setHandlers(Warning warning, EmailOffer emailOffer);

    // A modal warning with the OK button, `details` beneath `text`; returns
    // when it is closed.
    static void warning(const QString &text, const QString &details = QString());
    // The send method dialog for `reportFile` with e-mail preselected, modal.
    static void offerEmail(const QString &reportFile);
};
