#include "gates.h"
#include "log.h"
#include "logcapture.h"
#include "paths.h"
#include "testfiles.h"

#include <QCoreApplication>
#include <QRegularExpression>
#include <QtTest>

class TestStartup : public QObject
{
    Q_OBJECT

    const QString m_room = qEnvironmentVariable("ROOM");

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void domainGate()
    {
        const QMap<QByteArray, bool> cases = {{R"({"is_Domain": true})", true},
                                              {R"({"is_Domain": "true"})", false},
                                              {R"({"is_Domain": 1})", false},
                                              {R"({"is_Domain": true)", false},
                                              {"{}", false},
                                              {"[true]", false},
                                              {"", false}};
        for (auto row = cases.begin(); row != cases.end(); ++row) {
            testfiles::write(zent::kUserinfoPath, row.key());
            LogCapture log;
            QVERIFY2(isDomain() == row.value(), row.key());
            QCOMPARE(log.lines(), row.value() ? QStringList() : QStringList("is not Domain!"));
        }
        LogCapture log;
        testfiles::remove(zent::kUserinfoPath);
        QVERIFY(!isDomain());
        QDir().mkpath(zent::kUserinfoPath);
        QVERIFY(!isDomain());
        testfiles::remove(zent::kUserinfoPath);
        QCOMPARE(log.lines(), QStringList());
    }

    void userGate()
    {
        const auto passes = [this](const char* output) {
            testfiles::write(m_room + "/standin/id.stdout", output);
            return isLDAPUser();
        };
        QVERIFY(passes("uid=1(a) gid=1(a) groups=1(a),9(my-zentusers)\n"));
        QVERIFY(!passes("uid=1(a) groups=9(ZENT)\n"));
        QVERIFY(!passes(""));
        // "id" ends with 1 when a group has no name, which is common with directory groups.
        testfiles::write(m_room + "/standin/id.rc", "1");
        QVERIFY(passes("uid=1(a) groups=9(zent)\n"));
        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", "/nowhere");
        const bool withoutProgram = isLDAPUser();
        qputenv("PATH", path);
        QVERIFY(!withoutProgram);
    }

    void minorVersion()
    {
        const QMap<QByteArray, int> cases = {{"[Version]\nMajorVersion=20\nMinorVersion=1030\nX=1\n", 1030},
                                             {"MinorVersion=1\nMinorVersion=1021", 1021},
                                             {"MinorVersion=abc\n", 0},
                                             {"MajorVersion=20\n", -1}};
        for (auto row = cases.begin(); row != cases.end(); ++row) {
            testfiles::write(zent::kOsVersionPath, row.key());
            QCOMPARE(getMiniVersion(), row.value());
        }
        testfiles::remove(zent::kOsVersionPath);
        QCOMPARE(getMiniVersion(), 1000);
        QDir().mkpath(zent::kOsVersionPath);
        QCOMPARE(getMiniVersion(), -1);
        testfiles::remove(zent::kOsVersionPath);
    }

    void syslogRecords()
    {
        zent::uOpenlog(zent::LEVEL_DEBUG);
        qDebug().noquote() << "first 记录 %s";
        const int line = __LINE__ - 1;
        qCritical("second");
        QMessageLogger().info("third");
        zent::uSyslogMessageHandler(QtFatalMsg, QMessageLogContext("a/b/c.cpp", 7, "int f()", "default"), "fourth");
        zent::uOpenlog(zent::LEVEL_WARNING);
        qDebug("dropped");
        qInfo("dropped");
        qWarning("fifth");
        zent::uCloselog();
        qInstallMessageHandler(nullptr);
        QTRY_VERIFY(testfiles::read(m_room + "/syslog").contains("fifth"));

        const QString here = "test_startup.cpp void TestStartup::syslogRecords() ";
        // The priority, which 24, the facility of daemons, is part of, and what follows the time stamp. The record ends
        // with the blank that the line format has before its end.
        const QList<QPair<QString, QString>> expected = {
            {"31", QStringLiteral("debug [ %1%2]  first 记录 %s ").arg(here).arg(line)},
            {"26", QStringLiteral("critical [ %1%2]  second ").arg(here).arg(line + 2)},
            {"30", "info [   0]  third "},
            {"27", "fata [ c.cpp int f() 7]  fourth "},
            {"28", QStringLiteral("warning [ %1%2]  fifth ").arg(here).arg(line + 8)},
        };
        const QStringList records = QString::fromUtf8(testfiles::read(m_room + "/syslog")).split('\n');
        for (const auto& [priority, text] : expected) {
            const QRegularExpression pattern(
                QStringLiteral("^<%1>.* test_startup\\[\\d+\\]: \\d{4}-\\d\\d-\\d\\d \\d\\d:\\d\\d:\\d\\d\\.\\d{3} %2$")
                    .arg(priority, QRegularExpression::escape(text)));
            QVERIFY2(records.indexOf(pattern) >= 0, qPrintable(text));
        }
        QVERIFY(records.filter("dropped").isEmpty());
    }
};

QTEST_GUILESS_MAIN(TestStartup)
#include "test_startup.moc"
