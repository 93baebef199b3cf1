#include "screens.h"

#include <QApplication>
#include <QDesktopWidget>
#include <QScreen>
#include <QWidget>

#include <algorithm>

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

QList<QRect> all()
{
    QList<QRect> geometries;
    const QList<QScreen*> screens = QGuiApplication::screens();
    for (const QScreen* screen : screens)
        geometries.append(screen->geometry());
    return geometries;
}

QPoint bottomRight(const QRect& area, const QSize& window)
{
    return {area.width() - window.width(), area.height() - window.height()};
}

QPoint centre(const QRect& screen, const QSize& window)
{
    return {screen.width() / 2 - window.width() / 2, screen.height() / 2 - window.height() / 2};
}

bool showWhole(const QList<QRect>& screens, const QRect& window)
{
    return std::any_of(screens.begin(), screens.end(), [&](const QRect& screen) { return screen.contains(window); });
}

void placeBottomRight(QWidget& window, const QRect& area)
{
    window.move(bottomRight(area, window.size()));
}

void placeCentre(QWidget& window)
{
    window.move(centre(fullGeometry(), window.size()));
}

void watch(QObject* context, const std::function<void()>& react)
{
    const auto watchOne = [context, react](const QScreen* screen) {
        QObject::connect(screen, &QScreen::geometryChanged, context, react);
        QObject::connect(screen, &QScreen::availableGeometryChanged, context, react);
    };
    const QList<QScreen*> screens = QGuiApplication::screens();
    for (const QScreen* screen : screens)
        watchOne(screen);
    QObject::connect(qGuiApp, &QGuiApplication::screenAdded, context, watchOne);
    QObject::connect(qGuiApp, &QGuiApplication::primaryScreenChanged, context, react);
    // Queued: while the signal is out, the removed screen is still among the others.
    QObject::connect(qGuiApp, &QGuiApplication::screenRemoved, context, react, Qt::QueuedConnection);
}

} // namespace zent::screens
