#include "common/TestEnvironment.h"

#include "transmit/DataCollectionEmail.h"
#include "transmit/DataCollectionUnixImpl.h"
#include "transmit/UserNotice.h"

#include <QtTest>

class TestDataCollectionEmail : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    QByteArray m_path;
    QStringList m_warnings;

    // home/<folder> with copies of the fake mail program named `names`.
    QString programDir(const QString &folder, const QStringList &names)
    {
        const QString dir = m_env->home() + '/' + folder;
        QDir().mkpath(dir);
        for (const QString &name : names) {
            QFile::remove(dir + '/' + name);
            if (!QFile::copy(CORVID_FAKES_DIR "/fakemail", dir + '/' + name))
                return QString();
        }
        return dir;
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        m_path = qgetenv("PATH");
    }

    void init()
    {
        m_warnings.clear();
        CrvC_UserNotice::setHandlers([this](const QString &text) { m_warnings << text; }, nullptr);
    }

    void cleanup()
    {
        qputenv("PATH", m_path);
        CrvC_UserNotice::setHandlers(nullptr, nullptr);
    }

    void splitCommandLine_data()
    {
        QTest::addColumn<QString>("command");
        QTest::addColumn<QStringList>("words");
        QTest::newRow("quoted parts") << "\"C:\\P Q\\mail.exe\" /m \"mailto:a?subject=b\""
                                      << QStringList{"C:\\P Q\\mail.exe", "/m", "mailto:a?subject=b"};
        QTest::newRow("spaces and tabs") << "  a \t b\t\tc  " << QStringList{"a", "b", "c"};
        QTest::newRow("quote inside a word") << "ab\"c d\"e" << QStringList{"abc d", "e"};
        QTest::newRow("empty quotes") << "a \"\" b" << QStringList{"a", "b"};
        QTest::newRow("unclosed quote") << "a \"b c" << QStringList{"a", "b c"};
        QTest::newRow("NUL ends") << QString("a b") + QChar(0) + " c" << QStringList{"a", "b"};
    }

    void splitCommandLine()
    {
        QFETCH(QString, command);
        QFETCH(QStringList, words);
        QCOMPARE(CrvC_DataCollectionEmail::splitCommandLine(command), words);
    }

    void commandWords_data()
    {
        QTest::addColumn<QString>("command");
        QTest::addColumn<QString>("argument");
        QTest::addColumn<QStringList>("words");
        QTest::newRow("template") << "prog.exe -mail %1" << "mailto:x" << QStringList{"prog.exe", "-mail", "mailto:x"};
        QTest::newRow("no %1") << "prog.exe -mail" << "mailto:x" << QStringList();
        QTest::newRow("%1 alone") << "%1" << "mailto:x" << QStringList{"mailto:x"};
        QTest::newRow("second %1 stays") << "p %1 %1" << "a" << QStringList{"p", "a", "%1"};
        QTest::newRow("argument with %1") << "p \"%1\" x" << "a %1" << QStringList{"p", "a %1", "x"};
    }

    void commandWords()
    {
        QFETCH(QString, command);
        QFETCH(QString, argument);
        QFETCH(QStringList, words);
        QCOMPARE(CrvC_DataCollectionEmail::commandWords(command, argument), words);
    }

    void unixCommand_data()
    {
        QTest::addColumn<QString>("tool");
        QTest::addColumn<QString>("body");
        QTest::addColumn<QStringList>("words");
        QTest::newRow("compose") << "/usr/bin/thunderbird" << ""
                                 << QStringList{"/usr/bin/thunderbird", "-compose",
                                                "to=a@x.example,subject=Corvid,body=,attachment=file:///p q/r.html"};
        QTest::newRow("path with a space") << "/my apps/mozilla" << "b"
                                           << QStringList{"/my apps/mozilla", "-compose",
                                                          "to=a@x.example,subject=Corvid,body=b,attachment=file:///p q/r.html"};
        QTest::newRow("xdg-email") << "/usr/bin/xdg-email" << ""
                                   << QStringList{"/usr/bin/xdg-email", "--subject", "Corvid", "--attach", "/p q/r.html",
                                                  "a@x.example"};
        QTest::newRow("xdg-email, body") << "/usr/bin/xdg-email" << "see \"it\""
                                         << QStringList{"/usr/bin/xdg-email", "--subject", "Corvid", "--body", "see it",
                                                        "--attach", "/p q/r.html", "a@x.example"};
    }

    void unixCommand()
    {
        QFETCH(QString, tool);
        QFETCH(QString, body);
        QFETCH(QStringList, words);
        CrvC_DataCollectionUnixImpl impl;
        const QString argument = impl.composeArgument(tool, "a@x.example", "Corvid", body, "/p q/r.html");
        QCOMPARE(CrvC_DataCollectionEmail::commandWords(impl.toolCommand(tool), argument), words);
    }

    void unixTools_data()
    {
        QTest::addColumn<QStringList>("path");     // folders under home
        QTest::addColumn<QStringList>("expected"); // relative to home
        QTest::newRow("folder twice") << QStringList{"a", "a", "a/"}
                                      << QStringList{"a/mozilla", "a/thunderbird", "a/xdg-email"};
        QTest::newRow("folders in order") << QStringList{"b", "missing", "", "a"}
                                          << QStringList{"b/netscape", "b/thunderbird", "a/mozilla", "a/thunderbird",
                                                         "b/xdg-email"};
    }

    void unixTools()
    {
        QFETCH(QStringList, path);
        QFETCH(QStringList, expected);
        QVERIFY(!programDir("a", {"mozilla", "thunderbird", "xdg-email", "evolution"}).isEmpty());
        QVERIFY(!programDir("b", {"thunderbird", "netscape", "xdg-email"}).isEmpty());
        QDir().mkpath(m_env->home() + "/a/netscape"); // a folder is no program
        QStringList dirs;
        for (const QString &p : path)
            dirs << (p.isEmpty() ? p : m_env->home() + '/' + p);
        qputenv("PATH", QFile::encodeName(dirs.join(':')));

        QStringList found;
        // The fixed fall-back folders may hold programs of this machine.
        for (const QString &tool : CrvC_DataCollectionEmail().emailTools())
            if (tool.startsWith(m_env->home() + '/'))
                found << tool.mid(m_env->home().size() + 1);
        QCOMPARE(found, expected);
    }

    void mailProgramArguments_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<QStringList>("arguments");
        QTest::newRow("compose") << "thunderbird"
                                 << QStringList{"-compose", "to=c@x.example,subject=Corvid,body=,attachment=file:///p q/r.html"};
        QTest::newRow("xdg-email") << "xdg-email"
                                   << QStringList{"--subject", "Corvid", "--attach", "/p q/r.html", "c@x.example"};
    }

    void mailProgramArguments()
    {
        QFETCH(QString, name);
        QFETCH(QStringList, arguments);
        const QString log = m_env->home() + "/mail.log";
        QFile::remove(log);
        qputenv("FAKE_MAIL_LOG", QFile::encodeName(log));
        CrvC_DataCollectionEmail().send(programDir("mail", {name}) + '/' + name, "c@x.example", "Corvid", "",
                                        "/p q/r.html");
        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(log), 10000);
        QCOMPARE(QString::fromUtf8(CorvidTest::readFile(log)).split('\n'), QStringList{name} + arguments);
        QVERIFY(m_warnings.isEmpty());
    }

    void programThatCannotStart()
    {
        CrvC_DataCollectionEmail email;
        email.send(m_env->home() + "/none/thunderbird", "c@x.example", "Corvid", "", "/r.html");
        QCOMPARE(m_warnings, QStringList{"Could not run E-mail Tool:\n"}); // reported before send() returns
    }
};

QTEST_GUILESS_MAIN(TestDataCollectionEmail)
#include "tst_datacollectionemail.moc"
