#include "common/TestEnvironment.h"
#include "host/Settings.h"
#include "project/CorvidSettings.h"
#include "report/VersionSection.h"

#include <QRegularExpression>
#include <QtTest>

// The table's layout is checked with the sample's golden page; here the
// host values and identifiers that go into it.
namespace {

// The value of the dtag-property `name` in `text`.
QString dtagValue(const QString &text, const QString &name)
{
    const QRegularExpression re(QLatin1String("<dtag-property name=\"") + QRegularExpression::escape(name)
                                + QLatin1String("\">([^<]*)</dtag-property>"));
    return re.match(text).captured(1);
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

    CorvidTest::Environment m_env;

private Q_SLOTS:
    void initTestCase()
    {
        QVERIFY(m_env.writeDataFile(QStringLiteral("orb_version"),
                                    "product=Orb Design Suite\nversion=14.7\n"
                                    "Registration_ID=ORB-EVAL-0000\nconfiguration.xc5=WebEdition\n"
                                    "configuration.xc6=Professional\n"));
    }

    void hostValues_data()
    {
        QTest::addColumn<QString>("registrationSetting");
        QTest::addColumn<QString>("device");
        QTest::addColumn<QString>("registration");
        QTest::addColumn<QString>("configuration");

        QTest::newRow("registered user, known device") << "REG-1234"
                                                       << "xc6a25"
                                                       << "REG-1234"
                                                       << " (Professional)";
        QTest::newRow("no user information: build value") << "No user information available."
                                                          << "XC5vlx"
                                                          << "ORB-EVAL-0000"
                                                          << " (WebEdition)";
    }

    void hostValues()
    {
        QFETCH(QString, registrationSetting);
        QFETCH(QString, device);
        setRegistration(registrationSetting);
        CrvC_ReportData data;
        data.targetDevice = device;
        const QString text = CrvC_VersionSection::versionSection(data, {});
        QTEST(dtagValue(text, QStringLiteral("RegistrationID")), "registration");
        QTEST(dtagValue(text, QStringLiteral("ProductConfiguration")), "configuration");
        QCOMPARE(dtagValue(text, QStringLiteral("ProductVersion")), QStringLiteral("Orb Design Suite:14.7"));
        QCOMPARE(dtagValue(text, QStringLiteral("OSPlatform")),
                 sizeof(void *) == 8 ? QStringLiteral("LIN64") : QStringLiteral("LIN"));
    }

    void identifiers()
    {
        m_env.clearSettings();
        CrvC_ReportData first, second;
        first.projectFile = second.projectFile = m_env.home() + QLatin1String("/gone.orb");
        second.projectIteration = QStringLiteral("12"); // a report's iteration is kept once shown
        const QString a = CrvC_VersionSection::versionSection(first, {});
        const QString b = CrvC_VersionSection::versionSection(second, {});

        const QString random = dtagValue(a, QStringLiteral("RandomID"));
        QVERIFY(QRegularExpression(QStringLiteral("^[0-9a-f]{32}$")).match(random).hasMatch());
        QCOMPARE(dtagValue(b, QStringLiteral("RandomID")), random);
        QCOMPARE(CrvC_Settings::value(CrvC_Settings::RandomID, QString()).toString(), random);

        // Without a project file every report has an identifier of its own.
        QVERIFY(dtagValue(a, QStringLiteral("ProjectID")) != dtagValue(b, QStringLiteral("ProjectID")));
        QCOMPARE(dtagValue(a, QStringLiteral("ProjectIteration")), QStringLiteral("1"));
        QCOMPARE(dtagValue(b, QStringLiteral("ProjectIteration")), QStringLiteral("12"));
        QVERIFY(!QFile::exists(first.projectFile));
    }
};

QTEST_GUILESS_MAIN(tst_VersionSection)
#include "tst_versionsection.moc"
