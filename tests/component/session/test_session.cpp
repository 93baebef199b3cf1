// SPDX-License-Identifier: Apache-2.0
#include "desktopnotifier.h"
#include "fixture.h"
#include "notificationserver.h"
#include "processrecord.h"
#include "resumedialog.h"

#include <QDBusServiceWatcher>
#include <QSignalSpy>

/// What the session's other programs make the client show: notifications of the desktop, and the dialog of a failed
/// verification.
class TestSession : public QObject
{
    Q_OBJECT

    std::unique_ptr<DesktopNotifier> m_notifier;
    std::unique_ptr<NotificationServer> m_server;
    std::unique_ptr<QSignalSpy> m_activated;
    std::unique_ptr<QSignalSpy> m_unavailable;

    void startServer(const QStringList& capabilities = {"actions", "body", "body-markup"})
    {
        m_server.reset();
        m_server = std::make_unique<NotificationServer>(capabilities);
    }

    /// Lets everything arrive that was under way before: the bus keeps the order of a connection's messages.
    void settle()
    {
        const QString name = QString("com.vantor.test.settle%1").arg(++m_round);
        QDBusServiceWatcher watcher(name, QDBusConnection::sessionBus(), QDBusServiceWatcher::WatchForRegistration);
        QSignalSpy seen(&watcher, &QDBusServiceWatcher::serviceRegistered);
        QDBusConnection other = QDBusConnection::connectToBus(QDBusConnection::SessionBus, name);
        if (!other.registerService(name) || !(seen.size() || seen.wait()))
            qFatal("the bus does not answer");
        QDBusConnection::disconnectFromBus(name);
    }
    int m_round = 0;

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
        m_notifier.reset();
        m_server.reset();
        settle();
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
