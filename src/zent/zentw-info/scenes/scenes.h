// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "system/randnum.h"
#include "terminal/terminal.h"

#include <QList>
#include <QObject>
#include <QPair>
#include <QString>
#include <QStringList>
#include <QTimer>

class QNetworkAccessManager;
class QNetworkReply;

/// The scenes offered to the user, and the current one. Asks for them, again where no definite answer came. Records the
/// chosen one and starts to load its policy.
class Scenes : public QObject
{
    Q_OBJECT

public:
    /// `terminal` and `userName` are looked up when they are needed and must outlive this.
    Scenes(const zent::Terminal& terminal, const QString& userName, QObject* parent = nullptr,
           zent::RandomInterval random = zent::generateRandnum);

    /// Makes the manager of the requests.
    void start();

    int count() const { return sceneList.size(); }
    /// The code of the current scene; the one in which every session starts when there is no list.
    QString currentCode() const;
    /// Whether the user has a choice.
    bool areOffered() const { return sceneBoxReady; }
    /// Makes the first scene the current one.
    void startWithFirst() { currentSceneIndex = 0; }

    /// Reads a scene reply's body; 1 when it was JSON, else 0.
    int analyseEvnData(QByteArray* body);
    /// Index of the first scene called `name`, −1 when there is none.
    int getEvncode(const QString& name) const;
    /// Records the code of the scene the user works in; a file that cannot be written is skipped.
    void renewCurrentScene(const QString& scene);
    /// Starts policy loading for a scene; this version has no command to run.
    void callloadpolicy(const int& kind, const QString& scene);

public slots:
    /// Asks the server for the scenes of this user on this terminal.
    void getAllUserEnvironment();
    /// Takes the answer, and asks again later when it is not definite.
    void rcvEvninfoData(QNetworkReply* reply);
    /// Makes the scene called `name` the current one.
    void switchUserEvn(const QString& name);
    /// Selects the current scene among the names offered.
    void reverseEvn();
    /// Loads the policy of the scene that every session starts in, once.
    void startPolicy();

signals:
    /// Whether there is a choice to offer; before the names of the first one.
    void choiceChanged(bool offered);
    /// More names behind those already offered.
    void namesAdded(const QStringList& names);
    /// The scene at this place among the names offered is to be shown as the current one; −1 when it is not among them.
    void selected(int index);

private:
    void offerScenes(const QStringList& names);

    const zent::Terminal& m_terminal;
    const QString& m_userName;
    const zent::RandomInterval m_random;
    QNetworkAccessManager* sceneManager = nullptr;
    QList<QPair<QString, QString>> sceneList;
    /// The names offered; a list of one scene is no choice.
    QStringList offeredScenes;
    int sceneState = 2;
    int currentSceneIndex = 0;
    bool sceneBoxReady = false;
    QTimer policyTimer{this};
    QTimer scenesAgain{this};
};
