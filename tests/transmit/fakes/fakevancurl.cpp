// Test stand-in for vancurl: "vancurl URL" GETs a plain http:// URL and writes
// the body to standard output; exit 0 only for a status below 400.
#include <QCoreApplication>
#include <QTcpSocket>
#include <QUrl>

#include <cstdio>

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    const QStringList args = app.arguments();
    if (args.size() != 2)
        return 2;
    const QUrl url(args.at(1));
    if (url.scheme() != QLatin1String("http"))
        return 2;
    QTcpSocket socket;
    socket.connectToHost(url.host(), quint16(url.port(80)));
    if (!socket.waitForConnected(10000))
        return 7;
    socket.write("GET " + url.path(QUrl::FullyEncoded).toUtf8() + " HTTP/1.0\r\nHost: " + url.host().toUtf8()
                 + "\r\n\r\n");
    QByteArray answer;
    while (socket.state() == QAbstractSocket::ConnectedState && socket.waitForReadyRead(10000))
        answer += socket.readAll();
    answer += socket.readAll();
    const int headerEnd = answer.indexOf("\r\n\r\n");
    if (headerEnd < 0)
        return 8;
    const int status = answer.split(' ').value(1).toInt();
    if (status < 200 || status >= 400) {
        std::fprintf(stderr, "HTTP status %d\n", status);
        return 22;
    }
    const QByteArray body = answer.mid(headerEnd + 4);
    std::fwrite(body.constData(), 1, size_t(body.size()), stdout);
    return 0;
}
