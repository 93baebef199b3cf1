#include "buspeer.h"
#include "logcapture.h"
#include "processrecord.h"
#include "resumedialog.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusPendingCall>
#include <QDBusPendingCallWatcher>
#include <QDesktopServices>
#include <QLabel>
#include <QPushButton>
#include <QTimer>
#include <QtTest>

namespace
{

const QString kPath = QStringLiteral("/com/vantor/tarn/Fullzone");
const QString kInterface = QStringLiteral("com.vantor.tarn.Fullzone");
const QString kFrontEnd = QStringLiteral("fenx-cli.bash");
const QString kFailure = QStringLiteral("校验失败");
constexpr int kPeriodMs = 300000;

} // namespace

/// The dialog as hosting code exports it, and as its own window.
class TestResumeDialog : public QObject
{
    Q_OBJECT

    BusPeer m_bus{kPath};
    std::unique_ptr<resumeDialog> m_dialog;
    QList<QUrl> m_opened;
    int m_heard = 0;

    QTimer* timer() const { return m_dialog->findChild<QTimer*>("terminalVarifyTimer"); }
    /// The text under the heading.
    QString shownText() const
    {
        for (const QLabel* label : m_dialog->findChildren<QLabel*>()) {
            if (label->size() == QSize(210, 36))
                return label->text();
        }
        return QStringLiteral("no such label");
    }
    static int runs() { return processrecord::entries(kFrontEnd).size(); }

public slots:
    void take(const QUrl& url) { m_opened.append(url); }
    void hear() { ++m_heard; }

private slots:
    void initTestCase()
    {
        QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only");
        QDesktopServices::setUrlHandler("http", this, "take");
        QVERIFY(m_bus.peer.connect(m_bus.host.baseService(), kPath, kInterface, "hidewin", this, SLOT(hear())));
    }
    void init()
    {
        processrecord::clear();
        m_opened.clear();
        m_heard = 0;
        m_dialog = std::make_unique<resumeDialog>();
        m_dialog->setIpPort("10.0.0.1", "8443");
        QVERIFY(m_bus.host.registerObject(
            kPath, m_dialog.get(), QDBusConnection::ExportScriptableSlots | QDBusConnection::ExportScriptableSignals));
    }
    void cleanup() { m_dialog.reset(); }

    void openTwiceRunsOnceAPeriod()
    {
        LogCapture log;
        m_dialog->Notify("open", "true");
        m_dialog->Notify("open", "false");
        QCOMPARE(m_dialog->findChildren<QTimer*>("terminalVarifyTimer").size(), 1);
        QVERIFY(timer()->isActive());
        QCOMPARE(timer()->interval(), kPeriodMs);
        QCOMPARE(log.count("terminalVarifyTimer Timer started!"), 2);
        QVERIFY(m_dialog->isHidden());

        timer()->setSingleShot(true);
        QSignalSpy ticks(timer(), &QTimer::timeout);
        timer()->start(0);
        QTRY_COMPARE(ticks.count(), 1);
        QCOMPARE(m_dialog->findChildren<QProcess*>().size(), 1);
        QTRY_COMPARE(runs(), 1);
        QCOMPARE(processrecord::words(processrecord::entries(kFrontEnd).first()),
                 QStringList({"--cmd", "policy", "--scenceinfo", "emptyscenecode", "--args", "RUNFULLZONEVARIFY"}));
        QCOMPARE(log.count("....closeguardApp.bash:"), 7);
        QTRY_COMPARE(m_dialog->findChildren<QProcess*>().size(), 0);
    }

    void runsMayOverlap()
    {
        const QString hook = qEnvironmentVariable("ROOM") + "/standin/" + kFrontEnd + ".hook";
        const QString go = qEnvironmentVariable("ROOM") + "/go";
        testfiles::write(hook, "while [ ! -e " + go.toUtf8() + " ]; do sleep 0.05; done");
        m_dialog->getDeviceIntegralityVarifyScript();
        m_dialog->getDeviceIntegralityVarifyScript();
        QTRY_COMPARE(runs(), 2);
        QCOMPARE(m_dialog->findChildren<QProcess*>().size(), 2);
        testfiles::write(go, "");
        QTRY_COMPARE(m_dialog->findChildren<QProcess*>().size(), 0);
        testfiles::remove(hook);
    }

    void runWithoutAnInterpreterLeavesNothing()
    {
        const QByteArray path = qgetenv("PATH");
        qputenv("PATH", "/nowhere");
        m_dialog->getDeviceIntegralityVarifyScript();
        qputenv("PATH", path);
        QTRY_COMPARE(m_dialog->findChildren<QProcess*>().size(), 0);
        QCOMPARE(runs(), 0);
    }

    void otherWordsStop_data()
    {
        QTest::addColumn<QString>("word");
        QTest::addColumn<QString>("url");
        for (const char* word : {"close", "", "OPEN", "open ", "success"}) {
            QTest::addRow("%s true", word) << QString(word) << "true";
            QTest::addRow("%s false", word) << QString(word) << "false";
        }
    }
    void otherWordsStop()
    {
        QFETCH(QString, word);
        QFETCH(QString, url);
        LogCapture log;
        m_dialog->Notify("open", "true");
        m_dialog->Notify(word, url);
        QVERIFY(!timer()->isActive());
        QCOMPARE(log.count("terminalVarifyTimer Timer stoped!"), 1);
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(m_dialog->repairUrl(), QString());
        m_dialog->Notify("open", "true");
        QVERIFY(timer()->isActive());
    }

