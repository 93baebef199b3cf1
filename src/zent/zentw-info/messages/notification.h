// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "httprules.h"
#include "messages/notifymessages.h"

#include <QMap>
#include <QNetworkRequest>
#include <QObject>
#include <QSslConfiguration>
#include <QString>
#include <QUrl>

#include <functional>
#include <optional>

class QNetworkAccessManager;
class QNetworkReply;

/// Called with whether a list request succeeded, and its result.
using list_message_callback = std::function<void(bool ok, NotifyMessageResponse response)>;
/// Called with whether a request succeeded, and the network's words about it.
using read_message_callback = std::function<void(bool ok, QString text)>;
using readall_message_callback = std::function<void(bool ok, QString text)>;

/// Client of the notification service, which keeps a message box for every user. Results come through the callback
/// handed in with a request; what the callback refers to must outlive the request or be guarded by it. A request that
/// is not answered whole within 30 s fails.
class QNotification : public QObject
{
    Q_OBJECT

public:
    /// The process-wide instance, null until the main window has made it.
    static QNotification* qInstance;

    explicit QNotification(QObject* parent = nullptr);

    /// Reads the settings from the terminal info file and builds the URLs, which are built in every case. 0 on success,
    /// −1 without a file, −2 when it cannot be read, −3 when it is not JSON.
    int loadCfg();

    /// Asks for a user's messages. Always 0; failures reach the callback.
    int getNotifyMessageList(const NotifyMessageOption& option, list_message_callback callback);
    /// The same for one page (counted from 1; 0 counts as 1) of the newest messages.
    int getNotifyMessageList(const QString& uid, bool isNotRead, int page, int pageSize,
                             list_message_callback callback);
    /// Marks one message read. Always 0; failures reach the callback.
    int readNotifyMessage(const QString& uuid, read_message_callback callback);

    /// A server time as it is shown, at UTC+8; with the words for today and yesterday when `relative`. Empty when the
    /// text is no time.
    static QString formatTime(const QString& serverTime, bool relative);
    /// The number as it is shown: "..." from 100 on.
    static QString formatUnReadNumber(int n);
    /// Waits `ms` milliseconds and lets events through; ends early when the application quits, and at once when the
    /// wait would cross midnight.
    static void msleep(int ms);

    /// Changes how long a request may take, for those made from now on.
    void setTimeLimit(std::chrono::milliseconds time) { m_timeLimit = time; }

    QString listUrl() const { return m_listUrl; }
    /// How many requests still wait for their reply.
    int pendingRequests() const { return m_listCallbacks.size() + m_readCallbacks.size() + m_readAllCallbacks.size(); }

private slots:
    void messageListRequestFinished(QNetworkReply* reply);
    void messageReadRequestFinished(QNetworkReply* reply);
    void messageReadAllRequestFinished(QNetworkReply* reply);

private:
    using ReadCallbacks = QMap<QUrl, read_message_callback>;

    QNetworkRequest makeRequest(const QUrl& url, const char* caller);
    void followAuthority();
    void put(QNetworkAccessManager* manager, const QString& baseUrl, const QString& key, const QString& value,
             const char* caller, ReadCallbacks& callbacks, read_message_callback callback);
    void finishRead(QNetworkReply* reply, ReadCallbacks& callbacks);

    QString m_listUrl;
    QString m_readUrl;
    QString m_readAllUrl;
    QString m_token;
    QMap<QUrl, list_message_callback> m_listCallbacks;
    ReadCallbacks m_readCallbacks;
    ReadCallbacks m_readAllCallbacks;
    QNetworkAccessManager* m_listManager;
    QNetworkAccessManager* m_readManager;
    QNetworkAccessManager* m_readAllManager;
    /// Comes with the first request: making even an empty one loads OpenSSL.
    std::optional<QSslConfiguration> m_ssl;
    /// The authority's file as it was when it was read.
    QByteArray m_authority;
    /// Connections may be left that were made with another authority.
    bool m_oldConnections = false;
    std::chrono::milliseconds m_timeLimit = zent::http::kBackgroundTime;

    // Agreed with other components, and called by them only.
public:
    /// Marks all messages of a user read. Always 0; failures reach the callback.
    int readAllNotifyMessage(const QString& uid, readall_message_callback callback);
    /// The local time now as "yyyy-MM-dd hh:mm:ss".
    static QString getCurrentTime();
};
