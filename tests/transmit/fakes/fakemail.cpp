// Test stand-in for a mail program: writes its own file name and then its
// arguments, one per line, to the file named by FAKE_MAIL_LOG.
#include <QCoreApplication>
#include <QFile>
#include <QFileInfo>

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    const QString log = qEnvironmentVariable("FAKE_MAIL_LOG");
    if (log.isEmpty())
        return 1;
    QStringList lines = app.arguments();
    lines[0] = QFileInfo(lines.at(0)).fileName();
    // Written whole and renamed, so the test never reads half a record.
    QFile out(log + QLatin1String(".part"));
    if (!out.open(QIODevice::WriteOnly))
        return 1;
    out.write(lines.join(QLatin1Char('\n')).toUtf8());
    out.close();
    QFile::remove(log);
    return QFile::rename(log + QLatin1String(".part"), log) ? 0 : 1;
}
