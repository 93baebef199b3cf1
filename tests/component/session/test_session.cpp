// SPDX-License-Identifier: Apache-2.0
#include "desktopnotifier.h"
#include "fixture.h"
#include "mainwindow.h"
#include "notificationserver.h"
#include "notify.h"
#include "processrecord.h"
#include "resumedialog.h"
#include "sessionhost.h"
#include "sizedicon.h"
#include "themehelper.h"
#include "toolkittitlebar.h"
#include "trayclicks.h"
#include "trayhost.h"
#include "trayicon.h"
#include "trayregistry.h"

#include <QDBusConnectionInterface>

/// What the client shows and takes on the desktop beside its windows: the tray icon, notifications, and the dialog of a
/// failed verification.
class TestSession : public QObject
{
    Q_OBJECT

    std::unique_ptr<MainWindow> m_window;
    std::unique_ptr<DesktopNotifier> m_notifier;
    std::unique_ptr<NotificationServer> m_server;
    std::unique_ptr<QSignalSpy> m_activated;
    std::unique_ptr<QSignalSpy> m_unavailable;

    void makeWindow() { m_window = std::make_unique<MainWindow>(nullptr, 1029); }
    void startServer(const QStringList& capabilities = {"actions", "body", "body-markup"})
    {
        m_server.reset();
        m_server = std::make_unique<NotificationServer>(capabilities);
    }

    /// Lets everything arrive that was under way before: the bus keeps the order of a connection's messages.
    void settle() const
    {
        const QString asked = m_server ? NotificationServer::service() : "org.freedesktop.DBus";
        QDBusConnection::sessionBus().call(
            QDBusMessage::createMethodCall(asked, "/", "org.freedesktop.DBus.Peer", "Ping"), QDBus::BlockWithGui);
        QCoreApplication::processEvents();
    }

    /// Shows one message and waits until the notifier knows its id.
    void showOne()
    {
        const int before = m_server->shown.size();
        m_notifier->notify("title", "sender", "text");
        QTRY_COMPARE(m_server->shown.size(), before + 1);
        settle();
    }

private slots:
    void init()
    {
        m_notifier = std::make_unique<DesktopNotifier>();
        m_activated = std::make_unique<QSignalSpy>(m_notifier.get(), &DesktopNotifier::activated);
        m_unavailable = std::make_unique<QSignalSpy>(m_notifier.get(), &DesktopNotifier::unavailable);
    }

    void cleanup()
    {
        m_window.reset();
        m_notifier.reset();
        m_server.reset();
        settle();
    }

    void clicksOnTheIcon()
    {
        using Tray = QSystemTrayIcon;
        makeWindow();
        auto* icon = m_window->findChild<TrayIcon*>();
        const QPoint corner = m_window->pos();
        m_window->move(-50, 10);
        const std::pair<Tray::ActivationReason, bool> clicks[] = {
            {Tray::Trigger, false}, {Tray::Trigger, true},      {Tray::Context, true},
            {Tray::Trigger, true},  {Tray::Unknown, true},      {Tray::DoubleClick, true},
            {Tray::Trigger, false}, {Tray::MiddleClick, false}, {Tray::Trigger, true}};
        for (const auto& [reason, shown] : clicks) {
            emit icon->activated(reason);
            QVERIFY2(m_window->isVisible() == shown, qPrintable(QString("click %1").arg(reason)));
        }
        QCOMPARE(m_window->pos(), corner);
        QTRY_VERIFY(m_window->hasFocus());
        m_window->close();
        QVERIFY(m_window->isHidden());
        emit m_window->findChild<ToolkitTitlebar*>()->windowDragged();
        m_window->move(-50, 10);
        emit icon->activated(Tray::Trigger);
        QVERIFY(m_window->isVisible());
        QCOMPARE(m_window->pos(), QPoint(-50, 10));

        // Of a host that reports every click as one of its own.
        QList<int> meant;
        TrayClicks single;
        for (const auto reason : {Tray::Trigger, Tray::Trigger, Tray::Trigger, Tray::MiddleClick, Tray::Trigger})
            single.pass(Tray(), reason, [&](auto meaning) { meant.append(meaning); });
        QCOMPARE(meant, QList<int>({3, 2, 3, 4, 3}));
    }

