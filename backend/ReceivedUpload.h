#pragma once

#include "Store.h"

#include <QString>
#include <QStringList>

// One upload as corvid-receiver keeps it (docs/receiver.md): a numbered folder
// with the page and a metadata file of name=value lines, percent-encoded,
// among them received, domain, regid and stored_as (the page's file name).
class CrvB_ReceivedUpload
{
public:
    // The names the metadata file has had, newest first: a folder holding
    // one of them is an upload folder. The one place these names are kept.
    static const QStringList &metadataFileNames();
    // The metadata file in `folder`, or an empty text when it has none.
    static QString metadataFile(const QString &folder);

    // Reads the upload in `folder`; false with `error` when it has no
    // metadata file or no page (a regular file named by stored_as, or else
    // the one other regular file in the folder).
    bool read(const QString &folder, QString *error);

    QString pagePath;
    CrvB_Store::Arrival arrival;
};
