#include "DatabaseUrl.h"

#include <QRegularExpression>
#include <QUrl>
#include <QUrlQuery>

const char *const CrvB_DatabaseUrl::DefaultUrl = "sqlite:corvid.sqlite";

namespace {

QString decoded(const QString &text)
{
    return QUrl::fromPercentEncoding(text.toUtf8());
}

bool portOf(const QString &text, int &port)
{
    bool ok = false;
    port = text.toInt(&ok);
    return ok && port > 0 && port < 65536;
}

} // namespace

QString CrvB_DatabaseUrl::redacted(const QString &url)
{
    static const QRegularExpression userInfo(QStringLiteral("^(postgres(?:ql)?://[^:@/?]*:)[^@/?]*@"));
    static const QRegularExpression parameter(QStringLiteral("([?&]password=)[^&]*"));
    QString text = url;
    return text.replace(userInfo, QStringLiteral("\\1***@")).replace(parameter, QStringLiteral("\\1***"));
}

bool CrvB_DatabaseUrl::parse(const QString &url, QString *error)
{
    *this = CrvB_DatabaseUrl();
    auto fail = [&](const QString &why) {
        if (error)
            *error = QStringLiteral("%1: %2").arg(redacted(url), why);
        engine = Engine::None;
        return false;
    };
    if (url.startsWith(QLatin1String("sqlite:"))) {
        database = url.mid(7);
        if (database.isEmpty())
            return fail(QStringLiteral("no database file after \"sqlite:\""));
        engine = Engine::SQLite;
        return true;
    }
    QString rest;
    for (const char *scheme : {"postgresql://", "postgres://"})
        if (url.startsWith(QLatin1String(scheme)))
            rest = url.mid(int(qstrlen(scheme)));
    if (rest.isNull())
        return fail(QStringLiteral("not sqlite:FILE or postgresql://..."));
    engine = Engine::PostgreSQL;

    const int question = rest.indexOf(QLatin1Char('?'));
    const QString query = question < 0 ? QString() : rest.mid(question + 1);
    rest = rest.left(question < 0 ? rest.size() : question);
    const int slash = rest.indexOf(QLatin1Char('/'));
    const QString authority = slash < 0 ? rest : rest.left(slash);
    database = slash < 0 ? QString() : decoded(rest.mid(slash + 1));

    const int at = authority.lastIndexOf(QLatin1Char('@'));
    if (at >= 0) {
        const QString userInfo = authority.left(at);
        const int colon = userInfo.indexOf(QLatin1Char(':'));
        user = decoded(userInfo.left(colon < 0 ? userInfo.size() : colon));
        if (colon >= 0)
            password = decoded(userInfo.mid(colon + 1));
    }
    QString hostPort = authority.mid(at + 1);
    if (hostPort.contains(QLatin1Char(',')))
        return fail(QStringLiteral("more than one host is not supported"));
    const int bracket = hostPort.lastIndexOf(QLatin1Char(']'));
    const int colon = hostPort.lastIndexOf(QLatin1Char(':'));
    if (colon > bracket) {
        if (!portOf(hostPort.mid(colon + 1), port))
            return fail(QStringLiteral("the port is not a number from 1 to 65535"));
        hostPort.truncate(colon);
    }
    if (hostPort.startsWith(QLatin1Char('[')) && hostPort.endsWith(QLatin1Char(']')))
        hostPort = hostPort.mid(1, hostPort.size() - 2);
    host = decoded(hostPort);

    QStringList extra;
    for (const auto &item : QUrlQuery(query).queryItems(QUrl::FullyDecoded)) {
        const QString &name = item.first;
        const QString &value = item.second;
        if (name == QLatin1String("host"))
            host = value;
        else if (name == QLatin1String("port") && !portOf(value, port))
            return fail(QStringLiteral("the port is not a number from 1 to 65535"));
        else if (name == QLatin1String("user"))
            user = value;
        else if (name == QLatin1String("password"))
            password = value;
        else if (name == QLatin1String("dbname"))
            database = value;
        else if (name == QLatin1String("sslmode") || name == QLatin1String("connect_timeout")
                 || name == QLatin1String("application_name")) {
            if (value.contains(QLatin1Char(';')) || value.contains(QLatin1Char(' '))
                || value.contains(QLatin1Char('\'')))
                return fail(QStringLiteral("the value of %1 holds a blank, quote or semicolon").arg(name));
            extra.append(name + QLatin1Char('=') + value);
        } else if (name != QLatin1String("port"))
            return fail(QStringLiteral("unknown parameter \"%1\"").arg(name));
    }
    if (!extra.join(QLatin1Char(' ')).contains(QLatin1String("connect_timeout=")))
        extra.append(QStringLiteral("connect_timeout=10"));
    options = extra.join(QLatin1Char(';'));
    return true;
}
