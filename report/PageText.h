#pragma once

#include <QString>

// The text a page holds for its reader, for the review of what is sent.
// Values go into the page as they are, so a value can hold what an HTML view
// takes for mark-up ("count<3>", "<!--") and then hides. The review dialog
// compares the text below with what its view shows and, where they differ,
// shows the page's exact text instead.
class CrvC_PageText
{
public:
    // The text of `html` with every well-formed tag taken as mark-up and the
    // common entities read (&nbsp; &amp; &lt; &gt; &quot; &apos; and numeric
    // ones; other "&" stay as written). The page's own head
    // (<HTML><HEAD><TITLE>...</TITLE></HEAD> at its start) gives no text.
    // False when some "<" does not begin a well-formed tag (a comment, a
    // declaration, "<3>", a lone "<"): a view drops text there.
    static bool visibleText(const QString &html, QString *text);

    // True when `shown` (the plain text of a view of `html`) holds the
    // visible text of `html`, white space aside.
    static bool showsAllText(const QString &html, const QString &shown);
};
