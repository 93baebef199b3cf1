#include "controlmanagerthread.h"
#include "logcapture.h"
#include "processrecord.h"
#include "terminalsettings.h"
#include "testrows.h"
#include "thirdscript.h"
#include "upgradepriority.h"

#include <atomic>
#include <ctime>
#include <memory>
#include <unistd.h>

namespace
{

const QString kFrontEnd = QStringLiteral("fenx-cli.bash");
const QString kDesktopScript = QStringLiteral("/usr/share/lumo/restore_config.bash");
const QString kDirectoryScript = QStringLiteral("/usr/share/lumo/restore_ldap.bash");

/// The pauses in seconds that have been asked for, in order, where a test looks at them.
QStringList* pauses = nullptr;

} // namespace

/// Stands before the system's own, which the toolkit's pauses come down to. A pause that is written down instead of
/// slept is the same however busy the machine is.
extern "C" int nanosleep(const timespec* duration, timespec* rest)
{
    if (!pauses)
        return clock_nanosleep(CLOCK_MONOTONIC, 0, duration, rest) == 0 ? 0 : -1;
    pauses->append(
        QString::number(static_cast<double>(duration->tv_sec) + static_cast<double>(duration->tv_nsec) / 1e9));
    return 0;
}

/// What is asked of the privileged front end: by the runner, and by the worker that undoes the control.
class TestPrivilegedScript : public QObject
{
    Q_OBJECT

    const QString m_standin = qEnvironmentVariable("ROOM") + "/standin/" + kFrontEnd;
    const QString m_trace = qEnvironmentVariable("ROOM") + "/restored";

    static int runs() { return processrecord::entries(kFrontEnd).size(); }
    static QString hiddenModules()
    {
        return terminalsettings::shell("gsettings get " + terminalsettings::kControlCenter + " hide-module");
    }

    /// A worker whose signals are counted in its own thread, where a QSignalSpy must not be.
    static std::unique_ptr<ControlManagerThread> makeWorker(std::atomic<int>& finished)
    {
        auto worker = std::make_unique<ControlManagerThread>();
        connect(worker.get(), &ControlManagerThread::sigFinishedRemove, [&finished] { ++finished; });
        return worker;
    }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void init()
    {
        processrecord::clear();
        for (const QString& path : {m_standin + ".rc", m_standin + ".hook", m_trace, kDesktopScript})
            testfiles::remove(path);
    }

    void wordsAndToken_data()
    {
        addColumns<QString, QStringList>("script", "arguments");
        addRow("path only", kDirectoryScript, QStringList());
        addRow("arguments", kDirectoryScript, QStringList{"-a", "", "two words", "--args", "$HOME"});
        addRow("blank and quote", "/opt/a b/it's \"x\".bash", QStringList{"1"});
        addRow("Chinese", QStringLiteral("/opt/脚本/恢复.bash"), QStringList{QStringLiteral("参数")});
    }
    void wordsAndToken()
    {
        QFETCH(QString, script);
        QFETCH(QStringList, arguments);
        // The token as the front end makes it.
        const QString hash = QStringLiteral(" | sha256sum | cut -c1-64");
        const QString token = terminalsettings::shell(
            "printf %s \"$(printf %s \"kobaltrix_20191104${1}pemb_20191104\"" + hash + ")\"" + hash, {script});
        LogCapture log;
        QCOMPARE(UpgradePriority::GetInstance()->upgradeScript(QStringList{script} + arguments, true), 0);
        const QStringList words =
            QStringList{"--cmd", "thirdscript", "--thirdscript", script, "--args", token} + arguments;
        const QJsonObject entry = processrecord::entries(kFrontEnd).value(0);
        QCOMPARE(processrecord::words(entry), words);
        QVERIFY(entry.value("token_ok").toBool());
        // Support staff can repeat the request by hand from the log.
        QCOMPARE(log.count("strCmdList: "), words.size() + 1);
        QVERIFY(log.contains("strCmdList: \"" + token + '"'));
    }

