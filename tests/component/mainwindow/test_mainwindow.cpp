#include "fileconfig.h"
#include "httprequest.h"
#include "infowidget.h"
#include "logcapture.h"
#include "mainwindow.h"
#include "paths.h"
#include "platformcontrol.h"
#include "sessionhost.h"
#include "testfiles.h"

#include <QApplication>
#include <QComboBox>
#include <QLabel>
#include <QScreen>
#include <QSignalSpy>
#include <QtTest>

namespace
{

const QString kUser = QStringLiteral("zhangsan");
const QString kSceneFile = zent::kCurrentScenePath.arg(kUser);

QByteArray scenesReply(const QStringList& names)
{
    QJsonArray scenes;
    for (const QString& name : names)
        scenes.append(QJsonObject{{"scene_name", name}, {"scene_code", "code-" + name}});
    return QJsonDocument(QJsonObject{{"code", 0}, {"message", scenes}}).toJson();
}

QString userReply(int code, const QString& gecos)
{
    const QJsonObject user{{"gecos", gecos}, {"client_name", QStringLiteral("别名")}, {"id", 3}};
    return QJsonDocument(QJsonObject{{"code", code}, {"data", QJsonObject{{"user", user}}}}).toJson();
}

} // namespace

class TestMainWindow : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<MainWindow> m_window;

    QString shown(const char* label) const { return m_window->findChild<QLabel*>(label)->text(); }
    int analyseScenes(const QByteArray& reply)
    {
        QByteArray body = reply;
        return m_window->analyseEvnData(&body);
    }
    QComboBox* sceneBox() const { return m_window->findChild<QComboBox*>(); }
    QPoint bottomRight() const { return m_window->pos() + QPoint(m_window->width(), m_window->height()); }

