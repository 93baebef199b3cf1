#include "fileconfig.h"
#include "filecontent.h"
#include "filewrite.h"
#include "logcapture.h"
#include "paths.h"
#include "testfiles.h"

#include <QJsonDocument>
#include <QTemporaryDir>
#include <QtTest>

#include <csignal>
#include <sys/wait.h>
#include <unistd.h>

using zent::kUserinfoPath;
using zent::base::FileContent;
using zent::base::UserInfo;

namespace
{

const QByteArray kWhole = R"({"is_Domain": true, "server_host": "s.test", "server_port": "8443",
    "domain_host": "d.test", "domain_port": "9443", "terminal_name": "终端", "token": "secret"})";
const QByteArray kOlder = R"({"is_Domain": true, "server_host": "s.test", "server_port": "8443",
    "server_ip": "10.0.0.7", "terminal_name": "终端", "token": "secret"})";

QJsonObject storedObject()
{
    return QJsonDocument::fromJson(testfiles::read(kUserinfoPath)).object();
}

void load(const QByteArray& content)
{
    testfiles::write(kUserinfoPath, content);
    FileConfig::GetInstance()->readServerConfig(kUserinfoPath);
}

void setReadOnly(bool readOnly)
{
    QFile::setPermissions(kUserinfoPath, readOnly ? QFile::ReadOwner : QFile::ReadOwner | QFile::WriteOwner);
}

} // namespace

class TestTerminalFiles : public QObject
{
    Q_OBJECT

    FileContent* m_store = FileContent::instace();
    FileConfig* m_config = FileConfig::GetInstance();

private slots:
    void init() { testfiles::remove(kUserinfoPath); }

    void migratesAnOlderFileAndKeepsOtherKeys()
    {
        testfiles::write(kUserinfoPath, kOlder);
        setReadOnly(true);
        LogCapture log;
        QCOMPARE(m_store->getUserInfo(nullptr).domainHost, QString("10.0.0.7"));
        QCOMPARE(log.count("\"updateUserInfo\" open file failed!"), 2);
        QCOMPARE(testfiles::read(kUserinfoPath), kOlder);
        setReadOnly(false);
        m_store->getUserInfo(nullptr);
        QJsonObject expected = QJsonDocument::fromJson(kOlder).object();
        expected.insert("domain_host", "10.0.0.7");
        expected.insert("domain_port", "8443");
        QCOMPARE(storedObject(), expected);
    }

    void saveDomainWritesOnlyAChange()
    {
        testfiles::write(kUserinfoPath, kWhole);
        setReadOnly(true);
        QVERIFY(m_store->saveDomain(true));
        QVERIFY(!m_store->saveDomain(false));
        setReadOnly(false);
        // In a directory that nothing can be added to, the file is written in its place.
        const QString directory = QFileInfo(kUserinfoPath).path();
        QFile::setPermissions(directory, QFile::ReadOwner | QFile::ExeOwner);
        const bool saved = m_store->saveDomain(false);
        QFile::setPermissions(directory, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);
        QVERIFY(saved);
        QJsonObject expected = QJsonDocument::fromJson(kWhole).object();
        expected.insert("is_Domain", false);
        QCOMPARE(storedObject(), expected);
    }

    void badFilesAreReportedAndLeftAlone()
    {
        for (const QByteArray& content : {QByteArray(), kWhole.left(60), QByteArray("[1, 2]")}) {
            testfiles::write(kUserinfoPath, content);
            LogCapture log;
            bool ok = true;
            m_store->getUserInfo(&ok);
            QVERIFY2(!ok && log.contains("\"getUserInfo\" can not get json key: \"is_Domain\""), content);
            QVERIFY2(!m_store->saveDomain(true), content);
            QVERIFY2(!zent::base::updateUserInfo<QString>("domain_host", "x"), content);
            QCOMPARE(testfiles::read(kUserinfoPath), content);
        }
    }

