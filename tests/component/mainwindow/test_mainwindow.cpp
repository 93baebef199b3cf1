// SPDX-License-Identifier: Apache-2.0
#include "closeguarddialog.h"
#include "dbusnames.h"
#include "fileconfig.h"
#include "httprequest.h"
#include "infowidget.h"
#include "modifydialog.h"
#include "networkdaemonproxy.h"
#include "processrecord.h"
#include "sessionhost.h"
#include "toolkittitlebar.h"
#include "windowtest.h"

#include <QtWidgets>

#include <csignal>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

class TestMainWindow : public WindowTest
{
    Q_OBJECT

    const QString m_sceneFile = QString("/home/zhangsan/.cache/vantor/CurrentScene");
    const QJsonObject m_networkDaemon{{"dbus", "GetActiveConnectionInfo"}};

    /// The values of the panel's page that has this one among them.
    QJsonArray page(const char* value) const
    {
        QJsonArray values;
        const auto labels = m_window->findChild<QLabel*>(value)->parentWidget()->findChildren<QLabel*>();
        for (int i = 1; i < labels.size(); i += 2)
            values.append(labels[i]->text());
        return values;
    }
    void analyseScenes(const QStringList& names)
    {
        QJsonArray scenes;
        for (const QString& name : names)
            scenes.append(QJsonObject{{"scene_name", name}, {"scene_code", "code-" + name}});
        QByteArray body = QJsonDocument(QJsonObject{{"code", 0}, {"message", scenes}}).toJson();
        QCOMPARE(m_window->analyseEvnData(&body), 1);
    }
    void click(const char* button) const { m_window->findChild<QAbstractButton*>(button)->click(); }
    QComboBox* sceneBox() const { return m_window->findChild<QComboBox*>(); }
    QPoint centred(const QWidget& window) const
    {
        const QSize rest = QGuiApplication::primaryScreen()->size() - window.size();
        return {rest.width() / 2, rest.height() / 2};
    }
    void startNetworkDaemon() { m_platform.patchState({{"services", QJsonObject{{"network", true}}}}); }

private slots:
    void init()
    {
        startAnew();
        makeWindow(0);
    }
    void cleanup() { m_window.reset(); }

    void whatThePiecesFindReachesPanelAndSignals()
    {
        HttpRequest::GetInstance()->onCompanyName(200, R"({"code": 0, "data": {"name": "O"}})");
        HttpRequest::GetInstance()->onUserInfo(
            500, R"({"code": 0, "data": {"user": {"gecos": "A,,,1", "client_name": "PC"}}})");
        QJsonArray login = page("terminalValue");
        login.removeLast(); // The time.
        fixture::compare(login, QJsonArray{"PC", "O", "A", "1", ""});
        QSignalSpy spy(m_window.get(), &MainWindow::newMessage);
        // Requests within one second share their URL and thus their callback.
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        m_platform.setUnread(2);
        m_window->unreadMessages();
        QTRY_COMPARE(spy.count(), 1);
        QCOMPARE(MainWindow::unreadMessageCount, 2);
        m_window->onReadListMessage("x");
        QCOMPARE(MainWindow::unreadMessageCount, 1);
        m_window->onReadAllMessage();
        QCOMPARE(MainWindow::unreadMessageCount, 0);

        m_platform.clearRecord();
        emit m_window->startgetMeInfo();
        QCOMPARE(m_platform.requests("/uim/v3/client/account").size(), 1);
    }