private slots:
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        m_window->setWindowFlags(Qt::Tool | Qt::FramelessWindowHint);
    }
    void cleanup() { m_window.reset(); }

    void trayClicksAlternate()
    {
        using Tray = QSystemTrayIcon;
        const QList<QPair<Tray::ActivationReason, bool>> clicks{
            {Tray::Trigger, false}, {Tray::Trigger, true},     {Tray::Trigger, false},    {Tray::Context, false},
            {Tray::Trigger, true},  {Tray::DoubleClick, true}, {Tray::MiddleClick, true}, {Tray::Context, true},
            {Tray::Trigger, true},  {Tray::Trigger, false},
        };
        for (int i = 0; i < clicks.size(); ++i) {
            m_window->onActivatedSysTrayIcon(clicks.at(i).first);
            QVERIFY2(m_window->isVisible() == clicks.at(i).second, qPrintable(QString("click %1").arg(i)));
        }
        m_window->onActivatedSysTrayIcon(Tray::Trigger);
        QVERIFY(m_window->isVisible());
        m_window->close();
        QVERIFY(m_window->isHidden());
        m_window->onActivatedSysTrayIcon(Tray::Trigger);
        QVERIFY(m_window->isVisible());
        QVERIFY(m_window->windowFlags().testFlag(Qt::FramelessWindowHint));
    }

    void userReplyFillsTheLoginPage()
    {
        HttpRequest* client = HttpRequest::GetInstance();
        client->onUserInfo(500, userReply(0, QStringLiteral("张三,x,,A1")));
        QCOMPARE(shown("macValue") + shown("userRoleValue") + shown("terminalValue"), QStringLiteral("张三A1别名"));
        LogCapture log;
        for (const QString& bad : {userReply(1, QStringLiteral("李四")), QString("[]"), QString("nonsense"), QString()})
            client->onUserInfo(200, bad);
        QCOMPARE(log.count("analyseData getusrInfo failed! 200"), 4);
        QCOMPARE(shown("macValue"), QStringLiteral("张三"));
        client->onCompanyName(200, R"({"code": 0, "data": {"name": "公司"}})");
        client->onCompanyName(200, R"({"code": 0, "data": ["x"]})");
        m_window->onLogininfoClicked();
        QCOMPARE(m_window->findChildren<QLabel*>("nameValue").first()->text(), QStringLiteral("公司"));
    }

    void pollingEndsWithTheFirstGoodAnswer()
    {
        m_platform.addFault({{"path", "/uim/v3/client/account"}}, {{"status", 200}, {"body", R"({"code": 1})"}});
        QSignalSpy spy(HttpRequest::GetInstance(), &HttpRequest::sigUserInfo);
        QTRY_VERIFY_WITH_TIMEOUT(spy.count() >= 2, 10000);
        m_platform.clearFaults();
        QTRY_COMPARE_WITH_TIMEOUT(shown("userRoleValue"), QStringLiteral("A10023"), 10000);
        const int asked = spy.count();
        // Longer than the interval of the poll that must have stopped.
        QTest::qWait(2500);
        QCOMPARE(spy.count(), asked);
        emit m_window->startgetMeInfo();
        QCOMPARE(spy.count(), asked + 1);
    }

    void networkPage_data()
    {
        QTest::addColumn<QJsonObject>("fault");
        QTest::addColumn<QString>("fields");
        const QString two = R"([{"IsPrimaryConnection": false, "HwAddress": "no"}, {"IsPrimaryConnection": true,
            "HwAddress": "m", "Speed": "s", "Ip4": {"Address": "a", "Mask": "k", "Gateways": [], "Dnses": []}}])";
        QTest::newRow("second primary") << QJsonObject{{"value", two}} << "m|a|||k|s";
        QTest::newRow("none primary") << QJsonObject{{"value", "[{}]"}} << "|||||";
        QTest::newRow("object") << QJsonObject{{"value", "{}"}} << "old";
        QTest::newRow("not json") << QJsonObject{{"value", "["}} << "old";
        QTest::newRow("error") << QJsonObject{{"error", "com.vantor.Error.Failed"}} << "old";
        QTest::newRow("no value") << QJsonObject{{"no_value", true}} << "old";
        QTest::newRow("vanishes") << QJsonObject{{"vanish", true}} << "old";
    }
    void networkPage()
    {
        QFETCH(QJsonObject, fault);
        QFETCH(QString, fields);
        const auto page = [this] {
            QStringList texts;
            for (const char* label : {"netspeedValue", "subnetmaskValue", "dnsValeu", "ipV4GatewayValue", "ipv4Value"})
                texts.prepend(shown(label));
            for (const QLabel* label : m_window->findChildren<QLabel*>("macValue"))
                if (label->parent()->findChild<QLabel*>("netspeedValue"))
                    texts.prepend(label->text());
            return texts.join('|');
        };
        m_platform.patchState({{"services", QJsonObject{{"network", true}}}});
        m_window->onNetinfoClicked();
        const QString before = page();
        QCOMPARE(before.count('|'), 5);
        m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, fault);
        m_window->onNetinfoClicked();
        QCOMPARE(page(), fields == "old" ? before : fields);
        m_platform.patchState({{"services", QJsonObject{{"network", false}}}});
        m_platform.patchState({{"services", QJsonObject{{"network", true}}}});
    }

    void sessionStartsInTheIntranetScene() { QCOMPARE(testfiles::read(kSceneFile), QByteArray("intranet-scene")); }

    void oneSceneIsNoChoice()
    {
        QCOMPARE(analyseScenes(scenesReply({"甲"})), 1);
        QVERIFY(sceneBox()->isHidden());
        QCOMPARE(m_window->getEvncode("甲"), 0);
        QCOMPARE(m_window->getEvncode("乙"), -1);
    }

    void severalScenesAreOfferedAndSwitched()
    {
        placeAtStart();
        const QPoint corner = bottomRight();
        const int height = m_window->height();
        LogCapture log;
        QCOMPARE(analyseScenes(scenesReply({"甲", "乙", "丙"})), 1);
        QCOMPARE(sceneBox()->count(), 3);
        QCOMPARE(sceneBox()->currentIndex(), 0);
        QCOMPARE(m_window->height(), height + 515 - 469);
        QCOMPARE(bottomRight(), corner);
        // Filling the box is not a choice.
        QVERIFY(!log.contains("Switch to scene : "));

        sceneBox()->setCurrentIndex(1);
        QCOMPARE(log.count("Switch to scene : "), 1);
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("code-乙"));

        // A second reply adds its scenes and selects nothing.
        QCOMPARE(analyseScenes(scenesReply({"甲", "丁"})), 1);
        QCOMPARE(sceneBox()->count(), 5);
        QCOMPARE(sceneBox()->currentIndex(), 1);
        QCOMPARE(m_window->getEvncode("丁"), 4);
        sceneBox()->setCurrentIndex(4);
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("code-丁"));
    }

    void goingBackLeavesTheFileAlone()
    {
        analyseScenes(scenesReply({"甲", "乙"}));
        InfoWidget* panel = m_window->findChild<InfoWidget*>();
        {
            const QSignalBlocker blocker(panel);
            sceneBox()->setCurrentIndex(1);
        }
        testfiles::write(kSceneFile, "untouched");
        m_window->reverseEvn();
        QCOMPARE(sceneBox()->currentIndex(), 0);
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("untouched"));
    }

    void badSceneRepliesChangeNothing_data()
    {
        QTest::addColumn<QByteArray>("body");
        QTest::addColumn<int>("result");
        QTest::newRow("not json") << QByteArray("<html>") << 0;
        QTest::newRow("code 1") << QByteArray(R"({"code": 1})") << 1;
        QTest::newRow("no array") << QByteArray(R"({"code": 0, "message": "x"})") << 1;
        QTest::newRow("no scenes") << scenesReply({}) << 1;
    }
    void badSceneRepliesChangeNothing()
    {
        QFETCH(QByteArray, body);
        QFETCH(int, result);
        QCOMPARE(analyseScenes(body), result);
        QVERIFY(sceneBox()->isHidden());
        QCOMPARE(sceneBox()->count(), 0);
        m_window->switchUserEvn();
        QCOMPARE(analyseScenes(scenesReply({"甲", "乙"})), 1);
        QCOMPARE(sceneBox()->currentIndex(), 0);
    }

    void scenesAreAskedOnceAfterTheOrganisation()
    {
        testfiles::write(zent::kMachineidPath, "id&1\n");
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        SessionHost host(*m_window);
        m_platform.clearRecord();
        HttpRequest* client = HttpRequest::GetInstance();
        client->onCompanyName(200, R"({"code": 1})");
        client->onCompanyName(200, R"({"code": 0, "data": {"name": "公司"}})");
        client->onCompanyName(200, R"({"code": 0, "data": {"name": "公司"}})");
        QTRY_COMPARE(sceneBox()->count(), 3);
        QList<QJsonObject> asked;
        for (const QJsonObject& request : m_platform.record("http")) {
            if (request.value("path") == "/api/client/area/scenes")
                asked.append(request);
        }
        QCOMPARE(asked.size(), 1);
        QCOMPARE(asked.first().value("scheme").toString(), QStringLiteral("http"));
        QCOMPARE(asked.first().value("raw_query").toString(), "machine_id=id%261%0A&username=" + kUser);
        QCOMPARE(asked.first().value("headers").toObject().value("x-lumo-version").toString(), QStringLiteral("v2"));
    }

    void areaReplies()
    {
        QByteArray good = R"({"code": 0, "data": [{"name": "区域"}]})";
        QCOMPARE(m_window->analyseAreaData(&good), 1);
        m_window->onLogininfoClicked();
        QCOMPARE(m_window->findChildren<QLabel*>("nameValue").first()->text(), QStringLiteral("区域"));
        QTRY_COMPARE(sceneBox()->count(), 3);
        QByteArray empty = R"({"code": 0, "data": []})";
        QCOMPARE(m_window->analyseAreaData(&empty), 1);
        QByteArray broken = "{";
        QCOMPARE(m_window->analyseAreaData(&broken), 0);
    }

    void randomIntervals()
    {
        for (const auto& [upper, lower] : {std::pair{60000, 30000}, {180000, 60000}, {3000, 1000}, {5, 5}}) {
            const int value = m_window->generateRandnum(upper, lower);
            QVERIFY(value >= lower && (value < upper || upper == lower));
        }
    }

    void shellCommands()
    {
        QCOMPARE(m_window->system(QString()), -1);
        QCOMPARE(m_window->system("printf 'a\\nb'; exit 3"), 0);
        QCOMPARE(m_window->commandOutputLines(), QList<QString>({"a\n", "b"}));
        QCOMPARE(m_window->system("head -c 300 /dev/zero | tr '\\0' x"), 0);
        QCOMPARE(m_window->commandOutputLines().size(), 5);
        QCOMPARE(m_window->commandOutputLines().at(2).size(), 127);
    }

    void administrators_data()
    {
        QTest::addColumn<QByteArray>("output");
        QTest::addColumn<bool>("admin");
        QTest::newRow("both") << QByteArray("groups=1(sudo),2(my-zent)") << true;
        QTest::newRow("sudo alone") << QByteArray("groups=1(sudo)") << false;
        QTest::newRow("neither") << QByteArray() << false;
    }
    void administrators()
    {
        QFETCH(QByteArray, output);
        QFETCH(bool, admin);
        const QString file = qEnvironmentVariable("ROOM") + "/standin/id.stdout";
        testfiles::write(file, output);
        const MainWindow window(nullptr, 1020);
        QFile::remove(file);
        QCOMPARE(window.findChild<QWidget*>("closeGuard") != nullptr, admin);
    }

private:
    void placeAtStart()
    {
        const QRect area = QGuiApplication::primaryScreen()->availableGeometry();
        m_window->move(area.width() - m_window->width(), area.height() - m_window->height());
    }
};

QTEST_MAIN(TestMainWindow)
#include "test_mainwindow.moc"
