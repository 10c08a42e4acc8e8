// Counts a value of Corvid's project repository up from a process of its
// own, so that tests can have several processes write one repository.
//
//   project_repotool increment PROJECT KEY TIMES

#include "project/ProjectRepositoryValues.h"

#include <QCoreApplication>
#include <QStringList>

#include <cstdio>

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    const QStringList args = app.arguments().mid(1);
    if (args.size() != 4 || args.at(0) != QLatin1String("increment")) {
        std::fputs("usage: project_repotool increment PROJECT KEY TIMES\n", stderr);
        return 2;
    }
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    for (int i = 0, times = args.at(3).toInt(); i < times; ++i) {
        const qlonglong n = values.getValue(args.at(1), args.at(2)).toLongLong();
        values.setValue(args.at(1), args.at(2), QString::number(n + 1));
    }
    return 0;
}
