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
    // The cheap question first: the effects library loads a plugin and talks to the X server.
    return hasComposite() && KWindowEffects::isEffectAvailable(KWindowEffects::BlurBehind);
}

bool WindowManagerHelper::hasComposite() const
{
    if (QX11Info::isPlatformX11())
        return QX11Info::isCompositingManagerRunning();
    return QGuiApplication::platformName().startsWith(QLatin1String("wayland"));
}
