// SPDX-License-Identifier: Apache-2.0
#include "processrecord.h"
#include "resumedialog.h"

#include <QTimer>
#include <QtTest>

#include <memory>

/// The verification runs; the reports and the dialog's windows are driven on the bus.
class TestResumeDialog : public QObject
{
    Q_OBJECT

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void openTwiceRunsOnceAPeriod()
    {
        const QString room = qEnvironmentVariable("ROOM");
        testfiles::write(room + "/standin/fenx-cli.bash.hook",
                         "readlink /proc/$$/fd/0 > $ROOM/input; cat; until [ -e $ROOM/go ]; do sleep 0.02; done; "
                         "seq 100000; echo $? > $ROOM/finished");
        auto dialog = std::make_unique<resumeDialog>();
        auto* timer = dialog->findChild<QTimer*>("terminalVarifyTimer");
        dialog->Notify("open", "true");
        dialog->Notify("open", "false");
        QCOMPARE(timer->interval(), 300000);
        timer->setSingleShot(true);
        timer->start(0);
        QTRY_COMPARE(testfiles::read(room + "/input"), QByteArray("/dev/null\n"));
        // It goes on without the client, and can still write.
        dialog.reset();
        testfiles::write(room + "/go", "");
        QTRY_COMPARE(testfiles::read(room + "/finished"), QByteArray("0\n"));
        testfiles::remove(room + "/standin/fenx-cli.bash.hook");
        const QList<QJsonObject> runs = processrecord::entries("fenx-cli.bash");
        QCOMPARE(runs.size(), 1);
        QCOMPARE(processrecord::words(runs.first()),
                 QStringList({"--cmd", "policy", "--scenceinfo", "emptyscenecode", "--args", "RUNFULLZONEVARIFY"}));
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
