// Who is logged in: user, organisation and area information from the management server.

#include "mainwindow.h"

#include "httprequest.h"
#include "idcommand.h"
#include "infowidget.h"
#include "loginname.h"
#include "replies.h"

#include <QDebug>
#include <QNetworkReply>
#include <QTimer>

namespace
{

constexpr int kHttpOk = 200;
constexpr int kRefreshEarliestMs = 600000;
constexpr int kRefreshLatestMs = 900000;

int httpStatus(const QNetworkReply* reply)
{
    return reply->attribute(QNetworkRequest::HttpStatusCodeAttribute).toInt();
}

} // namespace

bool MainWindow::isScenceUser()
{
    qDebug() << "ScenceUsername :" << scenceUserName;
    return !scenceUserName.isEmpty();
}

bool MainWindow::isAdminUser()
{
    const auto command = startedId ? std::move(startedId) : std::make_unique<IdCommand>();
    const QString output = command->output();
    return output.contains(QLatin1String("sudo")) && output.contains(QLatin1String("zent"));
}

bool MainWindow::isLdapUser()
{
    return true;
}

void MainWindow::getusrInfo()
{
    HttpRequest::GetInstance()->getUserInfo(sessionLoginName().remove(QLatin1Char('@')));
}

void MainWindow::onUserInfo(const int& statusCode, const QString& data)
{
    // The body decides; the server answers good data with other status codes, too.
    const auto reply = zent::parseUserReply(data.toUtf8());
    if (!reply.isGood()) {
        qInfo() << "analyseData getusrInfo failed!" << statusCode;
        return;
    }
    storeUserData(reply.value);
    userInfoTimer->stop();
    onLogininfoClicked();
}

void MainWindow::storeUserData(const zent::UserData& data)
{
    gecosName = data.gecosFirst;
    gecosLast = data.gecosLast;
    groupName = data.groupName;
    userId = data.id;
    clientName = data.clientName;
}

void MainWindow::analysejson(QNetworkReply* reply)
{
    reply->deleteLater();
    if (httpStatus(reply) != kHttpOk) {
        qInfo() << "获取用户信息失败";
        return;
    }
    QByteArray body = reply->readAll();
    if (analyseData(&body) == 0) {
        qDebug() << "analysejson"
                 << "parse config.json file failed.";
        return;
    }
    userInfoTimer->start(generateRandnum(kRefreshLatestMs, kRefreshEarliestMs));
    qDebug() << "parse config.json file ok.";
}

int MainWindow::analyseData(QByteArray* body)
{
    qDebug() << "analyseData"
             << "---getuserinfo---";
    const auto reply = zent::parseUserReply(*body);
    if (!reply.isGood()) {
        if (reply.state == zent::ReplyState::Failed)
            qDebug() << "analyseData getusrInfo failed!";
        return 0;
    }
    storeUserData(reply.value);
    qDebug() << "user_obj[ permissions ].toObject() " << reply.value.permissions;
    qDebug() << gecosName << gecosLast << groupName << clientName << userId;
    onLogininfoClicked();
    return 1;
}

void MainWindow::getAreaInfo()
{
    HttpRequest::GetInstance()->getCompanyName();
}

void MainWindow::onCompanyName(const int& statusCode, const QString& data)
{
    const auto reply = zent::parseOrganisationReply(data.toUtf8());
    if (!reply.isGood()) {
        qInfo() << "getCompanyName failed!" << statusCode;
        return;
    }
    areaInfoTimer->stop();
    organizationName = reply.value;
    onLogininfoClicked();
    onNetinfoClicked();
}

void MainWindow::rcvAreainfoData(QNetworkReply* reply)
{
    reply->deleteLater();
    qDebug() << "rcvAreainfoData"
             << "############-------" << reply->url();
    if (httpStatus(reply) != kHttpOk) {
        qDebug() << "get net reqruest failed!";
        infoWidget->setSceneBox(false);
        fitToPanel();
        return;
    }
    QByteArray body = reply->readAll();
    if (analyseAreaData(&body) == 0) {
        qDebug() << "rcvAreainfoData"
                 << "parse config.json file failed.";
        return;
    }
    areaInfoTimer->start(generateRandnum(kRefreshLatestMs, kRefreshEarliestMs));
    qDebug() << "parse config.json file ok.";
}

int MainWindow::analyseAreaData(QByteArray* body)
{
    qDebug() << "analyseAreaData"
             << "----------data:" << *body;
    const auto reply = zent::parseAreaReply(*body);
    if (reply.state == zent::ReplyState::NotJson)
        return 0;
    if (!reply.isGood()) {
        qDebug() << "getareaInfo failed!";
        return 1;
    }
    organizationName = reply.value;
    onLogininfoClicked();
    onNetinfoClicked();
    getAllUserEnvironment();
    qDebug() << "getareaInfo succeeded!";
    return 1;
}
