// SPDX-License-Identifier: Apache-2.0
#include "httprules.h"
#include "lookups.h"
#include "mainwindow/mainwindow.h"
#include "screen/screens.h"
#include "session/sessionhost.h"
#include "startup/exitlimit.h"
#include "startup/gates.h"
#include "startup/log.h"
#include "startup/sessionlocale.h"
#include "startup/signalquit.h"
#include "system/childprocess.h"
#include "toolkitapplication.h"

#include <QDebug>

#include <malloc.h>

namespace
{
// The version handed to the main window is fixed: this build serves desktops below 1030 only.
constexpr int kOsVersion = 1020;
/// The C library's own first value, in bytes.
constexpr int kOwnMappingFrom = 128 * 1024;
} // namespace

int main(int argc, char* argv[])
{
    zent::prepareDescriptorsForChildren();
    // Qt's threads for the buses and for HTTP allocate too little to be worth a heap of their own each.
    mallopt(M_ARENA_MAX, 1);
    // Large blocks keep their own mappings; otherwise the first large reply would move them into the heap, between
    // others.
    mallopt(M_MMAP_THRESHOLD, kOwnMappingFrom);
    zent::initLocale();
    zent::uOpenlog(zent::LEVEL_DEBUG);

    ExitLimit exitLimit;
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

    qDebug() << "main ----nosversion---:" << kOsVersion;
    zent::http::leaveOutBearers();
    SignalQuit signalQuit;
    MainWindow window(nullptr, kOsVersion);
    SessionHost sessionHost(window);
    ToolkitApplication::setQuitOnLastWindowClosed(false);
    window.setWindowFlags(Qt::Tool | Qt::FramelessWindowHint);
    zent::screens::placeBottomRight(window, zent::screens::availableGeometry());
    window.hide();
    const int status = ToolkitApplication::exec();
    // The application waits for look-ups when it is destroyed; checks for leaks, which come later, run in any other
    // case.
    if (zent::http::mayBeLookingUp())
        exitLimit.start(status);
    return status;
}