    void failureLeadsToTheRepairPage_data()
    {
        QTest::addColumn<QString>("path");
        QTest::addColumn<QString>("opened");
        QTest::newRow("path") << "/fix/page"
                              << "http://10.0.0.1/api/fix/page";
        QTest::newRow("query") << "/fix?id=a%20b&x=1#part"
                               << "http://10.0.0.1/api/fix?id=a%20b&x=1#part";
        QTest::newRow("empty") << ""
                               << "http://10.0.0.1/api";
        QTest::newRow("capital") << "/True"
                                 << "http://10.0.0.1/api/True";
    }
    void failureLeadsToTheRepairPage()
    {
        QFETCH(QString, path);
        QFETCH(QString, opened);
        m_dialog->Notify("open", "true");
        m_dialog->Notify(kFailure, path);
        QVERIFY(m_dialog->isVisible());
        QCOMPARE(m_dialog->size(), QSize(380, 160));
        QCOMPARE(shownText(), kFailure);
        QCOMPARE(m_dialog->repairUrl(), opened);
        // A failure report says nothing about the runs to come.
        QVERIFY(timer()->isActive());
        for (QPushButton* button : m_dialog->findChildren<QPushButton*>()) {
            if (button->text() == QStringLiteral("修复方法"))
                button->click();
        }
        QCOMPARE(m_opened, QList<QUrl>{QUrl(opened)});
    }

    void successCloses_data()
    {
        QTest::addColumn<QString>("url");
        QTest::addColumn<bool>("shown");
        QTest::newRow("true") << "true" << false;
        QTest::newRow("false") << "false" << false;
        QTest::newRow("path") << "/fix" << true;
        QTest::newRow("empty") << "" << true;
    }
    void successCloses()
    {
        QFETCH(QString, url);
        QFETCH(bool, shown);
        m_dialog->Notify(kFailure, "/page");
        LogCapture log;
        QSignalSpy hidden(m_dialog.get(), &resumeDialog::hidewin);
        m_dialog->Notify("success", url);
        QVERIFY(log.contains("ignore close event"));
        QCOMPARE(hidden.count(), 0);
        // A text that is no switch is a repair path even then, and reporting it shows the dialog again.
        QCOMPARE(m_dialog->isVisible(), shown);
        QCOMPARE(shownText(), shown ? QString("success") : QString());
        QCOMPARE(m_dialog->repairUrl(), "http://10.0.0.1/api" + (shown ? url : QString("/page")));
    }

    void closingHides()
    {
        m_dialog->Notify(kFailure, "/page");
        QSignalSpy hidden(m_dialog.get(), &resumeDialog::hidewin);
        LogCapture log;
        QTest::keyClick(m_dialog.get(), Qt::Key_Escape);
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(hidden.count(), 1);
        QVERIFY(log.contains("================:$$$$$$$$$$$$$$"));
        QCOMPARE(log.count("closeEvent"), 1);
        QTRY_COMPARE(m_heard, 1);
        m_dialog->Notify(kFailure, "/page");
        QVERIFY(m_dialog->isVisible());
        m_dialog->Notify("success", "true");
        m_dialog->Notify(kFailure, "/page");
        m_dialog->close();
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(hidden.count(), 1);
    }

    void offersWhatItDescribes()
    {
        const QDBusMessage reply = m_bus.call("org.freedesktop.DBus.Introspectable", "Introspect");
        const QMap<QString, QStringList> live = BusPeer::members(reply.arguments().value(0).toString());
        const QMap<QString, QStringList> described =
            BusPeer::members(QString::fromUtf8(testfiles::read(ZENT_DATA_DIR "/com.vantor.tarn.Fullzone.xml")));
        QCOMPARE(described.value(kInterface),
                 QStringList({"method Notify(ss)", "signal confirmed()", "signal hidewin()"}));
        QCOMPARE(live.value(kInterface), described.value(kInterface));
        for (const QString& other : live.keys())
            QVERIFY2(other == kInterface || other.startsWith("org.freedesktop.DBus."), qPrintable(other));
    }

    void callsReachOnlyNotify()
    {
        QCOMPARE(m_bus.call(kInterface, "Notify", {kFailure, "/fix"}).type(), QDBusMessage::ReplyMessage);
        QVERIFY(m_dialog->isVisible());
        for (const char* member : {"confirmCliked", "hideWindow", "close", "hide", "reject", "deleteLater"})
            QCOMPARE(m_bus.call(kInterface, member).errorName(), QString("org.freedesktop.DBus.Error.UnknownMethod"));
        QCOMPARE(m_bus.call(kInterface, "Notify", {1, "/fix"}).type(), QDBusMessage::ErrorMessage);
        QVERIFY(m_dialog->isVisible());
        QCOMPARE(m_opened.size(), 0);
    }
};

QTEST_MAIN(TestResumeDialog)
#include "test_resumedialog.moc"
