#include "boxcloser.h"
#include "closeguarddialog.h"
#include "httprequest.h"
#include "logcapture.h"
#include "mainwindow.h"
#include "notification.h"
#include "platformcontrol.h"
#include "sessionhost.h"
#include "testrows.h"
#include "toolkitpasswordedit.h"

#include <QComboBox>
#include <QLabel>

namespace
{

const QString kRefused = QStringLiteral("管理员账号或密码错误");
const QString kNetwork = QStringLiteral("网络异常，请稍后重试");
const QString kWrongTypes = QStringLiteral(R"({"code": 0, "message": [{"scene_name": 1}], "data": {"name": ["x"],
    "result": "true", "user": {"gecos": ["x"], "client_name": 7, "supplementtary_groups": "g"}}})");
/// A poll holds the window up for 2 s at most; whatever else could takes 25 s or more. The rest is a busy machine's.
constexpr int kLongestGapMs = 8000;
constexpr int kPatienceMs = 20000;

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

    QComboBox* scenes() const { return m_window->findChild<QComboBox*>(); }
    /// What the panel and the count say.
    QString known() const
    {
        QStringList texts;
        for (const char* label : {"macValue", "userRoleValue", "terminalValue", "nameValue"})
            texts.append(m_window->findChild<QLabel*>(label)->text());
        return texts.join('|') + QString(" %1 %2").arg(scenes()->count()).arg(MainWindow::unreadMessageCount);
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
        // A list of odd messages, where the others are odd objects.
        if (action.value("body") == kWrongTypes)
            m_platform.addFault({{"path", "*/list"}}, {{"body", R"([{"uuid": 1, "title": {}}, 4])"}});
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
        const std::function<void()> requests[] = {
            [this] { m_window->unreadMessages(); },
            [this] {
                QNotification::qInstance->readNotifyMessage(
                    "0", [this](bool ok, const QString&) { m_readSuccesses += ok ? 1 : 0; });
            },
            [this] { m_window->getAllUserEnvironment(); },
            [this] { emit m_window->startgetMeInfo(); },
            [this] { m_window->getAreaInfo(); },
            [this] { tryRelease(); },
            [] { HttpRequest::GetInstance()->postQuitControl("zhangsan"); },
        };
        for (const auto& request : requests) {
            request();
            QCoreApplication::processEvents();
        }
    }
    /// Requests within one second share their URL and thus their callback.
    static void nextSecond() { QTest::qWait(1001 - QTime::currentTime().msec()); }

