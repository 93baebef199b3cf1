#include "desktopnotifier.h"
#include "logcapture.h"
#include "testrows.h"

#include <QDBusConnection>
#include <QDBusContext>
#include <QDBusMessage>
#include <QDBusServiceWatcher>
#include <QSignalSpy>

#include <memory>

namespace
{

const QString kService = QStringLiteral("org.freedesktop.Notifications");
const QString kPath = QStringLiteral("/org/freedesktop/Notifications");
const QString kSender = QStringLiteral("管理员");

/// A notification service of the desktop, on a connection of its own.
class FakeServer : public QObject, protected QDBusContext
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.freedesktop.Notifications")

public:
    explicit FakeServer(const QStringList& capabilities) : capabilities(capabilities)
    {
        static int number = 0;
        m_name = QString("server%1").arg(++number);
        QDBusConnection bus = QDBusConnection::connectToBus(QDBusConnection::SessionBus, m_name);
        if (!bus.registerObject(kPath, this, QDBusConnection::ExportAllSlots | QDBusConnection::ExportAllSignals) ||
            !bus.registerService(kService))
            qFatal("cannot own %s", qPrintable(kService));
    }
    ~FakeServer() override { QDBusConnection::disconnectFromBus(m_name); }

    QStringList capabilities;
    /// The method that does not answer as it should, and what it does instead: "hang", "fail" or this text.
    QString failing;
    QString instead;
    int asked = 0;
    QList<QVariantList> shown;
    uint lastId = 100;

public slots:
    QStringList GetCapabilities()
    {
        ++asked;
        answer("GetCapabilities");
        return capabilities;
    }
    uint Notify(const QString& application, uint replaces, const QString& icon, const QString& summary,
                const QString& body, const QStringList& actions, const QVariantMap& hints, int timeout)
    {
        shown.append({application, replaces, icon, summary, body, actions, hints, timeout});
        answer("Notify");
        return ++lastId;
    }

signals:
    void ActionInvoked(uint id, const QString& action);
    void NotificationClosed(uint id, uint reason);

private:
    void answer(const QString& method)
    {
        if (failing != method)
            return;
        if (instead == "fail")
            return sendErrorReply(QDBusError::Failed, "the server says no");
        setDelayedReply(true);
        if (instead != "hang")
            QDBusConnection(m_name).send(message().createReply(instead));
    }

    QString m_name;
};

} // namespace

class TestDesktopNotifier : public QObject
{
    Q_OBJECT

    std::unique_ptr<DesktopNotifier> m_notifier;
    std::unique_ptr<FakeServer> m_server;
    std::unique_ptr<QSignalSpy> m_activated;
    std::unique_ptr<QSignalSpy> m_unavailable;

    void startServer(const QStringList& capabilities = {"actions", "body", "body-markup"})
    {
        m_server.reset();
        m_server = std::make_unique<FakeServer>(capabilities);
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
        m_notifier->notify("title", kSender, "text");
        QTRY_COMPARE(m_server->shown.size(), before + 1);
        settle();
    }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

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
            QCOMPARE(m_server->shown.first().mid(3, 2), QVariantList({title, body}));
        }
    }

    void onlyClicksOnOurOwnActivate()
    {
        startServer();
        showOne();
        const uint ours = m_server->lastId;
        QDBusMessage forged = QDBusMessage::createSignal(kPath, kService, "ActionInvoked");
        forged << ours << "default";
        QDBusConnection stranger = QDBusConnection::connectToBus(QDBusConnection::SessionBus, "stranger");
        QVERIFY(stranger.send(forged));
        emit m_server->ActionInvoked(ours + 1, "default");
        emit m_server->ActionInvoked(ours, "other");
        settle();
        QDBusConnection::disconnectFromBus("stranger");
        QCOMPARE(m_activated->size(), 0);
        emit m_server->ActionInvoked(ours, "default");
        QTRY_COMPARE(m_activated->size(), 1);
        emit m_server->NotificationClosed(ours, 2);
        emit m_server->ActionInvoked(ours, "default");
        settle();
        QCOMPARE(m_activated->size(), 1);
    }

    void failureIsReported_data()
    {
        addColumns<QString, QString>("failing", "instead");
        addRow("no service", "", "");
        addRow("capabilities fail", "GetCapabilities", "fail");
        addRow("capabilities are a text", "GetCapabilities", "body");
        addRow("capabilities hang", "GetCapabilities", "hang");
        addRow("notify fails", "Notify", "fail");
        addRow("notify gives a text", "Notify", "101");
        addRow("notify hangs", "Notify", "hang");
    }
    void failureIsReported()
    {
        QFETCH(QString, failing);
        QFETCH(QString, instead);
        if (!failing.isEmpty()) {
            startServer();
            m_server->failing = failing;
            m_server->instead = instead;
        }
        LogCapture log;
        m_notifier->notify("<t>", kSender, "<x>");
        // It must not wait for the service.
        QCOMPARE(m_unavailable->size(), 0);
        QVERIFY(m_unavailable->wait(10000));
        QCOMPARE(m_unavailable->first(), QVariantList({"<t>", kSender, "<x>"}));
        QCOMPARE(log.count("DesktopNotifier"), 1);

        // The next message is tried afresh.
        if (!m_server)
            startServer();
        m_server->failing = QString();
        showOne();
        QCOMPARE(m_unavailable->size(), 1);
    }

    void serverGoesWhileAsked()
    {
        startServer();
        m_server->failing = "GetCapabilities";
        m_server->instead = "hang";
        m_notifier->notify("t", "", "x");
        QTRY_COMPARE(m_server->asked, 1);
        startServer({"body"});
        // Noticed before the question's own time-out.
        QTRY_COMPARE_WITH_TIMEOUT(m_unavailable->size(), 1, 4000);
        QCOMPARE(m_server->asked, 0);

        showOne();
        QCOMPARE(m_unavailable->size(), 1);
    }
};

QTEST_GUILESS_MAIN(TestDesktopNotifier)
#include "test_desktopnotifier.moc"
