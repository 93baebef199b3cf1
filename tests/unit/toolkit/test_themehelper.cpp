// The theme helper against a private session bus with a settings portal that this test plays.

#include "themehelper.h"

#include <QApplication>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusVariant>
#include <QDBusVirtualObject>
#include <QProcess>
#include <QSignalSpy>
#include <QtTest>

namespace
{

const QString portalService = QStringLiteral("org.freedesktop.portal.Desktop");
const QString portalPath = QStringLiteral("/org/freedesktop/portal/desktop");
const QString settingsInterface = QStringLiteral("org.freedesktop.portal.Settings");

/// Answers Read as the portal does, with the value in a variant in a variant.
class Portal : public QDBusVirtualObject
{
public:
    uint colorScheme = 1;
    int calls = 0;

    QString introspect(const QString&) const override { return {}; }
    bool handleMessage(const QDBusMessage& message, const QDBusConnection& connection) override
    {
        ++calls;
        const bool asked = message.member() == QLatin1String("Read") &&
                           message.arguments() == QVariantList{QStringLiteral("org.freedesktop.appearance"),
                                                               QStringLiteral("color-scheme")};
        const QVariant inner = QVariant::fromValue(QDBusVariant(colorScheme));
        return connection.send(asked ? message.createReply(QVariant::fromValue(QDBusVariant(inner)))
                                     : message.createErrorReply(QDBusError::UnknownMethod, QString()));
    }
};

} // namespace

class TestThemeHelper : public QObject
{
    Q_OBJECT

public:
    explicit TestThemeHelper(const QString& address) : m_address(address) {}

private slots:
    void followsThePortal();

private:
    QString m_address;
};

void TestThemeHelper::followsThePortal()
{
    QDBusConnection bus = QDBusConnection::connectToBus(m_address, QStringLiteral("portal"));
    QVERIFY(bus.isConnected());
    Portal portal;
    QVERIFY(bus.registerVirtualObject(portalPath, &portal));
    QVERIFY(bus.registerService(portalService));

    QApplication::setPalette(ThemeHelper::palette(ThemeHelper::LightType));
    ThemeHelper* helper = ThemeHelper::instance();
    QCOMPARE(helper->themeType(), ThemeHelper::LightType); // the palette's, before the portal has answered
    QSignalSpy changes(helper, &ThemeHelper::themeTypeChanged);
    QTRY_COMPARE(helper->themeType(), ThemeHelper::DarkType);
    QCOMPARE(portal.calls, 1);

    struct Change {
        QString nameSpace;
        uint value;
        ThemeHelper::ColorType expected;
    };
    const QString appearance = QStringLiteral("org.freedesktop.appearance");
    const QList<Change> steps = {{appearance, 2, ThemeHelper::LightType},
                                 {appearance, 1, ThemeHelper::DarkType},
                                 {QStringLiteral("org.example.other"), 2, ThemeHelper::DarkType},
                                 {appearance, 0, ThemeHelper::LightType}, // no preference: the palette decides
                                 {appearance, 77, ThemeHelper::LightType},
                                 {appearance, 1, ThemeHelper::DarkType}};
    for (const Change& step : steps) {
        QDBusMessage signal =
            QDBusMessage::createSignal(portalPath, settingsInterface, QStringLiteral("SettingChanged"));
        signal << step.nameSpace << QStringLiteral("color-scheme") << QVariant::fromValue(QDBusVariant(step.value));
        QVERIFY(bus.send(signal));
        // What arrives in order can be waited for: when the last step's type is there, all were handled.
    }
    QTRY_COMPARE(changes.count(), 5);
    QList<int> seen;
    for (const QList<QVariant>& arguments : changes)
        seen.append(arguments.constFirst().toInt());
    QCOMPARE(seen, QList<int>({2, 1, 2, 1, 2}));
    QDBusConnection::disconnectFromBus(QStringLiteral("portal"));
}

int main(int argc, char** argv)
{
    QProcess daemon;
    daemon.start(QStringLiteral("dbus-daemon"),
                 {QStringLiteral("--session"), QStringLiteral("--nofork"), QStringLiteral("--print-address=1")});
    while (!daemon.canReadLine() && daemon.waitForReadyRead()) {
    }
    const QByteArray address = daemon.readLine().trimmed();
    qputenv("DBUS_SESSION_BUS_ADDRESS", address);
    int result = 1;
    {
        QApplication application(argc, argv);
        TestThemeHelper test(QString::fromLatin1(address));
        result = QTest::qExec(&test, argc, argv);
    }
    daemon.kill();
    daemon.waitForFinished();
    return result;
}

#include "test_themehelper.moc"
