// The two pages of the panel, filled from the network daemon and from what the server said.

#include "mainwindow.h"

#include "activeconnections.h"
#include "infowidget.h"
#include "networkdaemonproxy.h"
#include "records.h"

#include <QDebug>

namespace
{

constexpr int kLoginPage = 0;
constexpr int kNetworkPage = 1;

} // namespace

void MainWindow::onLogininfoClicked()
{
    infoPage = kLoginPage;
    toLogininfo();
}

void MainWindow::onNetinfoClicked()
{
    infoPage = kNetworkPage;
    toNetinfo();
}

void MainWindow::toLogininfo()
{
    updateNetInfo();
}

void MainWindow::toNetinfo()
{
    updateNetInfo();
}

void MainWindow::updateNetInfo()
{
    const std::optional<QString> answer = networkProxy->activeConnectionInfo();
    const auto array = zent::parseConnectionArray(answer.value_or(QString()).toLocal8Bit());
    // Without an answer both pages keep what they show.
    if (!array) {
        if (answer)
            qWarning() << "GetActiveConnectionInfo gave no list of connections";
        return;
    }
    if (infoPage == kLoginPage) {
        infoWidget->setLoginInfo({clientName, organizationName, gecosName, gecosLast, QString(), groupName});
        return;
    }
    if (infoPage != kNetworkPage)
        return;
    TNetInfo info;
    info.hostName = hostName;
    info.userName = userName;
    qDebug() << "updateNetInfo"
             << "array----:" << *array;
    // A later primary connection overwrites an earlier one.
    for (const zent::ActiveConnection& connection : zent::activeConnections(*array)) {
        if (!connection.primary)
            continue;
        qDebug() << "updateNetInfo"
                 << "array--2@@@--:" << connection.hwAddress;
        info.mac = connection.hwAddress;
        info.ipv4 = connection.address;
        info.gateway = connection.gateway;
        info.dns = connection.dns;
        info.subnetMask = connection.mask;
        info.speed = connection.speed;
    }
    infoWidget->setNetInfo(info);
}