private slots:
    void initTestCase()
    {
        connect(&m_beat, &QTimer::timeout, this,
                [this] { m_longestGap = std::max(m_longestGap, m_sinceBeat.restart()); });
    }
    void cleanup()
    {
        m_beat.stop();
        m_host.reset();
        m_window.reset();
        setFault({}, {});
    }

    void everyRequestUnder_data()
    {
        addColumns<QJsonObject, QJsonObject, int, QString, QString>("state", "action", "status", "box", "logged");
        const QJsonObject none;
        const auto tls = [](const char* name) { return QJsonObject{{"tls", QJsonObject{{"certificate", name}}}}; };
        // What is logged of the list, the marking as read and the scenes; nothing while their answers are awaited.
        const auto all = [](const QString& why) { return QString("list%1;read%1;scenes%1").arg("\" failed: " + why); };
        const QString untrusted = "list\" failed: SSL handshake failed;read\" failed: SSL handshake failed";
        addRow("refused", QJsonObject{{"listening", false}}, none, -7, kNetwork, all("Connection refused"));
        addRow("black hole", QJsonObject{{"black_hole", true}}, none, -28, kNetwork, "");
        addRow("slow", none, QJsonObject{{"delay_ms", 8000}}, -28, kNetwork, "");
        addRow("dropped", none, QJsonObject{{"drop", "mid"}}, -18, kNetwork, all("Connection closed"));
        addRow("500", none, QJsonObject{{"status", 500}, {"body", "{}"}}, 500, kNetwork, all("status 500"));
        addRow("garbage", none, QJsonObject{{"body", "<html>"}}, 200, "",
               "list holds no message;parse config.json file failed.");
        addRow("wrong types", none, QJsonObject{{"body", kWrongTypes}}, 200, "",
               "list holds no message;analyseEvnData failed!");
        addRow("20 MB", none, QJsonObject{{"body_bytes", 20'000'000}}, -63, kNetwork, all("the reply is over 16 MiB"));
        addRow("other authority", tls("other_ca"), none, -60, kNetwork, untrusted);
        addRow("expired", tls("expired"), none, -60, kNetwork, untrusted);
    }
    void everyRequestUnder()
    {
        QFETCH(QJsonObject, state);
        QFETCH(QJsonObject, action);
        QFETCH(int, status);
        QFETCH(QString, box);
        QFETCH(QString, logged);
        const QString name = QTest::currentDataTag();
        const QString failedPolls[] = {QString("getusrInfo failed! %1").arg(status),
                                       QString("getCompanyName failed! %1").arg(status)};
        const bool scenesAnswer = state.contains("tls");
        LogCapture log;

        // A session that starts during the fault: its polls go on until they are answered.
        serve(name, 2);
        setFault(state, action);
        MainWindow::unreadMessageCount = 0;
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        m_host = std::make_unique<SessionHost>(*m_window);
        m_longestGap = 0;
        m_sinceBeat.start();
        m_beat.start(5);
        const QString unknown = known();
        for (const QString& line : failedPolls)
            QTRY_VERIFY2_WITH_TIMEOUT(log.contains(line), qPrintable(log.lines().join('\n')), kPatienceMs);
        QCOMPARE(known(), unknown);
        setFault({}, {});
        const QString first = QString("%1|N1|PC|%1 3 2").arg(name);
        const auto retry = [this] { return m_host->findChild<QTimer*>("scenesAgain"); };
        QTRY_VERIFY_WITH_TIMEOUT(scenes()->count() == 3, kPatienceMs);
        m_window->unreadMessages();
        QTRY_COMPARE_WITH_TIMEOUT(known(), first, kPatienceMs);
        QVERIFY(!retry()->isActive());

        // One that had everything before.
        LogCapture later;
        setFault(state, action);
        askEverything();
        if (logged.isEmpty()) {
            QVERIFY(QNotification::qInstance->pendingRequests() > 0);
            QCOMPARE(m_readSuccesses, 0);
        } else {
            QTRY_COMPARE_WITH_TIMEOUT(QNotification::qInstance->pendingRequests(), 0, kPatienceMs);
            QTRY_VERIFY_WITH_TIMEOUT(retry()->isActive() != scenesAnswer, kPatienceMs);
            QCOMPARE(m_readSuccesses, status == 200 ? 1 : 0);
        }
        QTRY_COMPARE(m_boxes.texts, QStringList(box));
        QStringList expected = logged.split(';', Qt::SkipEmptyParts);
        expected << failedPolls[0] << failedPolls[1];
        if (status < 0)
            expected << "client/remove\" failed: "
                     << "client/remove_status\" failed: ";
        for (const QString& line : qAsConst(expected))
            QVERIFY2(later.count(line) == 1, qPrintable(line + "\n\n" + later.lines().join('\n')));
        if (!scenesAnswer)
            QCOMPARE(known(), first);

        // What a person or a poll does next succeeds.
        serve(name + " over", 5);
        setFault({}, {});
        if (retry()->isActive())
            retry()->start(0);
        tryRelease();
        QTRY_COMPARE(m_boxes.texts, QStringList(kRefused));
        QTRY_COMPARE_WITH_TIMEOUT(scenes()->count(), 6, kPatienceMs);
        QTRY_COMPARE_WITH_TIMEOUT(QNotification::qInstance->pendingRequests(), 0, kPatienceMs);
        m_platform.setUnread(5);
        nextSecond();
        askEverything();
        QTRY_COMPARE_WITH_TIMEOUT(m_readSuccesses, 1, kPatienceMs);
        nextSecond();
        m_window->unreadMessages();
        QTRY_COMPARE_WITH_TIMEOUT(known(), QString("%1|N1|PC|%1 9 4").arg(name + " over"), kPatienceMs);
        QVERIFY2(m_longestGap < kLongestGapMs, qPrintable(QString::number(m_longestGap)));
    }
};

QTEST_MAIN(TestFaults)
#include "test_faults.moc"
