// SPDX-License-Identifier: Apache-2.0
#include "account/account.h"

#include "httprequest.h"
#include "httprules.h"
#include "replies/replies.h"
#include "system/idcommand.h"
#include "system/loginname.h"

#include <QDebug>
#include <QNetworkAccessManager>
#include <QNetworkReply>

namespace
{

constexpr int kUserInfoIntervalMs = 2000;
constexpr int kAreaInfoIntervalMs = 3000;
constexpr int kRefreshEarliestMs = 600000;
constexpr int kRefreshLatestMs = 900000;

} // namespace

Account::Account(QObject* parent, zent::RandomInterval random)
    : QObject(parent), m_random(std::move(random)), startedId(std::make_unique<IdCommand>())
{
}

Account::~Account() = default;

bool Account::getUserName()
{
    const QString name = sessionLoginName().remove(QLatin1Char('@'));
    qDebug() << "getusername:" << name;
    if (isLdapUser()) {
        userName = name;
        qDebug() << "userName:" << userName;
    }
    qDebug() << "username got :" << userName;
    return isLdapUser();
}

void Account::start()
{
    userManager = new QNetworkAccessManager(this);
    areaManager = new QNetworkAccessManager(this);
    connect(userManager, &QNetworkAccessManager::finished, this, &Account::analysejson);
    connect(areaManager, &QNetworkAccessManager::finished, this, &Account::rcvAreainfoData);
    const HttpRequest* client = HttpRequest::GetInstance();
    connect(client, &HttpRequest::sigUserInfo, this, &Account::onUserInfo);
    connect(client, &HttpRequest::sigCompanyName, this, &Account::onCompanyName);
    connect(&userInfoTimer, &QTimer::timeout, this, &Account::getusrInfo);
    userInfoTimer.start(kUserInfoIntervalMs);
    connect(&areaInfoTimer, &QTimer::timeout, this, &Account::getAreaInfo);
    areaInfoTimer.start(kAreaInfoIntervalMs);
}

TLoginInfo Account::loginInfo() const
{
    return {clientName, organizationName, gecosName, gecosLast, QString(), groupName};
}

bool Account::isScenceUser() const
{
    qDebug() << "ScenceUsername :" << scenceUserName;
    return !scenceUserName.isEmpty();
}

bool Account::isAdminUser()
{
    const auto command = startedId ? std::move(startedId) : std::make_unique<IdCommand>();
    const QString output = command->output();
    return output.contains(QLatin1String("sudo")) && output.contains(QLatin1String("zent"));
}

bool Account::isLdapUser()
{
    return true;
}

void Account::getusrInfo()
{
    HttpRequest::GetInstance()->getUserInfo(sessionLoginName().remove(QLatin1Char('@')));
}

void Account::onUserInfo(const int& statusCode, const QString& data)
{
    // The body alone decides, whatever the status, as agreed.
    const auto reply = zent::parseUserReply(data.toUtf8());
    if (!reply.isGood()) {
        qInfo() << "analyseData getusrInfo failed!" << statusCode;
        return;
    }
    storeUserData(reply.value);
    userInfoTimer.stop();
    emit userChanged();
}

void Account::storeUserData(const zent::UserData& data)
{
    gecosName = data.gecosFirst;
    gecosLast = data.gecosLast;
    groupName = data.groupName;
    userId = data.id;
    clientName = data.clientName;
}

void Account::analysejson(QNetworkReply* reply)
{
    reply->deleteLater();
    if (zent::http::statusOf(reply) != zent::http::kOk) {
        qInfo() << "获取用户信息失败";
        return;
    }
    QByteArray body = reply->readAll();
    if (analyseData(&body) == 0) {
        qDebug() << "analysejson parse config.json file failed.";
        return;
    }
    userInfoTimer.start(m_random(kRefreshLatestMs, kRefreshEarliestMs));
    qDebug() << "parse config.json file ok.";
}

int Account::analyseData(QByteArray* body)
{
    qDebug() << "analyseData ---getuserinfo---";
    const auto reply = zent::parseUserReply(*body);
    if (!reply.isGood()) {
        if (reply.state == zent::ReplyState::Failed)
            qDebug() << "analyseData getusrInfo failed!";
        return 0;
    }
    storeUserData(reply.value);
    qDebug() << "user_obj[ permissions ].toObject() " << reply.value.permissions;
    qDebug() << gecosName << gecosLast << groupName << clientName << userId;
    emit userChanged();
    return 1;
}

void Account::getAreaInfo()
{
    HttpRequest::GetInstance()->getCompanyName();
}

void Account::onCompanyName(const int& statusCode, const QString& data)
{
    const auto reply = zent::parseOrganisationReply(data.toUtf8());
    if (!reply.isGood()) {
        qInfo() << "getCompanyName failed!" << statusCode;
        return;
    }
    areaInfoTimer.stop();
    organizationName = reply.value;
    emit organisationChanged();
}

void Account::rcvAreainfoData(QNetworkReply* reply)
{
    reply->deleteLater();
    qDebug() << "rcvAreainfoData ############-------" << reply->url();
    if (zent::http::statusOf(reply) != zent::http::kOk) {
        qDebug() << "get net reqruest failed!";
        emit areaFailed();
        return;
    }
    QByteArray body = reply->readAll();
    if (analyseAreaData(&body) == 0) {
        qDebug() << "rcvAreainfoData parse config.json file failed.";
        return;
    }
    areaInfoTimer.start(m_random(kRefreshLatestMs, kRefreshEarliestMs));
    qDebug() << "parse config.json file ok.";
}

int Account::analyseAreaData(QByteArray* body)
{
    qDebug() << "analyseAreaData ----------data:" << *body;
    const auto reply = zent::parseAreaReply(*body);
    if (reply.state == zent::ReplyState::NotJson)
        return 0;
    if (!reply.isGood()) {
        qDebug() << "getareaInfo failed!";
        return 1;
    }
    organizationName = reply.value;
    emit organisationChanged();
    emit areaKnown();
    qDebug() << "getareaInfo succeeded!";
    return 1;
}
