#pragma once

#include <QObject>
#include <QString>
#include <QStringList>

class QProcess;

// Sends the report to the maker over HTTPS through the transfer tool vancurl:
// a lookup of the current upload address, then the form upload. Create it
// with new, call SendFile once and forget it: it deletes itself.
class CrvC_SendUsingSSL : public QObject
{
    Q_OBJECT
public:
    CrvC_SendUsingSSL();

    // Starts the lookup for the report at the absolute path `file`.
    void SendFile(const QString &file);

public Q_SLOTS:
    void LaunchSSLProcess();
};
