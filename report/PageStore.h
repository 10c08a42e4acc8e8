#pragma once

#include <QDateTime>
#include <QString>

// Where each report keeps its own copy of its page: the copy that its send
// uploads or attaches. Every report gets a folder of its own under the user's
// cache, so a later report (in this process or another) never changes what an
// earlier one sends, and a mail program that reads its attachment after the
// report's window has closed still finds it. The folder keeps the page's own
// name, device_usage_statistics.html, since an attachment is sent under it.
// Folders are kept for KeepDays and removed when a later report makes its own.
class CrvC_PageStore
{
public:
    static const int KeepDays; // 7

    // <user's cache>/Vantor/Corvid/pages
    static QString root();

    // A new empty folder, readable by the user only, under root(); folders of
    // root() last changed more than KeepDays before `now` are removed first.
    // Empty when no folder could be made.
    static QString newFolder(const QDateTime &now = QDateTime::currentDateTime());

    // Removes the folders directly under `root` last changed before `limit`;
    // links and files are left alone.
    static void prune(const QString &root, const QDateTime &limit);

    // Removes `folder`, one made by newFolder(), with what it holds.
    static void remove(const QString &folder);
};
