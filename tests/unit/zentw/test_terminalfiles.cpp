// SPDX-License-Identifier: Apache-2.0
#include "fileconfig.h"
#include "filecontent.h"
#include "filewrite.h"
#include "fixture.h"
#include "jsonreader.h"

#include <QTemporaryDir>

#include <csignal>
#include <sched.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

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
    return QJsonDocument::fromJson(testfiles::read(testfiles::kInfoFile)).object();
}

void load(const QByteArray& content)
{
    testfiles::write(testfiles::kInfoFile, content);
    FileConfig::GetInstance()->readServerConfig(testfiles::kInfoFile);
}

/// Writes the content that the row has, if any.
void writeContent(const QJsonObject& row)
{
    if (row["content"].isString())
        testfiles::write(testfiles::kInfoFile, row["content"].toString().toUtf8());
}

void setReadOnly(bool readOnly)
{
    QFile::setPermissions(testfiles::kInfoFile, readOnly ? QFile::ReadOwner : QFile::ReadOwner | QFile::WriteOwner);
}

} // namespace

/// What is read from the terminal's files and written to them, and what the log says when that fails.
class TestTerminalFiles : public QObject
{
    Q_OBJECT

    FileContent* m_store = FileContent::instace();
    FileConfig* m_config = FileConfig::GetInstance();

    /// What each getter of the store returns, with its verdict.
    QJsonObject read()
    {
        bool ok = false;
        const auto verdict = [&ok] { return std::exchange(ok, false); };
        QJsonObject got;
        const bool isDomain = m_store->isDomain(&ok);
        got["isDomain"] = QJsonArray{isDomain, verdict()};
        const QString alias = m_store->getTerminalAlias(&ok);
        got["alias"] = QJsonArray{alias, verdict()};
        QString host = "kept";
        QString port = "kept";
        const bool both = m_store->getHostAndPort(host, port);
        got["hostAndPort"] = QJsonArray{host, port, both};
        const zent::base::UserInfo info = m_store->getUserInfo(&ok);
        got["all"] = QJsonArray{info.isDomain,   info.serverHost,   info.serverPort, info.domainHost,
                                info.domainPort, info.terminalName, verdict()};
        return got;
    }

private slots:
    void init()
    {
        testfiles::remove(testfiles::kInfoFile);
        testfiles::remove(QFileInfo(testfiles::kStagedInfoFile).path());
        testfiles::write(testfiles::kHostNameFile, "host-1\n");
    }

    void migratesAnOlderFileAndKeepsOtherKeys()
    {
        testfiles::write(testfiles::kInfoFile, kOlder);
        setReadOnly(true);
        LogCapture log;
        QCOMPARE(m_store->getUserInfo(nullptr).domainHost, QString("10.0.0.7"));
        QCOMPARE(log.count("\"updateUserInfo\" open file failed!"), 2);
        QCOMPARE(testfiles::read(testfiles::kInfoFile), kOlder);
        setReadOnly(false);
        m_store->getUserInfo(nullptr);
        QJsonObject expected = QJsonDocument::fromJson(kOlder).object();
        expected.insert("domain_host", "10.0.0.7");
        expected.insert("domain_port", "8443");
        QCOMPARE(storedObject(), expected);
    }

