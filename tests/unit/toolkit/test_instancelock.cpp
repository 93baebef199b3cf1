// The single-instance lock between real processes: this program starts itself as the other instance.

#include "instancelock.h"
#include "toolkitapplication.h"

#include <QFile>
#include <QProcess>
#include <QTemporaryDir>
#include <QtTest>

#include <csignal>
#include <cstdio>
#include <unistd.h>

namespace
{

const QString key = QStringLiteral("zent/../info");

/// The other instance: takes the lock, starts a program that outlives it, says so, and waits to be killed.
int holdLock(const QString& directory)
{
    InstanceLock lock;
    const InstanceLock::Result result = lock.acquire(directory, key);
    qint64 child = 0;
    if (result == InstanceLock::Result::Acquired)
        QProcess::startDetached(QStringLiteral("sleep"), {QStringLiteral("60")}, QString(), &child);
    std::printf("%d %lld\n", static_cast<int>(result), static_cast<long long>(child));
    std::fflush(stdout);
    return result == InstanceLock::Result::Acquired ? ::pause() : 0;
}

} // namespace

class TestInstanceLock : public QObject
{
    Q_OBJECT

private slots:
    void onlyOneProcessHoldsTheKey();
    void killedHolderReleases();
    void unusableFiles_data();
    void unusableFiles();
    void applicationClaimsKeyOnce();

private:
    /// Starts the other instance and returns its first line: result and the id of its child.
    static QList<qint64> startHolder(QProcess& process, const QString& directory)
    {
        process.start(QCoreApplication::applicationFilePath(), {QStringLiteral("--hold"), directory});
        while (!process.canReadLine() && process.waitForReadyRead()) {
        }
        QList<qint64> numbers;
        for (const QByteArray& word : process.readLine().split(' '))
            numbers.append(word.trimmed().toLongLong());
        return numbers;
    }
};

void TestInstanceLock::onlyOneProcessHoldsTheKey()
{
    QTemporaryDir directory;
    InstanceLock lock;
    QCOMPARE(lock.acquire(directory.path(), key), InstanceLock::Result::Acquired);
    QCOMPARE(lock.acquire(directory.path(), key), InstanceLock::Result::Acquired);
    QProcess other;
    QCOMPARE(startHolder(other, directory.path()).value(0, -1), qint64(InstanceLock::Result::Held));
    other.waitForFinished();

    InstanceLock another;
    QCOMPARE(another.acquire(directory.path(), QStringLiteral("another key")), InstanceLock::Result::Acquired);
    QCOMPARE(QDir(directory.path()).entryList(QDir::Files).size(), 2);
}

void TestInstanceLock::killedHolderReleases()
{
    QTemporaryDir directory;
    QProcess holder;
    const QList<qint64> started = startHolder(holder, directory.path());
    QCOMPARE(started.value(0, -1), qint64(InstanceLock::Result::Acquired));
    const pid_t child = static_cast<pid_t>(started.value(1));
    QVERIFY(child > 0);
    InstanceLock lock;
    const InstanceLock::Result whileHeld = lock.acquire(directory.path(), key);
    holder.kill();
    holder.waitForFinished();
    const InstanceLock::Result afterwards = lock.acquire(directory.path(), key);
    const bool childOutlived = ::kill(child, SIGTERM) == 0;

    QCOMPARE(whileHeld, InstanceLock::Result::Held);
    QVERIFY2(childOutlived, "the holder's child must still run for this to prove anything");
    QCOMPARE(afterwards, InstanceLock::Result::Acquired);
}

void TestInstanceLock::unusableFiles_data()
{
    QTest::addColumn<QString>("obstacle");
    QTest::newRow("folder is missing") << QStringLiteral("missing");
    QTest::newRow("a symbolic link lies in wait") << QStringLiteral("link");
    QTest::newRow("a folder has the name") << QStringLiteral("folder");
}

void TestInstanceLock::unusableFiles()
{
    QFETCH(QString, obstacle);
    QTemporaryDir directory;
    const QString where =
        obstacle == QLatin1String("missing") ? directory.filePath(QStringLiteral("no such folder")) : directory.path();
    const QString target = directory.filePath(QStringLiteral("target"));
    if (obstacle == QLatin1String("link"))
        QVERIFY(QFile::link(target, InstanceLock::filePath(where, key)));
    if (obstacle == QLatin1String("folder"))
        QVERIFY(QDir().mkdir(InstanceLock::filePath(where, key)));
    QTest::ignoreMessage(QtWarningMsg, QRegularExpression(QStringLiteral("cannot open the lock file")));
    InstanceLock lock;
    QCOMPARE(lock.acquire(where, key), InstanceLock::Result::Failed);
    QVERIFY(!QFile::exists(target));
}

void TestInstanceLock::applicationClaimsKeyOnce()
{
    auto* application = qobject_cast<ToolkitApplication*>(qApp);
    QVERIFY(application);
    const QString ownKey = QStringLiteral("zent-test-%1").arg(::getpid());
    const QString directory = InstanceLock::userDirectory();
    {
        InstanceLock other;
        QCOMPARE(other.acquire(directory, ownKey), InstanceLock::Result::Acquired);
        QVERIFY(!application->setSingleInstance(ownKey));
    }
    QVERIFY(application->setSingleInstance(ownKey));
    QVERIFY(application->setSingleInstance(ownKey));
    InstanceLock late;
    QCOMPARE(late.acquire(directory, ownKey), InstanceLock::Result::Held);
    QFile::remove(InstanceLock::filePath(directory, ownKey));
}

int main(int argc, char** argv)
{
    if (argc == 3 && qstrcmp(argv[1], "--hold") == 0)
        return holdLock(QFile::decodeName(argv[2]));
    ToolkitApplication application(argc, argv);
    TestInstanceLock test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_instancelock.moc"
