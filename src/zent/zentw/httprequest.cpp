// SPDX-License-Identifier: Apache-2.0
#include "httprequest.h"

#include "fileconfig.h"
#include "filecontent.h"
#include "httpclientapi.h"
#include "httprules.h"
#include "paths.h"
#include "pcnamerules.h"
#include "urlquery.h"

#include <QDebug>
#include <QJsonDocument>

namespace
{

constexpr int kReplyTimeoutSeconds = 2;

const QString kCaCertPath = QStringLiteral("/apiauth/v1/client/ca_cert");
const QString kStatusPath = QStringLiteral("/uim/v3/client/status");
const QString kAuthPath = QStringLiteral("/uim/v3/client/auth");
const QString kJoinPath = QStringLiteral("/uim/v3/client/join");
const QString kRemovePath = QStringLiteral("/uim/v3/client/remove");
const QString kRemoveStatusPath = QStringLiteral("/uim/v3/client/remove_status");
const QString kDepartmentPath = QStringLiteral("/uim/v3/client/uim_department/id");
const QString kAccountPath = QStringLiteral("/uim/v3/client/account");
const QString kVerifyNamePath = QStringLiteral("/uim/v3/client/pc/verify/name");

const QString kMachineIdKey = QStringLiteral("machine_id");
const QString kUsernameKey = QStringLiteral("username");
const QString kPasswordKey = QStringLiteral("password");
const QString kMacKey = QStringLiteral("mac");
const QString kNameKey = QStringLiteral("name");

const QString kConfigFailed = QStringLiteral("域管服务配置失败，请重试");
const QString kRuleEmpty = QStringLiteral("服务端返回终端规则数据为空");
const QString kRuleInvalid = QStringLiteral("正则表达式不合法");
const QString kNameRefused = QStringLiteral("终端别名不符合正则安全规则!!");

/// The lines of the rule check carry the name of the server check; this is agreed and stays.
QMessageLogger ruleLog(int line)
{
    return QMessageLogger(__FILE__, line, "bool HttpRequest::checkTerminalByServer(const QString&, QString&)");
}

QString machineId()
{
    return zent::base::FileContent::instace()->getMachineID(nullptr, false);
}

QString jsonText(const QJsonObject& body)
{
    return QString::fromUtf8(QJsonDocument(body).toJson());
}

QString urlText(const QUrl& url)
{
    return url.toString(QUrl::FullyEncoded);
}

} // namespace

HttpRequest* HttpRequest::GetInstance()
{
    static HttpRequest instance;
    return &instance;
}

HttpRequest::HttpRequest() : m_client(new HttpClientApi(this, false))
{
    m_client->setReplyTimer(kReplyTimeoutSeconds);
    setSSLConfig(zent::kServerCertPath, zent::kPublicKeyPath, zent::kPrivateKeyPath);
}

void HttpRequest::setSSLConfig(const QString& ca, const QString& cert, const QString& key)
{
    m_client->setSSLConfig(ca, cert, key);
}

void HttpRequest::get(const QUrl& url, ResultSlot done)
{
    QString reply;
    const int status = m_client->getRequest(reply, urlText(url), QString(), true);
    (this->*done)(status, reply);
}

void HttpRequest::poll(const QUrl& url, const QString& body, ResultSlot done)
{
    QString reply;
    const int status = m_client->pollRequest(reply, urlText(url), body);
    (this->*done)(status, reply);
}

void HttpRequest::post(const QUrl& url, const QJsonObject& body, ResultSlot done)
{
    QString reply;
    const int status = m_client->postRequest(reply, urlText(url), jsonText(body), true);
    (this->*done)(status, reply);
}

void HttpRequest::getCaCert(const QString& host, const QString& port)
{
    m_certHost = host;
    m_certPort = port;
    QUrl url;
    url.setScheme(QStringLiteral("https"));
    url.setHost(host);
    url.setPort(port.toInt());
    url.setPath(kCaCertPath);
    get(url, &HttpRequest::onCaCert);
}

void HttpRequest::getMacheineCheck(MachineState state, const QString& username)
{
    const QUrl url = FileConfig::GetInstance()->getDomainUrl(kStatusPath);
    const zent::QueryItem machine{kMachineIdKey, machineId()};
    const zent::QueryItem user{kUsernameKey, username};
    const QString keyword = QStringLiteral("keyword");
    switch (state) {
    case MachineState::Join:
        return get(zent::withQuery(url, {machine, {keyword, QStringLiteral("join")}, user}),
                   &HttpRequest::onMacheineCheck);
    case MachineState::Remove:
        return get(zent::withQuery(url, {machine, {keyword, QStringLiteral("remove")}, user}),
                   &HttpRequest::onMacheineCheck);
    }
    get(zent::withQuery(url, {machine, user}), &HttpRequest::onMacheineCheck);
}

void HttpRequest::postCheckAccountPwd(const QString& username, const QString& password)
{
    post(FileConfig::GetInstance()->getDomainUrl(kAuthPath), {{kUsernameKey, username}, {kPasswordKey, password}},
         &HttpRequest::onCheckAccountPwd);
}

