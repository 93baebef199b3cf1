#include "controlmanagerthread.h"
#include "processrecord.h"
#include "testrows.h"
#include "thirdscript.h"
#include "upgradepriority.h"

#include <atomic>
#include <ctime>
#include <unistd.h>

namespace
{

const QString kFrontEnd = QStringLiteral("fenx-cli.bash");
constexpr int kNoInterpreter = -1;

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

    static int runs() { return processrecord::entries(kFrontEnd).size(); }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }
    void init() { processrecord::clear(); }

    void attempts_data()
    {
        addColumns<bool, bool, int, int, int, QString>("detached", "flag", "status", "result", "starts", "pauses");
        addRow("once, fails", false, true, 7, 7, 1, "");
        addRow("repeated, good at once", false, false, 0, 0, 1, "1");
        addRow("repeated, fails", false, false, 7, 7, 3, "1 2 3");
        addRow("repeated, no interpreter", false, false, kNoInterpreter, -2, 3, "1 2 3");
        addRow("detached, once", true, false, 7, 1, 1, "1");
        addRow("detached, three times", true, true, 7, 1, 3, "1 2 3 1");
        addRow("detached, three times, no interpreter", true, true, kNoInterpreter, 0, 1, "1 1");
    }
    void attempts()
    {
        QFETCH(bool, detached);
        QFETCH(bool, flag);
        QFETCH(int, status);
        QFETCH(int, starts);
        const QString standin = qEnvironmentVariable("ROOM") + "/standin/" + kFrontEnd + ".rc";
        testfiles::write(standin, QByteArray::number(status));
        UpgradePriority* runner = UpgradePriority::GetInstance();
        const QByteArray searchPath = qgetenv("PATH");
        if (status == kNoInterpreter)
            qputenv("PATH", "/nowhere");
        QStringList asked;
        pauses = &asked;
        const int result =
            detached ? runner->upgradeScriptAsy({"/a.bash", "x"}, flag) : runner->upgradeScript({"/a.bash", "x"}, flag);
        pauses = nullptr;
        qputenv("PATH", searchPath);
        QTEST(result, "result");
        QTEST(asked.join(' '), "pauses");
        QTRY_COMPARE(runs(), status == kNoInterpreter ? 0 : starts);
        testfiles::remove(standin);
    }

    void workerMakesOnePassPerCall()
    {
        const QString desktopScript = QStringLiteral("/usr/share/lumo/restore_config.bash");
        const QString trace = qEnvironmentVariable("ROOM") + "/restored";
        testfiles::write(desktopScript, "echo \"$0 $# $(/usr/bin/id -u)\" >> $ROOM/restored");
        const QByteArray line = QString("%1 0 %2\n").arg(desktopScript).arg(getuid()).toUtf8();
        // Counted in the worker's own thread, where a QSignalSpy must not be.
        std::atomic<int> finished{0};
        ControlManagerThread worker;
        connect(&worker, &ControlManagerThread::sigFinishedRemove, [&finished] { ++finished; });
        worker.stop(); // of no lasting effect
        for (int pass = 1; pass <= 2; ++pass) {
            worker.removeControlManager();
            worker.removeControlManager();
            QVERIFY(worker.wait(30000));
            QTRY_COMPARE(finished.load(), pass);
            QTRY_COMPARE(runs(), pass);
            QTRY_COMPARE(testfiles::read(trace), line.repeated(pass));
        }
    }
};

QTEST_GUILESS_MAIN(TestPrivilegedScript)
#include "test_privilegedscript.moc"