    void choiceOfSceneIsTheUsers()
    {
        analyseScenes({"甲"});
        QVERIFY(sceneBox()->isHidden());
        const QPoint corner = m_window->geometry().bottomRight();
        analyseScenes({"乙", "丙"});
        QVERIFY(!sceneBox()->isHidden());
        QCOMPARE(m_window->geometry().bottomRight(), corner);
        // Neither filling the box nor going back is a choice.
        QCOMPARE(testfiles::read(m_sceneFile), QByteArray("intranet-scene"));
        sceneBox()->setCurrentIndex(1);
        QCOMPARE(testfiles::read(m_sceneFile), QByteArray("code-丙"));
        auto* panel = m_window->findChild<InfoWidget*>();
        panel->blockSignals(true);
        sceneBox()->setCurrentIndex(0);
        panel->blockSignals(false);
        testfiles::write(m_sceneFile, "untouched");
        m_window->reverseEvn();
        QCOMPARE(sceneBox()->currentText(), QStringLiteral("丙"));
        // A session starts with the first scene, which the box lacks.
        m_window->getUserName();
        m_window->reverseEvn();
        QCOMPARE(sceneBox()->currentIndex(), -1);
        QCOMPARE(testfiles::read(m_sceneFile), QByteArray("untouched"));
    }

    void placesOfPanelAndDialog()
    {
        m_window->show();
        const QRect screen = QGuiApplication::primaryScreen()->geometry();
        const QPoint corner = m_window->pos();
        QCOMPARE(m_window->geometry().bottomRight(), screen.bottomRight());
        const auto placesAfter = [this](const QPoint& panel, const QPoint& dialog) {
            m_window->move(panel);
            notice()->move(dialog);
            emit QGuiApplication::primaryScreen()->geometryChanged({});
            return QList<QPoint>{m_window->pos(), notice()->pos()};
        };
        const QPoint inside(10, 10), outside(-50, 10);
        QCOMPARE(placesAfter(inside, inside), (QList<QPoint>{corner, inside}));
        emit m_window->findChild<ToolkitTitlebar*>()->windowDragged();
        QCOMPARE(placesAfter(inside, outside), (QList<QPoint>{inside, centred(*notice())}));
        QCOMPARE(placesAfter(outside, inside), (QList<QPoint>{corner, inside}));
        // From then on the place is the client's again, as it is after a change of the box.
        QCOMPARE(placesAfter(inside, inside), (QList<QPoint>{corner, inside}));
        emit m_window->findChild<ToolkitTitlebar*>()->windowDragged();
        for (const bool onTop : {true, false}) {
            m_window->move(inside);
            click("onTop");
            const auto flags = Qt::Tool | Qt::FramelessWindowHint;
            QCOMPARE(m_window->windowFlags(), onTop ? flags | Qt::WindowStaysOnTopHint : flags);
            QCOMPARE(m_window->pos(), corner);
        }
        analyseScenes({"甲", "乙"});
        QCOMPARE(m_window->geometry().bottomRight(), screen.bottomRight());
        // Placing goes on while the panel is shown, and the date anyway.
        for (const bool shown : {true, false}) {
            m_window->setVisible(shown);
            m_window->resetUIPos();
            QSet<int> intervals;
            for (const QTimer* timer : m_window->findChildren<QTimer*>())
                intervals += timer->isActive() ? timer->interval() : 0;
            QVERIFY(intervals.contains(1000) == shown && intervals.contains(1000000));
        }
    }

    void outputIsCutIntoPiecesOfWholeCharacters()
    {
        const QString x(300, 'x'), middle(100, QChar(0x4e2d));
        const LogCapture log;
        for (const QString& text : {x, middle, QString("'a\\344'")})
            QCOMPARE(m_window->system("printf " + text), 0);
        QCOMPARE(m_window->system(""), -1);
        QStringList pieces{x.left(127), x.left(127), x.left(46)};
        pieces << middle.left(42) << middle.left(42) << middle.left(16) << "a";
        QCOMPARE(log.records(),
                 QStringList(pieces).replaceInStrings(QRegularExpression("(.+)"), "debug system \"\\1\""));
        pieces.last() += QChar(QChar::ReplacementCharacter);
        QCOMPARE(m_window->commandOutputLines(), pieces);
        // A child that somebody else has waited for, and no descriptor for the pipe.
        const auto handler = std::signal(SIGCHLD, SIG_IGN);
        QCOMPARE(m_window->system("true"), -3);
        std::signal(SIGCHLD, handler);
        rlimit before{};
        getrlimit(RLIMIT_NOFILE, &before);
        const rlimit none{3, before.rlim_max};
        setrlimit(RLIMIT_NOFILE, &none);
        const int refused = m_window->system("true");
        setrlimit(RLIMIT_NOFILE, &before);
        QCOMPARE(refused, -2);
    }

