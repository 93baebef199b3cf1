#include "fileconfig.h"
#include "httprequest.h"
#include "infowidget.h"
#include "logcapture.h"
#include "mainwindow.h"
#include "paths.h"
#include "platformcontrol.h"
#include "sessionhost.h"
#include "testfiles.h"
#include "testrows.h"

#include <QComboBox>
#include <QLabel>
#include <QScreen>
#include <QSignalSpy>

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

QString organisation(int code)
{
    return QString(R"({"code": %1, "data": {"name": "公司"}})").arg(code);
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

private slots:
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        m_window->setWindowFlags(Qt::Tool | Qt::FramelessWindowHint);
    }
    void cleanup() { m_window.reset(); }

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
        client->onCompanyName(200, organisation(0));
        client->onCompanyName(200, R"({"code": 0, "data": ["x"]})");
        m_window->onLogininfoClicked();
        QCOMPARE(shown("nameValue"), QStringLiteral("公司"));
    }

    void pollingEndsWithTheFirstGoodAnswer()
    {
        for (const char* path : {"account", "uim_department/id"})
            m_platform.addFault({{"path", QString("/uim/v3/client/") + path}}, {{"body", R"({"code": 1})"}});
        QSignalSpy users(HttpRequest::GetInstance(), &HttpRequest::sigUserInfo);
        QSignalSpy organisations(HttpRequest::GetInstance(), &HttpRequest::sigCompanyName);
        QTRY_VERIFY_WITH_TIMEOUT(users.count() >= 2, 20000);
        HttpRequest::GetInstance()->onUserInfo(200, userReply(0, "A"));
        const int asked = users.count();
        // The other question, which is still open, is asked more rarely than this one was.
        const int before = organisations.count();
        QTRY_VERIFY_WITH_TIMEOUT(organisations.count() >= before + 2, 20000);
        QCOMPARE(users.count(), asked);
        emit m_window->startgetMeInfo();
        QCOMPARE(users.count(), asked + 1);
    }

    void networkPage_data()
    {
        addColumns<QJsonObject, QString>("fault", "fields");
        const QString three = R"([{"IsPrimaryConnection": false, "HwAddress": "no"}, {"IsPrimaryConnection": true,
            "HwAddress": "m", "Speed": "s", "Ip4": {"Address": "a", "Mask": "k", "Gateways": [], "Dnses": []}}, {}])";
        addRow("second primary", QJsonObject{{"value", three}}, "m|a|||k|s");
        addRow("none primary", QJsonObject{{"value", "[{}]"}}, "|||||");
        addRow("object", QJsonObject{{"value", "{}"}}, "old");
        addRow("not json", QJsonObject{{"value", "["}}, "old");
        addRow("error", QJsonObject{{"error", "com.vantor.Error.Failed"}}, "old");
        addRow("no value", QJsonObject{{"no_value", true}}, "old");
        addRow("vanishes", QJsonObject{{"vanish", true}}, "old");
        addRow("hangs until it ends", QJsonObject{{"vanish", true}, {"delay_ms", 500}}, "old");
        addRow("absent", QJsonObject(), "old");
        addRow("a number", QJsonObject{{"value", 7}, {"signature", "i"}}, "old");
        addRow("odd types", QJsonObject{{"value", R"([{"IsPrimaryConnection": true, "Speed": 7}])"}}, "old");
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
        if (fault.isEmpty())
            m_platform.patchState({{"services", QJsonObject{{"network", false}}}});
        m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, fault);
        LogCapture log;
        m_window->onNetinfoClicked();
        QCOMPARE(page(), fields == "old" ? before : fields);
        QCOMPARE(log.contains("GetActiveConnectionInfo"), fields == "old");
        m_platform.patchState({{"services", QJsonObject{{"network", false}}}});
        m_platform.patchState({{"services", QJsonObject{{"network", true}}}});
    }

    void severalScenesAreOfferedAndSwitched()
    {
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("intranet-scene"));
        const QRect area = QGuiApplication::primaryScreen()->availableGeometry();
        m_window->move(area.width() - m_window->width(), area.height() - m_window->height());
        const QPoint corner = m_window->geometry().bottomRight();
        const int height = m_window->height();
        QCOMPARE(analyseScenes(scenesReply({"甲", "乙", "丙"})), 1);
        QCOMPARE(sceneBox()->count(), 3);
        QCOMPARE(sceneBox()->currentIndex(), 0);
        QCOMPARE(m_window->height(), height + 515 - 469);
        QCOMPARE(m_window->geometry().bottomRight(), corner);
        // Filling the box is not a choice.
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("intranet-scene"));
        sceneBox()->setCurrentIndex(1);
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("code-乙"));

        // A second reply adds its scenes and selects nothing.
        QCOMPARE(analyseScenes(scenesReply({"甲", "丁"})), 1);
        QCOMPARE(sceneBox()->count(), 5);
        QCOMPARE(sceneBox()->currentIndex(), 1);
        LogCapture log;
        sceneBox()->setCurrentIndex(4);
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("code-丁"));
        QCOMPARE(log.count("Switch to scene : "), 1);
    }

    void goingBackLeavesTheFileAlone()
    {
        analyseScenes(scenesReply({"甲", "乙"}));
        {
            const QSignalBlocker blocker(m_window->findChild<InfoWidget*>());
            sceneBox()->setCurrentIndex(1);
        }
        testfiles::write(kSceneFile, "untouched");
        m_window->reverseEvn();
        QCOMPARE(sceneBox()->currentIndex(), 0);
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("untouched"));
    }

    void repliesWithoutAChoice()
    {
        QCOMPARE(analyseScenes("<html>"), 0);
        for (const QByteArray& body : {QByteArray(R"({"code": 1})"), QByteArray("[]"), scenesReply({})})
            QCOMPARE(analyseScenes(body), 1);
        m_window->switchUserEvn();
        QCOMPARE(m_window->getEvncode("甲"), -1);
        QCOMPARE(analyseScenes(scenesReply({"甲"})), 1);
        QCOMPARE(m_window->getEvncode("甲"), 0);
        QVERIFY(sceneBox()->isHidden());
        QCOMPARE(sceneBox()->count(), 0);
    }

    void scenesAreAskedOnceAfterTheOrganisation()
    {
        testfiles::write(zent::kMachineidPath, "id&1\n");
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        SessionHost host(*m_window);
        m_platform.clearRecord();
        for (int code : {1, 0, 0})
            HttpRequest::GetInstance()->onCompanyName(200, organisation(code));
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
        const auto analyse = [this](QByteArray body) { return m_window->analyseAreaData(&body); };
        QCOMPARE(analyse(R"({"code": 0, "data": [{"name": "区域"}]})"), 1);
        QTRY_COMPARE(sceneBox()->count(), 3);
        QCOMPARE(analyse(R"({"code": 0, "data": []})"), 1);
        QCOMPARE(analyse("{"), 0);
        m_window->onLogininfoClicked();
        QCOMPARE(shown("nameValue"), QStringLiteral("区域"));
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
};

QTEST_MAIN(TestMainWindow)
#include "test_mainwindow.moc"
