// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QJsonObject>
#include <QObject>
#include <QString>
#include <QUrl>

class HttpClientApi;

/// The kind of terminal status asked for; any other value sends no keyword.
enum class MachineState { Join = 0, Remove = 1 };

/// Client of the management server's terminal API. Every request blocks until the server has answered or the reply
/// time-out has passed. Before it returns it emits its signal with the HTTP status, negative when there was none, and
/// the reply text.
class HttpRequest : public QObject
{
    Q_OBJECT

public:
    /// The one instance, made on first use.
    static HttpRequest* GetInstance();

    /// Paths of the certificate authority to trust, and of the client certificate and key to present.
    void setSSLConfig(const QString& ca, const QString& cert, const QString& key);

    /// Tells the server that this terminal has left management.
    void postQuitControl(const QString& username);
    /// Has the server check the administrator password for the release of this terminal.
    void postRemoveStatus(const QString& username, const QString& password);
    /// Asks for the name of the terminal's organisation.
    void getCompanyName();
    /// Asks for the directory data of `username`.
    void getUserInfo(const QString& username);

public slots:
    void onCaCert(const int& statusCode, const QString& data);
    void onMacheineCheck(const int& statusCode, const QString& data);
    void onCheckAccountPwd(const int& statusCode, const QString& data);
    void onJoinControl(const int& statusCode, const QString& data);
    void onQuitControl(const int& statusCode, const QString& data);
    void onRemoveStatus(const int& statusCode, const QString& data);
    void onCompanyName(const int& statusCode, const QString& data);
    void onUserInfo(const int& statusCode, const QString& data);

signals:
    void sigCaCert(const int& statusCode, const QString& data);
    void sigMacheineCheck(const int& statusCode, const QString& data);
    void sigCheckAccountPwd(const int& statusCode, const QString& data);
    void sigJoinControl(const int& statusCode, const QString& data);
    void sigQuitControl(const int& statusCode, const QString& data);
    void sigRemoveStatus(const int& statusCode, const QString& data);
    void sigCompanyName(const int& statusCode, const QString& data);
    void sigUserInfo(const int& statusCode, const QString& data);

private:
    using ResultSlot = void (HttpRequest::*)(const int&, const QString&);

    HttpRequest();

    void get(const QUrl& url, ResultSlot done);
    void poll(const QUrl& url, const QString& body, ResultSlot done);
    void post(const QUrl& url, const QJsonObject& body, ResultSlot done);

    static bool matchesRule(const QString& rule, const QString& name, QString& message);

    HttpClientApi* m_client;
    QString m_certHost;
    QString m_certPort;

    // Agreed with other components, and called by them only.
public:
    /// Asks the certificate service at `host` and `port` for its authority; the naming rule is asked there later.
    void getCaCert(const QString& host, const QString& port);
    /// Asks whether this terminal is joining or being removed, for `username`.
    void getMacheineCheck(MachineState state, const QString& username);
    /// Has the server check a directory account.
    void postCheckAccountPwd(const QString& username, const QString& password);
    /// Tells the server that this terminal joins management.
    void postJoinControl(const QString& username);
    /// Whether the server accepts `name` for this terminal; otherwise `message` says why, in words for the user.
    bool checkTerminalByServer(const QString& name, QString& message);
    /// Whether `name` follows the server's naming rule; with an empty rule the server decides. Otherwise `message`
    /// says why not, in words for the user.
    bool checkPcName(const QString& name, QString& message);
};
