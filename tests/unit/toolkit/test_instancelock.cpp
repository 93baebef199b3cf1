// SPDX-License-Identifier: Apache-2.0
#include "instancelock.h"

#include <QFile>
#include <QProcess>
#include <QTemporaryDir>
#include <QtTest>

#include <csignal>

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
        for (const char* key : {"link", "folder"}) {
            QTest::ignoreMessage(QtWarningMsg, QRegularExpression("cannot open the lock file"));
            QCOMPARE(InstanceLock().acquire(directory.path(), key), Result::Failed);
        }
        QVERIFY(!QFile::exists(target));
    }
};

QTEST_GUILESS_MAIN(TestInstanceLock)
#include "test_instancelock.moc"
