// The theme helper against the room's session bus, with a settings portal that this test plays.

#include "themehelper.h"

#include <QApplication>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusVariant>
#include <QDBusVirtualObject>
#include <QSignalSpy>
#include <QtTest>

namespace
{

const QString portalPath = "/org/freedesktop/portal/desktop";
/// Answers Read as the portal does, with the value in a variant in a variant.
class Portal : public QDBusVirtualObject
{
public:
    int calls = 0;

    QString introspect(const QString&) const override { return {}; }
    bool handleMessage(const QDBusMessage& message, const QDBusConnection& connection) override
    {
        ++calls;
        const bool asked = message.member() == "Read" &&
                           message.arguments() == QVariantList{"org.freedesktop.appearance", "color-scheme"};
        const QVariant inner = QVariant::fromValue(QDBusVariant(1U));
        return connection.send(asked ? message.createReply(QVariant::fromValue(QDBusVariant(inner)))
                                     : message.createErrorReply(QDBusError::UnknownMethod, QString()));
    }
};

} // namespace

class TestThemeHelper : public QObject
{
    Q_OBJECT

private slots:
    void followsThePortal()
    {
        QDBusConnection bus = QDBusConnection::connectToBus(QDBusConnection::SessionBus, "portal");
        Portal portal;
        QVERIFY(bus.registerVirtualObject(portalPath, &portal));
        QVERIFY(bus.registerService("org.freedesktop.portal.Desktop"));

        QApplication::setPalette(ThemeHelper::palette(ThemeHelper::LightType));
        ThemeHelper* helper = ThemeHelper::instance();
        QCOMPARE(helper->themeType(), ThemeHelper::LightType); // the palette's, before the portal has answered
        QSignalSpy changes(helper, &ThemeHelper::themeTypeChanged);
        QTRY_COMPARE(helper->themeType(), ThemeHelper::DarkType);
        QCOMPARE(portal.calls, 1);

        // 0 is no preference and 77 no known value: the palette, which is light, decides then.
        const QString appearance = "org.freedesktop.appearance";
        const QList<QPair<QString, uint>> steps = {{appearance, 2}, {appearance, 1}, {"org.example.other", 2},
                                                   {appearance, 1}, {appearance, 0}, {appearance, 77},
                                                   {appearance, 1}};
        for (const auto& [nameSpace, value] : steps) {
            QDBusMessage signal =
                QDBusMessage::createSignal(portalPath, "org.freedesktop.portal.Settings", "SettingChanged");
            signal << nameSpace << "color-scheme" << QVariant::fromValue(QDBusVariant(value));
            QVERIFY(bus.send(signal));
        }
        // The answer to a later call comes behind all of them.
        const auto later = QDBusMessage::createMethodCall("org.freedesktop.portal.Desktop", portalPath, "", "Later");
        QDBusPendingCallWatcher answer(QDBusConnection::sessionBus().asyncCall(later));
        QSignalSpy answered(&answer, &QDBusPendingCallWatcher::finished);
        QVERIFY(answered.wait());
        QList<int> seen;
        for (const QList<QVariant>& arguments : changes)
            seen.append(arguments.constFirst().toInt());
        QCOMPARE(seen, QList<int>({2, 1, 2, 1, 2}));
        QDBusConnection::disconnectFromBus("portal");
    }
};

QTEST_MAIN(TestThemeHelper)
#include "test_themehelper.moc"
