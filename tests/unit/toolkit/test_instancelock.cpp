// SPDX-License-Identifier: Apache-2.0
#include "instancelock.h"
#include "logcapture.h"

#include <QFile>
#include <QProcess>
#include <QTemporaryDir>
#include <QtTest>

#include <csignal>

#include <sys/syscall.h>
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

class TestInstanceLock : public QObject
{
    Q_OBJECT

    using Result = InstanceLock::Result;

private slots:
    void goesWithItsHolderWhateverItStarted()
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

    void unusableFiles()
    {
        const QTemporaryDir directory;
        const QString target = directory.filePath("target");
        QVERIFY(QFile::link(target, InstanceLock::filePath(directory.path(), "link")));
        QVERIFY(QDir().mkdir(InstanceLock::filePath(directory.path(), "folder")));
        const std::tuple<const char*, int, int, Result, const char*> rows[] = {
            {"link", 0, 0, Result::Failed, "warning cannot open the lock file %1 : Too many levels of symbolic links"},
            {"folder", 0, 0, Result::Failed, "warning cannot open the lock file %1 : Is a directory"},
            {"refused", EIO, 1, Result::Failed, "warning cannot lock %1 : Input/output error"},
            {"held", EWOULDBLOCK, 1, Result::Held, nullptr},
            {"interrupted", EINTR, 2, Result::Acquired, nullptr}};
        const int files = QDir("/proc/self/fd").entryList(QDir::NoDotAndDotDot | QDir::AllEntries).size();
        for (const auto& [key, error, times, result, line] : rows) {
            const LogCapture log;
            refusal = error;
            refusals = times;
            const QString path = InstanceLock::filePath(directory.path(), key);
            QCOMPARE(InstanceLock().acquire(directory.path(), key), result);
            QCOMPARE(log.records(), line ? QStringList{QString(line).arg(path)} : QStringList());
        }
        QCOMPARE(QDir("/proc/self/fd").entryList(QDir::NoDotAndDotDot | QDir::AllEntries).size(), files);
        QVERIFY(!QFile::exists(target));
    }
};

QTEST_GUILESS_MAIN(TestInstanceLock)
#include "test_instancelock.moc"
