#include "common/TestEnvironment.h"
#include "host/Settings.h"
#include "plugin/CorvidSettings.h"
#include "project/ProjectRepositoryValues.h"
#include "report/VersionSection.h"

#include <QRegularExpression>
#include <QTemporaryDir>
#include <QtTest>

namespace {

// The table with %1 product:version, %2 configuration label, %3 family,
// %4 platform, %5 device, %6 identifiers, %7 package, %8 registration,
// %9 speed, %10 date.
const char *const VersionTable = R"(<TABLE BORDER CELLSPACING=0 WIDTH='100%'>
<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN='4'><B>Software Version and Target Device</B></TD></TR>
<TR ALIGN=LEFT>
<TD BGCOLOR='#FFFF99'><B>Product Version:</B></TD>
<TD><dtag-property name="ProductVersion">%1</dtag-property><dtag-property name="ProductConfiguration"> (%2)</dtag-property></TD>
<TD BGCOLOR='#FFFF99'><B>Target Family:</B></TD>
<TD><dtag-property name="TargetFamily">%3</dtag-property></TD>
</TR>
<TR ALIGN=LEFT>
<TD BGCOLOR='#FFFF99'><B>OS Platform:</B></TD>
<TD><dtag-property name="OSPlatform">%4</dtag-property></TD>
<TD BGCOLOR='#FFFF99'><B>Target Device:</B></TD>
<TD><dtag-property name="TargetDevice">%5</dtag-property></TD>
</TR>
<TR ALIGN=LEFT>
<TD BGCOLOR='#FFFF99'><B>Project ID (random number)</B></TD>
<TD>%6</TD>
<TD BGCOLOR='#FFFF99'><B>Target Package:</B></TD>
<TD><dtag-property name="TargetPackage">%7</dtag-property></TD>
</TR>
<TR ALIGN=LEFT>
<TD BGCOLOR='#FFFF99'><B>Registration ID</B></TD>
<TD><dtag-property name="RegistrationID">%8</dtag-property></TD>
<TD BGCOLOR='#FFFF99'><B>Target Speed:</B></TD>
<TD><dtag-property name="TargetSpeed">%9</dtag-property></TD>
</TR>
<TR ALIGN=LEFT>
<TD BGCOLOR='#FFFF99'><B>Date Generated</B></TD>
<TD><dtag-property name="Date Generated">%10</dtag-property></TD>
</TR>
</TABLE>)";

QString ids(const QString &random, const QString &project, const QString &iteration)
{
    return QLatin1String("<dtag-property name=\"RandomID\">") + random
        + QLatin1String("</dtag-property>.<dtag-property name=\"ProjectID\">") + project
        + QLatin1String("</dtag-property>.<dtag-property name=\"ProjectIteration\">") + iteration
        + QLatin1String("</dtag-property>");
}

const QByteArray BuildValues = "product=Orb Design Suite\nversion=14.7\n"
                               "Registration_ID=ORB-EVAL-0000\nconfiguration.xc5=WebEdition\n"
                               "configuration.xc6=Professional\n";

CrvC_ReportBuilder::Environment fixedEnvironment()
{
    CrvC_ReportBuilder::Environment env;
    env.now = [] { return QDateTime(QDate(2009, 3, 17), QTime(14, 5, 9)); };
    env.newIdentifier = [] { return QStringLiteral("0123456789abcdef0123456789abcdef"); };
    return env;
}

// The three identifiers shown in a version table.
QStringList shownIds(const QString &text)
{
    static const QRegularExpression re(QStringLiteral(
        "name=\"RandomID\">([^<]*)<.*name=\"ProjectID\">([^<]*)<.*name=\"ProjectIteration\">([^<]*)<"));
    const QRegularExpressionMatch m = re.match(text);
    return m.hasMatch() ? QStringList{m.captured(1), m.captured(2), m.captured(3)} : QStringList();
}

void setRegistration(const QString &text)
{
    Gui::Clip::Settings settings(QStringLiteral("UserInformation"), true, true, true);
    settings.setValue(QStringLiteral("Registration"), text);
}

} // namespace

class tst_VersionSection : public QObject
{
    Q_OBJECT

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;

    // True when the project repository keeps values for a project file.
    bool repositoryAvailable(const QString &projectFile)
    {
        const QString key = QStringLiteral("Corvid-Test-Probe");
        ProjectRepositoryValues::instance().setValue(projectFile, key, QStringLiteral("x"));
        return ProjectRepositoryValues::instance().getValue(projectFile, key) == QLatin1String("x");
    }

    QString newProjectFile(const QString &name)
    {
        const QString path = m_dir.filePath(name);
        CorvidTest::writeFile(path, QByteArray());
        return path;
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        QVERIFY(m_env->writeDataFile(QStringLiteral("orb_version"), BuildValues));
    }

    void init()
    {
        m_env->clearSettings();
        CrvC_Settings::setValue(CrvC_Settings::RandomID,
                                QStringLiteral("fedcba9876543210fedcba9876543210"));
    }

    void table_data()
    {
        QTest::addColumn<QString>("registrationSetting");
        QTest::addColumn<QString>("device");
        QTest::addColumn<QString>("family");
        QTest::addColumn<QString>("config");
        QTest::addColumn<QString>("registration");

        QTest::newRow("registered user, known device")
            << "REG-1234" << "xc6a25" << "Xc6" << "Professional" << "REG-1234";
        QTest::newRow("no user information: build value")
            << "No user information available." << "XC5vlx" << "Xc5" << "WebEdition"
            << "ORB-EVAL-0000";
        QTest::newRow("registration unset: build value")
            << "" << "" << "" << "" << "ORB-EVAL-0000";
        QTest::newRow("unknown device: empty label") << "REG-1" << "zz100" << "Zz" << "" << "REG-1";
    }