    void withoutConfigurationTheClientEnds()
    {
        m_window->getConfig();
        QVERIFY(m_window->whetherJoinGuard());
        QVERIFY(QFile::rename(testfiles::kInfoFile, "/tmp/info"));
        const LogCapture log;
        QVERIFY(!m_window->whetherJoinGuard());
        fixture::compareLog(log, QJsonArray{"info no config.json to use, error code:  5 , error detail: *"});
        m_boxes.instead = [this] { testfiles::write("/tmp/box", m_boxes.texts[0].toUtf8()); };
        const pid_t child = fork();
        if (child == 0) {
            m_window->getConfig();
            _exit(0);
        }
        m_boxes.instead = nullptr;
        int status = 0;
        const pid_t ended = waitpid(child, &status, 0);
        QVERIFY(QFile::rename("/tmp/info", testfiles::kInfoFile));
        QVERIFY(ended == child && WIFEXITED(status));
        QCOMPARE(WEXITSTATUS(status), 255);
        QCOMPARE(QString(testfiles::read("/tmp/box")),
                 QString("域管终端提示读取/etc/zent/userinfo.json失败，错误原因是：No such file or directory"));
    }

    void agreedInterface()
    {
        QVERIFY(m_window->isAdminUser());
        m_window->closewindow();
        emit m_window->findChild<InfoWidget*>()->shutdownClicked();
        QTRY_COMPARE(processrecord::entries("killall").size(), 1);
        QCOMPARE(processrecord::words(processrecord::entries("killall")[0]), QStringList({"-9", "tarn"}));
        QTRY_COMPARE(processrecord::entries("oxa-shutdown").size(), 1);
        testfiles::write("/tmp/script", "脚本\n");
        QCOMPARE(m_window->readScriptsFile("/tmp/script"), QStringLiteral("脚本\n"));
        QVERIFY(m_window->metaObject()->indexOfSignal("sizeChanged()") >= 0);
        QCOMPARE(m_window->generateRandnum(7, 7), 7);
        QCOMPARE(m_window->generateRandnum(8, 7), 7);
        // Within one second each call draws the same number.
        int second = 0;
        QList<int> others;
        do {
            others.clear();
            second = QTime::currentTime().second();
            const int drawn = m_window->generateRandnum(INT_MAX, 0);
            for (int width = 1; width <= 50; ++width) {
                if (m_window->generateRandnum(7 + width, 7) != 7 + drawn % width)
                    others.append(width);
            }
        } while (QTime::currentTime().second() != second);
        QCOMPARE(others, QList<int>());
    }

    void linksOpenTheirDialogs()
    {
        m_window->show();
        const LogCapture log;
        for (int opening = 0; opening < 2; ++opening) {
            click("closeGuard");
            click("changePassword");
            QWidget* const dialogs[] = {m_window->findChild<closeGuarddialog*>(), m_window->findChild<ModifyDialog*>()};
            for (QWidget* dialog : dialogs) {
                QVERIFY(dialog->isVisible());
                QCOMPARE(dialog->pos(), centred(*dialog));
                dialog->move(0, 0);
                dialog->hide();
            }
        }
        QCOMPARE(log.records().count("debug closeguard get username : \"zhangsan\""), 2);
        m_window->findChild<closeGuarddialog*>()->closeallfather();
        QVERIFY(m_window->isHidden());
    }

    void windowMayGoAtAnyTime()
    {
        QTimer::singleShot(100, this, [this] { m_window.reset(); });
        m_window->openNotice();
        QVERIFY(!m_window);
        // The next one's first question is under way.
        makeWindow(1);
        m_window.reset();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
    }

