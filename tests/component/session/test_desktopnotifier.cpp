#include "desktopnotifier.h"
#include "logcapture.h"
#include "testrows.h"

#include <QDBusConnection>
#include <QDBusContext>
#include <QDBusMessage>
#include <QDBusServiceWatcher>
#include <QElapsedTimer>
#include <QProcess>
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
    ~FakeServer() override { leave(); }

    /// Goes off the bus, as a program that ends.
    void leave() { QDBusConnection::disconnectFromBus(m_name); }
    void giveNameAway() { QDBusConnection(m_name).unregisterService(kService); }

    QStringList capabilities;
    /// The method that fails, or that never answers.
    QString failing;
    QString hanging;
    /// What the failing method answers with: an error when this is empty, else "nothing" or this text.
    QString odd;
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
        if (hanging == method)
            setDelayedReply(true);
        else if (failing == method && !odd.isEmpty()) {
            setDelayedReply(true);
            const QVariantList values = odd == "nothing" ? QVariantList() : QVariantList{odd};
            QDBusConnection(m_name).send(message().createReply(values));
        } else if (failing == method)
            sendErrorReply(QDBusError::Failed, "the server says no");
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
        if (!m_server)
            return;
        m_server.reset();
        settle();
    }

    void showsTheMessage_data()
    {
        addColumns<QStringList, QString, QString, QString>("capabilities", "sender", "title", "body");
        addRow("markup", QStringList{"body", "body-markup", "actions"}, "<a>", "&lt;i&gt; &amp; more",
               QStringLiteral("发送人: &lt;a&gt;\n&lt;b&gt; &amp;amp; &quot;x&quot;\n2"));
        addRow("plain", QStringList{"body", "actions"}, "<a>", "<i> & more",
               QStringLiteral("发送人: <a>\n<b> &amp; \"x\"\n2"));
        addRow("no capabilities, no sender", QStringList(), "", "<i> & more", "<b> &amp; \"x\"\n2");
    }
    void showsTheMessage()
    {
        QFETCH(QStringList, capabilities);
        QFETCH(QString, sender);
        QFETCH(QString, title);
        QFETCH(QString, body);
        startServer(capabilities);
        m_notifier->notify("<i> & more", sender, "<b> &amp; \"x\"\n2");
        QTRY_COMPARE(m_server->shown.size(), 1);
        const QStringList actions{"default", QStringLiteral("查看")};
        const QVariantMap hints{{"desktop-entry", "zentw-info"}};
        QCOMPARE(m_server->shown.first(),
                 QVariantList({QStringLiteral("域管平台"), 0U, "zentw-info", title, body, actions, hints, -1}));
    }

    void asksCapabilitiesOnceAndKeepsTheOrder()
    {
        startServer();
        for (const char* title : {"1", "2", "3"})
            m_notifier->notify(title, "", "");
        QTRY_COMPARE(m_server->shown.size(), 3);
        showOne();
        for (int i = 0; i < 3; ++i)
            QCOMPARE(m_server->shown[i].at(3).toInt(), i + 1);
        QCOMPARE(m_server->asked, 1);
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
        addColumns<QString, QString, int, QString>("failing", "hanging", "delayMs", "odd");
        addRow("no service", "", "", 0, "");
        addRow("capabilities fail", "GetCapabilities", "", 0, "");
        addRow("capabilities are a text", "GetCapabilities", "", 0, "body");
        addRow("capabilities without a value", "GetCapabilities", "", 0, "nothing");
        addRow("notify fails", "Notify", "", 0, "");
        addRow("notify gives a text", "Notify", "", 0, "101");
        addRow("notify gives no value", "Notify", "", 0, "nothing");
        addRow("capabilities hang", "", "GetCapabilities", 5000, "");
        addRow("notify hangs", "", "Notify", 5000, "");
    }
    void failureIsReported()
    {
        QFETCH(QString, failing);
        QFETCH(QString, hanging);
        QFETCH(int, delayMs);
        QFETCH(QString, odd);
        if (!failing.isEmpty() || !hanging.isEmpty()) {
            startServer();
            m_server->failing = failing;
            m_server->hanging = hanging;
            m_server->odd = odd;
        }
        LogCapture log;
        QElapsedTimer clock;
        clock.start();
        m_notifier->notify("<t>", kSender, "<x>");
        // It must not wait for the service.
        QCOMPARE(m_unavailable->size(), 0);
        QVERIFY(m_unavailable->wait(delayMs + 10000));
        // The toolkit may round a time-out by a twentieth.
        QVERIFY2(clock.elapsed() >= delayMs * 9 / 10, qPrintable(QString::number(clock.elapsed())));
        QCOMPARE(m_unavailable->first(), QVariantList({"<t>", kSender, "<x>"}));
        QCOMPARE(log.count("DesktopNotifier"), 1);

        // The next message is tried afresh.
        if (!m_server)
            startServer();
        m_server->failing = m_server->hanging = QString();
        showOne();
        QCOMPARE(m_unavailable->size(), 1);
    }

    void restartedServerIsAskedAgain()
    {
        startServer();
        showOne();
        const uint former = m_server->lastId;
        startServer({"body"});
        settle();
        // Numbers begin anew, so the former service's mean nothing now.
        emit m_server->ActionInvoked(former, "default");
        settle();
        QCOMPARE(m_activated->size(), 0);
        m_notifier->notify("t", "", "<x>");
        QTRY_COMPARE(m_server->shown.size(), 1);
        QCOMPARE(m_server->asked, 1);
        QCOMPARE(m_server->shown.first().at(4).toString(), QString("<x>"));
        settle();
        emit m_server->ActionInvoked(m_server->lastId, "default");
        QTRY_COMPARE(m_activated->size(), 1);
        QCOMPARE(m_unavailable->size(), 0);
    }

    void serverGoesWhileAsked_data()
    {
        addColumns<bool>("ends");
        addRow("ends", true);
        addRow("gives its name away and stays on the bus", false);
    }
    void serverGoesWhileAsked()
    {
        QFETCH(bool, ends);
        startServer();
        m_server->hanging = "GetCapabilities";
        m_notifier->notify("t", "", "x");
        QTRY_COMPARE(m_server->asked, 1);
        QElapsedTimer clock;
        clock.start();
        const std::unique_ptr<FakeServer> former = std::move(m_server);
        if (!ends)
            former->giveNameAway();
        else
            former->leave();
        startServer({"body"});
        QTRY_COMPARE(m_unavailable->size(), 1);
        QVERIFY2(clock.elapsed() < 4000, "must be noticed before the question's own time-out");
        QCOMPARE(m_server->asked, 0);
        showOne();
        QCOMPARE(m_unavailable->size(), 1);
    }

    /// A process keeps its bus, so this runs a second time in a process that has none.
    void withoutBus()
    {
        if (!QDBusConnection::sessionBus().isConnected()) {
            m_notifier->notify("t", "", "x");
            QCOMPARE(m_unavailable->size(), 0);
            QVERIFY(m_unavailable->wait(2000));
            return;
        }
        QProcess process;
        QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
        environment.insert("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nowhere");
        process.setProcessEnvironment(environment);
        process.setProcessChannelMode(QProcess::ForwardedChannels);
        process.start(QCoreApplication::applicationFilePath(), {"withoutBus"});
        QVERIFY(process.waitForFinished());
        QCOMPARE(process.exitStatus(), QProcess::NormalExit);
        QCOMPARE(process.exitCode(), 0);
    }
};

QTEST_GUILESS_MAIN(TestDesktopNotifier)
#include "test_desktopnotifier.moc"
