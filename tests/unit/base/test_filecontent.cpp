#include "filecontent.h"
#include "logcapture.h"
#include "paths.h"
#include "testfiles.h"

#include <QJsonDocument>
#include <QtTest>

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

void setReadOnly(bool readOnly)
{
    QFile::setPermissions(kUserinfoPath, readOnly ? QFile::ReadOwner : QFile::ReadOwner | QFile::WriteOwner);
}

} // namespace

class TestFileContent : public QObject
{
    Q_OBJECT

    FileContent* m_store = FileContent::instace();

private slots:
    void init() { testfiles::remove(kUserinfoPath); }

    void recordsAreRead()
    {
        const QMap<QByteArray, QString> cases = {
            {kWhole, "true|s.test|8443|d.test|9443|终端"},
            {kOlder, "true|s.test|8443|10.0.0.7|8443|终端"},
            {R"({"is_Domain": "true", "server_host": 5, "server_port": null, "domain_host": ["x"], "domain_port": {},
                 "terminal_name": true})",
             "false|||||"},
        };
        for (auto row = cases.begin(); row != cases.end(); ++row) {
            testfiles::write(kUserinfoPath, row.key());
            bool ok = false;
            const UserInfo i = m_store->getUserInfo(&ok);
            const QStringList fields = {i.serverHost, i.serverPort, i.domainHost, i.domainPort, i.terminalName};
            QCOMPARE((i.isDomain ? "true|" : "false|") + fields.join('|'), row.value());
            QString host, port;
            QVERIFY(ok && m_store->getHostAndPort(host, port));
            QCOMPARE(QStringList({host, port}), fields.mid(0, 2));
        }
    }

    void migratesAnOlderFileOnceAndKeepsOtherKeys()
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
        setReadOnly(true);
        m_store->getUserInfo(nullptr);
        QCOMPARE(log.count("\"updateUserInfo\" open file failed!"), 2);

        // An older value that is no text is not written back.
        testfiles::remove(kUserinfoPath);
        testfiles::write(kUserinfoPath, R"({"is_Domain": true, "server_port": 443, "domain_host": "d"})");
        m_store->getUserInfo(nullptr);
        QVERIFY(!storedObject().contains("domain_port"));
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

        testfiles::write(kUserinfoPath, R"({"server_host": "h"})");
        LogCapture log;
        QVERIFY(!m_store->saveDomain(true));
        QVERIFY(log.contains("It is not contain in info file, key: \"is_Domain\""));
        QVERIFY(!storedObject().contains("is_Domain"));
    }

    void badFilesAreReportedAndLeftAlone()
    {
        for (const QByteArray& content :
             {QByteArray(), kWhole.left(60), QByteArray("[1, 2]"), QByteArray("\xff\xfe{}"), QByteArray("a=true")}) {
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

    void missingFileIsReported()
    {
        LogCapture log;
        bool ok[3] = {true, true, true};
        QString host, port;
        m_store->isDomain(&ok[0]);
        m_store->getTerminalAlias(&ok[1]);
        m_store->getUserInfo(&ok[2]);
        QVERIFY(!ok[0] && !ok[1] && !ok[2]);
        QVERIFY(!m_store->getHostAndPort(host, port) && !m_store->saveDomain(true));
        for (const char* caller : {"isDomain", "getTerminalAlias", "getUserInfo", "getHostAndPort", "saveDomain"})
            QVERIFY2(log.contains(QStringLiteral("\"%1\" open file failed!").arg(caller)), caller);
        QVERIFY(!QFile::exists(kUserinfoPath));
    }

    void saveUserInfoDropsTheOlderKey()
    {
        testfiles::write(kUserinfoPath, kOlder);
        UserInfo info = m_store->getUserInfo(nullptr);
        info.terminalName = "新终端";
        QVERIFY(m_store->saveUserInfo(info));
        QCOMPARE(storedObject().keys(), QStringList({"domain_host", "domain_port", "is_Domain", "server_host",
                                                     "server_port", "terminal_name"}));
        QCOMPARE(m_store->getTerminalAlias(nullptr), QString("新终端"));
    }

    void machineIdIsTrimmed()
    {
        testfiles::write(zent::kMachineidPath, " 4f1d-22 \n");
        QCOMPARE(m_store->getMachineID(nullptr, false), QString("4f1d-22"));
        testfiles::remove(zent::kMachineidPath);
        bool ok = true;
        QVERIFY(m_store->getMachineID(&ok, false).isEmpty() && !ok);
    }
};

QTEST_GUILESS_MAIN(TestFileContent)
#include "test_filecontent.moc"
