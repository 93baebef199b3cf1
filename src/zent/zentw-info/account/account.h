// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "panel/records.h"
#include "system/randnum.h"

#include <QObject>
#include <QString>
#include <QTimer>

#include <memory>

class IdCommand;
class QNetworkAccessManager;
class QNetworkReply;

namespace zent
{
struct UserData;
}

/// Who works at this terminal: the session's user, and what the management server says about the person and the
/// organisation. Asks for each again and again until the server has answered once, and keeps the last good answer.
class Account : public QObject
{
    Q_OBJECT

public:
    explicit Account(QObject* parent = nullptr, zent::RandomInterval random = zent::generateRandnum);
    ~Account() override;

    /// Takes the session user's name, without any "@"; false when the user is not of the directory.
    bool getUserName();
    /// Starts the polls.
    void start();

    const QString& name() const { return userName; }
    int id() const { return userId; }
    /// What the login page shows of all this.
    TLoginInfo loginInfo() const;

    /// Whether the user works under a scene's name.
    bool isScenceUser() const;
    /// Whether "id" shows an administrator of the platform.
    bool isAdminUser();
    /// Whether the user comes from the directory; always, in this version.
    static bool isLdapUser();

    /// Reads a user reply's body; 1 when it was good, else 0.
    int analyseData(QByteArray* body);
    /// Reads an area reply's body; 1 when it was JSON, else 0.
    int analyseAreaData(QByteArray* body);

public slots:
    /// Asks for the user, and takes the answer.
    void getusrInfo();
    void onUserInfo(const int& statusCode, const QString& data);
    /// Asks for the organisation, and takes the answer.
    void getAreaInfo();
    void onCompanyName(const int& statusCode, const QString& data);
    /// Take a user or area reply of the managers; a good one sets the time of the next poll.
    void analysejson(QNetworkReply* reply);
    void rcvAreainfoData(QNetworkReply* reply);

signals:
    void userChanged();
    void organisationChanged();
    /// An area reply has come; the scenes of the area can be asked for.
    void areaKnown();
    /// An area reply with another status than 200 has come.
    void areaFailed();

private:
    void storeUserData(const zent::UserData& data);

    const zent::RandomInterval m_random;
    QString userName;
    QString clientName;
    QString organizationName;
    QString gecosName;
    QString gecosLast;
    QString groupName;
    int userId = 0;
    QString scenceUserName;
    /// The run of "id" that isAdminUser() waits for first, under way while the window is made.
    std::unique_ptr<IdCommand> startedId;
    QNetworkAccessManager* userManager = nullptr;
    QNetworkAccessManager* areaManager = nullptr;
    QTimer userInfoTimer{this};
    QTimer areaInfoTimer{this};
};