    void networkPage_data() { fixture::addRows("networkpages.json"); }
    void networkPage()
    {
        QFETCH(QJsonObject, row);
        // Where a row has no page, the one before is kept.
        QJsonArray values = row.value("page").toArray(page("hostValue"));
        values[0] = zent::localHostName();
        m_platform.addFault(m_networkDaemon, row["fault"].toObject());
        const LogCapture log;
        m_window->onNetinfoClicked();
        fixture::compare(page("hostValue"), values);
        fixture::compare(FileConfig::GetInstance()->getMacAddress(), row["mac"]);
        fixture::compareLog(log, row["log"]);
        // What could not be filled is filled with the next opening.
        startNetworkDaemon();
        m_platform.clearFaults();
        m_platform.clearRecord();
        for (const bool shown : {true, false, true})
            m_window->setVisible(shown);
        QCOMPARE(m_platform.record("dbus").size(), row.contains("page") ? 0 : 1);
        if (!row.contains("page"))
            fixture::compare(page("hostValue").at(3), "10.20.30.117");
    }

    void scenesAreAskedOnceAfterTheOrganisation()
    {
        testfiles::write(testfiles::kMachineFile, "M 1&2\n");
        testfiles::write(testfiles::kInfoFile,
                         R"({"server_host": "server.zent.test", "server_port": "80", "protocol": "https"})");
        makeWindow(0);
        const SessionHost host(*m_window);
        m_platform.clearRecord();
        for (int code : {1, 0, 0})
            HttpRequest::GetInstance()->onCompanyName(200, QString(R"({"code": %1, "data": {}})").arg(code));
        QTRY_COMPARE(sceneBox()->count(), 3);
        QJsonArray sent;
        for (const QJsonObject& request : m_platform.requests("/api/client/area/scenes")) {
            const QJsonObject headers = request["headers"].toObject();
            sent += QJsonArray{request["method"], request["scheme"],       request["raw_query"],
                               headers["host"],   headers["content-type"], headers["x-lumo-version"]};
        }
        fixture::compare(sent, QJsonArray{QJsonArray{"GET", "http", "machine_id=M%201%262%0A&username=zhangsan",
                                                     "server.zent.test:80", "application/json", "v2"}});
        QNetworkAccessManager manager;
        QNetworkReply* failed = manager.get(QNetworkRequest(QUrl("http://server.zent.test/none")));
        QTRY_VERIFY(failed->isFinished());
        QVERIFY(!sceneBox()->isHidden());
        m_window->rcvAreainfoData(failed);
        QVERIFY(sceneBox()->isHidden());
    }

    /// Comes last: the pause is the process's.
    void hangingNetworkDaemonCostsOneTimeOut()
    {
        m_window.reset();
        NetworkDaemonProxy daemon(zent::dbus::kNetworkService, zent::dbus::kNetworkPath, QDBusConnection::sessionBus());
        daemon.setTimeout(3000);
        const QPair<QJsonObject, int> faults[] = {{{{"error", "com.vantor.Error.Failed"}, {"delay_ms", 1100}}, 2},
                                                  {{{"vanish", true}}, 2},
                                                  {{{"hang", true}}, 1}};
        for (const auto& [action, asked] : faults) {
            m_platform.addFault(m_networkDaemon, action);
            m_platform.clearRecord();
            const LogCapture log;
            QVERIFY(!daemon.activeConnectionInfo());
            startNetworkDaemon();
            QCOMPARE(FileConfig::GetInstance()->getMacAddress(), QString());
            QCOMPARE(m_platform.record("dbus").size(), asked);
            QCOMPARE(log.count(". The network daemon is not asked again for 60 s."), asked == 1 ? 1 : 0);
            startNetworkDaemon();
        }
    }
};

QTEST_MAIN(TestMainWindow)
#include "test_mainwindow.moc"
