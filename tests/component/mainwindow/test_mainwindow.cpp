#include "dbusnames.h"
#include "httprequest.h"
#include "infowidget.h"
#include "logcapture.h"
#include "mainwindow.h"
#include "networkdaemonproxy.h"
#include "noticedialog.h"
#include "notification.h"
#include "paths.h"
#include "platformcontrol.h"
#include "sessionhost.h"
#include "testfiles.h"

#include <QApplication>
#include <QComboBox>
#include <QLabel>
#include <QMessageBox>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QSignalSpy>
#include <QtTest>

namespace
{

const QString kSceneFile = zent::kCurrentScenePath.arg("zhangsan");
const QString kListPath = QStringLiteral("/notification/v2/list");

} // namespace

class TestMainWindow : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<MainWindow> m_window;

    QString shown(const char* label) const { return m_window->findChild<QLabel*>(label)->text(); }
    void analyseScenes(const QStringList& names)
    {
        QJsonArray scenes;
        for (const QString& name : names)
            scenes.append(QJsonObject{{"scene_name", name}, {"scene_code", "code-" + name}});
        QByteArray body = QJsonDocument(QJsonObject{{"code", 0}, {"message", scenes}}).toJson();
        QCOMPARE(m_window->analyseEvnData(&body), 1);
    }
    QComboBox* sceneBox() const { return m_window->findChild<QComboBox*>(); }
    NoticeDialog* notice() const { return m_window->findChild<NoticeDialog*>(); }
    QPushButton* first() const { return notice()->firstButton(); }
    QPushButton* next() const { return notice()->nextButton(); }
    QString shownTitle() const { return notice()->findChildren<QPlainTextEdit*>().first()->toPlainText(); }
    QList<QJsonObject> requests(const QString& path)
    {
        QList<QJsonObject> result;
        for (const QJsonObject& request : m_platform.record("http")) {
            if (request.value("path") == path)
                result.append(request);
        }
        return result;
    }
    void makeWindow(int unread)
    {
        m_platform.setUnread(unread);
        MainWindow::unreadMessageCount = 0;
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
    }

