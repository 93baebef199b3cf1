// The terminal's configuration, the scenes offered to the user and the one in force.

#include "mainwindow.h"

#include "filecontent.h"
#include "filewrite.h"
#include "gethttpheader.h"
#include "infowidget.h"
#include "legacyqt.h"
#include "noconfig.h"
#include "paths.h"
#include "replies.h"
#include "replywatch.h"
#include "toolkitmessagebox.h"
#include "urlquery.h"

#include <QDebug>
#include <QFile>
#include <QJsonObject>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QSignalBlocker>
#include <QTimer>

#include <cstdlib>

namespace
{

constexpr int kSceneTransferTimeoutMs = 30000;
constexpr int kSceneSwitchedBack = 3;
constexpr int kStartPolicy = -1;

const QString kScenesUrl = QStringLiteral("http://%1/api/client/area/scenes");

/// Opens a file that is known to be missing, so that it carries the error that the diagnostics name.
void provokeOpenError(QFile& file)
{
    file.open(QIODevice::ReadOnly | QIODevice::Text);
}

void showNoConfig(const QFile& file)
{
    ToolkitMessageBox(QMessageBox::Critical, zent::noconfig::kTitle,
                      zent::noconfig::text(file.fileName(), file.errorString()))
        .exec();
}

} // namespace

bool MainWindow::whetherJoinGuard()
{
    QFile file(zent::kUserinfoPath);
    if (file.exists())
        return true;
    provokeOpenError(file);
    zent::noconfig::describe(qInfo(), file);
    return false;
}

void MainWindow::getConfig()
{
    QFile file(zent::kUserinfoPath);
    if (!file.exists()) {
        provokeOpenError(file);
        zent::noconfig::describe(qInfo(), file);
        showNoConfig(file);
        std::_Exit(-1);
    }
    if (!file.open(QIODevice::ReadOnly | QIODevice::Text))
        return;
    QFile machineFile(zent::kMachineidPath);
    if (!machineFile.exists()) {
        qDebug() << "no machine.txt to use";
        return;
    }
    if (!machineFile.open(QIODevice::ReadOnly))
        return;
    // The server knows terminals by the whole content, a trailing line break included; only a NUL byte ends it.
    machineId = QString::fromUtf8(machineFile.readAll().constData());
    namespace infokey = zent::base::infokey;
    const QJsonObject object = zent::base::parseInfoObject(file.readAll()).value_or(QJsonObject());
    serverHost = object.value(infokey::kServerHost).toString();
    // Read as text here while the notification client reads a number: each serves one form of the file.
    serverPort = object.value(infokey::kServerPort).toString();
    isDomain = object.value(infokey::kIsDomain).toString();
    hostName = getHostName();
}

void MainWindow::getAllUserEnvironment()
{
    // Plain http whatever the file's protocol says: the scene service of the platform has no TLS port.
    const QUrl url =
        zent::withQuery(QUrl(kScenesUrl.arg(serverHost + QLatin1Char(':') + serverPort)),
                        {{QStringLiteral("machine_id"), machineId}, {QStringLiteral("username"), userName}});
    qDebug() << "getAllUserEnvironment"
             << "Url :" << url;
    QNetworkRequest request(url);
    request.setTransferTimeout(kSceneTransferTimeoutMs);
    const GetHttpHeader* version = GetHttpHeader::GetInstance();
    qDebug() << "getAllUserEnvironment"
             << " strVersion:" << version->header();
    version->apply(request);
    zent::watchReply(sceneManager->get(request));
}

void MainWindow::rcvEvninfoData(QNetworkReply* reply)
{
    reply->deleteLater();
    if (!zent::succeeded(reply)) {
        qDebug() << "get net reqruest failed!";
        emit scenesNotKnown();
        return;
    }
    QByteArray body = reply->readAll();
    if (analyseEvnData(&body) == 0)
        qDebug() << "rcvEvninfoData"
                 << "parse config.json file failed.";
    else
        qDebug() << "parse config.json file ok.";
}

int MainWindow::analyseEvnData(QByteArray* body)
{
    qDebug() << "analyseEvnData"
             << "@@@@@@@--------------scene info for combobox !";
    const auto reply = zent::parseSceneReply(*body);
    if (!reply.isGood())
        emit scenesNotKnown();
    if (reply.state == zent::ReplyState::NotJson)
        return 0;
    if (!reply.isGood()) {
        qDebug() << "@@@@@@@--------------analyseEvnData failed!";
        return 1;
    }
    QStringList names;
    // The list only grows: a second reply adds its scenes behind the first ones.
    for (const zent::Scene& scene : reply.value) {
        names.append(scene.name);
        sceneList.append({scene.name, scene.code});
    }
    if (names.size() == 1) {
        infoWidget->setSceneBox(false);
        fitToPanel();
    } else if (!names.isEmpty()) {
        offerScenes(names);
    }
    return 1;
}

void MainWindow::offerScenes(const QStringList& names)
{
    if (!sceneBoxReady) {
        infoWidget->setSceneBox(true);
        fitToPanel();
    }
    infoWidget->setSceneBoxData(names);
    if (sceneBoxReady)
        return;
    infoWidget->setCurrentScene(currentSceneIndex);
    sceneBoxReady = true;
    // Only from now on does a change of the box come from the user; filling it is not a choice.
    connect(infoWidget, &InfoWidget::environmentChanegd, this, &MainWindow::switchUserEvn, Qt::UniqueConnection);
}

int MainWindow::getEvncode(const QString& name)
{
    for (int i = 0; i < sceneList.size(); ++i) {
        if (sceneList.at(i).first == name)
            return i;
    }
    return -1;
}

void MainWindow::switchUserEvn()
{
    const int index = getEvncode(infoWidget->getCurrentScene());
    if (index < 0)
        return;
    const QString code = sceneList.at(index).second;
    qDebug() << "Switch to scene : " << code;
    currentSceneIndex = index;
    renewCurrentScene(code);
    callloadpolicy(index, code);
}

void MainWindow::reverseEvn()
{
    sceneState = kSceneSwitchedBack;
    // Going back is not a choice either: it must not reach the user's scene file.
    const QSignalBlocker blocker(infoWidget);
    infoWidget->setCurrentScene(currentSceneIndex);
}

void MainWindow::renewCurrentScene(const QString& scene)
{
    qDebug() << "renewCurrentScene : " << scene;
    zent::base::replaceFile(zent::kCurrentScenePath.arg(userName), scene.toUtf8());
}

void MainWindow::callloadpolicy(const int& kind, const QString&)
{
    qDebug() << "Call loadpolicy" << kind;
    const QString commandLine;
    qDebug() << "loadpolicy start :" << commandLine;
    zent::legacy::startDetached(commandLine);
}

void MainWindow::startPolicy()
{
    policyTimer->stop();
    callloadpolicy(kStartPolicy, zent::kStartScene);
}

QString MainWindow::readScriptsFile(const QString& path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) {
        qDebug() << "readScriptsFile"
                 << "read file path failed! " << path;
        return QString();
    }
    return QString::fromUtf8(file.readAll());
}