    void shutdownEndsTheWaitForATray()
    {
        makeWindow();
        m_window->setSysThemetype(2);
        for (const bool ended : {true, false}) {
            makeWindow();
            const SessionHost host(*m_window);
            m_window->show();
            if (ended)
                m_window->shutdown();
            QCOMPARE(m_window->isHidden(), ended);
            const TrayHostWatch witness;
            QSignalSpy appeared(&witness, &TrayHostWatch::hostAppeared);
            const LogCapture log;
            const TrayRegistry registry;
            QTRY_COMPARE(appeared.count(), 1);
            QVERIFY(log.records().contains("info TrayHostWatch a tray host is there"));
            QCOMPARE(m_window->findChild<QSystemTrayIcon*>() != nullptr, !ended);
            // Of a tray that shows no balloons, or of none.
            emit host.findChild<Notification*>()->onMessage(1, "", "title", "text", "sender");
            QTRY_VERIFY(log.records().contains(
                "warning SessionHost neither a notification service nor a tray shows the message"));
        }
        const auto* icon = m_window->findChild<QSystemTrayIcon*>();
        QCOMPARE(icon->toolTip(), QStringLiteral("终端域管平台"));
        const QList<QSize> sizes{{16, 16}, {22, 22}, {24, 24}, {32, 32}, {48, 48}, {64, 64}};
        QCOMPARE(icon->icon().availableSizes(), sizes);
        const char* const files[] = {"finalogo", "tarn", "tarn_dark"};
        for (int theme = 0; theme <= 2; ++theme) {
            if (theme > 0)
                m_window->setSysThemetype(theme);
            const QImage drawn = zent::sizedIcon(QString(":/images/%1.svg").arg(files[theme])).pixmap(64).toImage();
            QVERIFY2(!drawn.isNull() && icon->icon().pixmap(64).toImage() == drawn, files[theme]);
        }
        QVERIFY(icon->isVisible());
        m_window->shutdown();
        QVERIFY(!icon->isVisible());
    }

    void iconOfANewerDesktopFollowsTheTheme()
    {
        TrayIcon icon(1030, "name", nullptr);
        icon.show();
        const auto* shown = icon.findChild<QSystemTrayIcon*>();
        QVERIFY(shown->icon().isNull());
        emit ThemeHelper::instance()->themeTypeChanged(ThemeHelper::DarkType);
        QVERIFY(!shown->icon().isNull());
    }

    void showsTheMessage()
    {
        const std::tuple<QStringList, QString, QString> cases[] = {
            {{"body", "body-markup"}, "&lt;i&gt;", QStringLiteral("发送人: &lt;a&gt;\n&amp;amp;\n2")},
            {{"body"}, "<i>", QStringLiteral("发送人: <a>\n&amp;\n2")}};
        for (const auto& [capabilities, title, body] : cases) {
            startServer(capabilities);
            settle();
            for (int i = 1; i <= 3; ++i)
                m_notifier->notify("<i>", "<a>", "&amp;\n2");
            QTRY_COMPARE(m_server->shown.size(), 3);
            QCOMPARE(m_server->asked, 1);
            const QVariantMap hints{{"desktop-entry", "zentw-info"}};
            const QStringList action{"default", QStringLiteral("查看")};
            QCOMPARE(m_server->shown.first(),
                     QVariantList({QStringLiteral("域管平台"), 0U, "zentw-info", title, body, action, hints, -1}));
        }
    }

