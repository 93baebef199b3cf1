#include "filecontent.h"
#include "logcapture.h"
#include "paths.h"
#include "testfiles.h"

#include <QJsonDocument>
#include <QtTest>

#include <sys/stat.h>

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

/// Tells whether the file has been written since, also with the same content.
struct FileIdentity {
    explicit FileIdentity(const QString& path) { stat(QFile::encodeName(path).constData(), &status); }
    bool operator==(const FileIdentity& other) const
    {
        return status.st_ino == other.status.st_ino && status.st_mtim.tv_sec == other.status.st_mtim.tv_sec &&
               status.st_mtim.tv_nsec == other.status.st_mtim.tv_nsec;
    }
    struct stat status = {};
};

} // namespace

class TestFileContent : public QObject
{
    Q_OBJECT

private slots:
    void init() { testfiles::remove(kUserinfoPath); }

    void readsTheWholeRecord()
    {
        testfiles::write(kUserinfoPath, kWhole);
        bool ok = false;
        const UserInfo info = FileContent::instace()->getUserInfo(&ok);
        QVERIFY(ok);
        QVERIFY(info.isDomain);
        QCOMPARE(QStringList({info.serverHost, info.serverPort, info.domainHost, info.domainPort, info.terminalName}),
                 QStringList({"s.test", "8443", "d.test", "9443", QStringLiteral("终端")}));
        QString host, port;
        QVERIFY(FileContent::instace()->getHostAndPort(host, port));
        QCOMPARE(host + port, QStringLiteral("s.test8443"));
    }

    void migratesAnOlderFileOnceAndKeepsOtherKeys()
    {
        testfiles::write(kUserinfoPath, kOlder);
        bool ok = false;
        UserInfo info = FileContent::instace()->getUserInfo(&ok);
        QVERIFY(ok);
        QCOMPARE(info.domainHost, QStringLiteral("10.0.0.7"));
        QCOMPARE(info.domainPort, QStringLiteral("8443"));
        QCOMPARE(storedObject().value("domain_host").toString(), QStringLiteral("10.0.0.7"));
        QCOMPARE(storedObject().value("domain_port").toString(), QStringLiteral("8443"));
        QCOMPARE(storedObject().value("token").toString(), QStringLiteral("secret"));

        const FileIdentity before(kUserinfoPath);
        info = FileContent::instace()->getUserInfo(&ok);
        QCOMPARE(info.domainHost, QStringLiteral("10.0.0.7"));
        QVERIFY(before == FileIdentity(kUserinfoPath));
    }

