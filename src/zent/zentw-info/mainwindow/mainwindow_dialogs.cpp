// The dialogs that the panel's links open. Each is made on first use and kept.

#include "mainwindow.h"

#include "closeguarddialog.h"
#include "modifydialog.h"
#include "replies.h"
#include "screens.h"

void MainWindow::onCloseguardClicked()
{
    if (!guardDialog)
        guardDialog = new closeGuarddialog(this);
    guardDialog->setUsrname(userName);
    guardDialog->setScencelist(sceneList.size());
    zent::screens::placeCentre(*guardDialog);
    // A connection more on every call, as the dialog's users expect.
    connect(guardDialog, &closeGuarddialog::closeall, this, &MainWindow::shutdown);
    guardDialog->show();
}

void MainWindow::onModifypasswordClicked()
{
    if (!modifyDialog)
        modifyDialog = new ModifyDialog(this);
    const bool sceneKnown = currentSceneIndex >= 0 && currentSceneIndex < sceneList.size();
    modifyDialog->setUserName(userName, sceneKnown ? sceneList.at(currentSceneIndex).second : zent::kStartScene);
    modifyDialog->setIpport(serverHost + QLatin1Char(':') + serverPort);
    modifyDialog->setMachineId(machineId);
    modifyDialog->setUserID(userId);
    zent::screens::placeCentre(*modifyDialog);
    modifyDialog->show();
}
