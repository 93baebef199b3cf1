#include "gates.h"
#include "heap.h"
#include "log.h"
#include "mainwindow.h"
#include "screens.h"
#include "sessionhost.h"
#include "sessionlocale.h"
#include "signalquit.h"
#include "toolkitapplication.h"

#include <QDebug>

namespace
{
// The version handed to the main window is fixed: this build serves desktops below 1030 only.
constexpr int kOsVersion = 1020;
} // namespace

int main(int argc, char* argv[])
{
    zent::boundHeap();
    zent::initLocale();
    zent::uOpenlog(zent::LEVEL_DEBUG);
    // Qt's bearer thread would otherwise wake up every ten seconds for as long as the client runs.
    qputenv("QT_BEARER_POLL_TIMEOUT", "2147483647");

    ToolkitApplication::loadPlatformPlugin();
    ToolkitApplication application(argc, argv);
    ToolkitApplication::setApplicationName(QStringLiteral("域管平台"));
    if (!application.setSingleInstance(QStringLiteral("zent-info"))) {
        qInfo() << "another instance running!";
        return 0;
    }
    if (!isDomain())
        return 0;
    if (!isLDAPUser())
        return 0;

    qDebug() << "main"
             << "----nosversion---:" << kOsVersion;
    SignalQuit signalQuit;
    MainWindow window(nullptr, kOsVersion);
    SessionHost sessionHost(window);
    ToolkitApplication::setQuitOnLastWindowClosed(false);
    window.setWindowFlags(Qt::Tool | Qt::FramelessWindowHint);
    zent::screens::placeBottomRight(window, zent::screens::availableGeometry());
    window.hide();
    return ToolkitApplication::exec();
}