private slots:
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        makeWindow(0);
    }
    void cleanup() { m_window.reset(); }

    void pollingEndsWithTheFirstGoodAnswer()
    {
        for (const char* path : {"account", "uim_department/id"})
            m_platform.addFault({{"path", QString("/uim/v3/client/") + path}}, {{"body", R"({"code": 1})"}});
        HttpRequest* client = HttpRequest::GetInstance();
        QSignalSpy users(client, &HttpRequest::sigUserInfo);
        QSignalSpy organisations(client, &HttpRequest::sigCompanyName);
        QTRY_VERIFY_WITH_TIMEOUT(users.count() >= 2, 20000);
        // The body alone decides.
        client->onUserInfo(500, R"({"code": 0, "data": {"user": {"gecos": "A,,,1", "client_name": "PC"}}})");
        QCOMPARE(shown("macValue") + shown("userRoleValue") + shown("terminalValue"), QString("A1PC"));
        const int asked = users.count();
        // The other question, which is still open, is asked more rarely than this one was.
        const int before = organisations.count();
        QTRY_VERIFY_WITH_TIMEOUT(organisations.count() >= before + 2, 20000);
        QCOMPARE(users.count(), asked);
    }

    void networkPage()
    {
        const auto page = [this] { return shown("ipv4Value") + shown("ipV4GatewayValue") + shown("netspeedValue"); };
        const QString before = page();
        QVERIFY(before.startsWith("10.20.30.11710.20.30.1"));
        const QJsonObject faults[] = {{{"value", 7}, {"signature", "i"}},
                                      {{"error", "com.vantor.Error.Failed"}},
                                      {{"vanish", true}, {"delay_ms", 500}},
                                      {{"value", "[{}]"}}};
        for (const QJsonObject& fault : faults) {
            m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, fault);
            LogCapture log;
            m_window->onNetinfoClicked();
            const bool answers = fault.value("value").isString();
            QCOMPARE(page(), answers ? QString() : before);
            QCOMPARE(log.contains("GetActiveConnectionInfo"), !answers);
            m_platform.patchState({{"services", QJsonObject{{"network", true}}}});
        }
    }

    void hangingNetworkDaemonCostsOneTimeOut()
    {
        NetworkDaemonProxy daemon(zent::dbus::kNetworkService, zent::dbus::kNetworkPath, QDBusConnection::sessionBus());
        daemon.setTimeout(1500);
        // A failure that comes at once does not keep it from being asked.
        const QPair<QJsonObject, int> faults[] = {{{{"error", "com.vantor.Error.Failed"}}, 2}, {{{"hang", true}}, 1}};
        for (const auto& [action, asked] : faults) {
            m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, action);
            m_platform.clearRecord();
            QVERIFY(!daemon.activeConnectionInfo() && !daemon.activeConnectionInfo());
            QCOMPARE(m_platform.record("dbus").size(), asked);
        }
    }

    void scenesAreSwitched()
    {
        // One scene alone is no choice.
        analyseScenes({"甲"});
        QVERIFY(sceneBox()->isHidden());
        const QPoint corner = m_window->geometry().bottomRight();
        analyseScenes({"乙", "丙", "丁"});
        QCOMPARE(sceneBox()->count(), 3);
        QCOMPARE(m_window->geometry().bottomRight(), corner);
        // Filling the box is not a choice either.
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("intranet-scene"));
        sceneBox()->setCurrentIndex(1);
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("code-丙"));
        // A second reply adds its scenes and selects nothing.
        analyseScenes({"甲", "戊"});
        QCOMPARE(sceneBox()->count(), 5);
        QCOMPARE(sceneBox()->currentIndex(), 1);
        // Nor is going back.
        {
            const QSignalBlocker blocker(m_window->findChild<InfoWidget*>());
            sceneBox()->setCurrentIndex(0);
        }
        testfiles::write(kSceneFile, "untouched");
        m_window->reverseEvn();
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("untouched"));
    }

    void scenesAreAskedOnceAfterTheOrganisation()
    {
        testfiles::write(zent::kMachineidPath, "id&1\n");
        makeWindow(0);
        SessionHost host(*m_window);
        m_platform.clearRecord();
        for (int code : {1, 0, 0})
            HttpRequest::GetInstance()->onCompanyName(200, QString(R"({"code": %1, "data": {}})").arg(code));
        QTRY_COMPARE(sceneBox()->count(), 3);
        const QList<QJsonObject> asked = requests("/api/client/area/scenes");
        QCOMPARE(asked.size(), 1);
        QCOMPARE(asked.first().value("scheme").toString(), QStringLiteral("http"));
        QCOMPARE(asked.first().value("raw_query").toString(), QString("machine_id=id%261%0A&username=zhangsan"));
    }

    void administrators()
    {
        const QString file = qEnvironmentVariable("ROOM") + "/standin/id.stdout";
        for (const char* groups : {"1(sudo),2(my-zent)", "1(sudo)", "2(zent)", ""}) {
            testfiles::write(file, groups);
            const MainWindow window(nullptr, 1020);
            QCOMPARE(window.findChild<QWidget*>("closeGuard") != nullptr, QString(groups).contains(','));
        }
        QFile::remove(file);
    }

    void countIsAnnouncedOncePerChange()
    {
        m_platform.setUnread(2);
        QSignalSpy spy(m_window.get(), &MainWindow::newMessage);
        for (const bool fails : {false, false, true}) {
            if (fails)
                m_platform.addFault({{"path", kListPath}}, {{"status", 500}});
            // A new second: polls within one second share their URL and thus their callback.
            const QString second = QTime::currentTime().toString();
            QTRY_VERIFY(QTime::currentTime().toString() != second);
            m_window->unreadMessages();
            QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
            QCOMPARE(spy.count(), 1);
        }
        const QJsonObject request = requests(kListPath).last();
        QVERIFY(request.value("raw_query").toString().startsWith("uid=zhangsan&is_not_read=1&limit=1&offset=0&"));
        QCOMPARE(request.value("headers").toObject().value("x-xsrf-token"), m_platform.state().value("token"));
        for (const int left : {1, 0, 0}) {
            m_window->onReadListMessage("x");
            QCOMPARE(MainWindow::unreadMessageCount, left);
        }
    }

    void oneMessageIsMarkedReadOnce()
    {
        makeWindow(1);
        m_window->openNotice();
        QTRY_VERIFY(notice()->isVisible());
        QCOMPARE(first()->text(), QStringLiteral("已读"));
        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        first()->click();
        first()->click();
        QTRY_COMPARE(read, QList<QVariantList>{{"0"}});
        QCOMPARE(requests("/notification/v2/read").size(), 1);
        QTRY_COMPARE(first()->text(), QStringLiteral("关闭"));
        QTRY_VERIFY(!first()->signalsBlocked());
        first()->click();
        QVERIFY(notice()->isHidden());
    }

    void severalMessagesAreSteppedThrough()
    {
        makeWindow(120);
        m_window->openNotice();
        QTRY_VERIFY(notice()->isVisible());
        QCOMPARE(first()->text() + next()->text(), QStringLiteral("关闭下一条(...)"));
        m_platform.setUnread(3);
        m_window->openNotice();
        QTRY_COMPARE(next()->text(), QStringLiteral("下一条(3)"));
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 2 %2"));
        next()->click();
        QVERIFY(!next()->isEnabled());
        QTRY_COMPARE(next()->text(), QStringLiteral("下一条(2)"));
        QVERIFY(next()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));

        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        m_platform.addFault({{"path", "/notification/v2/*"}}, {{"status", 500}});
        QStringList warnings;
        QTimer closing;
        connect(&closing, &QTimer::timeout, this, [&warnings] {
            if (auto* box = qobject_cast<QMessageBox*>(QApplication::activeModalWidget())) {
                warnings.append(box->windowTitle());
                box->close();
            }
        });
        closing.start(5);
        // The request is under way when this returns.
        m_window->openNotice();
        next()->click();
        QTRY_COMPARE(warnings, QStringList("消息调用警告"));
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QVERIFY(read.isEmpty() && !next()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));
        m_platform.clearFaults();
        m_window->onReadListMessage("other");
        QTRY_VERIFY(next()->isEnabled());
    }

    void windowMayGoAtAnyTime()
    {
        makeWindow(1);
        QTimer::singleShot(100, this, [this] { m_window.reset(); });
        m_window->openNotice();
        QVERIFY(!m_window);
        m_platform.addFault({{"path", kListPath}}, {{"delay_ms", 300}});
        makeWindow(1);
        m_window->unreadMessages();
        m_window.reset();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
    }
};

QTEST_MAIN(TestMainWindow)
#include "test_mainwindow.moc"
