// SPDX-License-Identifier: Apache-2.0
#include "displaytext.h"
#include "fileconfig.h"
#include "filecontent.h"
#include "filewrite.h"
#include "fixture.h"
#include "jsonreader.h"

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

/// Writes the files that the row has.
void writeFiles(const QJsonObject& row)
{
    for (const auto& [key, path] : {std::pair("content", testfiles::kInfoFile), {"machine", testfiles::kMachineFile}}) {
        if (row[key].isString())
            testfiles::write(path, row[key].toString().toUtf8());
    }
}

mode_t modeOf(const QString& path)
{
    struct stat status = {};
    return stat(QFile::encodeName(path).constData(), &status) == 0 ? status.st_mode & 07777U : 0;
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
        bool ok[4] = {};
        const QString machine = m_store->getMachineID(&ok[0], false);
        const bool isDomain = m_store->isDomain(&ok[1]);
        const QString alias = m_store->getTerminalAlias(&ok[2]);
        QString host = "kept", port = "kept";
        const bool both = m_store->getHostAndPort(host, port);
        const UserInfo all = m_store->getUserInfo(&ok[3]);
        return {{"machine", QJsonArray{machine, ok[0]}},
                {"isDomain", QJsonArray{isDomain, ok[1]}},
                {"alias", QJsonArray{alias, ok[2]}},
                {"hostAndPort", QJsonArray{host, port, both}},
                {"all", QJsonArray{all.isDomain, all.serverHost, all.serverPort, all.domainHost, all.domainPort,
                                   all.terminalName, ok[3]}}};
    }

