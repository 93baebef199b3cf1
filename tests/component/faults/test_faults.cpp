// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "closeguarddialog.h"
#include "fixture.h"
#include "httpclientapi.h"
#include "httprequest.h"
#include "infowidget.h"
#include "mainwindow.h"
#include "modifydialog.h"
#include "noticedialog.h"
#include "notification.h"
#include "notify.h"
#include "platformcontrol.h"
#include "resumedialog.h"
#include "sessionhost.h"
#include "toolkitpasswordedit.h"

#include <QtWidgets>

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
    /// Long enough to hold up a view that lays it all out for half a minute. A cut at an even length would halve a
    /// character.
    const QString m_long = 'x' + QString("😀").repeated(500'000);
    const QString m_shown = m_long.left(999) + QChar(0x2026);

    QComboBox* scenes() const { return m_window->findChild<QComboBox*>(); }
    /// What the panel and the count say.
    QString known() const
    {
        QStringList texts;
        for (const char* label : {"macValue", "userRoleValue", "terminalValue", "nameValue"})
            texts.append(m_window->findChild<QLabel*>(label)->text());
        return texts.join('|') + ' ' + QString::number(MainWindow::unreadMessageCount);
    }
    void start()
    {
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        m_host = std::make_unique<SessionHost>(*m_window);
    }
    void setFault(const QJsonObject& state, const QJsonObject& action = {})
    {
        m_platform.clearFaults();
        if (!action.isEmpty())
            m_platform.addFault({{"path", "*"}}, action);
        m_platform.patchState(
            {{"listening", true}, {"black_hole", false}, {"tls", QJsonObject{{"certificate", "server"}}}});
        if (!state.isEmpty())
            m_platform.patchState(state);
    }
    /// An administrator types a password that the server refuses.
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
        QNotification::qInstance->readAllNotifyMessage("lisi", [this](bool ok, const auto&) { m_readSuccesses += ok; });
        m_window->getAllUserEnvironment();
        QCoreApplication::processEvents();
        emit m_window->startgetMeInfo();
        m_window->getAreaInfo();
        QCoreApplication::processEvents();
        tryRelease();
        HttpRequest::GetInstance()->postQuitControl("zhangsan");
    }
    static QByteArray json(const QJsonObject& object) { return QJsonDocument(object).toJson(); }
    void feedLongTexts()
    {
        const QJsonObject message{{"title", m_long}, {"send_uid", m_long}, {"content", m_long}};
        const QString refusal = json({{"code", 1}, {"msg", m_long}});
        m_platform.addFault({{"path", "*/list"}}, {{"body", QString(QJsonDocument(QJsonArray{message}).toJson())}});
        m_platform.addFault({{"path", "*/remove_status"}}, {{"body", refusal}});
        m_platform.addFault({{"dbus", "ModifyUserPassword"}}, {{"value", refusal}});
        QJsonArray list;
        for (int i = 0; i < 10000; ++i)
            list.append(QJsonObject{{"scene_name", QString(900, 's') + QString::number(i)}, {"scene_code", "code"}});
        const QJsonObject user{{"gecos", m_long + ",,," + m_long}, {"client_name", m_long}};
        HttpRequest::GetInstance()->onUserInfo(200, json({{"code", 0}, {"data", QJsonObject{{"user", user}}}}));
        HttpRequest::GetInstance()->onCompanyName(200, json({{"code", 0}, {"data", QJsonObject{{"name", m_long}}}}));
        QByteArray scenes = json({{"code", 0}, {"message", list}});
        m_window->analyseEvnData(&scenes);
    }
    /// A size of this process in MiB, by its name in the kernel's status file.
    static int memory(const char* name)
    {
        const QString status = testfiles::read("/proc/self/status");
        return QRegularExpression(QString("%1:\\s+(\\d+)").arg(name)).match(status).captured(1).toInt() / 1024;
    }

