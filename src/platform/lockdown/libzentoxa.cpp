// SPDX-License-Identifier: Apache-2.0
#include "libzentoxa.h"

#include <QDebug>
#include <QGSettings>
#include <QVariant>

namespace
{

const char* const kSchema = "com.vantor.zent.lockdown";

} // namespace

Libzentoxa::Libzentoxa() : m_installed(QGSettings::isSchemaInstalled(kSchema))
{
    if (!m_installed)
        qWarning() << "settings schema is not installed, the desktop stays as it is:" << kSchema;
}

bool Libzentoxa::SetControlConfig(const QStringList& shown, const QStringList& hidden)
{
    const bool shownStored = set("controlCenterShown", shown);
    return set("controlCenterHidden", hidden) && shownStored;
}

bool Libzentoxa::SetHotspotEnable(int enable)
{
    return set("hotspotEnable", enable);
}

bool Libzentoxa::SetShortcutKeyEnable(bool enable)
{
    return set("shortcutKeyEnable", enable);
}

bool Libzentoxa::SetLauncherDisplayable(bool displayable)
{
    return set("launcherDisplayable", displayable);
}

bool Libzentoxa::SetTaskbarRightclickMenuEnable(bool enable)
{
    return set("taskbarRightclickMenuEnable", enable);
}

bool Libzentoxa::SetResidentTaskbarAppDisplayable(bool displayable)
{
    return set("residentTaskbarAppDisplayable", displayable);
}

bool Libzentoxa::SetRecycleBinDisplayable(bool displayable)
{
    return set("recycleBinDisplayable", displayable);
}

bool Libzentoxa::SetWebTrayIconClickable(bool clickable)
{
    return set("webTrayIconClickable", clickable);
}

bool Libzentoxa::SetUsbTrayIconClickable(bool clickable)
{
    return set("usbTrayIconClickable", clickable);
}

bool Libzentoxa::set(const char* key, const QVariant& value)
{
    // QGSettings aborts the process over a schema or a key that does not exist.
    if (!m_installed)
        return false;
    // For this one value only: the destructor of QGSettings waits until what was set has been written.
    QGSettings settings(kSchema);
    // In camel case, where the schema has dashes.
    const QString name = QString::fromLatin1(key);
    if (!settings.keys().contains(name))
        return false;
    if (settings.trySet(name, value))
        return true;
    qWarning() << "setting cannot be changed:" << kSchema << key << value;
    return false;
}
