// A small command-line client of Corvid's project repository values, so
// that tests can read and write a repository from separate processes.
//
//   project_repotool get PROJECT KEY
//   project_repotool set PROJECT KEY VALUE
//   project_repotool increment PROJECT KEY TIMES
//   project_repotool age PROJECT

#include "project/ProjectRepositoryValues.h"

#include <QCoreApplication>
#include <QStringList>

#include <cstdio>

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    const QStringList args = app.arguments().mid(1);
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    const QString command = args.value(0);
    if (command == QLatin1String("get") && args.size() == 3) {
        std::printf("%s\n", qUtf8Printable(values.getValue(args.at(1), args.at(2))));
        return 0;
    }
    if (command == QLatin1String("set") && args.size() == 4) {
        values.setValue(args.at(1), args.at(2), args.at(3));
        return 0;
    }
    if (command == QLatin1String("increment") && args.size() == 4) {
        const int times = args.at(3).toInt();
        for (int i = 0; i < times; ++i) {
            const qlonglong n = values.getValue(args.at(1), args.at(2)).toLongLong();
            values.setValue(args.at(1), args.at(2), QString::number(n + 1));
        }
        return 0;
    }
    if (command == QLatin1String("age") && args.size() == 2) {
        std::printf("%s\n", qUtf8Printable(values.projectAgeInDays(args.at(1))));
        return 0;
    }
    std::fputs("usage: project_repotool get|set|increment|age PROJECT [KEY [VALUE|TIMES]]\n", stderr);
    return 2;
}
