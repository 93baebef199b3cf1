#include "gates.h"
#include "log.h"
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

    void userGate()
    {
        const auto passes = [this](const QByteArray& output) {
            testfiles::write(m_room + "/standin/id.stdout", output);
            return isLDAPUser();
        };
        QVERIFY(passes("uid=1(a) gid=1(a) groups=1(a),9(my-zentusers)\n"));
        QVERIFY(!passes("uid=1(a) groups=9(ZENT)\n"));
        // "id" ends with 1 when a group has no name, which is common with directory groups.
        testfiles::write(m_room + "/standin/id.rc", "1");
        QVERIFY(passes("uid=1(a) groups=9(zent)\n"));
        // More than a pipe holds.
        QVERIFY(passes(QByteArray(200000, ' ') + "zent\n"));
        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", "/nowhere");
        QVERIFY(!isLDAPUser());
        qputenv("PATH", path);
    }

    void minorVersion()
    {
        testfiles::write(zent::kOsVersionPath, "MinorVersion=1\nMinorVersion=1021\nX=1\n");
        QCOMPARE(getMiniVersion(), 1021);
        testfiles::write(zent::kOsVersionPath, "MajorVersion=20\n");
        QCOMPARE(getMiniVersion(), -1);
        testfiles::remove(zent::kOsVersionPath);
        QCOMPARE(getMiniVersion(), 1000);
    }

    void syslogRecords()
    {
        zent::uOpenlog(zent::LEVEL_DEBUG);
        qDebug().noquote() << "first 记录 %s";
        const int line = __LINE__ - 1;
        zent::uSyslogMessageHandler(QtFatalMsg, QMessageLogContext("a/b/c.cpp", 7, "int f()", "default"), "second");
        zent::uOpenlog(zent::LEVEL_WARNING);
        qDebug("dropped");
        qWarning("third");
        zent::uCloselog();
        qInstallMessageHandler(nullptr);
        QTRY_VERIFY(testfiles::read(m_room + "/syslog").contains("third"));

        const QString here = "test_startup.cpp void TestStartup::syslogRecords() ";
        // The priority, which 24, the facility of daemons, is part of, and what follows the time stamp. The record ends
        // with the blank that the line format has before its end.
        const QList<QPair<QString, QString>> expected = {
            {"31", QStringLiteral("debug [ %1%2]  first 记录 %s ").arg(here).arg(line)},
            {"27", "fata [ c.cpp int f() 7]  second "},
            {"28", QStringLiteral("warning [ %1%2]  third ").arg(here).arg(line + 5)},
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
