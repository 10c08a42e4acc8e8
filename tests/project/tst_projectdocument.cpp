#include "common/TestEnvironment.h"

#include "host/project/ProjectDocument.h"

#include <QtTest>

using OrbProject::ProjectDocument;

// Project files the host must refuse (a project that cannot be read gives
// Corvid no project) or read although they are odd.
class TestProjectDocument : public QObject
{
    Q_OBJECT
    CorvidTest::Environment m_env;

private Q_SLOTS:
    void read_data()
    {
        QTest::addColumn<QByteArray>("contents"); // null: no file at all
        QTest::addColumn<QString>("problem");     // empty: read

        const int depth = 200000;
        const QByteArray deep = "<project name='deep'><sources><file path='a.vhd'/></sources>"
                                + QByteArray("<x>").repeated(depth);
        QTest::newRow("missing file") << QByteArray() << "no such project file";
        QTest::newRow("empty file") << QByteArray("") << "not a well-formed project file";
        QTest::newRow("unclosed element") << QByteArray("<project><sources>") << "line 1";
        QTest::newRow("UTF-7") << QByteArray(
            "<?xml version='1.0' encoding='UTF-7'?><project name='+2D3d,-'/>")
                               << "its encoding \"UTF-7\" is not supported";
        QTest::newRow("internal DTD subset")
            << QByteArray("<!DOCTYPE project [<!ENTITY n 'x'>]><project name='&n;'/>")
            << "not a well-formed project file: DTD declarations";
        QTest::newRow("deep nesting, never closed") << deep << "not a well-formed";
        QTest::newRow("deep nesting is passed over")
            << deep + QByteArray("</x>").repeated(depth) + "</project>" << QString();
    }

    void read()
    {
        QFETCH(QByteArray, contents);
        QFETCH(QString, problem);
        const QString file = contents.isNull() ? m_env.path(QStringLiteral("none.orb"))
                                               : m_env.write(QStringLiteral("read.orb"), contents);
        ProjectDocument document;
        document.name = QStringLiteral("unchanged");
        QString error;
        QCOMPARE(document.read(file, &error), problem.isEmpty());
        if (problem.isEmpty()) {
            QCOMPARE(document.sources.size(), 1);
        } else {
            QVERIFY2(error.startsWith(file + QLatin1String(": ")) && error.contains(problem),
                     qPrintable(error));
            QCOMPARE(document.name, QStringLiteral("unchanged"));
        }
    }
};

QTEST_GUILESS_MAIN(TestProjectDocument)
#include "tst_projectdocument.moc"
