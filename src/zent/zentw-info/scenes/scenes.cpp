// SPDX-License-Identifier: Apache-2.0
#include "scenes/scenes.h"

#include "filewrite.h"
#include "gethttpheader.h"
#include "httprules.h"
#include "paths.h"
#include "replies/replies.h"
#include "replywatch.h"
#include "system/childprocess.h"
#include "urlquery.h"

#include <QDebug>
#include <QNetworkAccessManager>
#include <QNetworkReply>

namespace
{

/// When scenes that did not come are asked for again: about as often as the unread messages.
constexpr int kScenesAgainEarliestMs = 60000;
constexpr int kScenesAgainLatestMs = 180000;
constexpr int kPolicyEarliestMs = 30000;
constexpr int kPolicyLatestMs = 60000;
constexpr int kFirstClientError = 400;
constexpr int kFirstServerError = 500;
constexpr int kSceneSwitchedBack = 3;
constexpr int kStartPolicy = -1;

const QString kScenesUrl = QStringLiteral("http://%1/api/client/area/scenes");

/// Whether the answer would be the same if it were asked for again.
bool isDefinite(const QNetworkReply& reply, int status, const QByteArray& body)
{
    if (status >= kFirstClientError)
        return status < kFirstServerError;
    return reply.error() == QNetworkReply::NoError && zent::hasCode(body);
}

} // namespace

Scenes::Scenes(const zent::Terminal& terminal, const QString& userName, QObject* parent, zent::RandomInterval random)
    : QObject(parent), m_terminal(terminal), m_userName(userName), m_random(std::move(random))
{
    connect(&policyTimer, &QTimer::timeout, this, &Scenes::startPolicy);
    policyTimer.start(m_random(kPolicyLatestMs, kPolicyEarliestMs));
    scenesAgain.setObjectName(QStringLiteral("scenesAgain"));
    scenesAgain.setSingleShot(true);
    connect(&scenesAgain, &QTimer::timeout, this, &Scenes::getAllUserEnvironment);
}

void Scenes::start()
{
    sceneManager = new QNetworkAccessManager(this);
    connect(sceneManager, &QNetworkAccessManager::finished, this, &Scenes::rcvEvninfoData);
}

QString Scenes::currentCode() const
{
    return currentSceneIndex < sceneList.size() ? sceneList.at(currentSceneIndex).second : zent::kStartScene;
}

void Scenes::getAllUserEnvironment()
{
    // Plain http whatever protocol the file names, as agreed.
    const QUrl url = zent::withQuery(
        QUrl(kScenesUrl.arg(m_terminal.server())),
        {{QStringLiteral("machine_id"), m_terminal.machineId}, {QStringLiteral("username"), m_userName}});
    qDebug() << "getAllUserEnvironment Url :" << url;
    QNetworkRequest request = zent::http::makeRequest(url);
    const GetHttpHeader* version = GetHttpHeader::GetInstance();
    qDebug() << "getAllUserEnvironment  strVersion:" << version->header();
    version->apply(request);
    zent::watchReply(sceneManager->get(request));
}

void Scenes::rcvEvninfoData(QNetworkReply* reply)
{
    reply->deleteLater();
    const int status = zent::http::statusOf(reply);
    // Closed where it was aborted, as too large.
    QByteArray body = reply->isOpen() ? reply->readAll() : QByteArray();
    if (!isDefinite(*reply, status, body))
        scenesAgain.start(m_random(kScenesAgainLatestMs, kScenesAgainEarliestMs));
    if (status != zent::http::kOk) {
        qDebug() << "get net reqruest failed!";
        return;
    }
    if (analyseEvnData(&body) == 0)
        qDebug() << "rcvEvninfoData parse config.json file failed.";
    else
        qDebug() << "parse config.json file ok.";
}

int Scenes::analyseEvnData(QByteArray* body)
{
    qDebug() << "analyseEvnData @@@@@@@--------------scene info for combobox !";
    const auto reply = zent::parseSceneReply(*body);
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
        emit choiceChanged(false);
    } else if (!names.isEmpty()) {
        offerScenes(names);
    }
    return 1;
}

void Scenes::offerScenes(const QStringList& names)
{
    if (!sceneBoxReady)
        emit choiceChanged(true);
    offeredScenes += names;
    emit namesAdded(names);
    if (sceneBoxReady)
        return;
    emit selected(currentSceneIndex);
    // Only from now on does a change of the box come from the user; filling it is not a choice.
    sceneBoxReady = true;
}

int Scenes::getEvncode(const QString& name) const
{
    for (int i = 0; i < sceneList.size(); ++i) {
        if (sceneList.at(i).first == name)
            return i;
    }
    return -1;
}

void Scenes::switchUserEvn(const QString& name)
{
    const int index = getEvncode(name);
    if (index < 0)
        return;
    const QString code = sceneList.at(index).second;
    qDebug() << "Switch to scene : " << code;
    currentSceneIndex = index;
    renewCurrentScene(code);
    callloadpolicy(index, code);
}

void Scenes::reverseEvn()
{
    sceneState = kSceneSwitchedBack;
    if (currentSceneIndex >= sceneList.size())
        return;
    // The box may lack scenes of the list; a reply with a single one does not reach it.
    emit selected(offeredScenes.indexOf(sceneList.at(currentSceneIndex).first));
}

void Scenes::renewCurrentScene(const QString& scene)
{
    qDebug() << "renewCurrentScene : " << scene;
    zent::base::replaceFile(zent::kCurrentScenePath.arg(m_userName), scene.toUtf8());
}

void Scenes::callloadpolicy(const int& kind, const QString&)
{
    qDebug() << "Call loadpolicy" << kind;
    const QString commandLine;
    qDebug() << "loadpolicy start :" << commandLine;
    zent::startDetached(commandLine);
}

void Scenes::startPolicy()
{
    policyTimer.stop();
    callloadpolicy(kStartPolicy, zent::kStartScene);
}
