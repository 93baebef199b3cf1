#include "screens.h"

#include <QApplication>
#include <QDesktopWidget>
#include <QScreen>
#include <QWidget>

namespace zent::screens
{

QRect availableGeometry()
{
    QT_WARNING_PUSH
    QT_WARNING_DISABLE_DEPRECATED
    return QApplication::desktop()->availableGeometry(-1);
    QT_WARNING_POP
}

QRect fullGeometry()
{
    const QScreen* screen = QGuiApplication::primaryScreen();
    return screen ? screen->geometry() : QRect();
}

QRect primaryAvailableGeometry()
{
    const QScreen* screen = QGuiApplication::primaryScreen();
    return screen ? screen->availableGeometry() : QRect();
}

void placeBottomRight(QWidget& window, const QRect& area)
{
    window.move(area.width() - window.width(), area.height() - window.height());
}

void placeCentre(QWidget& window)
{
    const QRect screen = fullGeometry();
    window.move(screen.width() / 2 - window.width() / 2, screen.height() / 2 - window.height() / 2);
}

} // namespace zent::screens
