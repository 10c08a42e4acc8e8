#include "common/TestEnvironment.h"

#include "transmit/DataCollectionEmail.h"
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
        CrvC_UserNotice::setHandlers([this](const QString &text) { m_warnings << text; }, nullptr);
    }

    void cleanupTestCase() { CrvC_UserNotice::setHandlers(nullptr, nullptr); }

    void init() { m_warnings.clear(); }
    void cleanup() { qputenv("PATH", m_path); }

    void commandWords_data()
    {
        QTest::addColumn<QString>("command");
        QTest::addColumn<QString>("argument");
        QTest::addColumn<QStringList>("words");
        QTest::newRow("quoted parts") << "\"C:\\P Q\\mail.exe\" /m \"%1\"" << "mailto:a?subject=b"
                                      << QStringList{"C:\\P Q\\mail.exe", "/m", "mailto:a?subject=b"};
        QTest::newRow("spaces and tabs") << "  a \t b\t\t%1  " << "c" << QStringList{"a", "b", "c"};
        QTest::newRow("quote inside a word") << "ab\"c d\"%1" << "e" << QStringList{"abc d", "e"};
        QTest::newRow("empty quotes") << "a \"\" %1" << "b" << QStringList{"a", "b"};
        QTest::newRow("unclosed quote") << "a \"b %1" << "c" << QStringList{"a", "b c"};
        QTest::newRow("NUL ends") << "a %1 c" << QString("b") + QChar(0) << QStringList{"a", "b"};
        QTest::newRow("no %1") << "prog.exe -mail" << "mailto:x" << QStringList();
        QTest::newRow("second %1 stays") << "p %1 %1" << "a" << QStringList{"p", "a", "%1"};
        QTest::newRow("argument with %1") << "p \"%1\" x" << "a %1" << QStringList{"p", "a %1", "x"};
    }

    void commandWords()
    {
        QFETCH(QString, command);
        QFETCH(QString, argument);
        QTEST(CrvC_DataCollectionEmail::commandWords(command, argument), "words");
    }

    void emailTools()
    {
        QVERIFY(!programDir("a", {"mozilla", "thunderbird", "xdg-email", "evolution"}).isEmpty());
        QVERIFY(!programDir("b", {"thunderbird", "netscape", "xdg-email"}).isEmpty());
        QDir().mkpath(m_env->home() + "/a/netscape"); // a folder is no program
        // Folders in order, each once; only the first xdg-email.
        const QString home = m_env->home();
        qputenv("PATH", QFile::encodeName(QStringList{home + "/b", home + "/missing", "", home + "/a", home + "/a/"}.join(':')));
        QStringList found;
        // The fixed fall-back folders may hold programs of this machine.
        for (const QString &tool : CrvC_DataCollectionEmail().emailTools())
            if (tool.startsWith(home + '/'))
                found << tool.mid(home.size() + 1);
        QCOMPARE(found, (QStringList{"b/netscape", "b/thunderbird", "a/mozilla", "a/thunderbird", "b/xdg-email"}));
    }

    void mailProgramArguments_data()
    {
        QTest::addColumn<QString>("folder");
        QTest::addColumn<QString>("name");
        QTest::addColumn<QString>("body");
        QTest::addColumn<QStringList>("arguments");
        QTest::newRow("compose") << "mail" << "thunderbird" << ""
                                 << QStringList{"-compose", "to=c@x.example,subject=Corvid,body=,attachment=file:///p q/r.html"};
        QTest::newRow("folder with a space") << "my apps" << "mozilla" << "b"
                                             << QStringList{"-compose", "to=c@x.example,subject=Corvid,body=b,attachment=file:///p q/r.html"};
        QTest::newRow("xdg-email") << "mail" << "xdg-email" << ""
                                   << QStringList{"--subject", "Corvid", "--attach", "/p q/r.html", "c@x.example"};
        QTest::newRow("xdg-email, body") << "mail" << "xdg-email" << "see \"it\""
                                         << QStringList{"--subject", "Corvid", "--body", "see it", "--attach",
                                                        "/p q/r.html", "c@x.example"};
    }

    void mailProgramArguments()
    {
        QFETCH(QString, folder);
        QFETCH(QString, name);
        QFETCH(QString, body);
        QFETCH(QStringList, arguments);
        const QString log = m_env->home() + "/mail.log";
        QFile::remove(log);
        qputenv("FAKE_MAIL_LOG", QFile::encodeName(log));
        CrvC_DataCollectionEmail().send(programDir(folder, {name}) + '/' + name, "c@x.example", "Corvid", body,
                                        "/p q/r.html");
        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(log), 10000);
        QCOMPARE(QString::fromUtf8(CorvidTest::readFile(log)).split('\n'), QStringList{name} + arguments);
        QVERIFY(m_warnings.isEmpty());
    }

    void programThatCannotStart()
    {
        CrvC_DataCollectionEmail().send(m_env->home() + "/none/thunderbird", "c@x.example", "Corvid", "", "/r.html");
        QCOMPARE(m_warnings, QStringList{"Could not run E-mail Tool:\n"}); // reported before send() returns
    }
};

QTEST_GUILESS_MAIN(TestDataCollectionEmail)
#include "tst_datacollectionemail.moc"
