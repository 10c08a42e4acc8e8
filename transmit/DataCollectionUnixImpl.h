#pragma once

#include "DataCollectionEmailImpl.h"

// Mail programs of Unix-like systems, found on the search path (PATH, then
// /usr/bin/, /usr/X11R6/bin/ and /usr/dt/bin/): "netscape", "mozilla" and
// "thunderbird", each started with a compose request that attaches the report,
//   <program> -compose to='...',subject='...',body='...',attachment='file:///...'
// and after them the desktop's "xdg-email", started with
//   xdg-email --subject ... [--body ...] --attach <report> <to>
// The list holds absolute paths, each once, in the order found; it is built
// on the first call of emailTools().
class CrvC_DataCollectionUnixImpl : public CrvC_DataCollectionEmailImpl
{
public:
    QStringList emailTools() override;
    QStringList composeArguments(const QString &tool, const QString &to, const QString &subject,
                                 const QString &body, const QString &file) override;

    // The compose request: each value in single quotes, so that a comma in
    // it stays in it, and the attachment as a file URL whose path is
    // percent-encoded. Empty when `to`, `subject` or `body` holds a single
    // quote, for which the request knows no escape.
    static QString composeRequest(const QString &to, const QString &subject, const QString &body,
                                  const QString &file);
    // True when `tool` names the desktop's xdg-email.
    static bool isXdgEmail(const QString &tool);

private:
    QStringList m_tools;
};
