// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QJsonArray>
#include <QString>

#include <vector>

/// Reading the management server's replies: from bytes to a record, with nothing of widgets, timers or logs in it.
namespace zent
{

enum class ReplyState {
    NotJson, ///< the body is no JSON text
    Failed,  ///< no code, a code other than 0, or nothing where the values should be
    Good,
};

/// A reply and, when it is good, what it says.
template <typename T>
struct Reply {
    ReplyState state = ReplyState::NotJson;
    T value{};

    bool isGood() const { return state == ReplyState::Good; }
};

/// The directory data of the session user; what the reply left out is empty.
struct UserData {
    /// First and last part of the comma-separated "gecos", the same text when there is one part only.
    QString gecosFirst;
    QString gecosLast;
    QString groupName;
    QString clientName;
    int id = 0;
    QJsonArray permissions;
};

/// A working environment that the platform offers to the user.
struct Scene {
    QString name;
    QString code;
};

/// Code of the scene in which every session starts.
inline const QString kStartScene = QStringLiteral("intranet-scene");

Reply<UserData> parseUserReply(const QByteArray& body);

/// The organisation's name.
Reply<QString> parseOrganisationReply(const QByteArray& body);

/// The name of the first area.
Reply<QString> parseAreaReply(const QByteArray& body);

Reply<std::vector<Scene>> parseSceneReply(const QByteArray& body);

/// Whether the body is a JSON object with an integer as its code, whatever else it holds.
bool hasCode(const QByteArray& body);

} // namespace zent
