// SPDX-License-Identifier: Apache-2.0
#include "screen/showwindow.h"

#include "windowmanagerhelper.h"

#include <KWindowSystem>
#include <QWidget>
#include <QX11Info>

namespace zent
{

void showActive(QWidget& window)
{
    WindowManagerHelper::takePresentTime();
    if (QX11Info::isPlatformX11()) {
        // Some task bars list tool windows unless told not to; a window manager forgets it when the window hides.
        if (window.windowType() == Qt::Tool)
            KWindowSystem::setState(window.winId(), NET::SkipTaskbar | NET::SkipPager);
    }
    // A window that is not on the screen cannot be activated.
    window.show();
    window.raise();
    window.activateWindow();
}

} // namespace zent