    void onlyClicksOnOurOwnActivate()
    {
        startServer();
        showOne();
        const uint ours = m_server->lastId;
        QDBusConnection stranger = QDBusConnection::connectToBus(QDBusConnection::SessionBus, "stranger");
        QDBusMessage forged =
            QDBusMessage::createSignal(NotificationServer::path(), NotificationServer::service(), "ActionInvoked");
        QVERIFY(stranger.send(forged << ours << "default"));
        QVERIFY(stranger.interface()->isServiceRegistered(NotificationServer::service()));
        emit m_server->ActionInvoked(ours + 1, "default");
        emit m_server->ActionInvoked(ours, "other");
        settle();
        QDBusConnection::disconnectFromBus("stranger");
        QCOMPARE(m_activated->size(), 0);
        emit m_server->ActionInvoked(ours, "default");
        QTRY_COMPARE(m_activated->size(), 1);
        emit m_server->NotificationClosed(ours, 2);
        emit m_server->ActionInvoked(ours, "default");
        // Another server's numbers are not ours.
        showOne();
        const uint last = m_server->lastId;
        startServer();
        settle();
        emit m_server->ActionInvoked(last, "default");
        settle();
        QCOMPARE(m_activated->size(), 1);
    }

    void failureIsReported_data() { fixture::addRows("notifierfailures.json"); }
    void failureIsReported()
    {
        QFETCH(QJsonObject, row);
        if (row.contains("failing")) {
            startServer();
            m_server->failing = row["failing"].toString();
            m_server->instead = row["instead"].toString();
        }
        LogCapture log;
        const QString text(50001, '<');
        m_notifier->notify(text, "管理员", text);
        // It must not wait for the service.
        QCOMPARE(m_unavailable->size(), 0);
        if (row["late"].toBool()) {
            QTRY_COMPARE(m_notifier->findChildren<QTimer*>().size(), 1);
            QCOMPARE(m_notifier->findChild<QTimer*>()->interval(), 5000);
        }
        if (row["replaced"].toBool()) {
            QTRY_COMPARE(m_server->asked, 1);
            startServer();
        }
        QVERIFY(m_unavailable->wait(10000));
        QCOMPARE(m_unavailable->first(),
                 QVariantList({text.left(1000) + QChar(0x2026), "管理员", text.left(50000) + QChar(0x2026)}));
        fixture::compareLog(log, row["log"]);
        QVERIFY(!row["replaced"].toBool() || m_server->asked == 0);
        // It has been shown otherwise by then.
        if (row["late"].toBool()) {
            m_server->answerLate();
            QTRY_COMPARE(m_server->closed, QList<uint>{m_server->lastId});
        }
        // The next message is tried afresh.
        if (!m_server)
            startServer();
        m_server->failing = QString();
        showOne();
        QCOMPARE(m_unavailable->size(), 1);
    }

    void openTwiceRunsOnceAPeriod()
    {
        resumeDialog dialog;
        auto* timer = dialog.findChild<QTimer*>("terminalVarifyTimer");
        dialog.Notify("open", "true");
        dialog.Notify("open", "false");
        QCOMPARE(timer->interval(), 300000);
        const LogCapture log;
        timer->setSingleShot(true);
        timer->start(0);
        QTRY_VERIFY(!timer->isActive());
        QCOMPARE(log.count("\"policy\""), 1);
        QTRY_COMPARE(processrecord::entries("fenx-cli.bash").size(), 1);
        QCOMPARE(processrecord::words(processrecord::entries("fenx-cli.bash").first()),
                 QStringList({"--cmd", "policy", "--scenceinfo", "emptyscenecode", "--args", "RUNFULLZONEVARIFY"}));
    }

    void otherWordsStop()
    {
        resumeDialog dialog;
        auto* timer = dialog.findChild<QTimer*>("terminalVarifyTimer");
        for (const char* word : {"close", "", "OPEN", "success"}) {
            dialog.Notify("open", "true");
            // A failure report says nothing about the runs to come.
            dialog.Notify("failed", "/fix?id=a%20b");
            QVERIFY(timer->isActive() && dialog.isVisible());
            dialog.Notify(word, "true");
            QVERIFY2(!timer->isActive(), word);
        }
        // A text that is no switch is a repair path even then, and reporting it shows the dialog again.
        QVERIFY(dialog.isHidden());
        dialog.Notify("success", "");
        QVERIFY(dialog.isVisible());
    }
};

QTEST_MAIN(TestSession)
#include "test_session.moc"
