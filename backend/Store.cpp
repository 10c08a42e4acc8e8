#include "Store.h"

#include "Schema.h"

#include <QAtomicInteger>
#include <QDateTime>
#include <QFileInfo>
#include <QSqlError>
#include <QSqlQuery>
#include <QStringList>

namespace {

QAtomicInteger<quint64> connectionCount;

QString errorText(const QSqlError &error)
{
    return error.text().trimmed();
}

// Named placeholders ":p0", ":p1", ...: QtSql binds a value by name several
// times as fast as by position, which formats the position as a name first.
const QString &placeholder(int index)
{
    static const QStringList names = [] {
        QStringList list;
        for (int i = 0; i < 1024; ++i)
            list.append(QStringLiteral(":p%1").arg(i));
        return list;
    }();
    return names.at(index);
}

QString placeholders(int from, int count)
{
    QStringList list;
    for (int i = from; i < from + count; ++i)
        list.append(placeholder(i));
    return list.join(QLatin1Char(','));
}

QVariant textOrNull(const QString &text)
{
    return text.isNull() ? QVariant() : QVariant(text);
}

// The rows of one table for one page, written with as few statements as
// possible: inserts of 32 rows at a time as they come, then of 16, 8, ... 1
// for the rest, each statement prepared once. So a large page is never held
// a second time over as bound values.
class RowWriter
{
public:
    RowWriter(const QSqlDatabase &db, const QString &table, const QStringList &columns)
        : m_db(db)
        , m_head(QStringLiteral("INSERT INTO %1 (report_id, %2) VALUES ")
                     .arg(table, columns.join(QLatin1String(", "))))
        , m_width(int(columns.size()) + 1)
    {
    }

    // Starts the rows of the report `reportId`.
    void begin(qlonglong reportId)
    {
        m_reportId = reportId;
        m_values.clear();
        m_error.clear();
        m_failed = false;
    }

    void add(std::initializer_list<QVariant> values)
    {
        if (m_failed)
            return;
        m_values.append(QVariant(m_reportId));
        m_values.append(values);
        if (m_values.size() == MaxRows * m_width)
            write();
    }

    // Writes the rows not written yet; false with `error` when any failed.
    bool finish(QString *error)
    {
        write();
        if (m_failed)
            *error = m_error;
        return !m_failed;
    }

private:
    static const int MaxRows = 32;

    void write()
    {
        const int rows = int(m_values.size()) / m_width;
        int done = 0;
        for (int chunk = MaxRows; chunk >= 1 && !m_failed; chunk /= 2) {
            for (; rows - done >= chunk && !m_failed; done += chunk) {
                QSqlQuery &query = statement(chunk);
                for (int i = 0; i < chunk * m_width; ++i)
                    query.bindValue(placeholder(i), bindable(m_values.at(done * m_width + i)));
                if (!query.exec()) {
                    m_error = errorText(query.lastError());
                    m_failed = true;
                }
            }
        }
        m_values.clear();
    }

    // A text column is never bound NULL by accident: QtSql binds a null
    // QString as NULL, and a page's empty values are texts.
    static QVariant bindable(const QVariant &value)
    {
        return value.typeId() == QMetaType::QString
                       && static_cast<const QString *>(value.constData())->isNull()
                   ? QVariant(QLatin1String(""))
                   : value;
    }

    QSqlQuery &statement(int rows)
    {
        std::unique_ptr<QSqlQuery> &query = m_statements[rows];
        if (!query) {
            QStringList values;
            for (int row = 0; row < rows; ++row)
                values.append(QLatin1Char('(') + placeholders(row * m_width, m_width) + QLatin1Char(')'));
            query.reset(new QSqlQuery(m_db));
            query->prepare(m_head + values.join(QLatin1Char(',')));
        }
        return *query;
    }

    QSqlDatabase m_db;
    QString m_head;
    int m_width;
    qlonglong m_reportId = -1;
    QVariantList m_values;
    QString m_error;
    bool m_failed = false;
    std::map<int, std::unique_ptr<QSqlQuery>> m_statements;
};

} // namespace