    void saveUserInfoDropsTheOlderKey()
    {
        testfiles::write(kUserinfoPath, kOlder);
        UserInfo info = m_store->getUserInfo(nullptr);
        info.terminalName = "新终端";
        QVERIFY(m_store->saveUserInfo(info));
        QCOMPARE(storedObject().keys(), QStringList({"domain_host", "domain_port", "is_Domain", "server_host",
                                                     "server_port", "terminal_name"}));
    }

    void killedWriterLeavesAWholeFile()
    {
        constexpr int kKills = 200;
        const QTemporaryDir directory;
        const QString path = directory.filePath("userinfo.json");
        const auto files = [&] { return QDir(directory.path()).entryList(QDir::Files | QDir::Hidden); };
        // Long enough for a kill to meet a write.
        const QByteArray versions[] = {QByteArray(300000, 'a'), QByteArray(200000, 'b')};
        testfiles::write(path, versions[0]);
        int longestUs = 20000;
        QVERIFY(QFile::setPermissions(path, QFile::ReadOwner | QFile::WriteOwner));
        int interrupted = 0;
        for (int kill = 0; kill < kKills; ++kill) {
            const pid_t writer = fork();
            if (writer == 0) {
                for (int round = 0;; ++round)
                    zent::base::replaceFile(path, versions[round % 2]);
            }
            QVERIFY(writer > 0);
            usleep(1000 + QRandomGenerator::global()->bounded(longestUs));
            QCOMPARE(::kill(writer, SIGKILL), 0);
            QCOMPARE(waitpid(writer, nullptr, 0), writer);
            const QByteArray found = testfiles::read(path);
            QVERIFY2(found == versions[0] || found == versions[1], qPrintable(QString::number(found.size())));
            QVERIFY2(files().size() <= 2, qPrintable(files().join(' ')));
            interrupted += files().size() - 1;
            // Under a tool that slows the writer down it may not have come to write.
            if (interrupted == 0 && kill % 25 == 24)
                longestUs *= 2;
        }
        QVERIFY2(interrupted > 0, "no kill has met a write");
        QCOMPARE(zent::base::replaceFile(path, "end"), zent::base::WriteResult::Done);
        QCOMPARE(files(), QStringList("userinfo.json"));
        QCOMPARE(QFile::permissions(path) & (QFile::ReadGroup | QFile::ReadOther), QFile::Permissions());
    }

    void brokenFileLeavesWhatWasLoaded()
    {
        load(kWhole);
        LogCapture log;
        load(kWhole.left(50));
        QCOMPARE(m_config->readServerHost(), QString("s.test"));
        QVERIFY(log.contains("userinfo.json Json error"));
    }

    void withoutAFileTheTerminalIsCalledAsTheHost()
    {
        load("{}");
        testfiles::remove(kUserinfoPath);
        testfiles::write(zent::kHostnamePath, "host-9\n");
        m_config->readServerConfig(kUserinfoPath);
        QCOMPARE(m_config->readTerminalName(), QString("host-9"));
        QVERIFY(m_config->getServerUrl("/x").host().isEmpty());
    }

    void stagingCopyCarriesTheChangeOnly()
    {
        load(kWhole);
        m_config->setIsDomain(false);
        const QString staging = QFileInfo(zent::kTmpUserinfoPath).path();
        QTemporaryDir elsewhere;
        QVERIFY(QFile::link(elsewhere.path(), staging));
        m_config->writeServerConfig();
        QVERIFY2(QDir(elsewhere.path()).isEmpty(), "followed a link that lay in wait");
        QFile::remove(staging);
        m_config->writeServerConfig();
        QJsonObject expected = QJsonDocument::fromJson(kWhole).object();
        expected.insert("is_Domain", false);
        expected.remove("token");
        QCOMPARE(QJsonDocument::fromJson(testfiles::read(zent::kTmpUserinfoPath)).object(), expected);
        QCOMPARE(testfiles::read(kUserinfoPath), kWhole);
    }
};

QTEST_GUILESS_MAIN(TestTerminalFiles)
#include "test_terminalfiles.moc"
