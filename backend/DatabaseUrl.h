#pragma once

#include <QString>

// Where the store is, as the back-end programs take it on their command line:
//   sqlite:FILE                 an SQLite database file (made when missing)
//   postgresql://[USER[:PASSWORD]@][HOST][:PORT][/DATABASE][?NAME=VALUE&...]
//   postgres://...              the same
// A PostgreSQL host may be a socket folder, given percent-encoded in place of
// the host (postgresql://%2Fvar%2Frun%2Fpostgresql/db) or as the parameter
// host=/socket/folder; the parameters host, port, user, password, dbname,
// sslmode, connect_timeout and application_name are understood.
class CrvB_DatabaseUrl
{
public:
    static const char *const DefaultUrl; // "sqlite:corvid.sqlite"

    enum class Engine { None, SQLite, PostgreSQL };

    // False with `error` when `url` is not one of the forms above.
    bool parse(const QString &url, QString *error);
    // `url` with any password in it replaced by "***", for messages.
    static QString redacted(const QString &url);

    Engine engine = Engine::None;
    QString database; // the SQLite file, or the PostgreSQL database name
    QString host;     // host name, address or socket folder; empty for the default
    int port = -1;    // -1 for the default
    QString user;
    QString password;
    QString options; // further PostgreSQL connection parameters, "name=value;..."
};
