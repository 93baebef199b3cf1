#include "logcapture.h"
#include "processrecord.h"
#include "resumedialog.h"
#include "testrows.h"

#include <QDesktopServices>
#include <QLabel>
#include <QPushButton>
#include <QSignalSpy>
#include <QTimer>

namespace
{

const QString kFrontEnd = QStringLiteral("fenx-cli.bash");
const QString kFailure = QStringLiteral("校验失败");

} // namespace

class TestResumeDialog : public QObject
{
    Q_OBJECT

    std::unique_ptr<resumeDialog> m_dialog;
    QList<QUrl> m_opened;

    QTimer* timer() const { return m_dialog->findChild<QTimer*>("terminalVarifyTimer"); }
    int processes() const { return m_dialog->findChildren<QProcess*>().size(); }
    static int runs() { return processrecord::entries(kFrontEnd).size(); }
    /// The text under the heading.
    QString shownText() const
    {
        for (const QLabel* label : m_dialog->findChildren<QLabel*>()) {
            if (label->size() == QSize(210, 36))
                return label->text();
        }
        return QStringLiteral("no such label");
    }

public slots:
    void take(const QUrl& url) { m_opened.append(url); }

private slots:
    void initTestCase()
    {
        QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only");
        QDesktopServices::setUrlHandler("http", this, "take");
    }
    void init()
    {
        processrecord::clear();
        m_opened.clear();
        m_dialog = std::make_unique<resumeDialog>();
        m_dialog->setIpPort("10.0.0.1", "8443");
    }
    void cleanup() { m_dialog.reset(); }

    void openTwiceRunsOnceAPeriod()
    {
        m_dialog->Notify("open", "true");
        m_dialog->Notify("open", "false");
        QCOMPARE(m_dialog->findChildren<QTimer*>("terminalVarifyTimer").size(), 1);
        QVERIFY(timer()->isActive());
        QCOMPARE(timer()->interval(), 300000);
        QVERIFY(m_dialog->isHidden());
        timer()->setSingleShot(true);
        timer()->start(0);
        QTRY_COMPARE(runs(), 1);
        QCOMPARE(processrecord::words(processrecord::entries(kFrontEnd).first()),
                 QStringList({"--cmd", "policy", "--scenceinfo", "emptyscenecode", "--args", "RUNFULLZONEVARIFY"}));
        QTRY_COMPARE(processes(), 0);
        QCOMPARE(runs(), 1);
    }

    void runsMayOverlapAndLeaveNothing()
    {
        const QString room = qEnvironmentVariable("ROOM");
        const QString hook = room + "/standin/" + kFrontEnd + ".hook";
        const QString go = room + "/go";
        testfiles::write(hook, "while [ ! -e " + go.toUtf8() + " ]; do sleep 0.05; done");
        m_dialog->getDeviceIntegralityVarifyScript();
        m_dialog->getDeviceIntegralityVarifyScript();
        QTRY_COMPARE(runs(), 2);
        QCOMPARE(processes(), 2);
        testfiles::write(go, "");
        QTRY_COMPARE(processes(), 0);
        testfiles::remove(hook);

        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", "/nowhere");
        m_dialog->getDeviceIntegralityVarifyScript();
        qputenv("PATH", path);
        QTRY_COMPARE(processes(), 0);
    }

    void otherWordsStop()
    {
        for (const char* word : {"close", "", "OPEN", "success"}) {
            for (const char* url : {"true", "false"}) {
                m_dialog->Notify("open", "true");
                m_dialog->Notify(word, url);
                QVERIFY2(!timer()->isActive(), word);
                QCOMPARE(m_dialog->repairUrl(), QString());
                QVERIFY(m_dialog->isHidden());
            }
        }
    }

    void failureLeadsToTheRepairPage()
    {
        m_dialog->Notify("open", "true");
        for (const char* path : {"/fix/page", "/fix?id=a%20b&x=1#part", "", "/True"}) {
            m_dialog->Notify(kFailure, path);
            QVERIFY(m_dialog->isVisible());
            QCOMPARE(shownText(), kFailure);
            QCOMPARE(m_dialog->repairUrl(), QString("http://10.0.0.1/api") + path);
            for (QPushButton* button : m_dialog->findChildren<QPushButton*>()) {
                if (button->text() == QStringLiteral("修复方法"))
                    button->click();
            }
            QCOMPARE(m_opened.value(m_opened.size() - 1), QUrl(m_dialog->repairUrl()));
        }
        QCOMPARE(m_opened.size(), 4);
        // A failure report says nothing about the runs to come.
        QVERIFY(timer()->isActive());
    }

    void successCloses_data()
    {
        addColumns<QString, bool>("url", "shown");
        addRow("switch", "false", false);
        addRow("path", "/fix", true);
        addRow("empty", "", true);
    }
    void successCloses()
    {
        QFETCH(QString, url);
        QFETCH(bool, shown);
        m_dialog->Notify(kFailure, "/page");
        QSignalSpy hidden(m_dialog.get(), &resumeDialog::hidewin);
        m_dialog->Notify("success", url);
        QCOMPARE(hidden.count(), 0);
        // A text that is no switch is a repair path even then, and reporting it shows the dialog again.
        QCOMPARE(m_dialog->isVisible(), shown);
        QCOMPARE(shownText(), QString(shown ? "success" : ""));
        QCOMPARE(m_dialog->repairUrl(), "http://10.0.0.1/api" + (shown ? url : QString("/page")));
    }

    void closingHides()
    {
        m_dialog->Notify(kFailure, "/page");
        QSignalSpy hidden(m_dialog.get(), &resumeDialog::hidewin);
        QTest::keyClick(m_dialog.get(), Qt::Key_Escape);
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(hidden.count(), 1);
        // After a success it closes without a word.
        m_dialog->Notify("success", "true");
        m_dialog->Notify(kFailure, "/page");
        m_dialog->close();
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(hidden.count(), 1);
    }
};

QTEST_MAIN(TestResumeDialog)
#include "test_resumedialog.moc"
