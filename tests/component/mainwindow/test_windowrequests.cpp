// SPDX-License-Identifier: Apache-2.0
#include "dbusnames.h"
#include "fileconfig.h"
#include "fixture.h"
#include "httprequest.h"
#include "mainwindow.h"
#include "networkdaemonproxy.h"
#include "platformcontrol.h"
#include "sessionhost.h"

#include <QComboBox>
#include <QLabel>

namespace
{

const QJsonObject kNetworkDaemon{{"dbus", "GetActiveConnectionInfo"}};

} // namespace

/// What the main window asks the server and the network daemon by itself, and what its pages show of the answers.
class TestWindowRequests : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<MainWindow> m_window;

    QString shown(const char* label) const { return m_window->findChild<QLabel*>(label)->text(); }
    void startNetworkDaemon() { m_platform.patchState({{"services", QJsonObject{{"network", true}}}}); }

private slots:
    void init()
    {
        m_platform.clearFaults();
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
    }

    void scenesAreAskedOnceAfterTheOrganisation()
    {
        testfiles::write(testfiles::kMachineFile, "M 1&2\n");
        testfiles::write(testfiles::kInfoFile,
                         R"({"server_host": "server.zent.test", "server_port": "80", "protocol": "https"})");
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        const SessionHost host(*m_window);
        m_platform.clearRecord();
        for (int code : {1, 0, 0})
            HttpRequest::GetInstance()->onCompanyName(200, QString(R"({"code": %1, "data": {}})").arg(code));
        QTRY_COMPARE(m_window->findChild<QComboBox*>()->count(), 3);
        QJsonArray sent;
        for (const QJsonObject& request : m_platform.requests("/api/client/area/scenes")) {
            const QJsonObject headers = request["headers"].toObject();
            sent += QJsonArray{request["method"], request["scheme"],       request["raw_query"],
                               headers["host"],   headers["content-type"], headers["x-lumo-version"]};
        }
        fixture::compare(sent, QJsonArray{QJsonArray{"GET", "http", "machine_id=M%201%262%0A&username=zhangsan",
                                                     "server.zent.test:80", "application/json", "v2"}});
    }

    void networkPage_data() { fixture::addRows("networkpages.json"); }
    void networkPage()
    {
        QFETCH(QJsonObject, row);
        const auto page = [this] { return shown("ipv4Value") + shown("ipV4GatewayValue") + shown("netspeedValue"); };
        const bool kept = row["kept"].toBool();
        const QString before = page();
        QVERIFY(before.startsWith("10.20.30.11710.20.30.1"));
        m_platform.addFault(kNetworkDaemon, row["fault"].toObject());
        const LogCapture log;
        m_window->onNetinfoClicked();
        fixture::compare(page(), kept ? before : row["page"].toString());
        fixture::compare(FileConfig::GetInstance()->getMacAddress(), row["mac"]);
        startNetworkDaemon();
        fixture::compareLog(log, row["log"]);
    }

    void pagesThatTheDaemonMissedAreFilledOnOpening()
    {
        m_platform.addFault(kNetworkDaemon, {{"error", "com.vantor.Error.Failed"}});
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        HttpRequest::GetInstance()->onUserInfo(200, R"({"code": 0, "data": {"user": {"gecos": "A,,,1"}}})");
        QCOMPARE(shown("macValue") + shown("ipv4Value"), QString());
        m_platform.clearFaults();
        m_platform.clearRecord();
        m_window->show();
        QCOMPARE(shown("macValue") + shown("ipv4Value"), QString("A10.20.30.117"));
        m_window->hide();
        m_window->show();
        QCOMPARE(m_platform.record("dbus").size(), 1);
    }

    void randomNumbersKeepTheirBounds()
    {
        QCOMPARE(m_window->generateRandnum(7, 7), 7);
        QList<int> got;
        QList<int> expected;
        // Within one second each call draws the same number.
        bool sameSecond = false;
        for (int tries = 0; tries < 3 && !sameSecond; ++tries) {
            const int drawn = m_window->generateRandnum(INT_MAX, 0);
            got.clear();
            expected.clear();
            for (int width = 1; width <= 50; ++width) {
                got.append(m_window->generateRandnum(7 + width, 7));
                expected.append(7 + drawn % width);
            }
            sameSecond = m_window->generateRandnum(INT_MAX, 0) == drawn;
        }
        QVERIFY(sameSecond);
        QCOMPARE(got, expected);
    }

    /// Comes last: the pause is the process's.
    void hangingNetworkDaemonCostsOneTimeOut()
    {
        m_window.reset();
        NetworkDaemonProxy daemon(zent::dbus::kNetworkService, zent::dbus::kNetworkPath, QDBusConnection::sessionBus());
        daemon.setTimeout(1500);
        const QString failure = QStringLiteral("com.vantor.Error.Failed");
        const QPair<QJsonObject, int> faults[] = {
            {{{"error", failure}, {"delay_ms", 1100}}, 3}, {{{"vanish", true}}, 3}, {{{"hang", true}}, 1}};
        for (const auto& [action, asked] : faults) {
            m_platform.addFault(kNetworkDaemon, action);
            m_platform.clearRecord();
            const LogCapture log;
            for (int call = 0; call < 2; ++call) {
                QVERIFY(!daemon.activeConnectionInfo());
                startNetworkDaemon();
            }
            QCOMPARE(FileConfig::GetInstance()->getMacAddress(), QString());
            QCOMPARE(m_platform.record("dbus").size(), asked);
            const QStringList paused =
                log.lines().filter(QRegularExpression("\\. The network daemon is not asked again "
                                                      "for 60 s\\.$"));
            QCOMPARE(paused.size(), asked == 1 ? 1 : 0);
            startNetworkDaemon();
        }
    }
};

QTEST_MAIN(TestWindowRequests)
#include "test_windowrequests.moc"
