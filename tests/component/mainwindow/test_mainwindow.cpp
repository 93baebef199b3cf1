// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "childprocess.h"
#include "fixture.h"
#include "httprequest.h"
#include "infowidget.h"
#include "mainwindow.h"
#include "noticedialog.h"
#include "notification.h"
#include "platformcontrol.h"
#include "processrecord.h"
#include "sessionhost.h"
#include "toolkittitlebar.h"
#include "trayhost.h"
#include "trayregistry.h"

#include <QApplication>
#include <QCheckBox>
#include <QComboBox>
#include <QLabel>
#include <QLayout>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QScreen>
#include <QSignalSpy>
#include <QSystemTrayIcon>

#include <unistd.h>

namespace
{

const QString kSceneFile = QString("/home/zhangsan/.cache/vantor/CurrentScene");
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
    /// Requests within one second share their URL and thus their callback.
    static void nextSecond() { QTest::qWait(1001 - QTime::currentTime().msec()); }
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

    void whatThePiecesFindReachesPanelAndSignals()
    {
        HttpRequest::GetInstance()->onUserInfo(
            500, R"({"code": 0, "data": {"user": {"gecos": "A,,,1", "client_name": "PC"}}})");
        HttpRequest::GetInstance()->onCompanyName(200, R"({"code": 0, "data": {"name": "O"}})");
        m_window->onLogininfoClicked();
        QCOMPARE(shown("macValue") + shown("userRoleValue") + shown("terminalValue"), QString("A1PC"));
        QCOMPARE(m_window->findChildren<QLabel*>("nameValue").first()->text(), QString("O"));
        QSignalSpy spy(m_window.get(), &MainWindow::newMessage);
        m_platform.setUnread(2);
        nextSecond();
        m_window->unreadMessages();
        QTRY_COMPARE(spy.count(), 1);
        QCOMPARE(MainWindow::unreadMessageCount, 2);
        m_window->onReadListMessage("x");
        QCOMPARE(MainWindow::unreadMessageCount, 1);
        m_window->onReadAllMessage();
        QCOMPARE(MainWindow::unreadMessageCount, 0);
    }

