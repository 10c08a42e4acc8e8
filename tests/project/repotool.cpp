// Works on Corvid's project repository from a process of its own, so that
// tests can have several processes use one repository.
//
//   project_repotool increment PROJECT KEY TIMES   count a value up, read then write
//   project_repotool send PROJECT TIMES            count sends as the send step does
//   project_repotool lock REPOSITORY MS            hold the file locked, then let go

#include "project/ProjectRepositoryValues.h"

#include <QCoreApplication>
#include <QSqlDatabase>
#include <QSqlQuery>
#include <QStringList>
#include <QThread>

#include <cstdio>

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    const QStringList args = app.arguments().mid(1);
    const QString mode = args.value(0);
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    if (mode == QLatin1String("increment") && args.size() == 4) {
        for (int i = 0, times = args.at(3).toInt(); i < times; ++i) {
            const qlonglong n = values.getValue(args.at(1), args.at(2)).toLongLong();
            values.setValue(args.at(1), args.at(2), QString::number(n + 1));
        }
        return 0;
    }
    if (mode == QLatin1String("send") && args.size() == 3) {
        for (int i = 0, times = args.at(2).toInt(); i < times; ++i)
            values.countSend(args.at(1), values.sendIteration(args.at(1)));
        return 0;
    }
    if (mode == QLatin1String("lock") && args.size() == 3) {
        QSqlDatabase db = QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"));
        db.setDatabaseName(args.at(1));
        QSqlQuery query(db);
        if (!db.open() || !query.exec(QStringLiteral("BEGIN EXCLUSIVE")))
            return 1;
        std::puts("locked");
        std::fflush(stdout);
        QThread::msleep(args.at(2).toULong());
        query.exec(QStringLiteral("ROLLBACK"));
        return 0;
    }
    std::fputs("usage: project_repotool increment PROJECT KEY TIMES | send PROJECT TIMES"
               " | lock REPOSITORY MS\n", stderr);
    return 2;
}