    void saveDomainWritesOnlyAChange()
    {
        testfiles::write(testfiles::kInfoFile, kWhole);
        setReadOnly(true);
        QVERIFY(m_store->saveDomain(true));
        QVERIFY(!m_store->saveDomain(false));
        setReadOnly(false);
        // In a directory that nothing can be added to, the file is written in its place.
        const QString directory = QFileInfo(testfiles::kInfoFile).path();
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
            testfiles::write(testfiles::kInfoFile, content);
            LogCapture log;
            bool ok = true;
            m_store->getUserInfo(&ok);
            QVERIFY2(!ok && log.contains("\"getUserInfo\" can not get json key: \"is_Domain\""), content);
            QVERIFY2(!m_store->saveDomain(true), content);
            QVERIFY2(!zent::base::updateUserInfo<QString>("domain_host", "x"), content);
            QCOMPARE(testfiles::read(testfiles::kInfoFile), content);
        }
    }

    void saveUserInfoDropsTheOlderKey()
    {
        testfiles::write(testfiles::kInfoFile, kOlder);
        UserInfo info = m_store->getUserInfo(nullptr);
        info.terminalName = "新终端";
        setReadOnly(true);
        const LogCapture log;
        QVERIFY(!m_store->saveUserInfo(info) && log.contains("\"saveUserInfo\" open file failed!"));
        setReadOnly(false);
        QVERIFY(m_store->saveUserInfo(info));
        QCOMPARE(storedObject().keys(), QStringList({"domain_host", "domain_port", "is_Domain", "server_host",
                                                     "server_port", "terminal_name"}));
    }

    void fullDiskLeavesTheFile()
    {
        testfiles::write(testfiles::kInfoFile, kWhole);
        std::signal(SIGXFSZ, SIG_IGN);
        rlimit before{};
        getrlimit(RLIMIT_FSIZE, &before);
        const rlimit full{20, before.rlim_max};
        setrlimit(RLIMIT_FSIZE, &full);
        const LogCapture log;
        const bool saved = m_store->saveDomain(false) || m_store->saveUserInfo(UserInfo());
        setrlimit(RLIMIT_FSIZE, &before);
        QVERIFY(!saved);
        QCOMPARE(log.records(),
                 QStringList({"warning write value failed, key: \"is_Domain\"", "warning write info json failed"}));
        QCOMPARE(testfiles::read(testfiles::kInfoFile), kWhole);
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
        // Whatever the mask for new files.
        struct stat status {
        };
        QCOMPARE(chmod(QFile::encodeName(path).constData(), 0666), 0);
        QCOMPARE(zent::base::replaceFile(path, "end"), zent::base::WriteResult::Done);
        QCOMPARE(stat(QFile::encodeName(path).constData(), &status), 0);
        QCOMPARE(status.st_mode & 07777U, 0666U);
    }

    void fileThatCannotBeReplacedIsWrittenInPlace()
    {
        const QTemporaryDir directory;
        const QString target = directory.filePath("target");
        const QString link = directory.filePath("link");
        QVERIFY(QFile::link(target, link));
        QCOMPARE(zent::base::replaceFile(link, "first"), zent::base::WriteResult::Done);
        QVERIFY2(QFileInfo(link).isSymLink(), "a link that leads to no file yet was replaced");
        QCOMPARE(testfiles::read(target), QByteArray("first"));
        // A mount point, in a mount namespace of its own.
        const QByteArray path = QFile::encodeName(target);
        const pid_t writer = fork();
        if (writer == 0) {
            const bool mounted = unshare(CLONE_NEWUSER | CLONE_NEWNS) == 0 &&
                                 mount(path.constData(), path.constData(), nullptr, MS_BIND, nullptr) == 0;
            const bool done = mounted && zent::base::replaceFile(link, "second") == zent::base::WriteResult::Done;
            // A memory checker that looked for leaks here would miss the threads of the parent, which hold memory.
            execlp(done ? "true" : "false", "writer", nullptr);
            _exit(1);
        }
        int status = 0;
        QCOMPARE(waitpid(writer, &status, 0), writer);
        QCOMPARE(WEXITSTATUS(status), 0);
        QCOMPARE(testfiles::read(target), QByteArray("second"));
        QCOMPARE(QDir(directory.path()).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot).size(), 2);
    }

    void brokenFileLeavesWhatWasLoaded()
    {
        load(kWhole);
        LogCapture log;
        load(kWhole.left(50));
        QCOMPARE(m_config->readServerHost(), QString("s.test"));
        QVERIFY(log.contains("userinfo.json Json error"));
    }

    void stagingCopyCarriesTheChangeOnly()
    {
        load(kWhole);
        m_config->setIsDomain(false);
        const QString staging = QFileInfo(testfiles::kStagedInfoFile).path();
        QTemporaryDir elsewhere;
        QVERIFY(QFile::link(elsewhere.path(), staging));
        m_config->writeServerConfig();
        QVERIFY2(QDir(elsewhere.path()).isEmpty(), "followed a link that lay in wait");
        QFile::remove(staging);
        for (const mode_t mode : {0775, 0757}) {
            QVERIFY(mkdir(qPrintable(staging), mode) == 0 && chmod(qPrintable(staging), mode) == 0);
            m_config->writeServerConfig();
            QVERIFY2(QDir().rmdir(staging), "others could change what is staged");
        }
        LogCapture log;
        m_config->writeServerConfig();
        QVERIFY2(log.contains("终端"), qPrintable(log.lines().join('\n')));
        QJsonObject expected = QJsonDocument::fromJson(kWhole).object();
        expected.insert("is_Domain", false);
        expected.remove("token");
        QCOMPARE(QJsonDocument::fromJson(testfiles::read(testfiles::kStagedInfoFile)).object(), expected);
        QCOMPARE(testfiles::read(testfiles::kInfoFile), kWhole);
    }

    void terminalInfo_data() { fixture::addRows("infofiles.json"); }
    void terminalInfo()
    {
        QFETCH(QJsonObject, row);
        writeContent(row);
        const LogCapture log;
        fixture::compare(read(), row["got"]);
        fixture::compareLog(log, row["log"]);
    }

    void changesOfTheDomainFlag_data() { fixture::addRows("domainflags.json"); }
    void changesOfTheDomainFlag()
    {
        QFETCH(QJsonObject, row);
        writeContent(row);
        const LogCapture log;
        QCOMPARE(m_store->saveDomain(row["value"].toBool()), row["saved"].toBool());
        const QByteArray stored = testfiles::read(testfiles::kInfoFile);
        QCOMPARE(QJsonDocument::fromJson(stored).object(), row["stored"].toObject());
        // What changes nothing writes nothing.
        const QByteArray before = row["content"].toString().toUtf8();
        if (QJsonDocument::fromJson(before).object() == row["stored"].toObject())
            QCOMPARE(stored, before);
        fixture::compareLog(log, row["log"]);
    }

    void machineId()
    {
        bool ok = false;
        testfiles::write(testfiles::kMachineFile, "\t M-1 2 \r\n\n");
        QCOMPARE(m_store->getMachineID(&ok, false), QString("M-1 2"));
        QVERIFY(ok);
        testfiles::remove(testfiles::kMachineFile);
        const LogCapture log;
        QCOMPARE(m_store->getMachineID(&ok, false), QString());
        QVERIFY(!ok && log.contains("\"getMachineID\" open file failed!"));
        QVERIFY2(log.contains("open file failed, file: \"/usr/share/zent/machine.txt\" , mode: "),
                 qPrintable(log.lines().join("\n")));
        QVERIFY(log.contains(", exist: false"));
    }

    void addresses_data() { fixture::addRows("addresses.json"); }
    void addresses()
    {
        QFETCH(QJsonObject, row);
        testfiles::write(testfiles::kInfoFile, QJsonDocument(row["file"].toObject()).toJson());
        m_config->readServerConfig(testfiles::kInfoFile);
        const LogCapture log;
        QCOMPARE(m_config->getServerUrl("/a b?").toString(QUrl::FullyEncoded), row["server"].toString());
        QCOMPARE(m_config->getDomainUrl("/x").toString(QUrl::FullyEncoded), row["domain"].toString());
        QCOMPARE(log.count("url: QUrl("), 2);
        const QJsonArray fields{m_config->readServerHost(), m_config->readServerPort(),   m_config->readDomainHost(),
                                m_config->readDomainPort(), m_config->readTerminalName(), m_config->readIsDomain()};
        fixture::compare(fields, row["fields"]);
    }

    void terminalIsCalledAsTheHost()
    {
        const auto name = [this] {
            m_config->setTerminalName("unknown");
            m_config->readServerConfig(testfiles::kInfoFile);
            return m_config->readTerminalName();
        };
        const LogCapture log;
        testfiles::write(testfiles::kHostNameFile, "host\n-9 \n");
        QCOMPARE(name(), QString("host-9 "));
        QVERIFY(log.contains(" not found userinfo.json"));
        testfiles::write(testfiles::kInfoFile, "{}");
        QFile::setPermissions(testfiles::kInfoFile, {});
        QCOMPARE(name(), QString("host-9 "));
        QVERIFY(log.contains("fail to open file userinfo.json !"));
        QFile::setPermissions(testfiles::kHostNameFile, {});
        QCOMPARE(name(), QString());
        QVERIFY(log.contains(" open filed : \"/etc/hostname\""));
        testfiles::remove(testfiles::kHostNameFile);
        QCOMPARE(name(), QString());
        QVERIFY(log.contains(" not found : \"/etc/hostname\""));
    }

    void stagingIsLogged()
    {
        const QString directory = QFileInfo(testfiles::kStagedInfoFile).path();
        const LogCapture log;
        m_config->writeServerConfig();
        QVERIFY(log.contains("FileConfig::writeServerInfo---strConfig: \"{\\n") && log.contains("write json success"));
        QCOMPARE(QFile::permissions(directory) & (QFile::WriteGroup | QFile::WriteOther), QFile::Permissions());
        testfiles::remove(directory);
        testfiles::write(directory, "no directory");
        m_config->writeServerConfig();
        QCOMPARE(log.count("file open error"), 1);
        QCOMPARE(log.count("write json success"), 1);
    }

    void certificates()
    {
        const QTemporaryDir directory;
        const QString path = directory.filePath("a/b/ca.crt");
        m_config->saveCert("Q0VSVAoA/w==", path);
        QCOMPARE(testfiles::read(path), QByteArray("CERT\n\0\xff", 7));
        const LogCapture log;
        m_config->saveCert("QQ==", path + "/below-a-file");
        QVERIFY(log.contains("writeCERT open error!  \"" + path));
        QCOMPARE(testfiles::read(path).size(), 7);
    }

    void jsonReader_data() { fixture::addRows("jsonreader.json"); }
    void jsonReader()
    {
        QFETCH(QJsonObject, row);
        zent::base::JsonReader reader(row["value"]);
        const QJsonArray got{reader.flag("flag"), reader.text("text"), reader.array("array"), reader.firstText("first"),
                             reader.object("object")};
        QCOMPARE(reader.isGood(), row["good"].toBool());
        if (row.contains("got"))
            fixture::compare(got, row["got"]);
    }
};

QTEST_GUILESS_MAIN(TestTerminalFiles)
#include "test_terminalfiles.moc"
