// SPDX-License-Identifier: Apache-2.0
#include "windowmanagerhelper.h"

#include <KWindowEffects>
#include <QGuiApplication>
#include <QX11Info>

WindowManagerHelper* WindowManagerHelper::instance()
{
    static WindowManagerHelper helper;
    return &helper;
}

bool WindowManagerHelper::hasBlurWindow() const
{
    // The cheap question comes first: the effects library loads a plugin and asks the X server.
    return hasComposite() && KWindowEffects::isEffectAvailable(KWindowEffects::BlurBehind);
}

bool WindowManagerHelper::hasComposite() const
{
    if (QX11Info::isPlatformX11())
        return QX11Info::isCompositingManagerRunning();
    return QGuiApplication::platformName().startsWith(QLatin1String("wayland"));
}

void WindowManagerHelper::takePresentTime()
{
    if (!QX11Info::isPlatformX11())
        return;
    const auto now = static_cast<unsigned long>(QX11Info::getTimestamp());
    QX11Info::setAppTime(now);
    QX11Info::setAppUserTime(now);
}