private slots:
    void initTestCase() { std::signal(SIGXFSZ, SIG_IGN); }
    void init()
    {
        testfiles::remove(testfiles::kInfoFile);
        testfiles::remove(testfiles::kMachineFile);
        testfiles::remove(QFileInfo(testfiles::kStagedInfoFile).path());
        testfiles::remove(testfiles::kHostNameFile);
        testfiles::write(testfiles::kHostNameFile, "host\n-9 \n");
    }

    void filesAreReplacedWhole()
    {
        const QTemporaryDir directory;
        const QString path = directory.filePath("file");
        const mode_t mask = umask(0022);
        QCOMPARE(zent::base::replaceFile(path, "new"), zent::base::WriteResult::Done);
        QCOMPARE(modeOf(path), 0644U);
        // Whatever the mask for new files.
        for (const mode_t mode : {0666U, 0701U, 0600U}) {
            QCOMPARE(chmod(QFile::encodeName(path).constData(), mode), 0);
            // What a writer that was killed has left behind.
            testfiles::write(directory.filePath(QString(".file.zentw-info-%1").arg(getuid())), "part");
            QFile reader(path);
            QVERIFY(reader.open(QIODevice::ReadOnly));
            const QByteArray old = testfiles::read(path);
            QCOMPARE(zent::base::replaceFile(path, old + '+'), zent::base::WriteResult::Done);
            QCOMPARE(reader.readAll(), old);
            QCOMPARE(testfiles::read(path), old + '+');
            QCOMPARE(modeOf(path), mode);
            QCOMPARE(QDir(directory.path()).entryList(QDir::Files | QDir::Hidden), QStringList("file"));
        }
        umask(mask);
        zent::base::FileError error;
        QCOMPARE(zent::base::replaceFile("/none/file", "x", &error), zent::base::WriteResult::NotOpened);
        QCOMPARE(error.code, QFileDevice::OpenError);
        QCOMPARE(error.text, QString("No such file or directory"));
        QCOMPARE(zent::base::replaceFile("/dev/full", "x", &error), zent::base::WriteResult::Short);
        QCOMPARE(error.text, QString("No space left on device"));
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
        QVERIFY(waitpid(writer, &status, 0) == writer && status == 0);
        QCOMPARE(testfiles::read(target), QByteArray("second"));
        QCOMPARE(QDir(directory.path()).entryList(QDir::AllEntries | QDir::Hidden | QDir::NoDotAndDotDot).size(), 2);
    }

    void terminalInfo_data() { fixture::addRows("infofiles.json"); }
    void terminalInfo()
    {
        QFETCH(QJsonObject, row);
        writeFiles(row);
        const LogCapture log;
        fixture::compare(read(), row["got"]);
        fixture::compareLog(log, row["log"]);
    }

    void changes_data() { fixture::addRows("infochanges.json"); }
    void changes()
    {
        QFETCH(QJsonObject, row);
        writeFiles(row);
        const QString directory = QFileInfo(testfiles::kInfoFile).path();
        // In a directory that nothing can be added to, the file is written in its place.
        QFile::setPermissions(directory, QFile::Permissions(row["sealed"].toBool() ? 0x5000 : 0x7000));
        QFile::setPermissions(testfiles::kInfoFile, QFile::Permissions(row["locked"].toBool() ? 0x4000 : 0x6000));
        rlimit before{};
        getrlimit(RLIMIT_FSIZE, &before);
        const rlimit full{row["full"].toBool() ? 20 : before.rlim_cur, before.rlim_max};
        setrlimit(RLIMIT_FSIZE, &full);
        const LogCapture log;
        const QString call = row["call"].toString();
        bool done = false;
        if (call == "saveDomain")
            done = m_store->saveDomain(row["value"].toBool());
        else if (call == "updateUserInfo")
            done = zent::base::updateUserInfo<QString>("domain_host", "x");
        else if (call == "getUserInfo")
            m_store->getUserInfo(&done);
        else if (call == "saveUserInfo")
            done = m_store->saveUserInfo({true, "s", "1", "d", "2", "新"});
        setrlimit(RLIMIT_FSIZE, &before);
        QFile::setPermissions(directory, QFile::Permissions(0x7000));
        QCOMPARE(done, row["done"].toBool());
        const QByteArray stored = testfiles::read(testfiles::kInfoFile);
        if (row.contains("stored"))
            fixture::compare(QJsonDocument::fromJson(stored).object(), row["stored"]);
        else
            QCOMPARE(stored, row["content"].toString().toUtf8());
        fixture::compareLog(log, row["log"]);
    }

    void addresses_data() { fixture::addRows("addresses.json"); }
    void addresses()
    {
        QFETCH(QJsonObject, row);
        testfiles::write(testfiles::kInfoFile, row["before"].toString("{}").toUtf8());
        m_config->readServerConfig(testfiles::kInfoFile);
        testfiles::remove(testfiles::kInfoFile);
        writeFiles(row);
        for (const QJsonValue& path : row["unreadable"].toArray())
            QFile::setPermissions(path.toString(), {});
        for (const QJsonValue& path : row["missing"].toArray())
            testfiles::remove(path.toString());
        const LogCapture log;
        m_config->readServerConfig(testfiles::kInfoFile);
        QCOMPARE(m_config->getServerUrl("/a b?").toString(QUrl::FullyEncoded), row["server"].toString());
        QCOMPARE(m_config->getDomainUrl("/x").toString(QUrl::FullyEncoded), row["domain"].toString());
        const QJsonArray fields{m_config->readServerHost(), m_config->readServerPort(),   m_config->readDomainHost(),
                                m_config->readDomainPort(), m_config->readTerminalName(), m_config->readIsDomain()};
        fixture::compare(fields, row["fields"]);
        fixture::compareLog(log, row["log"]);
    }

    void stagingCopyCarriesTheChangeOnly()
    {
        testfiles::write(testfiles::kInfoFile, kWhole);
        m_config->readServerConfig(testfiles::kInfoFile);
        m_config->setIsDomain(false);
        const QString staging = QFileInfo(testfiles::kStagedInfoFile).path();
        QTemporaryDir elsewhere;
        const LogCapture log;
        QVERIFY(QFile::link(elsewhere.path(), staging));
        m_config->writeServerConfig();
        QVERIFY2(QDir(elsewhere.path()).isEmpty(), "followed a link that lay in wait");
        QFile::remove(staging);
        for (const mode_t mode : {0775, 0757}) {
            QVERIFY(mkdir(qPrintable(staging), mode) == 0 && chmod(qPrintable(staging), mode) == 0);
            m_config->writeServerConfig();
            QVERIFY2(QDir().rmdir(staging), "others could change what is staged");
        }
        testfiles::write(staging, "no directory");
        m_config->writeServerConfig();
        testfiles::remove(staging);
        // Its own directory may be there.
        m_config->writeServerConfig();
        m_config->writeServerConfig();
        QJsonObject expected = QJsonDocument::fromJson(kWhole).object();
        expected.insert("is_Domain", false);
        expected.remove("token");
        fixture::compare(QJsonDocument::fromJson(testfiles::read(testfiles::kStagedInfoFile)).object(), expected);
        QCOMPARE(modeOf(staging), 0755U);
        QJsonArray lines;
        for (int time = 0; time < 6; ++time) {
            lines.append("debug FileConfig::writeServerInfo---strConfig: \"{\\n*终端*\\n}\\n\"");
            lines.append(time < 4 ? "warning file open error" : "info write json success");
        }
        fixture::compareLog(log, lines);
    }

    void certificates()
    {
        const QTemporaryDir directory;
        const QString path = directory.filePath("a/b/ca.crt");
        const LogCapture log;
        m_config->saveCert("Q0VSVAoA/w==", path);
        m_config->saveCert("QQ==", path + "/below-a-file");
        fixture::compareLog(log, QJsonArray{"warning writeCERT open error!  \"" + path + "/below-a-file\""});
        QCOMPARE(testfiles::read(path), QByteArray("CERT\n\0\xff", 7));
    }

    void longTextsAreCut()
    {
        using zent::display::cut;
        const QString longest(1000, 'x');
        QCOMPARE(QStringList({cut(longest), cut(longest + 'x'), cut("a😀b", 2), cut("a😀b", 3)}),
                 QStringList({longest, longest + "…", "a…", "a😀…"}));
    }

    void jsonReader_data() { fixture::addRows("jsonreader.json"); }
    void jsonReader()
    {
        QFETCH(QJsonObject, row);
        QJsonValue value = row["value"];
        if (row.contains("times"))
            value = QJsonObject{{"identifier", QString(row["times"].toInt(), 'i')}};
        zent::base::JsonReader reader(value);
        const QJsonArray got{reader.flag("flag"), reader.text("text"), reader.array("array"), reader.firstText("first"),
                             reader.object("object")};
        const int shown = zent::base::identifierIn(value["identifier"]).size();
        QCOMPARE(shown, row["good"].toBool() ? row["times"].toInt() : 0);
        reader.identifier("identifier");
        QCOMPARE(reader.isGood(), row["good"].toBool());
        if (row.contains("got"))
            fixture::compare(got, row["got"]);
    }
};

QTEST_GUILESS_MAIN(TestTerminalFiles)
#include "test_terminalfiles.moc"