void HttpRequest::postJoinControl(const QString& username)
{
    const FileConfig* config = FileConfig::GetInstance();
    post(config->getDomainUrl(kJoinPath),
         {{kMachineIdKey, machineId()},
          {kNameKey, config->readTerminalName()},
          {kUsernameKey, username},
          {kMacKey, config->getMacAddress()}},
         &HttpRequest::onJoinControl);
}

void HttpRequest::postQuitControl(const QString& username)
{
    const FileConfig* config = FileConfig::GetInstance();
    post(config->getServerUrl(kRemovePath),
         {{kMachineIdKey, machineId()}, {kUsernameKey, username}, {kMacKey, config->getMacAddress()}},
         &HttpRequest::onQuitControl);
}

void HttpRequest::postRemoveStatus(const QString& username, const QString& password)
{
    post(FileConfig::GetInstance()->getServerUrl(kRemoveStatusPath),
         {{kUsernameKey, username}, {kPasswordKey, password}, {kMachineIdKey, machineId()}},
         &HttpRequest::onRemoveStatus);
}

void HttpRequest::getCompanyName()
{
    const QUrl url = zent::withQuery(FileConfig::GetInstance()->getServerUrl(kDepartmentPath),
                                     {{QStringLiteral("id"), QStringLiteral("1")}});
    poll(url, QString(), &HttpRequest::onCompanyName);
}

void HttpRequest::getUserInfo(const QString& username)
{
    const QJsonObject body{{kUsernameKey, username}, {kMachineIdKey, machineId()}};
    poll(FileConfig::GetInstance()->getServerUrl(kAccountPath), jsonText(body), &HttpRequest::onUserInfo);
}

bool HttpRequest::checkTerminalByServer(const QString& name, QString& message)
{
    const QUrl url =
        zent::withQuery(FileConfig::GetInstance()->getDomainUrl(kVerifyNamePath), {{QStringLiteral("pc_name"), name}});
    qDebug() << "url===" << url;
    QString reply;
    const int status = m_client->getRequest(reply, urlText(url), QString(), true);
    qDebug() << "check pc name result:" << status;

    const auto verdict = zent::parsePcNameVerdict(reply.toUtf8());
    if (status != zent::http::kOk || !verdict) {
        message = kConfigFailed;
        return false;
    }
    message = verdict->message;
    return verdict->accepted;
}

bool HttpRequest::checkPcName(const QString& name, QString& message)
{
    const QString url = zent::KPCRegular.arg(m_certHost, m_certPort);
    ruleLog(__LINE__).debug() << "------regularUrl-----:" << url;
    QString reply;
    const int status = m_client->getRequest(reply, url, QString(), true);
    ruleLog(__LINE__).debug() << "------initSshPort-------msg:" << reply << "code:" << status;

    const zent::PcNameRule rule = zent::parsePcNameRule(reply.toUtf8());
    if (rule.state == zent::PcNameRule::State::NotJson)
        ruleLog(__LINE__).warning() << "invalid reply data, parse error: " << rule.parseError;
    if (status != zent::http::kOk || rule.state == zent::PcNameRule::State::NotJson ||
        rule.state == zent::PcNameRule::State::Refused) {
        message = kConfigFailed;
        return false;
    }
    if (rule.state == zent::PcNameRule::State::Missing) {
        message = kRuleEmpty;
        return false;
    }
    if (rule.expression.isEmpty())
        return checkTerminalByServer(name, message);
    return matchesRule(zent::withoutSlashes(rule.expression), name, message);
}

bool HttpRequest::matchesRule(const QString& rule, const QString& name, QString& message)
{
    if (rule.isEmpty())
        return false;
    ruleLog(__LINE__).debug() << "terminal Name Regular " << rule;
    const zent::PcNameMatch match = zent::matchPcName(rule, name);
    if (!match.validRule) {
        message = kRuleInvalid;
        return false;
    }
    if (match.found)
        ruleLog(__LINE__).debug() << "满足部分==" << match.text;
    if (!match.whole)
        message = kNameRefused;
    return match.whole;
}

void HttpRequest::onCaCert(const int& statusCode, const QString& data)
{
    emit sigCaCert(statusCode, data);
}

void HttpRequest::onMacheineCheck(const int& statusCode, const QString& data)
{
    emit sigMacheineCheck(statusCode, data);
}

void HttpRequest::onCheckAccountPwd(const int& statusCode, const QString& data)
{
    emit sigCheckAccountPwd(statusCode, data);
}

void HttpRequest::onJoinControl(const int& statusCode, const QString& data)
{
    emit sigJoinControl(statusCode, data);
}

void HttpRequest::onQuitControl(const int& statusCode, const QString& data)
{
    emit sigQuitControl(statusCode, data);
}

void HttpRequest::onRemoveStatus(const int& statusCode, const QString& data)
{
    emit sigRemoveStatus(statusCode, data);
}

void HttpRequest::onCompanyName(const int& statusCode, const QString& data)
{
    emit sigCompanyName(statusCode, data);
}

void HttpRequest::onUserInfo(const int& statusCode, const QString& data)
{
    emit sigUserInfo(statusCode, data);
}
