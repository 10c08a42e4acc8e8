#include "HostileInputs.h"
#include "common/TestEnvironment.h"

#include "host/InputFile.h"
#include "host/MsgManData.h"
#include "host/XmlGuard.h"

#include <QTemporaryDir>
#include <QtTest>

using Port::InputFile;
using Port::XmlGuard;
using Status = InputFile::Status;

Q_DECLARE_METATYPE(InputFile::Status)

class tst_InputFile : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;
    QStringList m_debug;
    Port_MsgManData::Sink m_previousSink;

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        QVERIFY(m_dir.isValid());
        m_previousSink = Port_MsgManData::setSink([this](const Port_MsgManData::Message &m) {
            m_debug << QString::fromStdString(m.text);
        });
    }

    void init() { m_debug.clear(); }
    void cleanupTestCase() { Port_MsgManData::setSink(m_previousSink); }

    void open_data()
    {
        QTest::addColumn<QString>("setup"); // "regular", "link", "missing", "dangling", "at limit" or a case name
        QTest::addColumn<int>("kind");
        QTest::addColumn<InputFile::Status>("status");

        const std::pair<const char *, Status> setups[] = {
            {"regular", Status::Opened},           {"link", Status::Opened},
            {"at limit", Status::Opened},          {"missing", Status::Missing},
            {"dangling", Status::Missing},         {"named pipe", Status::NotRegular},
            {"link to /dev/zero", Status::NotRegular}, {"directory", Status::NotRegular},
            {"over the limit", Status::TooLarge},
        };
        // Two kinds with different limits are enough for the table; every kind
        // meets every case through its reader in tst_hostileinputs.
        for (int kind : {int(InputFile::InstallSettings), int(InputFile::UsageXml)}) {
            for (const auto &s : setups) {
                QTest::addRow("%s: %s", InputFile::kindName(InputFile::Kind(kind)), s.first)
                    << QString::fromLatin1(s.first) << kind << s.second;
            }
        }
    }

    void open()
    {
        QFETCH(QString, setup);
        QFETCH(int, kind);
        QFETCH(InputFile::Status, status);
        const InputFile::Kind k = InputFile::Kind(kind);
        const QString path = m_dir.filePath(QString::number(kind) + setup);
        const QString regular = m_dir.filePath(QStringLiteral("regular-target"));
        QVERIFY(CorvidTest::writeFile(regular, "contents\n"));

        QFile file;
        if (setup == QLatin1String("regular"))
            QVERIFY(CorvidTest::writeFile(path, "contents\n"));
        else if (setup == QLatin1String("link") || setup == QLatin1String("dangling"))
            QVERIFY(QFile::link(setup == QLatin1String("link") ? regular : path + QLatin1String(".none"), path));
        else if (setup == QLatin1String("at limit"))
            QVERIFY(CorvidTest::writeFile(path, QByteArray()) && QFile::resize(path, InputFile::sizeLimit(k)));
        for (HostileInputs::Case c : {HostileInputs::Case::Fifo, HostileInputs::Case::DeviceLink,
                                      HostileInputs::Case::Directory, HostileInputs::Case::OverLimit}) {
            if (setup == QLatin1String(HostileInputs::name(c)))
                QVERIFY(HostileInputs::plant(path, c, k));
        }

        QString reason;
        QCOMPARE(InputFile::open(path, k, file, &reason), status);
        QCOMPARE(file.isOpen(), status == Status::Opened);
        QCOMPARE(InputFile::isAvailable(path, k), status == Status::Opened);
        if (status == Status::Opened) {
            QCOMPARE(file.pos(), qint64(0));
            if (setup != QLatin1String("at limit"))
                QCOMPARE(file.readAll(), QByteArray("contents\n"));
        }
        // Refusals leave a debug line naming the file and the reason; nothing else does.
        if (status == Status::Opened || status == Status::Missing) {
            QVERIFY2(m_debug.isEmpty(), qPrintable(m_debug.join(QLatin1Char('|'))));
        } else {
            QVERIFY(!reason.isEmpty() && !m_debug.isEmpty());
            QVERIFY2(m_debug.first().contains(path) && m_debug.first().contains(reason),
                     qPrintable(m_debug.first()));
        }
        QByteArray bytes("stale");
        QCOMPARE(InputFile::readAll(path, k, bytes), status);
        if (status != Status::Opened)
            QVERIFY(bytes.isEmpty());
    }

    void hasDeclarations_data()
    {
        QTest::addColumn<QByteArray>("xml");
        QTest::addColumn<bool>("declarations");

        // No false alarms: an external DTD (no parser here fetches it), brackets
        // outside a subset.
        QTest::newRow("public identifier with a bracket")
            << QByteArray("<!DOCTYPE r PUBLIC \"-//x//[DTD]//EN\" 'r[1].dtd'><r/>") << false;
        QTest::newRow("comment and instruction first")
            << QByteArray("\xEF\xBB\xBF<!-- <!DOCTYPE [ --><?pi [ ?>\n<r/>") << false;
        QTest::newRow("bracket in the content") << QByteArray("<r>[<![CDATA[x]]></r>") << false;
        QTest::newRow("empty") << QByteArray() << false;
        QTest::newRow("empty internal subset") << QByteArray("<!DOCTYPE r []><r/>") << true;
        QTest::newRow("external and internal")
            << QByteArray("<!DOCTYPE r SYSTEM 'r.dtd' [<!ELEMENT r ANY>]><r/>") << true;
        QTest::newRow("declaration without a doctype")
            << QByteArray("<!ENTITY a 'b'><r/>") << true;
        QTest::newRow("after a long comment")
            << QByteArray("<!--" + QByteArray(200000, 'x') + "--><!DOCTYPE r [ ]><r/>") << true;
        const QString subset = QStringLiteral("<?xml version='1.0' encoding='UTF-16'?>"
                                              "<!DOCTYPE r [<!ENTITY a 'b'>]><r/>");
        QByteArray le("\xFF\xFE");
        le.append(reinterpret_cast<const char *>(subset.utf16()), subset.size() * 2);
        QTest::newRow("UTF-16LE with a byte-order mark") << le << true;
        QTest::newRow("UTF-16LE without one") << le.mid(2) << true;
        QByteArray be;
        for (QChar c : subset)
            be.append(char(c.unicode() >> 8)).append(char(c.unicode() & 0xFF));
        QTest::newRow("UTF-16BE without a byte-order mark") << be << true;
        QByteArray utf32;
        for (QChar c : subset)
            utf32.append(char(c.unicode())).append(3, '\0');
        QTest::newRow("UTF-32LE") << utf32 << true;
    }

    void hasDeclarations()
    {
        QFETCH(QByteArray, xml);
        QFETCH(bool, declarations);
        QCOMPARE(XmlGuard::hasDeclarations(xml), declarations);
    }

    void depth_data()
    {
        QTest::addColumn<QByteArray>("xml");
        QTest::addColumn<int>("maxDepth");
        QTest::addColumn<bool>("tooDeep");

        const auto nested = [](int levels) -> QByteArray {
            return QByteArray("<d>").repeated(levels) + QByteArray("</d>").repeated(levels);
        };
        QTest::newRow("at the limit") << nested(5) << 5 << false;
        QTest::newRow("one level past") << nested(6) << 5 << true;
        QTest::newRow("50000 levels") << nested(50000) << XmlGuard::MaxDepth << true;
        QTest::newRow("siblings do not add up")
            << QByteArray("<r>" + QByteArray("<a/>").repeated(20) + "</r>") << 2 << false;
    }

    void depth()
    {
        QFETCH(QByteArray, xml);
        QFETCH(int, maxDepth);
        QFETCH(bool, tooDeep);
        QCOMPARE(XmlGuard::exceedsDepth(xml, maxDepth), tooDeep);

        // The streaming readers' counter agrees, and ends the stream with an error.
        QXmlStreamReader reader(xml);
        int depth = 0;
        int deepest = 0;
        while (!reader.atEnd()) {
            XmlGuard::readNext(reader, depth, maxDepth);
            deepest = qMax(deepest, depth);
        }
        QCOMPARE(deepest > maxDepth, tooDeep);
        if (tooDeep)
            QVERIFY(reader.hasError());
    }
};

QTEST_GUILESS_MAIN(tst_InputFile)
#include "tst_inputfile.moc"