    void numericPortIsNotMigratedAway()
    {
        testfiles::write(kUserinfoPath, R"({"is_Domain": true, "server_host": "h", "server_port": 443,
            "domain_host": "d", "terminal_name": "t"})");
        FileContent::instace()->getUserInfo(nullptr);
        QVERIFY(!storedObject().contains("domain_port"));
    }

    void readOnlyFileStillGivesTheRecord()
    {
        testfiles::write(kUserinfoPath, kOlder);
        QFile::setPermissions(kUserinfoPath, QFile::ReadOwner);
        bool ok = false;
        LogCapture log;
        const UserInfo info = FileContent::instace()->getUserInfo(&ok);
        QVERIFY(ok);
        QCOMPARE(info.domainHost, QStringLiteral("10.0.0.7"));
        QCOMPARE(testfiles::read(kUserinfoPath), kOlder);
        QVERIFY(log.contains("\"updateUserInfo\" open file failed!"));
    }

    void unwritableDirectoryIsWrittenInPlace()
    {
        testfiles::write(kUserinfoPath, kWhole);
        const QString directory = QFileInfo(kUserinfoPath).path();
        const FileIdentity before(kUserinfoPath);
        QFile::setPermissions(directory, QFile::ReadOwner | QFile::ExeOwner);
        const bool saved = FileContent::instace()->saveDomain(false);
        QFile::setPermissions(directory, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);
        QVERIFY(saved);
        QCOMPARE(storedObject().value("is_Domain"), QJsonValue(false));
        QCOMPARE(FileIdentity(kUserinfoPath).status.st_ino, before.status.st_ino);
    }

    void badFilesAreReportedAndLeftAlone_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::newRow("empty") << QByteArray();
        QTest::newRow("cut off") << kWhole.left(60);
        QTest::newRow("array") << QByteArray("[1, 2]");
        QTest::newRow("invalid utf-8") << QByteArray("\xff\xfe{}");
        QTest::newRow("text") << QByteArray("is_Domain=true");
    }
    void badFilesAreReportedAndLeftAlone()
    {
        QFETCH(QByteArray, content);
        testfiles::write(kUserinfoPath, content);
        LogCapture log;
        bool ok = true;
        FileContent::instace()->getUserInfo(&ok);
        QVERIFY(!ok);
        QVERIFY(log.contains("\"getUserInfo\" can not get json key: \"is_Domain\""));
        QVERIFY(!FileContent::instace()->saveDomain(true));
        QVERIFY(!zent::base::updateUserInfo<QString>("domain_host", "x"));
        QCOMPARE(testfiles::read(kUserinfoPath), content);
    }

    void missingFileAndDirectoryInItsPlace_data()
    {
        QTest::addColumn<bool>("directory");
        QTest::newRow("missing") << false;
        QTest::newRow("directory") << true;
    }
    void missingFileAndDirectoryInItsPlace()
    {
        QFETCH(bool, directory);
        if (directory)
            QDir().mkpath(kUserinfoPath);
        FileContent* store = FileContent::instace();
        LogCapture log;
        bool ok[3] = {true, true, true};
        store->isDomain(&ok[0]);
        store->getTerminalAlias(&ok[1]);
        store->getUserInfo(&ok[2]);
        QVERIFY(!ok[0] && !ok[1] && !ok[2]);
        QString host, port;
        QVERIFY(!store->getHostAndPort(host, port));
        QVERIFY(!store->saveDomain(true));
        for (const char* caller : {"isDomain", "getTerminalAlias", "getUserInfo", "getHostAndPort", "saveDomain"})
            QVERIFY2(log.contains(QStringLiteral("\"%1\" open file failed!").arg(caller)), caller);
        QVERIFY(log.contains("open file failed, file: \"/etc/zent/userinfo.json\" , mode:"));
        QCOMPARE(QFileInfo(kUserinfoPath).isDir(), directory);
    }

    void saveDomainWritesOnlyAChange()
    {
        FileContent* store = FileContent::instace();
        testfiles::write(kUserinfoPath, kWhole);
        const FileIdentity before(kUserinfoPath);
        QVERIFY(store->saveDomain(true));
        QVERIFY(before == FileIdentity(kUserinfoPath));
        QVERIFY(store->saveDomain(false));
        QCOMPARE(storedObject().value("is_Domain"), QJsonValue(false));
        QCOMPARE(storedObject().value("token").toString(), QStringLiteral("secret"));

        testfiles::write(kUserinfoPath, R"({"server_host": "h"})");
        LogCapture log;
        QVERIFY(!store->saveDomain(true));
        QVERIFY(log.contains("It is not contain in info file, key: \"is_Domain\""));
        QVERIFY(!storedObject().contains("is_Domain"));
    }

    void saveUserInfoDropsTheOlderKey()
    {
        testfiles::write(kUserinfoPath, kOlder);
        UserInfo info = FileContent::instace()->getUserInfo(nullptr);
        info.terminalName = QStringLiteral("新终端");
        QVERIFY(FileContent::instace()->saveUserInfo(info));
        QCOMPARE(storedObject().keys(), QStringList({"domain_host", "domain_port", "is_Domain", "server_host",
                                                     "server_port", "terminal_name"}));
        QCOMPARE(FileContent::instace()->getTerminalAlias(nullptr), QStringLiteral("新终端"));
    }

    void machineIdIsTrimmed()
    {
        testfiles::write(zent::kMachineidPath, " 4f1d-22 \n");
        bool ok = false;
        QCOMPARE(FileContent::instace()->getMachineID(&ok, false), QStringLiteral("4f1d-22"));
        QVERIFY(ok);
        testfiles::remove(zent::kMachineidPath);
        QCOMPARE(FileContent::instace()->getMachineID(&ok, false), QString());
        QVERIFY(!ok);
    }

    void wrongTypes()
    {
        testfiles::write(kUserinfoPath, R"({"is_Domain": "true", "server_host": 5, "server_port": null,
            "domain_host": ["x"], "domain_port": {}, "terminal_name": true})");
        const UserInfo info = FileContent::instace()->getUserInfo(nullptr);
        QVERIFY(!info.isDomain);
        QCOMPARE(info.serverHost + info.serverPort + info.domainHost + info.domainPort + info.terminalName, QString());
    }
};

QTEST_GUILESS_MAIN(TestFileContent)
#include "test_filecontent.moc"