    void table()
    {
        QFETCH(QString, registrationSetting);
        QFETCH(QString, device);
        QFETCH(QString, family);
        QFETCH(QString, config);
        QFETCH(QString, registration);
        setRegistration(registrationSetting);

        CrvC_ReportData data;
        data.targetFamily = family;
        data.targetDevice = device;
        data.targetPackage = QStringLiteral("csg324");
        data.targetSpeed = QStringLiteral("-2");
        data.projectFile = m_dir.filePath(QStringLiteral("absent.orb"));

        const QString platform = sizeof(void *) == 8 ? QStringLiteral("LIN64") : QStringLiteral("LIN");
        const QString expected = QString::fromLatin1(VersionTable)
                                     .arg(QStringLiteral("Orb Design Suite:14.7"), config, family,
                                          platform, device,
                                          ids(QStringLiteral("fedcba9876543210fedcba9876543210"),
                                              QStringLiteral("0123456789abcdef0123456789abcdef"),
                                              QStringLiteral("1")),
                                          QStringLiteral("csg324"), registration,
                                          QStringLiteral("-2"))
                                     .arg(QStringLiteral("Tue Mar 17 14:05:09 2009"));
        QCOMPARE(CrvC_VersionSection::versionSection(data, fixedEnvironment()), expected);
        QCOMPARE(data.projectIteration, QStringLiteral("1"));
    }

    void randomIdMadeOnceAndKept()
    {
        m_env->clearSettings();
        CrvC_ReportData first, second;
        const QStringList a = shownIds(CrvC_VersionSection::versionSection(first, {}));
        const QStringList b = shownIds(CrvC_VersionSection::versionSection(second, {}));
        QCOMPARE(a.size(), 3);
        QVERIFY(QRegularExpression(QStringLiteral("^[0-9a-f]{32}$")).match(a.at(0)).hasMatch());
        QCOMPARE(b.at(0), a.at(0));
        QCOMPARE(CrvC_Settings::value(CrvC_Settings::RandomID, QString()).toString(), a.at(0));
    }

    void freshProjectIdsWithoutProjectFile_data()
    {
        QTest::addColumn<QString>("projectFile");
        QTest::newRow("no project file") << QString();
        QTest::newRow("project file missing") << m_dir.filePath(QStringLiteral("gone.orb"));
    }

    void freshProjectIdsWithoutProjectFile()
    {
        QFETCH(QString, projectFile);
        CrvC_ReportData first, second;
        first.projectFile = second.projectFile = projectFile;
        const QStringList a = shownIds(CrvC_VersionSection::versionSection(first, {}));
        const QStringList b = shownIds(CrvC_VersionSection::versionSection(second, {}));
        QCOMPARE(a.size(), 3);
        QVERIFY(QRegularExpression(QStringLiteral("^[0-9a-f]{32}$")).match(a.at(1)).hasMatch());
        QVERIFY(a.at(1) != b.at(1));
        QCOMPARE(a.at(2), QStringLiteral("1"));
        if (!projectFile.isEmpty())
            QVERIFY(!QFile::exists(projectFile));
    }

    void iterationCached()
    {
        CrvC_ReportData data;
        data.projectIteration = QStringLiteral("12");
        QCOMPARE(CrvC_VersionSection::projectIteration(data), QStringLiteral("12"));
        QCOMPARE(shownIds(CrvC_VersionSection::versionSection(data, {})).value(2),
                 QStringLiteral("12"));
    }

    void projectIdStoredOnce()
    {
        const QString projectFile = newProjectFile(QStringLiteral("ids.orb"));
        if (!repositoryAvailable(projectFile))
            QSKIP("the project repository is not available in this build");
        CrvC_ReportData first, second;
        first.projectFile = second.projectFile = projectFile;
        const QString a = shownIds(CrvC_VersionSection::versionSection(first, {})).value(1);
        const QString b = shownIds(CrvC_VersionSection::versionSection(second, {})).value(1);
        QCOMPARE(b, a);
        QCOMPARE(ProjectRepositoryValues::instance().getValue(
                     projectFile, QString::fromLatin1(ProjectRepositoryValues::ProjectIdKey)),
                 a);
    }

    void iterationFromRepository_data()
    {
        QTest::addColumn<QString>("stored");
        QTest::addColumn<QString>("shown");
        QTest::newRow("leading zeros") << "007" << "7";
        QTest::newRow("not a number") << "abc" << "1";
        QTest::newRow("empty") << "" << "1";
        QTest::newRow("plain") << "2" << "2";
    }

    void iterationFromRepository()
    {
        QFETCH(QString, stored);
        QFETCH(QString, shown);
        const QString projectFile = newProjectFile(QStringLiteral("iter.orb"));
        if (!repositoryAvailable(projectFile))
            QSKIP("the project repository is not available in this build");
        ProjectRepositoryValues::instance().setValue(
            projectFile, QString::fromLatin1(ProjectRepositoryValues::SendIterationKey), stored);
        CrvC_ReportData data;
        data.projectFile = projectFile;
        QCOMPARE(CrvC_VersionSection::projectIteration(data), shown);
        QCOMPARE(data.projectIteration, shown);
    }
};

QTEST_GUILESS_MAIN(tst_VersionSection)
#include "tst_versionsection.moc"
