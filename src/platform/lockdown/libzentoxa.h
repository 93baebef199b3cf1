// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QStringList>

class QVariant;

/**
 * What a managed desktop lets its user do. Each setting is a key of the GSettings schema com.vantor.zent.lockdown.
 *
 * Every setter has stored its value for all processes when it returns. It returns false and changes nothing when the
 * schema is not installed or lacks the setting, or when the value is locked. Each object warns once of a missing
 * schema.
 */
class Libzentoxa
{
public:
    Libzentoxa();

    /// Control centre modules to show and to hide, by their names. False when either list could not be stored.
    bool SetControlConfig(const QStringList& shown, const QStringList& hidden);
    /// Sharing the network connection as a wireless hotspot: 0 forbidden, 1 allowed.
    bool SetHotspotEnable(int enable);
    bool SetShortcutKeyEnable(bool enable);
    bool SetLauncherDisplayable(bool displayable);
    bool SetTaskbarRightclickMenuEnable(bool enable);
    /// Applications that stay in the taskbar while they are not running.
    bool SetResidentTaskbarAppDisplayable(bool displayable);
    bool SetRecycleBinDisplayable(bool displayable);
    /// The tray icon of the network.
    bool SetWebTrayIconClickable(bool clickable);
    /// The tray icon of removable devices.
    bool SetUsbTrayIconClickable(bool clickable);

private:
    bool set(const char* key, const QVariant& value);

    bool m_installed;
};
