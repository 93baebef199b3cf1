// SPDX-License-Identifier: Apache-2.0
#include "controlmanagerthread.h"
#include "fixture.h"
#include "processrecord.h"
#include "upgradepriority.h"

#include <atomic>
#include <ctime>
#include <unistd.h>

/// The pauses in seconds that have been asked for, in order, where a test looks at them.
static QJsonArray* pauses = nullptr;

/// Stands before the system's own, which the toolkit's pauses come down to. A pause that is written down instead of
/// slept is the same however busy the machine is.
extern "C" int nanosleep(const timespec* duration, timespec* rest)
{
    if (!pauses)
        return clock_nanosleep(CLOCK_MONOTONIC, 0, duration, rest) == 0 ? 0 : -1;
    pauses->append(static_cast<double>(duration->tv_sec) + static_cast<double>(duration->tv_nsec) / 1e9);
    return 0;
}

/// What is asked of the privileged front end: by the runner, and by the worker that undoes the control.
class TestPrivilegedScript : public QObject
{
    Q_OBJECT

    const QString m_frontEnd = QStringLiteral("fenx-cli.bash");

private slots:
    void init() { processrecord::clear(); }

    void attempts_data() { fixture::addRows("scriptattempts.json"); }
    void attempts()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        const QString standin = qEnvironmentVariable("ROOM") + "/standin/" + m_frontEnd + ".rc";
        testfiles::write(standin, QByteArray::number(row["status"].toInt()));
        UpgradePriority* runner = UpgradePriority::GetInstance();
        const QByteArray searchPath = qgetenv("PATH");
        // Without an interpreter nothing starts.
        if (row["status"] == "none")
            qputenv("PATH", "/nowhere");
        QJsonArray asked;
        pauses = &asked;
        const QStringList script{"/a.bash", "x", "y z"};
        const bool flag = row["flag"].toBool();
        const int result =
            row["detached"].toBool() ? runner->upgradeScriptAsy(script, flag) : runner->upgradeScript(script, flag);
        pauses = nullptr;
        qputenv("PATH", searchPath);
        QCOMPARE(result, row["result"].toInt());
        fixture::compare(asked, row["pauses"]);
        QTRY_COMPARE(processrecord::entries(m_frontEnd).size(), row["starts"].toInt());
        testfiles::remove(standin);
        for (const QJsonObject& entry : processrecord::entries(m_frontEnd))
            fixture::compare(entry["args"], row["words"]);
        fixture::compareLog(log, row["log"]);
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
            QTRY_COMPARE(processrecord::entries(m_frontEnd).size(), pass);
            QTRY_COMPARE(testfiles::read(trace), line.repeated(pass));
        }
    }
};

QTEST_GUILESS_MAIN(TestPrivilegedScript)
#include "test_privilegedscript.moc"
