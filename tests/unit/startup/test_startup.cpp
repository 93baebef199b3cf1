// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "gates.h"
#include "idcommand.h"
#include "instancelock.h"
#include "log.h"
#include "signalquit.h"

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

namespace
{

/// What the kernel answers instead to so many calls, if anything.
int refusal = 0;
int refusals = 0;

} // namespace

extern "C" int flock(int fd, int operation) noexcept
{
    if (refusals-- <= 0)
        return int(::syscall(SYS_flock, fd, operation));
    errno = refusal;
    return -1;
}

/// What decides whether and how the client starts, and what goes on until its end.
class TestStartup : public QObject
{
    Q_OBJECT

    using Result = InstanceLock::Result;

    const QString m_room = qEnvironmentVariable("ROOM");

private slots:
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
        testfiles::write(m_room + "/standin/id.hook", "echo zent; kill -9 $PPID");
        QVERIFY(!isLDAPUser());
        testfiles::remove(m_room + "/standin/id.hook");
        // More than a pipe holds. Nothing stays open.
        const auto open = [] { return QDir("/proc/self/fd").count(); };
        const uint before = open();
        QVERIFY(passes(QByteArray(200000, ' ') + "zent\n"));
        QCOMPARE(open(), before);
        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", "/nowhere");
        QVERIFY(!isLDAPUser());
        qputenv("PATH", path);
    }

    void waitForIdSleeps()
    {
        // It closes its output well before its end.
        testfiles::write("/tmp/bin/id", "#!/bin/sh\necho zent; exec >&-; sleep 1\n");
        QFile::setPermissions("/tmp/bin/id", QFile::ReadOwner | QFile::ExeOwner);
        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", "/tmp/bin:" + path);
        const std::clock_t processor = std::clock();
        rusage before{};
        rusage after{};
        getrusage(RUSAGE_THREAD, &before);
        QVERIFY(isLDAPUser());
        getrusage(RUSAGE_THREAD, &after);
        qputenv("PATH", path);
        QVERIFY(after.ru_nvcsw - before.ru_nvcsw < 50);
        QVERIFY(std::clock() - processor < CLOCKS_PER_SEC / 3);
    }

    void forgottenIdEnds()
    {
        testfiles::write(m_room + "/standin/id.hook", "echo $PPID > $ROOM/id.pid; exec sleep 100");
        {
            const IdCommand command;
            QTRY_VERIFY(testfiles::read(m_room + "/id.pid").endsWith('\n'));
        }
        testfiles::remove(m_room + "/standin/id.hook");
        QCOMPARE(kill(testfiles::read(m_room + "/id.pid").trimmed().toInt(), 0), -1);
    }

    void instanceLockGoesWithItsHolder()
    {
        const QTemporaryDir directory;
        const QString key = "zent/../info";
        InstanceLock later;
        qint64 child = 0;
        {
            InstanceLock holder;
            QCOMPARE(holder.acquire(directory.path(), key), Result::Acquired);
            QCOMPARE(holder.acquire(directory.path(), key), Result::Acquired);
            QCOMPARE(int(QFile::permissions(InstanceLock::filePath(directory.path(), key))), 0x6600);
            QVERIFY(QProcess::startDetached("sleep", {"60"}, QString(), &child));
            QCOMPARE(later.acquire(directory.path(), key), Result::Held);
        }
        const Result afterwards = later.acquire(directory.path(), key);
        QVERIFY2(::kill(child, SIGTERM) == 0, "the holder's child must still run for this to prove anything");
        QCOMPARE(afterwards, Result::Acquired);
        QCOMPARE(QDir(directory.path()).entryList(QDir::Files).size(), 1);
    }

    void unusableLockFiles()
    {
        const QTemporaryDir directory;
        const QString target = directory.filePath("target");
        QVERIFY(QFile::link(target, InstanceLock::filePath(directory.path(), "link")));
        QVERIFY(QDir().mkdir(InstanceLock::filePath(directory.path(), "folder")));
        const std::tuple<const char*, int, int, Result, const char*> rows[] = {
            {"link", ELOOP, 0, Result::Failed, "warning cannot open the lock file %1 : %2"},
            {"folder", EISDIR, 0, Result::Failed, "warning cannot open the lock file %1 : %2"},
            {"refused", EIO, 1, Result::Failed, "warning cannot lock %1 : %2"},
            {"held", EWOULDBLOCK, 1, Result::Held, nullptr},
            {"interrupted", EINTR, 2, Result::Acquired, nullptr}};
        const int files = QDir("/proc/self/fd").entryList(QDir::NoDotAndDotDot | QDir::AllEntries).size();
        for (const auto& [key, error, times, result, line] : rows) {
            const LogCapture log;
            refusal = error;
            refusals = times;
            const QString path = InstanceLock::filePath(directory.path(), key);
            QCOMPARE(InstanceLock().acquire(directory.path(), key), result);
            QCOMPARE(log.records(),
                     line ? QStringList{QString(line).arg(path, qt_error_string(error))} : QStringList());
        }
        QCOMPARE(QDir("/proc/self/fd").entryList(QDir::NoDotAndDotDot | QDir::AllEntries).size(), files);
        QVERIFY(!QFile::exists(target));
    }

    void minorVersion()
    {
        const LogCapture log;
        const QPair<QByteArray, int> files[] = {{"MinorVersion=1\nMinorVersion=1021\nX=1\n", 1021}, {"X=20\n", -1}};
        for (const auto& [content, version] : files) {
            testfiles::write(testfiles::kVersionFile, content);
            QCOMPARE(getMiniVersion(), version);
        }
        QFile::setPermissions(testfiles::kVersionFile, {});
        QCOMPARE(getMiniVersion(), -1);
        testfiles::remove(testfiles::kVersionFile);
        QCOMPARE(getMiniVersion(), 1000);
        QCOMPARE(log.records(), QStringList({"debug nOSVersion: 1", "debug nOSVersion: 1021"}));
    }

    void signalsEndTheEventLoop()
    {
        for (const int number : {SIGTERM, SIGINT}) {
            const LogCapture log;
            const SignalQuit signalQuit;
            QTimer::singleShot(10000, [] { QCoreApplication::exit(1); });
            QTimer::singleShot(0, [number] { std::raise(number); });
            QCOMPARE(QCoreApplication::exec(), 0);
            QCOMPARE(log.records(), QStringList("info SignalQuit termination signal, quitting"));
        }
        QVERIFY(std::signal(SIGTERM, SIG_DFL) == SIG_DFL);
    }

    void identityLivesAsLongAsTheLog()
    {
        // Registered first, it runs last, when the memory of what was destroyed has been used again.
        const pid_t child = fork();
        if (child == 0) {
            std::atexit([] {
                for (std::size_t size = 24; size < 200; size += 8) {
                    for (int i = 0; i < 1000; ++i)
                        std::memset(std::malloc(size), 'x', size);
                }
                qWarning("at the end");
            });
            zent::uOpenlog(zent::LEVEL_DEBUG);
            std::exit(0);
        }
        waitpid(child, nullptr, 0);
        const QByteArray identity = " test_startup[" + QByteArray::number(child) + "]: ";
        QTRY_VERIFY(testfiles::read(m_room + "/syslog").contains("at the end"));
        QVERIFY(testfiles::read(m_room + "/syslog").contains(identity));
    }

    void syslogRecords()
    {
        zent::uOpenlog(zent::LEVEL_DEBUG);
        qDebug().noquote() << "first 记录 %s";
        qInfo("fifth");
        const int line = __LINE__ - 2;
        zent::uSyslogMessageHandler(QtFatalMsg, QMessageLogContext("a/b/c.cpp", 7, "int f()", "default"), "second");
        zent::uOpenlog(zent::LEVEL_WARNING);
        qDebug("dropped");
        qInfo("dropped");
        qWarning("third");
        qCritical("fourth");
        zent::uCloselog();
        qInstallMessageHandler(nullptr);
        QTRY_VERIFY(testfiles::read(m_room + "/syslog").contains("fourth"));

        const QString here = "test_startup.cpp void TestStartup::syslogRecords() ";
        // The priority, which 24, the facility of daemons, is part of, and what follows the time stamp. The record ends
        // with the blank that the line format has before its end.
        const QList<QPair<QString, QString>> expected = {
            {"31", QStringLiteral("debug [ %1%2]  first 记录 %s ").arg(here).arg(line)},
            {"27", "fata [ c.cpp int f() 7]  second "},
            {"28", QStringLiteral("warning [ %1%2]  third ").arg(here).arg(line + 7)},
            {"26", QStringLiteral("critical [ %1%2]  fourth ").arg(here).arg(line + 8)},
            {"30", QStringLiteral("info [ %1%2]  fifth ").arg(here).arg(line + 1)},
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
