#include "common/TestEnvironment.h"

#include "transmit/DataCollectionEmail.h"
#include "transmit/DataCollectionUnixImpl.h"
#include "transmit/UserNotice.h"

#include <QtTest>

class TestDataCollectionEmail : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void cleanup();
    void splitCommandLine_data();
    void splitCommandLine();
    void commandWords_data();
    void commandWords();
    void unixCommand_data();
    void unixCommand();
    void unixTools_data();
    void unixTools();
    void mailProgramArguments_data();
    void mailProgramArguments();
    void programThatCannotStart();

private:
    // A folder under the test's directory holding copies of the fake mail
    // program under `names`.
    QString makeProgramDir(const QString &folder, const QStringList &names);

    std::unique_ptr<CorvidTest::Environment> m_env;
    QByteArray m_path;
};

void TestDataCollectionEmail::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    m_path = qgetenv("PATH");
}

void TestDataCollectionEmail::cleanup()
{
    qputenv("PATH", m_path);
    CrvC_UserNotice::setHandlers(nullptr, nullptr);
}

QString TestDataCollectionEmail::makeProgramDir(const QString &folder, const QStringList &names)
{
    const QString dir = m_env->home() + QLatin1Char('/') + folder;
    QDir().mkpath(dir);
    for (const QString &name : names) {
        const QString target = dir + QLatin1Char('/') + name;
        QFile::remove(target);
        if (!QFile::copy(QStringLiteral(CORVID_FAKES_DIR "/fakemail"), target))
            return QString();
    }
    return dir;
}

void TestDataCollectionEmail::splitCommandLine_data()
{
    QTest::addColumn<QString>("command");
    QTest::addColumn<QStringList>("words");
    QTest::newRow("quoted program and argument")
        << "\"C:\\P Q\\mail.exe\" /m \"mailto:a?subject=b\""
        << QStringList{"C:\\P Q\\mail.exe", "/m", "mailto:a?subject=b"};
    QTest::newRow("spaces and tabs") << "  a \t b\t\tc  " << QStringList{"a", "b", "c"};
    QTest::newRow("quote inside a word") << "ab\"c d\"e" << QStringList{"abc d", "e"};
    QTest::newRow("empty quotes") << "a \"\" b" << QStringList{"a", "b"};
    QTest::newRow("unclosed quote") << "a \"b c" << QStringList{"a", "b c"};
    QTest::newRow("NUL ends the text") << QString("a b") + QChar(0) + QString(" c") << QStringList{"a", "b"};
    QTest::newRow("empty") << "" << QStringList();
}

void TestDataCollectionEmail::splitCommandLine()
{
    QFETCH(QString, command);
    QFETCH(QStringList, words);
    QCOMPARE(CrvC_DataCollectionEmail::splitCommandLine(command), words);
}

void TestDataCollectionEmail::commandWords_data()
{
    QTest::addColumn<QString>("command");
    QTest::addColumn<QString>("argument");
    QTest::addColumn<QStringList>("words");
    QTest::newRow("template") << "prog.exe -mail %1" << "mailto:x?subject=y"
                              << QStringList{"prog.exe", "-mail", "mailto:x?subject=y"};
    QTest::newRow("no %1") << "prog.exe -mail" << "mailto:x" << QStringList();
    QTest::newRow("%1 alone") << "%1" << "mailto:x" << QStringList{"mailto:x"};
    QTest::newRow("second %1 stays") << "p %1 %1" << "a" << QStringList{"p", "a", "%1"};
    QTest::newRow("argument holding %1") << "p \"%1\" x" << "a %1 b" << QStringList{"p", "a %1 b", "x"};
    QTest::newRow("compose request") << "/usr/bin/thunderbird -compose \"%1\""
                                     << "to=a@b,subject=S T,body=,attachment=file:///r.html"
                                     << QStringList{"/usr/bin/thunderbird", "-compose",
                                                    "to=a@b,subject=S T,body=,attachment=file:///r.html"};
}

void TestDataCollectionEmail::commandWords()
{
    QFETCH(QString, command);
    QFETCH(QString, argument);
    QFETCH(QStringList, words);
    QCOMPARE(CrvC_DataCollectionEmail::commandWords(command, argument), words);
}

