#include "filewrite.h"
#include "testfiles.h"

#include <QTemporaryDir>
#include <QtTest>

#include <csignal>
#include <sys/wait.h>
#include <unistd.h>

/// A file that is being written when the client is killed.
class TestKilledWriter : public QObject
{
    Q_OBJECT

private slots:
    void fileIsAlwaysWhole()
    {
        constexpr int kKills = 200;
        constexpr int kLongestUs = 20000;
        const QTemporaryDir directory;
        const QString path = directory.filePath("userinfo.json");
        // Long enough for a kill to meet a write.
        const QByteArray versions[] = {QByteArray(300000, 'a'), QByteArray(200000, 'b')};
        testfiles::write(path, versions[0]);
        QVERIFY(QFile::setPermissions(path, QFile::ReadOwner | QFile::WriteOwner));
        int interrupted = 0;
        for (int kill = 0; kill < kKills; ++kill) {
            const pid_t writer = fork();
            if (writer == 0) {
                for (int round = 0;; ++round)
                    zent::base::replaceFile(path, versions[round % 2]);
            }
            QVERIFY(writer > 0);
            usleep(1000 + QRandomGenerator::global()->bounded(kLongestUs));
            QCOMPARE(::kill(writer, SIGKILL), 0);
            QCOMPARE(waitpid(writer, nullptr, 0), writer);
            const QByteArray found = testfiles::read(path);
            QVERIFY2(found == versions[0] || found == versions[1], qPrintable(QString::number(found.size())));
            const QStringList files = QDir(directory.path()).entryList(QDir::Files | QDir::Hidden);
            QVERIFY2(files.size() <= 2, qPrintable(files.join(' ')));
            interrupted += files.size() - 1;
        }
        qInfo() << interrupted << "of" << kKills << "kills left a part behind";
        QVERIFY2(interrupted > 0, "no kill has met a write");
        QCOMPARE(zent::base::replaceFile(path, "end"), zent::base::WriteResult::Done);
        QCOMPARE(QDir(directory.path()).entryList(QDir::Files | QDir::Hidden), QStringList("userinfo.json"));
        QCOMPARE(QFile::permissions(path) & (QFile::ReadGroup | QFile::ReadOther), QFile::Permissions());
    }
};

QTEST_GUILESS_MAIN(TestKilledWriter)
#include "test_killedwriter.moc"
