#include "MakerServer.h"

#include <QUrl>

const char *const CrvC_MakerServer::DefaultUrl = "https://www.vantor.example";

QString CrvC_MakerServer::baseUrl()
{
    QString url = qEnvironmentVariable("CORVID_SERVER");
    if (url.isEmpty())
        url = QString::fromLatin1(DefaultUrl);
    while (url.endsWith(QLatin1Char('/')))
        url.chop(1);
    return url;
}

QString CrvC_MakerServer::host()
{
    return QUrl(baseUrl()).host();
}
