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
        CrvC_UserNotice::setHandlers(
            [this](const QString &text, const QString &details) { m_warnings << text + '|' + details; },
            nullptr);
    }

    void cleanupTestCase() { CrvC_UserNotice::setHandlers(nullptr, nullptr); }

    void init() { m_warnings.clear(); }
    void cleanup() { qputenv("PATH", m_path); }

    void emailTools()
    {
        QVERIFY(!programDir("a", {"mozilla", "thunderbird", "xdg-email", "evolution"}).isEmpty());
        QVERIFY(!programDir("b", {"thunderbird", "netscape", "xdg-email"}).isEmpty());
        QDir().mkpath(m_env->home() + "/a/netscape"); // a folder is no program
        // Folders in order, each once; only the first xdg-email.
        const QString home = m_env->home();
        qputenv("PATH",
                QFile::encodeName(
                    QStringList{home + "/b", home + "/missing", "", home + "/a", home + "/a/"}.join(':')));
        QStringList found;
        // The fixed fall-back folders may hold programs of this machine.
        for (const QString &tool : CrvC_DataCollectionEmail().emailTools())
            if (tool.startsWith(home + '/'))
                found << tool.mid(home.size() + 1);
        QCOMPARE(found,
                 (QStringList{"b/netscape", "b/thunderbird", "a/mozilla", "a/thunderbird", "b/xdg-email"}));
    }

    void mailProgramArguments_data()
    {
        QTest::addColumn<QString>("folder");
        QTest::addColumn<QString>("name");
        QTest::addColumn<QString>("body");
        QTest::addColumn<QString>("file");
        QTest::addColumn<QStringList>("arguments"); // empty: refused, nothing started
        const QString compose = "to='c@x.example',subject='Corvid',body='%1',attachment='file://%2'";
        QTest::newRow("compose") << "mail"
                                 << "thunderbird"
                                 << ""
                                 << "/p q/r.html"
                                 << QStringList{"-compose", compose.arg("", "/p%20q/r.html")};
        QTest::newRow("folder with a space")
            << "my apps"
            << "mozilla"
            << "b"
            << "/p/r.html" << QStringList{"-compose", compose.arg("b", "/p/r.html")};
        // Quotes and commas stay inside the request's values.
        QTest::newRow("compose, odd path")
            << "mail"
            << "netscape"
            << ""
            << "/a\"b,c'd/r.html" << QStringList{"-compose", compose.arg("", "/a%22b%2Cc%27d/r.html")};
        QTest::newRow("xdg-email") << "mail"
                                   << "xdg-email"
                                   << ""
                                   << "/p q/r.html"
                                   << QStringList{"--subject", "Corvid", "--attach", "/p q/r.html",
                                                  "c@x.example"};
        QTest::newRow("xdg-email, odd path and body")
            << "mail"
            << "xdg-email"
            << "see \"it\""
            << "/a\"b,c'd --new-instance/r.html"
            << QStringList{"--subject",  "Corvid",   "--body",
                           "see \"it\"", "--attach", "/a\"b,c'd --new-instance/r.html",
                           "c@x.example"};
        QTest::newRow("line break in the path") << "mail"
                                                << "xdg-email"
                                                << ""
                                                << "/p\nq/r.html" << QStringList();
    }

    void mailProgramArguments()
    {
        QFETCH(QString, folder);
        QFETCH(QString, name);
        QFETCH(QString, body);
        QFETCH(QString, file);
        QFETCH(QStringList, arguments);
        const QString log = m_env->home() + "/mail.log";
        QFile::remove(log);
        qputenv("FAKE_MAIL_LOG", QFile::encodeName(log));
        CrvC_DataCollectionEmail().send(programDir(folder, {name}) + '/' + name, "c@x.example", "Corvid",
                                        body, file);
        if (arguments.isEmpty()) { // refused before anything starts
            QVERIFY(m_warnings.size() == 1 && m_warnings.first().contains(file));
            return;
        }
        QTRY_VERIFY_WITH_TIMEOUT(QFile::exists(log), 10000);
        QCOMPARE(QString::fromUtf8(CorvidTest::readFile(log)).split('\n'), QStringList{name} + arguments);
        QVERIFY(m_warnings.isEmpty());
    }

    void programThatCannotStart()
    {
        const QString tool = m_env->home() + "/none/thunderbird";
        CrvC_DataCollectionEmail().send(tool, "c@x.example", "Corvid", "", "/r.html");
        // Named, with the reason; reported before send() returns.
        QVERIFY(m_warnings.size() == 1
                && m_warnings.first().startsWith("Could not run E-mail Tool:\n" + tool + "|"));
        QVERIFY2(m_warnings.first().contains("No such file"), qPrintable(m_warnings.first()));
    }
};

QTEST_GUILESS_MAIN(TestDataCollectionEmail)
#include "tst_datacollectionemail.moc"