void TestDataCollectionEmail::unixCommand_data()
{
    QTest::addColumn<QString>("tool");
    QTest::addColumn<QString>("body");
    QTest::addColumn<QString>("file");
    QTest::addColumn<QStringList>("words");
    QTest::newRow("thunderbird")
        << "/usr/bin/thunderbird" << "" << "/p/device_usage_statistics.html"
        << QStringList{"/usr/bin/thunderbird", "-compose",
                       "to=a@x.example,subject=Corvid,body=,attachment=file:///p/device_usage_statistics.html"};
    QTest::newRow("program path with a space")
        << "/opt/my apps/mozilla" << "" << "/r.html"
        << QStringList{"/opt/my apps/mozilla", "-compose", "to=a@x.example,subject=Corvid,body=,attachment=file:///r.html"};
    QTest::newRow("xdg-email") << "/usr/bin/xdg-email" << "" << "/my project/r.html"
                               << QStringList{"/usr/bin/xdg-email", "--subject", "Corvid", "--attach",
                                              "/my project/r.html", "a@x.example"};
    QTest::newRow("xdg-email with body") << "/usr/bin/xdg-email" << "see \"this\"" << "/r.html"
                                         << QStringList{"/usr/bin/xdg-email", "--subject", "Corvid", "--body",
                                                        "see this", "--attach", "/r.html", "a@x.example"};
}

void TestDataCollectionEmail::unixCommand()
{
    QFETCH(QString, tool);
    QFETCH(QString, body);
    QFETCH(QString, file);
    QFETCH(QStringList, words);
    CrvC_DataCollectionUnixImpl impl;
    const QString argument = impl.composeArgument(tool, "a@x.example", "Corvid", body, file);
    QCOMPARE(CrvC_DataCollectionEmail::commandWords(impl.toolCommand(tool), argument), words);
}

void TestDataCollectionEmail::unixTools_data()
{
    QTest::addColumn<QStringList>("path");     // folders under home; "-" a missing one
    QTest::addColumn<QStringList>("expected"); // relative to home
    QTest::newRow("folder twice")
        << QStringList{"a", "a", "a/"} << QStringList{"a/mozilla", "a/thunderbird", "a/xdg-email"};
    QTest::newRow("order of folders and names")
        << QStringList{"b", "missing", "", "a"}
        << QStringList{"b/netscape", "b/thunderbird", "a/mozilla", "a/thunderbird", "b/xdg-email"};
    QTest::newRow("nothing") << QStringList{"missing"} << QStringList();
}

void TestDataCollectionEmail::unixTools()
{
    QFETCH(QStringList, path);
    QFETCH(QStringList, expected);
    const QString a = makeProgramDir("a", {"mozilla", "thunderbird", "xdg-email", "evolution"});
    const QString b = makeProgramDir("b", {"thunderbird", "netscape", "xdg-email"});
    QVERIFY(!a.isEmpty() && !b.isEmpty());
    QDir().mkpath(m_env->home() + "/a/netscape"); // a folder is no program
    QStringList dirs;
    for (const QString &p : path)
        dirs << (p.isEmpty() ? QString() : m_env->home() + QLatin1Char('/') + p);
    qputenv("PATH", QFile::encodeName(dirs.join(QLatin1Char(':'))));

    CrvC_DataCollectionEmail email;
    QStringList found;
    // The fixed fall-back folders may hold programs of this machine.
    for (const QString &tool : email.emailTools()) {
        if (tool.startsWith(m_env->home() + QLatin1Char('/')))
            found << tool.mid(m_env->home().size() + 1);
    }
    QCOMPARE(found, expected);
}

void TestDataCollectionEmail::mailProgramArguments_data()
{
    QTest::addColumn<QString>("name");
    QTest::addColumn<QStringList>("arguments");
    QTest::newRow("compose request")
        << "thunderbird"
        << QStringList{"-compose", "to=c@x.example,subject=Corvid,body=,attachment=file:///p q/r.html"};
    QTest::newRow("xdg-email")
        << "xdg-email" << QStringList{"--subject", "Corvid", "--attach", "/p q/r.html", "c@x.example"};
}

void TestDataCollectionEmail::mailProgramArguments()
{
    QFETCH(QString, name);
    QFETCH(QStringList, arguments);
    const QString dir = makeProgramDir("mail", {name});
    const QString log = m_env->home() + "/mail.log";
    QFile::remove(log);
    qputenv("FAKE_MAIL_LOG", QFile::encodeName(log));
    QStringList warnings;
    CrvC_UserNotice::setHandlers([&warnings](const QString &text) { warnings << text; }, nullptr);

    CrvC_DataCollectionEmail email;
    email.send(dir + QLatin1Char('/') + name, "c@x.example", "Corvid", QString(), "/p q/r.html");
    QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(log), 10000);
    QCOMPARE(QString::fromUtf8(CorvidTest::readFile(log)).split('\n'), QStringList{name} + arguments);
    QVERIFY(warnings.isEmpty());
}

void TestDataCollectionEmail::programThatCannotStart()
{
    QStringList warnings;
    CrvC_UserNotice::setHandlers([&warnings](const QString &text) { warnings << text; }, nullptr);
    CrvC_DataCollectionEmail email;
    email.send(m_env->home() + "/none/thunderbird", "c@x.example", "Corvid", QString(), "/r.html");
    QTRY_COMPARE(warnings, QStringList{"Could not run E-mail Tool:\n"});
}

QTEST_GUILESS_MAIN(TestDataCollectionEmail)
#include "tst_datacollectionemail.moc"
