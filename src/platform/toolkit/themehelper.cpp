// SPDX-License-Identifier: Apache-2.0
#include "themehelper.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusVariant>
#include <QGuiApplication>
#include <QMetaMethod>

#include <utility>

namespace
{

const QString kPortalService = QStringLiteral("org.freedesktop.portal.Desktop");
const QString kPortalPath = QStringLiteral("/org/freedesktop/portal/desktop");
const QString kSettingsInterface = QStringLiteral("org.freedesktop.portal.Settings");
const QString kAppearance = QStringLiteral("org.freedesktop.appearance");
const QString kColorSchemeKey = QStringLiteral("color-scheme");

ThemeHelper::ColorType paletteType()
{
    return QGuiApplication::palette().color(QPalette::Window).lightness() < 128 ? ThemeHelper::DarkType
                                                                                : ThemeHelper::LightType;
}

} // namespace

ThemeHelper::ThemeHelper()
{
    qRegisterMetaType<ThemeHelper::ColorType>();
}

ThemeHelper* ThemeHelper::instance()
{
    static ThemeHelper helper;
    return &helper;
}

ThemeHelper::ColorType ThemeHelper::themeType()
{
    watch();
    return m_type;
}

void ThemeHelper::connectNotify(const QMetaMethod& signal)
{
    if (signal == QMetaMethod::fromSignal(&ThemeHelper::themeTypeChanged))
        watch();
}

void ThemeHelper::watch()
{
    if (m_watching)
        return;
    m_watching = true;
    m_type = paletteType();
    connect(qGuiApp, &QGuiApplication::paletteChanged, this, &ThemeHelper::update);

    QDBusConnection bus = QDBusConnection::sessionBus();
    if (!bus.isConnected())
        return;
    // The match names no service: with one, the connection would ask the bus for its owner and wait.
    bus.connect(QString(), kPortalPath, kSettingsInterface, QStringLiteral("SettingChanged"), this,
                SLOT(onSettingChanged(QString, QString, QDBusVariant)));
    QDBusMessage read =
        QDBusMessage::createMethodCall(kPortalService, kPortalPath, kSettingsInterface, QStringLiteral("Read"));
    read << kAppearance << kColorSchemeKey;
    auto* watcher = new QDBusPendingCallWatcher(bus.asyncCall(read), this);
    connect(watcher, &QDBusPendingCallWatcher::finished, this, &ThemeHelper::onPortalAnswer);
}

void ThemeHelper::onPortalAnswer(QDBusPendingCallWatcher* watcher)
{
    watcher->deleteLater();
    // A desktop may have no portal, or one without this setting. The palette then decides.
    if (!watcher->isError() && !watcher->reply().arguments().isEmpty())
        setPortalType(watcher->reply().arguments().constFirst());
}

void ThemeHelper::onSettingChanged(const QString& nameSpace, const QString& key, const QDBusVariant& value)
{
    if (nameSpace == kAppearance && key == kColorSchemeKey)
        setPortalType(value.variant());
}

void ThemeHelper::setPortalType(const QVariant& colorScheme)
{
    QVariant value = colorScheme;
    // The portal's Read wraps the value twice, its signal once.
    while (value.userType() == qMetaTypeId<QDBusVariant>())
        value = value.value<QDBusVariant>().variant();
    switch (value.toUInt()) {
    case 1:
        m_portalType = DarkType;
        break;
    case 2:
        m_portalType = LightType;
        break;
    default:
        m_portalType = UnknownType;
    }
    update();
}

void ThemeHelper::update()
{
    const ColorType type = m_portalType == UnknownType ? paletteType() : m_portalType;
    if (std::exchange(m_type, type) != type)
        emit themeTypeChanged(type);
}

QPalette ThemeHelper::palette(ColorType type)
{
    const bool dark = type == DarkType;
    const QColor window = dark ? QColor(0x25, 0x27, 0x2a) : QColor(0xfa, 0xfa, 0xfb);
    const QColor text = dark ? QColor(0xf2, 0xf2, 0xf2) : QColor(Qt::black);
    const QColor button = dark ? QColor(0x38, 0x3b, 0x40) : QColor(0xf2, 0xf3, 0xf5);
    const QColor base = dark ? QColor(0x1c, 0x1e, 0x20) : QColor(Qt::white);
    const QColor muted = dark ? QColor(0xa0, 0xa4, 0xaa) : QColor(0x6a, 0x6d, 0x72);

    QPalette palette(text, button, button.lighter(120), button.darker(160), button.darker(120), text, Qt::white, base,
                     window);
    palette.setColor(QPalette::AlternateBase, window);
    palette.setColor(QPalette::Highlight, dark ? QColor(0x1f, 0x6f, 0xd6) : QColor(0x00, 0x67, 0xd6));
    palette.setColor(QPalette::HighlightedText, Qt::white);
    palette.setColor(QPalette::Link, dark ? QColor(0x6c, 0xb0, 0xff) : QColor(0x00, 0x67, 0xd6));
    palette.setColor(QPalette::LinkVisited, palette.color(QPalette::Link));
    palette.setColor(QPalette::ToolTipBase, base);
    palette.setColor(QPalette::ToolTipText, text);
    palette.setColor(QPalette::PlaceholderText, muted);
    for (const QPalette::ColorRole role : {QPalette::WindowText, QPalette::Text, QPalette::ButtonText})
        palette.setColor(QPalette::Disabled, role, muted);
    return palette;
}
