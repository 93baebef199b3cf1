#include "controlmanagerthread.h"
#include "logcapture.h"
#include "processrecord.h"
#include "thirdscript.h"

#include <QProcess>
#include <QSignalSpy>
#include <QtTest>

#include <unistd.h>

namespace
{

const QString kFrontEnd = QStringLiteral("fenx-cli.bash");
const QString kDesktopScript = QStringLiteral("/usr/share/lumo/restore_config.bash");
const QString kDirectoryScript = QStringLiteral("/usr/share/lumo/restore_ldap.bash");

QByteArray gsettings(const QStringList& arguments)
{
    QProcess program;
    program.start("gsettings", arguments);
    return program.waitForFinished() && program.exitCode() == 0 ? program.readAllStandardOutput().trimmed() : "failed";
}

QByteArray hiddenModules()
{
    return gsettings({"get", "com.vantor.oxa.control-center", "hide-module"});
}

} // namespace

class TestControlManagerThread : public QObject
{
    Q_OBJECT

    const QString m_trace = qEnvironmentVariable("ROOM") + "/restored";

    static void finish(ControlManagerThread& worker) { QVERIFY(worker.wait(10000)); }
    /// The front end has been called that often and the modules are to be seen again.
    static void awaitProcesses(int calls)
    {
        QTRY_COMPARE(processrecord::entries(kFrontEnd).size(), calls);
        QTRY_COMPARE(hiddenModules(), QByteArray("@as []"));
    }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void init()
    {
        processrecord::clear();
        testfiles::remove(kDesktopScript);
        testfiles::remove(m_trace);
        gsettings({"set", "com.vantor.oxa.control-center", "hide-module", "['accounts', 'update']"});
        QCOMPARE(hiddenModules(), QByteArray("['accounts', 'update']"));
    }

    void onePass_data()
    {
        QTest::addColumn<bool>("withDesktopScript");
        QTest::newRow("with the desktop script") << true;
        QTest::newRow("without") << false;
    }
    void onePass()
    {
        QFETCH(bool, withDesktopScript);
        if (withDesktopScript) {
            testfiles::write(kDesktopScript, "printf '%s %s %s' \"$0\" $# \"$(/usr/bin/id -u)\" > $ROOM/restored.new\n"
                                             "mv $ROOM/restored.new $ROOM/restored\n");
        }
        LogCapture log;
        ControlManagerThread worker;
        worker.setAppPath("/opt/elsewhere");
        QSignalSpy spy(&worker, &ControlManagerThread::sigFinishedRemove);
        worker.removeControlManager();
        finish(worker);
        QTRY_COMPARE(spy.count(), 1);
        awaitProcesses(1);
        QCOMPARE(processrecord::words(processrecord::entries(kFrontEnd).first()),
                 zent::thirdScriptArguments(kDirectoryScript).mid(1));
        if (withDesktopScript)
            QTRY_COMPARE(testfiles::read(m_trace), QString("%1 0 %2").arg(kDesktopScript).arg(getuid()).toUtf8());

        QStringList expected{"ControlManagerThread::doRemoveController()....m_strCancelGroup"};
        if (withDesktopScript) {
            expected
                << QString("ControlManagerThread::doRemoveController()....strRestoreDesktop: \"%1\"")
                       .arg(kDesktopScript)
                << QString("doRemoveController ...execute...strRestoreDesktop: \"%1\" :nRet: 1").arg(kDesktopScript);
        }
        expected << QString("doRemoveController .....upgradeScript start: \"%1\"").arg(kDirectoryScript)
                 << QString("doRemoveController .....upgradeScript end: \"%1\"").arg(kDirectoryScript)
                 << "doRemoveController .....execute hide-module:";
        QCOMPARE(log.lines().filter("doRemoveController"), expected);
    }

    void everyStartFails()
    {
        testfiles::write(kDesktopScript, "exit 0\n");
        LogCapture log;
        ControlManagerThread worker;
        QSignalSpy spy(&worker, &ControlManagerThread::sigFinishedRemove);
        const QByteArray searchPath = qgetenv("PATH");
        qputenv("PATH", "/nowhere");
        worker.removeControlManager();
        const bool ended = worker.wait(10000);
        qputenv("PATH", searchPath);
        QVERIFY(ended);
        QTRY_COMPARE(spy.count(), 1);
        QCOMPARE(log.count(":nRet: 0"), 1);
        QCOMPARE(hiddenModules(), QByteArray("['accounts', 'update']"));
        QVERIFY(processrecord::entries(kFrontEnd).isEmpty());
    }

    void withoutTheFrontEnd()
    {
        QVERIFY(QFile::exists(zent::kFrontEndPath));
        const QString aside = zent::kFrontEndPath + ".aside";
        QVERIFY(QFile::rename(zent::kFrontEndPath, aside));
        ControlManagerThread worker;
        QSignalSpy spy(&worker, &ControlManagerThread::sigFinishedRemove);
        worker.removeControlManager();
        const bool ended = worker.wait(10000);
        QVERIFY(QFile::rename(aside, zent::kFrontEndPath));
        QVERIFY(ended);
        QTRY_COMPARE(spy.count(), 1);
        awaitProcesses(0);
    }

    void passesPerCall()
    {
        LogCapture log;
        ControlManagerThread worker;
        QSignalSpy spy(&worker, &ControlManagerThread::sigFinishedRemove);
        worker.stop(); // of no lasting effect
        worker.removeControlManager();
        worker.removeControlManager();
        finish(worker);
        QTRY_COMPARE(spy.count(), 1);
        awaitProcesses(1);
        worker.removeControlManager();
        finish(worker);
        QTRY_COMPARE(spy.count(), 2);
        awaitProcesses(2);
        QCOMPARE(log.count("....m_strCancelGroup"), 2);
    }
};

QTEST_GUILESS_MAIN(TestControlManagerThread)
#include "test_controlmanagerthread.moc"
