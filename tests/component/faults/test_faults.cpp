// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "closeguarddialog.h"
#include "fixture.h"
#include "httprequest.h"
#include "mainwindow.h"
#include "notification.h"
#include "platformcontrol.h"
#include "sessionhost.h"
#include "testfiles.h"
#include "toolkitpasswordedit.h"

#include <QComboBox>
#include <QLabel>
#include <QRegularExpression>

using namespace std::chrono_literals;

namespace
{

const QString kRefused = QStringLiteral("管理员账号或密码错误");
/// A poll holds the window up for 2 s at most; whatever else could takes 25 s or more. The rest is a busy machine's.
constexpr int kLongestGapMs = 8000;
constexpr int kPatienceMs = 40000;

} // namespace

/// Every request of the client under every fault that its servers can have: it stays alive, keeps what it knew, says in
/// the log what happened, and goes on by itself when the fault is over.
class TestFaults : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<MainWindow> m_window;
    std::unique_ptr<SessionHost> m_host;
    QTimer m_beat;
    QElapsedTimer m_sinceBeat;
    qint64 m_longestGap = 0;
    BoxCloser m_boxes;
    int m_readSuccesses = 0;
    /// The fault under test.
    QJsonObject m_row;

    int scenes() const { return m_window->findChild<QComboBox*>()->count(); }
    /// What the panel and the count say.
    QString known() const
    {
        QStringList texts;
        for (const char* label : {"macValue", "userRoleValue", "terminalValue", "nameValue"})
            texts.append(m_window->findChild<QLabel*>(label)->text());
        return texts.join('|') + QString(" %1 %2").arg(scenes()).arg(MainWindow::unreadMessageCount);
    }
    void start()
    {
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        m_host = std::make_unique<SessionHost>(*m_window);
    }
    void serve(const QString& name, int unread)
    {
        m_platform.patchState(
            {{"users", QJsonObject{{"zhangsan", QJsonObject{{"gecos", name + ",,N1"}, {"client_name", "PC"}}}}},
             {"organisation", QJsonObject{{"name", name}}}});
        m_platform.setUnread(unread);
    }
    void setFault(const QJsonObject& state, const QJsonObject& action)
    {
        m_platform.clearFaults();
        if (!action.isEmpty())
            m_platform.addFault({{"path", "*"}}, action);
        // A list of no messages, where the others are odd objects.
        if (action.value("body").toString().contains("scene_name"))
            m_platform.addFault({{"path", "*/list"}}, {{"body", R"([[], 4])"}});
        QJsonObject all{{"listening", true}, {"black_hole", false}, {"tls", QJsonObject{{"certificate", "server"}}}};
        for (auto entry = state.begin(); entry != state.end(); ++entry)
            all.insert(entry.key(), entry.value());
        m_platform.patchState(all);
    }
    /// An administrator types a password that the server would refuse.
    void tryRelease()
    {
        m_boxes.texts.clear();
        m_window->onCloseguardClicked();
        auto* dialog = m_window->findChild<closeGuarddialog*>();
        auto* password = dialog->findChild<ToolkitPasswordEdit*>("password");
        password->setText("wrong");
        QTest::keyClick(password, Qt::Key_Return);
        dialog->hide();
    }
    void askEverything()
    {
        m_readSuccesses = 0;
        m_window->unreadMessages();
        QNotification::qInstance->readNotifyMessage("0",
                                                    [this](bool ok, const auto&) { m_readSuccesses += ok ? 1 : 0; });
        m_window->getAllUserEnvironment();
        QCoreApplication::processEvents();
        emit m_window->startgetMeInfo();
        m_window->getAreaInfo();
        QCoreApplication::processEvents();
        tryRelease();
        QCoreApplication::processEvents();
        HttpRequest::GetInstance()->postQuitControl("zhangsan");
    }
    /// A size of this process in KiB, by its name in the kernel's status file.
    static long memory(const char* name)
    {
        const QString status = testfiles::read("/proc/self/status");
        return QRegularExpression(QString("%1:\\s+(\\d+)").arg(name)).match(status).captured(1).toLong();
    }
    /// Requests within one second share their URL and thus their callback.
    static void nextSecond() { QTest::qWait(1001 - QTime::currentTime().msec()); }

    QString failed(const char* poll) const { return QString("%1 failed! %2").arg(poll).arg(m_row["status"].toInt()); }
    QString first() const { return QString("%1|N1|PC|%1 3 2").arg(QTest::currentDataTag()); }
    QTimer* retry() const { return m_window->findChild<QTimer*>("scenesAgain"); }
    bool scenesAnswer() const { return m_row["state"].toObject().contains("tls"); }
    bool scenesRefused() const { return m_row["action"]["body"].toString().contains("scene_name"); }

    /// A session that starts during the fault: its polls go on until they are answered.
    void startUnderTheFault()
    {
        const LogCapture log;
        serve(QTest::currentDataTag(), 2);
        setFault(m_row["state"].toObject(), m_row["action"].toObject());
        MainWindow::unreadMessageCount = 0;
        start();
        m_sinceBeat.start();
        m_beat.callOnTimeout(this, [this] { m_longestGap = std::max(m_longestGap, m_sinceBeat.restart()); });
        m_beat.start(5);
        const QString unknown = known();
        for (const char* poll : {"getusrInfo", "getCompanyName"})
            QTRY_VERIFY2_WITH_TIMEOUT(log.contains(failed(poll)), qPrintable(log.lines().join('\n')), kPatienceMs);
        QCOMPARE(known(), unknown);
        setFault({}, {});
        QTRY_VERIFY_WITH_TIMEOUT(scenes() == 3, kPatienceMs);
        m_window->unreadMessages();
        QTRY_COMPARE_WITH_TIMEOUT(known(), first(), kPatienceMs);
        QVERIFY(!retry()->isActive());
    }

    /// One that had everything before.
    void askUnderTheFault()
    {
        const int status = m_row["status"].toInt();
        const LogCapture log;
        setFault(m_row["state"].toObject(), m_row["action"].toObject());
        askEverything();
        QStringList expected = m_row["log"].toVariant().toStringList() << failed("getusrInfo");
        // Nothing while the answers are awaited.
        if (m_row["log"].toArray().isEmpty()) {
            QVERIFY(QNotification::qInstance->pendingRequests() > 0);
            QCOMPARE(m_readSuccesses, 0);
        } else {
            QTRY_COMPARE_WITH_TIMEOUT(QNotification::qInstance->pendingRequests(), 0, kPatienceMs);
            QTRY_VERIFY_WITH_TIMEOUT(retry()->isActive() == (!scenesAnswer() && !scenesRefused()), kPatienceMs);
            QTRY_COMPARE(m_readSuccesses, status == 200 ? 1 : 0);
        }
        QTRY_COMPARE(m_boxes.texts, QStringList(m_row["box"].toString()));
        // The poll after one that took long, as on a busy machine, is held back.
        QVERIFY(log.count(failed("getCompanyName")) == 1 || log.contains("is slow to answer"));
        if (status < 0)
            expected += {"client/remove\" failed: ", "client/remove_status\" failed: "};
        for (const QString& line : qAsConst(expected))
            QVERIFY2(log.count(line) == 1, qPrintable(line + "\n\n" + log.lines().join('\n')));
        if (!scenesAnswer())
            QCOMPARE(known(), first());
    }

    /// What a person or a poll does next succeeds.
    void askWhenItIsOver()
    {
        const QString name = QString(QTest::currentDataTag()) + " over";
        serve(name, 5);
        setFault({}, {});
        if (retry()->isActive())
            retry()->start(0);
        if (scenesRefused())
            m_window->getAllUserEnvironment();
        tryRelease();
        QTRY_COMPARE(m_boxes.texts, QStringList(kRefused));
        QTRY_COMPARE_WITH_TIMEOUT(scenes(), 6, kPatienceMs);
        QTRY_COMPARE_WITH_TIMEOUT(QNotification::qInstance->pendingRequests(), 0, kPatienceMs);
        m_platform.setUnread(5);
        nextSecond();
        askEverything();
        QTRY_COMPARE_WITH_TIMEOUT(m_readSuccesses, 1, kPatienceMs);
        nextSecond();
        m_window->unreadMessages();
        bool user = false;
        const auto refreshed = [&] {
            if (known() == QString("%1|N1|PC|%1 9 4").arg(name))
                return true;
            // On a busy machine a poll takes long, and the next one is held back.
            user = !user;
            user ? m_window->getusrInfo() : m_window->getAreaInfo();
            return false;
        };
        QTRY_VERIFY_WITH_TIMEOUT(refreshed(), kPatienceMs);
    }