// The statements of one connection: the report's insert, the lookup by
// digest and a row writer per table.
class CrvB_Store::Statements
{
public:
    explicit Statements(const QSqlDatabase &db)
        : report(db)
        , find(db)
        , group(db, "usage_group", {"group_no", "section", "name"})
        , item(db, "usage_item", {"item_no", "group_no", "level", "name", "value"})
        , commandLine(db, "command_line", {"line_no", "tool", "command_line"})
        , option(db, "command_option", {"line_no", "option_name"})
        , run(db, "run_statistic",
              {"row_no", "tool", "runs", "completed", "failed", "cancelled", "total_seconds",
               "average_seconds", "last_run"})
        , help(db, "help_entry", {"entry_no", "list", "term", "hits"})
        , core(db, "core", {"core_no", "core_type"})
        , parameter(db, "core_parameter", {"parameter_no", "core_no", "name", "value"})
        , property(db, "project_property", {"property_no", "kind", "name", "value"})
        , sourceType(db, "source_type", {"type_no", "source_type", "files"})
        , other(db, "page_value", {"value_no", "tag", "name", "path", "value"})
    {
    }

    bool prepare()
    {
        QStringList columns{QStringLiteral("sha256"), QStringLiteral("page_bytes")};
        columns += CrvB_ReportRecord::propertyColumns().values();
        columns += {QStringLiteral("received_at"), QStringLiteral("domain"), QStringLiteral("regid"),
                    QStringLiteral("source"), QStringLiteral("ingested_at")};
        return report.prepare(
                   QStringLiteral("INSERT INTO report (%1) VALUES (%2) RETURNING id")
                       .arg(columns.join(QLatin1String(", ")), placeholders(0, int(columns.size()))))
               && find.prepare(QStringLiteral("SELECT 1 FROM report WHERE sha256 = ?"));
    }

    // In the order they are written.
    QVector<RowWriter *> writers()
    {
        return {&group, &item,      &commandLine, &option,     &run,  &help,
                &core,  &parameter, &property,    &sourceType, &other};
    }

    QSqlQuery report, find;
    RowWriter group, item, commandLine, option, run, help, core, parameter, property, sourceType, other;
};

CrvB_Store::CrvB_Store()
    : m_connection(QStringLiteral("corvid-store-%1").arg(connectionCount.fetchAndAddRelaxed(1)))
{
}

CrvB_Store::~CrvB_Store()
{
    m_statements.reset();
    {
        QSqlDatabase db = QSqlDatabase::database(m_connection, false);
        if (db.isValid())
            db.close();
    }
    QSqlDatabase::removeDatabase(m_connection);
}

QSqlDatabase CrvB_Store::database() const
{
    return QSqlDatabase::database(m_connection, false);
}

QString CrvB_Store::schema(CrvB_DatabaseUrl::Engine engine)
{
    QString sql = QString::fromUtf8(corvidSchemaSql);
    sql.replace(QLatin1String("REPORT_KEY"),
                engine == CrvB_DatabaseUrl::Engine::PostgreSQL
                    ? QLatin1String("BIGINT GENERATED BY DEFAULT AS IDENTITY PRIMARY KEY")
                    : QLatin1String("INTEGER PRIMARY KEY"));
    return sql;
}