    void attempts_data()
    {
        addColumns<bool, bool, QString, int, int, QString>("detached", "flag", "hook", "result", "starts", "pauses");
        const QString bad = "echo 1 > $0.tmp; mv $0.tmp ${0%hook}rc";
        const QString secondIsGood =
            "if [ -e $0.seen ]; then echo 0 > ${0%hook}rc; else echo 7 > ${0%hook}rc; fi; : > $0.seen";
        addRow("once", false, true, "", 0, 1, "");
        addRow("once, fails", false, true, bad, 1, 1, "");
        addRow("repeated, good at once", false, false, "", 0, 1, "1");
        addRow("repeated, good at the second", false, false, secondIsGood, 0, 2, "1 2");
        addRow("repeated, fails", false, false, bad, 1, 3, "1 2 3");
        addRow("repeated, no interpreter", false, false, "none", -2, 3, "1 2 3");
        addRow("detached, once", true, false, bad, 1, 1, "1");
        addRow("detached, once, no interpreter", true, false, "none", 0, 1, "1");
        addRow("detached, three times", true, true, bad, 1, 3, "1 2 3 1");
        addRow("detached, three times, no interpreter", true, true, "none", 0, 1, "1 1");
    }
    void attempts()
    {
        QFETCH(bool, detached);
        QFETCH(bool, flag);
        QFETCH(QString, hook);
        QFETCH(int, starts);
        const bool interpreter = hook != "none";
        if (interpreter)
            testfiles::write(m_standin + ".hook", hook.toUtf8());
        const QStringList list{"/usr/share/lumo/a.bash", "x"};
        UpgradePriority* runner = UpgradePriority::GetInstance();
        const QByteArray searchPath = qgetenv("PATH");
        if (!interpreter)
            qputenv("PATH", "/nowhere");
        LogCapture log;
        QStringList asked;
        pauses = &asked;
        const int result = detached ? runner->upgradeScriptAsy(list, flag) : runner->upgradeScript(list, flag);
        pauses = nullptr;
        qputenv("PATH", searchPath);
        QTEST(result, "result");
        QTEST(asked.join(' '), "pauses");
        QTRY_COMPARE(runs(), interpreter ? starts : 0);
        // Started or not, each try has its line.
        QCOMPARE(log.count("nRet: "), starts);
    }

    void workerRestores_data()
    {
        addColumns<bool>("withDesktopScript");
        addRow("with the desktop script", true);
        addRow("without", false);
    }
    void workerRestores()
    {
        QFETCH(bool, withDesktopScript);
        if (withDesktopScript) {
            testfiles::write(kDesktopScript, "printf '%s %s %s' \"$0\" $# \"$(/usr/bin/id -u)\" > $ROOM/restored.new\n"
                                             "mv $ROOM/restored.new $ROOM/restored\n");
        }
        terminalsettings::manage();
        LogCapture log;
        std::atomic<int> finished{0};
        const auto worker = makeWorker(finished);
        worker->removeControlManager();
        QTRY_COMPARE_WITH_TIMEOUT(finished.load(), 1, 30000);
        QTRY_COMPARE(runs(), 1);
        QCOMPARE(processrecord::words(processrecord::entries(kFrontEnd).first()),
                 zent::thirdScriptArguments(kDirectoryScript).mid(1));
        QTRY_COMPARE(hiddenModules(), QString("@as []"));
        if (withDesktopScript)
            QTRY_COMPARE(testfiles::read(m_trace), QString("%1 0 %2").arg(kDesktopScript).arg(getuid()).toUtf8());
        // The desktop first, then the directory, then the modules.
        const QStringList lines = log.lines();
        const auto line = [&lines](const char* text) { return lines.indexOf(lines.filter(text).value(0)); };
        QCOMPARE(line("strRestoreDesktop") >= 0, withDesktopScript);
        QVERIFY(line("strRestoreDesktop") < line("upgradeScript start"));
        QVERIFY(line("upgradeScript end") < line("execute hide-module"));
    }

    void workerMakesOnePassPerCall()
    {
        std::atomic<int> finished{0};
        const auto worker = makeWorker(finished);
        worker->stop(); // of no lasting effect
        for (int pass = 1; pass <= 2; ++pass) {
            worker->removeControlManager();
            worker->removeControlManager();
            QVERIFY(worker->wait(30000));
            QTRY_COMPARE(finished.load(), pass);
            QTRY_COMPARE(runs(), pass);
        }
    }
};

QTEST_GUILESS_MAIN(TestPrivilegedScript)
#include "test_privilegedscript.moc"
