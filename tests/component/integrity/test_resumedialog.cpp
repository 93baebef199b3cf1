#include "processrecord.h"
#include "resumedialog.h"

#include <QTimer>
#include <QtTest>

/// The verification runs; the reports and the dialog's windows are driven on the bus.
class TestResumeDialog : public QObject
{
    Q_OBJECT

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void openTwiceRunsOnceAPeriod()
    {
        resumeDialog dialog;
        auto* timer = dialog.findChild<QTimer*>("terminalVarifyTimer");
        const auto processes = [&dialog] { return dialog.findChildren<QProcess*>().size(); };
        dialog.Notify("open", "true");
        dialog.Notify("open", "false");
        QCOMPARE(timer->interval(), 300000);
        timer->setSingleShot(true);
        timer->start(0);
        QTRY_COMPARE(processes(), 1);
        QTRY_COMPARE(processes(), 0);
        const QList<QJsonObject> runs = processrecord::entries("fenx-cli.bash");
        QCOMPARE(runs.size(), 1);
        QCOMPARE(processrecord::words(runs.first()),
                 QStringList({"--cmd", "policy", "--scenceinfo", "emptyscenecode", "--args", "RUNFULLZONEVARIFY"}));

        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", "/nowhere");
        dialog.getDeviceIntegralityVarifyScript();
        qputenv("PATH", path);
        QTRY_COMPARE(processes(), 0);
    }

    void otherWordsStop()
    {
        resumeDialog dialog;
        auto* timer = dialog.findChild<QTimer*>("terminalVarifyTimer");
        for (const char* word : {"close", "", "OPEN", "success"}) {
            dialog.Notify("open", "true");
            // A failure report says nothing about the runs to come.
            dialog.Notify("failed", "/fix?id=a%20b");
            QVERIFY(timer->isActive() && dialog.isVisible());
            dialog.Notify(word, "true");
            QVERIFY2(!timer->isActive(), word);
        }
        // A text that is no switch is a repair path even then, and reporting it shows the dialog again.
        QVERIFY(dialog.isHidden());
        dialog.Notify("success", "");
        QVERIFY(dialog.isVisible());
    }
};

QTEST_MAIN(TestResumeDialog)
#include "test_resumedialog.moc"