bool CrvB_Store::open(const QString &url, bool readOnly, QString *error)
{
    if (!m_url.parse(url, error))
        return false;
    const bool sqlite = m_url.engine == CrvB_DatabaseUrl::Engine::SQLite;
    if (sqlite && readOnly && !QFileInfo(m_url.database).isFile()) {
        *error = QStringLiteral("no database file \"%1\"").arg(m_url.database);
        return false;
    }
    const QString driver = sqlite ? QStringLiteral("QSQLITE") : QStringLiteral("QPSQL");
    if (!QSqlDatabase::isDriverAvailable(driver)) {
        *error = QStringLiteral("the Qt SQL driver %1 is not installed").arg(driver);
        return false;
    }
    QSqlDatabase db = QSqlDatabase::addDatabase(driver, m_connection);
    db.setDatabaseName(m_url.database);
    if (sqlite) {
        db.setConnectOptions(readOnly ? QStringLiteral("QSQLITE_BUSY_TIMEOUT=30000;QSQLITE_OPEN_READONLY")
                                      : QStringLiteral("QSQLITE_BUSY_TIMEOUT=30000"));
    } else {
        if (!m_url.host.isEmpty())
            db.setHostName(m_url.host);
        if (m_url.port > 0)
            db.setPort(m_url.port);
        db.setUserName(m_url.user);
        db.setPassword(m_url.password);
        db.setConnectOptions(m_url.options);
    }
    if (!db.open()) {
        *error = QStringLiteral("cannot open the database %1: %2")
                     .arg(CrvB_DatabaseUrl::redacted(url), errorText(db.lastError()));
        return false;
    }
    if (readOnly)
        return true;
    if (sqlite) {
        // Write-ahead logging: a commit writes the log without waiting for the
        // disk, and readers (corvid-stats) do not block the writer. A commit
        // lost to a power cut is ingested again from its file.
        QSqlQuery pragma(db);
        pragma.exec(QStringLiteral("PRAGMA journal_mode=WAL"));
        pragma.exec(QStringLiteral("PRAGMA synchronous=NORMAL"));
        // Each page's savepoint keeps what it changed in a statement
        // journal: in memory, not in a temporary file.
        pragma.exec(QStringLiteral("PRAGMA temp_store=MEMORY"));
    }
    if (!createSchema(error))
        return false;
    m_statements.reset(new Statements(db));
    if (!m_statements->prepare()) {
        *error = QStringLiteral("cannot prepare the statements: %1").arg(errorText(db.lastError()));
        m_statements.reset();
        return false;
    }
    return true;
}

bool CrvB_Store::createSchema(QString *error)
{
    QSqlDatabase db = database();
    QSqlQuery query(db);
    // Another process may make the tables at the same moment; what counts is
    // that they are there afterwards.
    for (int attempt = 0; attempt < 3; ++attempt) {
        if (query.exec(QStringLiteral("SELECT version FROM corvid_schema")) && query.next())
            return true;
        query.finish();
        bool ok = db.transaction();
        QString failure;
        for (const QString &statement : schema(m_url.engine).split(QLatin1String(";\n"))) {
            QString sql;
            for (const QString &line : statement.split(QLatin1Char('\n')))
                if (!line.trimmed().startsWith(QLatin1String("--")))
                    sql += line + QLatin1Char('\n');
            if (ok && !sql.trimmed().isEmpty() && !query.exec(sql)) {
                ok = false;
                failure = errorText(query.lastError());
            }
        }
        if (ok && query.exec(QStringLiteral("INSERT INTO corvid_schema (version) VALUES (1)")) && db.commit())
            return true;
        if (failure.isEmpty())
            failure = errorText(query.lastError().isValid() ? query.lastError() : db.lastError());
        db.rollback();
        *error = QStringLiteral("cannot make the tables: %1").arg(failure);
    }
    return false;
}

bool CrvB_Store::exec(const char *sql)
{
    QSqlQuery query(database());
    return query.exec(QLatin1String(sql));
}

bool CrvB_Store::beginBatch(QString *error)
{
    QSqlDatabase db = database();
    m_inBatch = db.transaction();
    if (!m_inBatch)
        *error = errorText(db.lastError());
    return m_inBatch;
}

bool CrvB_Store::commitBatch(QString *error)
{
    QSqlDatabase db = database();
    const bool lost = m_batchLost || !m_inBatch;
    m_inBatch = m_batchLost = false;
    if (lost) {
        *error = QStringLiteral("the batch was rolled back");
        return false;
    }
    if (db.commit())
        return true;
    *error = errorText(db.lastError());
    db.rollback();
    return false;
}

bool CrvB_Store::contains(const QByteArray &sha256, QString *error)
{
    QSqlQuery &find = m_statements->find;
    find.bindValue(0, QString::fromLatin1(sha256));
    if (!find.exec()) {
        *error = errorText(find.lastError());
        return false;
    }
    const bool found = find.next();
    find.finish();
    return found;
}