    void areaReplyDecidesOnTheScenes()
    {
        QNetworkAccessManager manager;
        for (const int status : {200, 404}) {
            m_platform.addFault({{"path", "/any"}},
                                {{"status", status}, {"body", R"({"code": 0, "data": [{"name": "N"}]})"}});
            QNetworkReply* reply = manager.get(QNetworkRequest(QUrl("http://server.zent.test/any")));
            QTRY_VERIFY(reply->isFinished());
            m_platform.clearRecord();
            m_window->rcvAreainfoData(reply);
            QTRY_COMPARE(m_platform.requests("/api/client/area/scenes").size(), status == 200 ? 1 : 0);
            QTRY_COMPARE(sceneBox()->isHidden(), status != 200);
        }
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
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("intranet-scene"));
        sceneBox()->setCurrentIndex(1);
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("code-丙"));
        {
            const QSignalBlocker blocker(m_window->findChild<InfoWidget*>());
            sceneBox()->setCurrentIndex(0);
        }
        testfiles::write(kSceneFile, "untouched");
        m_window->reverseEvn();
        QCOMPARE(testfiles::read(kSceneFile), QByteArray("untouched"));
        QCOMPARE(sceneBox()->currentText(), QStringLiteral("丙"));
    }

    void panelThatTheClientPlacedKeepsItsCorner()
    {
        m_window->show();
        emit m_window->findChild<ToolkitTitlebar*>()->windowDragged();
        m_window->move(10, 10);
        m_window->findChild<QCheckBox*>("onTop")->click();
        QVERIFY(m_window->windowFlags().testFlag(Qt::WindowStaysOnTopHint));
        const QPoint placed = m_window->geometry().bottomRight();
        analyseScenes({"甲", "乙"});
        QCOMPARE(m_window->geometry().bottomRight(), placed);
    }

    void changeOfScreensLeavesTheUsersPlace()
    {
        m_window->show();
        const QPoint corner = m_window->pos();
        const auto placeAfter = [this](const QPoint& place) {
            m_window->move(place);
            emit QGuiApplication::primaryScreen()->geometryChanged({});
            return m_window->pos();
        };
        QCOMPARE(placeAfter({10, 10}), corner);
        emit m_window->findChild<ToolkitTitlebar*>()->windowDragged();
        QCOMPARE(placeAfter({10, 10}), QPoint(10, 10));
        QCOMPARE(placeAfter({-50, 10}), corner);
        // From then on the place is the client's again.
        QCOMPARE(placeAfter({10, 10}), corner);
    }

    void shutdownEndsTheWaitForATray()
    {
        m_window->setSysThemetype(2);
        for (const bool ended : {true, false}) {
            makeWindow(0);
            const SessionHost host(*m_window);
            if (ended)
                m_window->shutdown();
            const TrayHostWatch witness;
            QSignalSpy appeared(&witness, &TrayHostWatch::hostAppeared);
            const TrayRegistry registry;
            QTRY_COMPARE(appeared.count(), 1);
            QCOMPARE(m_window->findChild<QSystemTrayIcon*>() != nullptr, !ended);
        }
        QVERIFY(m_window->findChild<QSystemTrayIcon*>()->isVisible());
        m_window->shutdown();
        QVERIFY(!m_window->findChild<QSystemTrayIcon*>()->isVisible());
    }

    void outputIsCutIntoPiecesOfWholeCharacters()
    {
        const QString texts[] = {QString(300, 'x'), QString(100, QChar(0x4e2d))};
        for (const QString& text : texts)
            QCOMPARE(m_window->system("printf %s " + text), 0);
        QCOMPARE(m_window->system(""), -1);
        const QStringList pieces = m_window->commandOutputLines();
        QCOMPARE(pieces.size(), 6);
        QCOMPARE(pieces.join(QString()), texts[0] + texts[1]);
    }

    void aShellsInputIsEmptyAndNothingElseIsInherited()
    {
        int ends[2];
        QVERIFY(pipe(ends) == 0 && dup2(ends[0], STDIN_FILENO) == STDIN_FILENO);
        zent::prepareDescriptorsForChildren();
        m_window->system(QString("readlink /proc/self/fd/0; test -e /proc/$$/fd/%1 && echo open").arg(ends[1]));
        QCOMPARE(m_window->commandOutputLines(), QStringList("/dev/null\n"));
        QVERIFY(close(ends[0]) == 0 && close(ends[1]) == 0);
        m_window->closewindow();
        QTRY_COMPARE(processrecord::entries("killall").size(), 1);
        QCOMPARE(processrecord::words(processrecord::entries("killall")[0]), QStringList({"-9", "tarn"}));
    }

    void agreedInterface()
    {
        for (void (MainWindow::*const member)() : {&MainWindow::getUserName, &MainWindow::getConfig})
            (m_window.get()->*member)();
        const QMetaObject* type = m_window->metaObject();
        QStringList signalNames;
        for (int i = type->methodOffset(); i < type->methodCount(); ++i) {
            if (type->method(i).methodType() == QMetaMethod::Signal)
                signalNames += type->method(i).methodSignature();
        }
        QCOMPARE(signalNames,
                 QStringList({"sizeChanged()", "newMessage()", "readNotify(QString)", "startgetMeInfo()"}));
    }

    void administratorsMayRelease()
    {
        const QString file = qEnvironmentVariable("ROOM") + "/standin/id.stdout";
        for (const char* groups : {"1(sudo),2(my-zent)", "1(sudo)"}) {
            testfiles::write(file, groups);
            const MainWindow window(nullptr, 1020);
            QCOMPARE(window.findChild<QWidget*>("closeGuard") != nullptr, QString(groups).contains(','));
        }
        QFile::remove(file);
    }

    void oneMessageIsMarkedReadOnce()
    {
        makeWindow(1);
        m_window->openNotice();
        QTRY_VERIFY(notice()->isVisible());
        QCOMPARE(first()->text(), QStringLiteral("已读"));
        QVERIFY(notice()->windowFlags().testFlag(Qt::WindowStaysOnTopHint));
        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        BoxCloser boxes;
        m_platform.addFault({{"path", "*/read"}}, {{"status", 500}});
        first()->click();
        QTRY_COMPARE(boxes.texts.size(), 1);
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QVERIFY(read.isEmpty());
        m_platform.clearFaults();
        m_platform.clearRecord();
        nextSecond();
        first()->click();
        first()->click();
        QTRY_COMPARE(read, QList<QVariantList>{{"0"}});
        QCOMPARE(m_platform.requests("/notification/v2/read").size(), 1);
        QTRY_COMPARE(first()->text(), QStringLiteral("关闭"));
        QTRY_VERIFY(!first()->signalsBlocked());
        first()->click();
        QVERIFY(notice()->isHidden());
    }

    void firstButtonMarksOnlyWhatItSays_data() { fixture::addRows("noticebuttons.json"); }
    void firstButtonMarksOnlyWhatItSays()
    {
        QFETCH(QJsonObject, row);
        const int marked = row["marked"].toInt();
        makeWindow(1);
        m_window->openNotice();
        QTRY_VERIFY(notice()->isVisible());
        m_platform.addFault({{"path", kListPath}}, row["reply"].toObject());
        m_window->openNotice();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        fixture::compare(first()->text(), row["text"]);
        first()->click();
        QCOMPARE(notice()->isHidden(), marked == 0);
        QTRY_COMPARE(m_platform.requests("/notification/v2/read").size(), marked);
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
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
        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        next()->click();
        QVERIFY(!next()->isEnabled());
        QTRY_COMPARE(next()->text(), QStringLiteral("下一条(2)"));
        QCOMPARE(read, QList<QVariantList>{{"2"}});
        read.clear();
        QVERIFY(next()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));

        m_platform.addFault({{"path", "/notification/v2/*"}}, {{"status", 500}});
        BoxCloser boxes;
        const LogCapture log;
        bool logged = false;
        boxes.instead = [&logged, &log] {
            logged = log.contains("/read\" failed: status 500");
            QApplication::activeModalWidget()->close();
        };
        // The request is under way when this returns.
        m_window->openNotice();
        next()->click();
        QTRY_COMPARE(boxes.texts.size(), 1);
        QVERIFY2(boxes.texts.constFirst().startsWith("消息调用警告Error"), qPrintable(boxes.texts.constFirst()));
        QVERIFY(logged);
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QVERIFY(read.isEmpty() && !next()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));
        m_platform.clearFaults();
        m_window->onReadListMessage("other");
        QTRY_VERIFY(next()->isEnabled());
    }

    void floodOfActivationsAsksOnce()
    {
        makeWindow(1);
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        m_platform.clearRecord();
        LogCapture log;
        for (int i = 0; i < 300; ++i)
            QMetaObject::invokeMethod(m_window.get(), &MainWindow::openNotice, Qt::QueuedConnection);
        QTRY_VERIFY(notice()->isVisible());
        QCOMPARE(log.count("showNotice"), 300);
        const QString step = "debug noticeDialog::getNotifyMessageList()-0%1:%2";
        QCOMPARE(log.records().filter("noticeDialog::"),
                 QStringList({step.arg(1).arg(" true"), step.arg(2).arg(" 1"), step.arg(3).arg("")}));
        const QLayout* layout = notice()->findChild<QWidget*>("informationWidget")->layout();
        const auto views = notice()->findChildren<QPlainTextEdit*>();
        QCOMPARE(layout->indexOf(views[0]), 0);
        QCOMPARE(layout->indexOf(views[1]), layout->count() - 2);
        // One beside it is the poll's.
        QVERIFY(m_platform.requests(kListPath).size() <= 2);
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