private slots:
    void init()
    {
        const QJsonObject user{{"gecos", "name,,N1"}, {"client_name", "PC"}};
        m_platform.patchState(
            {{"users", QJsonObject{{"zhangsan", user}}}, {"organisation", QJsonObject{{"name", "O"}}}});
        m_platform.setUnread(2);
        MainWindow::unreadMessageCount = 0;
        m_longestGap = 0;
        m_sinceBeat.start();
        m_beat.callOnTimeout(this, [this] { m_longestGap = std::max(m_longestGap, m_sinceBeat.restart()); });
        m_beat.start(5);
    }
    void cleanup()
    {
        QVERIFY2(m_longestGap < kLongestGapMs, qPrintable(QString::number(m_longestGap)));
        m_beat.stop();
        m_host.reset();
        m_window.reset();
    }

    /// The client's thread ends while Qt can still destroy what lives in it.
    void cleanupTestCase() { delete HttpRequest::GetInstance()->findChild<HttpClientApi*>(); }

    void everyRequestUnder_data() { fixture::addRows("faults.json"); }
    void everyRequestUnder()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        setFault(row["state"].toObject(), row["action"].toObject());
        start();
        // While this holds the window up, nobody takes in what comes for the others.
        m_platform.addFault({{"path", "*/remove"}}, {{"hang", true}});
        // A service that keeps silent is given up soon.
        QNotification::qInstance->setTimeLimit(10s);
        tryRelease();
        const int before = memory("VmRSS");
        testfiles::write("/proc/self/clear_refs", "5");
        askEverything();
        QTRY_COMPARE(m_boxes.texts, QStringList(row["box"].toString()));
        for (const QJsonValue& line : row["log"].toArray())
            QTRY_VERIFY2_WITH_TIMEOUT(log.contains(line.toString()), qPrintable(line.toString()), kPatienceMs);
        QTRY_COMPARE(m_readSuccesses, row["read"].toInt());
        QCOMPARE(known(), QString("||| 0"));
        // Five replies, each kept by Qt's threads and by the client; without a bound it is all that comes in 2 s.
        const bool endless = row["action"].toObject()["endless"].toBool();
        QVERIFY2(!endless || memory("VmHWM") - before < 360, qPrintable(QString::number(memory("VmHWM") - before)));

        // What a person or a poll does next succeeds.
        setFault({});
        askEverything();
        QTRY_COMPARE(m_boxes.texts, QStringList(kRefused));
        const QString all = "name|N1|PC|O 2";
        QTRY_COMPARE_WITH_TIMEOUT(known(), all, kPatienceMs);
        QTRY_VERIFY_WITH_TIMEOUT(scenes()->count() > 0 && m_readSuccesses == 1, kPatienceMs);
        // No large reply is kept.
        QTRY_VERIFY(!endless || memory("VmRSS") - before < 14);
        setFault(row["state"].toObject(), row["action"].toObject());
        m_window->getusrInfo();
        m_window->getAreaInfo();
        QCOMPARE(known(), all);
    }

    /// Texts near the length that replies may have: the client stays usable, and shows their beginning.
    void longTexts()
    {
        setFault({});
        start();
        m_window->show();
        feedLongTexts();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        m_window->openNotice();
        auto* notice = m_window->findChild<NoticeDialog*>();
        QTRY_VERIFY_WITH_TIMEOUT(notice->isVisible(), kPatienceMs);
        tryRelease();
        ModifyDialog().modifyConfirm();
        QCOMPARE(m_boxes.texts, QStringList({m_shown, m_shown}));
        resumeDialog integrity;
        integrity.Notify(m_long, "/");
        m_host->findChild<Notification*>()->Notify(1, "", m_long, m_long, m_long);
        for (const auto page : {&MainWindow::onNetinfoClicked, &MainWindow::onLogininfoClicked}) {
            (m_window.get()->*page)();
            for (QWidget* window : QApplication::topLevelWidgets())
                window->grab();
        }
        for (QWidget* widget : QApplication::allWidgets()) {
            // The caption stands before a value's name.
            for (const char* name : {"accessibleName", "accessibleDescription", "toolTip", "text", "currentText"})
                QVERIFY2(widget->property(name).toString().size() <= 1010, qPrintable(widget->objectName() + name));
        }
        const QList<QPlainTextEdit*> views = notice->findChildren<QPlainTextEdit*>();
        QCOMPARE(views[0]->toPlainText(), m_shown);
        QCOMPARE(views[1]->toPlainText(), m_long.left(49999) + QChar(0x2026));
        // A scene is whole inside; the box cannot tell these apart.
        const QString name = QString(200, 's') + QChar(0x2026);
        const int second = scenes()->findText(name) + 1;
        scenes()->setCurrentIndex(second);
        QCOMPARE(scenes()->currentText(), name);
        QCOMPARE(m_window->getEvncode(m_window->findChild<InfoWidget*>()->getCurrentScene()), second);
    }
};

QTEST_MAIN(TestFaults)
#include "test_faults.moc"
