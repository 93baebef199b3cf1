// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>
#include <QPalette>

class QDBusPendingCallWatcher;
class QDBusVariant;

/**
 * Tells whether the desktop's theme is light or dark. It asks the desktop portal, else looks at the application's
 * palette. The session bus is not used before somebody asks or connects to the signal.
 */
class ThemeHelper : public QObject
{
    Q_OBJECT

public:
    enum ColorType { UnknownType = 0, LightType = 1, DarkType = 2 };
    Q_ENUM(ColorType)

    static ThemeHelper* instance();

    /// The theme as known now. Never waits: the portal's first answer arrives later, with the signal if it differs.
    ColorType themeType();

    /// A complete palette for a surface of the given kind (UnknownType counts as light), independent of the desktop's.
    static QPalette palette(ColorType type);

signals:
    void themeTypeChanged(ThemeHelper::ColorType type);

protected:
    void connectNotify(const QMetaMethod& signal) override;

private slots:
    void onSettingChanged(const QString& nameSpace, const QString& key, const QDBusVariant& value);

private:
    ThemeHelper();
    void watch();
    void onPortalAnswer(QDBusPendingCallWatcher* watcher);
    void setPortalType(const QVariant& colorScheme);
    void update();

    bool m_watching = false;
    ColorType m_portalType = UnknownType;
    ColorType m_type = UnknownType;
};
