// The single-instance lock between real processes: this program starts itself as the other instance.

#include "instancelock.h"

#include <QFile>
#include <QProcess>
#include <QTemporaryDir>
#include <QtTest>

#include <csignal>
#include <cstdio>
#include <unistd.h>

namespace
{

using Result = InstanceLock::Result;

const QString key = "zent/../info";

/// The other instance: takes the lock, starts a program that outlives it, says so, and waits to be killed.
int holdLock(const QString& directory)
{
    InstanceLock lock;
    const Result result = lock.acquire(directory, key);
    qint64 child = 0;
    if (result == Result::Acquired)
        QProcess::startDetached("sleep", {"60"}, QString(), &child);
    std::printf("%d %lld\n", static_cast<int>(result), static_cast<long long>(child));
    std::fflush(stdout);
    return result == Result::Acquired ? ::pause() : 0;
}

} // namespace

class TestInstanceLock : public QObject
{
    Q_OBJECT

private slots:
    void onlyOneProcessHoldsTheKey()
    {
        QTemporaryDir directory;
        QProcess holder;
        holder.start(QCoreApplication::applicationFilePath(), {"--hold", directory.path()});
        while (!holder.canReadLine() && holder.waitForReadyRead()) {
        }
        const QList<QByteArray> started = holder.readLine().trimmed().split(' ');
        QCOMPARE(started.first().toInt(), int(Result::Acquired));
        InstanceLock lock, other;
        const Result whileHeld = lock.acquire(directory.path(), key);
        const Result otherKey = other.acquire(directory.path(), "another key");
        holder.kill();
        holder.waitForFinished();
        const Result afterwards = lock.acquire(directory.path(), key);
        const bool childOutlived = ::kill(started.last().toInt(), SIGTERM) == 0;

        QCOMPARE(whileHeld, Result::Held);
        QCOMPARE(otherKey, Result::Acquired);
        QVERIFY2(childOutlived, "the holder's child must still run for this to prove anything");
        QCOMPARE(afterwards, Result::Acquired);
        QCOMPARE(QDir(directory.path()).entryList(QDir::Files).size(), 2);
    }

    void unusableFiles()
    {
        QTemporaryDir directory;
        const QString target = directory.filePath("target");
        QVERIFY(QFile::link(target, InstanceLock::filePath(directory.path(), "link")));
        QVERIFY(QDir().mkdir(InstanceLock::filePath(directory.path(), "folder")));
        const auto fails = [](const QString& where, const QString& name) {
            QTest::ignoreMessage(QtWarningMsg, QRegularExpression("cannot open the lock file"));
            return InstanceLock().acquire(where, name) == Result::Failed;
        };
        QVERIFY(fails(directory.path(), "link"));
        QVERIFY(fails(directory.path(), "folder"));
        QVERIFY(fails(directory.filePath("no such folder"), key));
        QVERIFY(!QFile::exists(target));
    }
};

int main(int argc, char** argv)
{
    if (argc == 3 && qstrcmp(argv[1], "--hold") == 0)
        return holdLock(QFile::decodeName(argv[2]));
    QCoreApplication application(argc, argv);
    TestInstanceLock test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_instancelock.moc"