void CrvB_Store::addRows(const CrvB_ReportRecord &record)
{
    Statements &s = *m_statements;
    for (int i = 0; i < record.groups.size(); ++i)
        s.group.add({i, record.groups.at(i).section, record.groups.at(i).name});
    for (int i = 0; i < record.items.size(); ++i) {
        const auto &item = record.items.at(i);
        s.item.add({i, item.group, item.level, item.name, item.value});
    }
    for (int i = 0; i < record.commandLines.size(); ++i) {
        const auto &line = record.commandLines.at(i);
        s.commandLine.add({i, line.tool, line.text});
        for (const QString &option : line.options)
            s.option.add({i, option});
    }
    for (int i = 0; i < record.runs.size(); ++i) {
        const auto &r = record.runs.at(i);
        s.run.add({i, r.tool, r.runs, r.completed, r.failed, r.cancelled, r.totalSeconds, r.averageSeconds,
                   textOrNull(r.lastRun)});
    }
    for (int i = 0; i < record.helpEntries.size(); ++i) {
        const auto &h = record.helpEntries.at(i);
        s.help.add({i, h.list, h.term, h.count});
    }
    for (int i = 0; i < record.cores.size(); ++i)
        s.core.add({i, record.cores.at(i)});
    for (int i = 0; i < record.coreParameters.size(); ++i) {
        const auto &p = record.coreParameters.at(i);
        s.parameter.add({i, p.core, p.name, p.value});
    }
    for (int i = 0; i < record.projectProperties.size(); ++i) {
        const auto &p = record.projectProperties.at(i);
        s.property.add({i, p.kind, p.name, p.value});
    }
    for (int i = 0; i < record.sourceTypes.size(); ++i)
        s.sourceType.add({i, record.sourceTypes.at(i).type, record.sourceTypes.at(i).count});
    for (int i = 0; i < record.others.size(); ++i) {
        const auto &o = record.others.at(i);
        s.other.add({i, o.tag, o.name, o.path, o.value});
    }
}

CrvB_Store::Outcome CrvB_Store::store(const QByteArray &sha256, qint64 pageBytes,
                                      const CrvB_ReportRecord &record, const Arrival &arrival, QString *error)
{
    Statements &s = *m_statements;
    QSqlDatabase db = database();
    if (m_batchLost) {
        *error = QStringLiteral("the batch was rolled back");
        return Outcome::Failed;
    }
    if (m_inBatch ? !exec("SAVEPOINT page") : !db.transaction()) {
        *error = errorText(db.lastError());
        return Outcome::Failed;
    }

    QVariantList reportValues{QString::fromLatin1(sha256), pageBytes};
    for (const QString &column : CrvB_ReportRecord::propertyColumns().values())
        reportValues.append(textOrNull(record.properties.value(column)));
    reportValues += {textOrNull(arrival.receivedAt), textOrNull(arrival.domain), textOrNull(arrival.regid),
                     textOrNull(arrival.source), QDateTime::currentDateTimeUtc().toString(Qt::ISODate)};
    for (int i = 0; i < reportValues.size(); ++i)
        s.report.bindValue(placeholder(i), reportValues.at(i));
    bool ok = s.report.exec() && s.report.next();
    const qlonglong id = ok ? s.report.value(0).toLongLong() : -1;
    if (!ok)
        *error = errorText(s.report.lastError());
    s.report.finish();

    if (ok) {
        for (RowWriter *writer : s.writers())
            writer->begin(id);
        addRows(record);
        for (RowWriter *writer : s.writers())
            ok = ok && writer->finish(error);
    }

    if (m_inBatch) {
        if (ok && exec("RELEASE SAVEPOINT page"))
            return Outcome::Stored;
        if (!exec("ROLLBACK TO SAVEPOINT page") || !exec("RELEASE SAVEPOINT page")) {
            db.rollback();
            m_batchLost = true;
        }
    } else {
        if (ok && db.commit())
            return Outcome::Stored;
        if (ok)
            *error = errorText(db.lastError());
        db.rollback();
    }
    // A unique digest that is there now was stored by someone else first.
    QString ignored;
    return contains(sha256, &ignored) ? Outcome::AlreadyPresent : Outcome::Failed;
}