private slots:
    void cleanup()
    {
        m_beat.stop();
        m_host.reset();
        m_window.reset();
        setFault({}, {});
    }

    void everyRequestUnder_data() { fixture::addRows("faults.json"); }
    void everyRequestUnder()
    {
        QFETCH(QJsonObject, row);
        m_row = row;
        startUnderTheFault();
        if (!QTest::currentTestFailed())
            askUnderTheFault();
        if (!QTest::currentTestFailed())
            askWhenItIsOver();
        QVERIFY2(m_longestGap < kLongestGapMs, qPrintable(QString::number(m_longestGap)));
    }

    void backgroundRequestsEnd_data() { fixture::addRows("endlessreplies.json"); }
    void backgroundRequestsEnd()
    {
        QFETCH(QJsonObject, row);
        const QJsonObject action = row["action"].toObject();
        const bool drips = action.contains("drip_ms");
        serve("before", 2);
        start();
        QTRY_VERIFY_WITH_TIMEOUT(known().startsWith("before|N1|PC|before 3 "), kPatienceMs);
        setFault({}, action);
        QNotification::qInstance->setTimeLimit(drips ? 1s : zent::http::kBackgroundTime);
        const long before = memory("VmRSS");
        testfiles::write("/proc/self/clear_refs", "5");
        m_platform.addFault({{"path", "*/remove"}}, {{"hang", true}});
        LogCapture log;
        m_window->unreadMessages();
        QCoreApplication::processEvents();
        // Nobody takes in what comes while the window is held up.
        HttpRequest::GetInstance()->postQuitControl("zhangsan");
        QTRY_COMPARE_WITH_TIMEOUT(QNotification::qInstance->pendingRequests(), 0, kPatienceMs);
        QVERIFY2(log.contains(row["reason"].toString()), qPrintable(log.lines().join('\n')));
        if (!drips) {
            m_window->getusrInfo();
            m_window->getAllUserEnvironment();
            const QRegularExpression ended("get net reqruest failed!|parse config.json file failed.");
            QTRY_VERIFY_WITH_TIMEOUT(!log.lines().filter(ended).isEmpty(), kPatienceMs);
        }
        QVERIFY2(memory("VmHWM") - before < 40 * 1024, qPrintable(QString::number(memory("VmHWM") - before)));
        QTRY_VERIFY_WITH_TIMEOUT(memory("VmRSS") - before < 4 * 1024, 60000);
    }
};

QTEST_MAIN(TestFaults)
#include "test_faults.moc"
