// The theme helper against the room's session bus, with a settings portal that this test plays.

#include "themehelper.h"

#include <QApplication>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusVariant>
#include <QDBusVirtualObject>
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

private slots:
    void followsThePortal();
};

void TestThemeHelper::followsThePortal()
{
    QDBusConnection bus = QDBusConnection::connectToBus(QDBusConnection::SessionBus, QStringLiteral("portal"));
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
    };
    const QString appearance = QStringLiteral("org.freedesktop.appearance");
    // 0 is no preference and 77 no known value: the palette, which is light, decides then.
    const QList<Change> steps = {{appearance, 2}, {appearance, 1},  {QStringLiteral("org.example.other"), 2},
                                 {appearance, 0}, {appearance, 77}, {appearance, 1}};
    for (const Change& step : steps) {
        QDBusMessage signal =
            QDBusMessage::createSignal(portalPath, settingsInterface, QStringLiteral("SettingChanged"));
        signal << step.nameSpace << QStringLiteral("color-scheme") << QVariant::fromValue(QDBusVariant(step.value));
        QVERIFY(bus.send(signal));
    }
    QTRY_COMPARE(changes.count(), 5);
    QList<int> seen;
    for (const QList<QVariant>& arguments : changes)
        seen.append(arguments.constFirst().toInt());
    QCOMPARE(seen, QList<int>({2, 1, 2, 1, 2}));
    QDBusConnection::disconnectFromBus(QStringLiteral("portal"));
}

QTEST_MAIN(TestThemeHelper)
#include "test_themehelper.moc"
