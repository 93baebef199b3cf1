#include "gates.h"
#include "idcommand.h"
#include "log.h"
#include "logcapture.h"
#include "paths.h"
#include "testfiles.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QLoggingCategory>
#include <QRegularExpression>
#include <QtTest>

class TestStartup : public QObject
{
    Q_OBJECT

    const QString m_room = qEnvironmentVariable("ROOM");

    QString standin(const QString& file) const { return m_room + "/standin/" + file; }

private slots:
    void initTestCase() { QVERIFY2(!m_room.isEmpty(), "runs inside a room only"); }

    void cleanup()
    {
        for (const char* file : {"id.stdout", "id.rc", "id.sleep"})
            QFile::remove(standin(file));
    }

    void domainGate_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<bool>("joined");
        QTest::newRow("true") << QByteArray(R"({"is_Domain": true})") << true;
        QTest::newRow("false") << QByteArray(R"({"is_Domain": false})") << false;
        QTest::newRow("the text true") << QByteArray(R"({"is_Domain": "true"})") << false;
        QTest::newRow("the number 1") << QByteArray(R"({"is_Domain": 1})") << false;
        QTest::newRow("no key") << QByteArray("{}") << false;
        QTest::newRow("empty file") << QByteArray() << false;
        QTest::newRow("broken") << QByteArray(R"({"is_Domain": true)") << false;
        QTest::newRow("array") << QByteArray("[true]") << false;
    }
    void domainGate()
    {
        QFETCH(QByteArray, content);
        QFETCH(bool, joined);
        testfiles::write(zent::kUserinfoPath, content);
        LogCapture log;
        QCOMPARE(isDomain(), joined);
        QCOMPARE(log.lines(), joined ? QStringList() : QStringList("is not Domain!"));
    }

    void domainGateIsSilentWithoutAReadableFile()
    {
        LogCapture log;
        testfiles::remove(zent::kUserinfoPath);
        QVERIFY(!isDomain());
        QDir().mkpath(zent::kUserinfoPath);
        QVERIFY(!isDomain());
        testfiles::remove(zent::kUserinfoPath);
        QCOMPARE(log.lines(), QStringList());
    }

    void userGate_data()
    {
        QTest::addColumn<QByteArray>("output");
        QTest::addColumn<bool>("passes");
        QTest::newRow("group") << QByteArray("uid=1(a) gid=1(a) groups=1(a),9(my-zentusers)\n") << true;
        QTest::newRow("other case") << QByteArray("uid=1(a) groups=9(ZENT)\n") << false;
        QTest::newRow("nothing") << QByteArray() << false;
    }
    void userGate()
    {
        QFETCH(QByteArray, output);
        QFETCH(bool, passes);
        testfiles::write(standin("id.stdout"), output);
        QCOMPARE(isLDAPUser(), passes);
    }

    void outputCountsWhateverTheExitStatus()
    {
        // "id" ends with 1 when a group has no name, which is common with directory groups.
        testfiles::write(standin("id.stdout"), "uid=1(a) groups=9(zent)\n");
        testfiles::write(standin("id.rc"), "1");
        QVERIFY(isLDAPUser());
    }

    void missingProgramGivesNothing()
    {
        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", "/nowhere");
        const QString output = idCommandOutput();
        qputenv("PATH", path);
        QCOMPARE(output, QString());
    }

    void minorVersion_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<int>("version");
        QTest::newRow("usual") << QByteArray("[Version]\nMajorVersion=20\nMinorVersion=1030\nX=1\n") << 1030;
        QTest::newRow("last wins") << QByteArray("MinorVersion=1\nMinorVersion=1021") << 1021;
        QTest::newRow("no number") << QByteArray("MinorVersion=abc\n") << 0;
        QTest::newRow("absent") << QByteArray("MajorVersion=20\n") << -1;
        QTest::newRow("empty") << QByteArray() << -1;
    }
    void minorVersion()
    {
        QFETCH(QByteArray, content);
        QFETCH(int, version);
        testfiles::write(zent::kOsVersionPath, content);
        QCOMPARE(getMiniVersion(), version);
        testfiles::remove(zent::kOsVersionPath);
        QCOMPARE(getMiniVersion(), 1000);
        QDir().mkpath(zent::kOsVersionPath);
        QCOMPARE(getMiniVersion(), -1);
        testfiles::remove(zent::kOsVersionPath);
    }

    void syslogRecords()
    {
        const QString logFile = m_room + "/syslog";
        const auto logged = [&](const QByteArray& text) {
            for (const QByteArray& line : testfiles::read(logFile).split('\n')) {
                if (line.contains(text))
                    return line;
            }
            return QByteArray();
        };
        zent::uOpenlog(zent::LEVEL_DEBUG);
        qDebug().noquote() << "first 记录 %s";
        const int line = __LINE__ - 1;
        qCritical("second");
        QMessageLogger().info("third");
        zent::uSyslogMessageHandler(QtFatalMsg, QMessageLogContext("a/b/c.cpp", 7, "int f()", "default"), "fourth");
        zent::uOpenlog(zent::LEVEL_WARNING);
        qDebug("dropped debug");
        qInfo("dropped info");
        qWarning("fifth");
        zent::uCloselog();
        qInstallMessageHandler(nullptr);
        QTRY_VERIFY(!logged("fifth").isEmpty());

        const QByteArray stamp = "test_startup\\[\\d+\\]: \\d{4}-\\d\\d-\\d\\d \\d\\d:\\d\\d:\\d\\d\\.\\d{3} ";
        const auto matches = [&](const QByteArray& text, const QString& priority, const QString& rest) {
            const QString pattern = QStringLiteral("^<%1>.* ").arg(priority) + stamp + rest + "$";
            const QString record = QString::fromUtf8(logged(text));
            const bool found = QRegularExpression(pattern).match(record).hasMatch();
            if (!found)
                qWarning() << record << pattern;
            return found;
        };
        const QString here = QStringLiteral("\\[ test_startup.cpp void TestStartup::syslogRecords\\(\\) ");
        // 24 is the facility of daemons; the record ends with the blank that the line format has before its end.
        QVERIFY(
            matches("first", "31", "debug " + here + QString::number(line) + QStringLiteral("\\]  first 记录 %s ")));
        QVERIFY(matches("second", "26", "critical " + here + QString::number(line + 2) + "\\]  second "));
        QVERIFY(matches("third", "30", "info \\[   0\\]  third "));
        QVERIFY(matches("fourth", "27", "fata \\[ c.cpp int f\\(\\) 7\\]  fourth "));
        QVERIFY(matches("fifth", "28", "warning .*fifth "));
        QVERIFY(logged("dropped").isEmpty());
    }
};

QTEST_GUILESS_MAIN(TestStartup)
#include "test_startup.moc"
