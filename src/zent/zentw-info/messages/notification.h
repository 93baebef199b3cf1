#pragma once

#include "notifymessages.h"

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
/// gets no answer fails after 30 s.
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
    /// Marks all messages of a user read. Always 0; failures reach the callback.
    int readAllNotifyMessage(const QString& uid, readall_message_callback callback);

    /// The local time now as "yyyy-MM-dd hh:mm:ss".
    static QString getCurrentTime();
    /// A server time as it is shown, at UTC+8; with the words for today and yesterday when `relative`. Empty when the
    /// text is no time.
    static QString formatTime(const QString& serverTime, bool relative);
    /// The number as it is shown: "..." from 100 on.
    static QString formatUnReadNumber(int n);
    /// Waits `ms` milliseconds and lets events through; ends early when the application quits, and at once when the
    /// wait would cross midnight.
    static void msleep(int ms);

    QString listUrl() const { return m_listUrl; }
    QString readUrl() const { return m_readUrl; }
    QString readAllUrl() const { return m_readAllUrl; }
    /// How many requests still wait for their reply.
    int pendingRequests() const { return m_listCallbacks.size() + m_readCallbacks.size() + m_readAllCallbacks.size(); }

private slots:
    void messageListRequestFinished(QNetworkReply* reply);
    void messageReadRequestFinished(QNetworkReply* reply);
    void messageReadAllRequestFinished(QNetworkReply* reply);

private:
    using ReadCallbacks = QMap<QUrl, read_message_callback>;

    /// Made on first use: the first one of the process loads Qt's network management, which the tray icon shall not
    /// wait for.
    QNetworkAccessManager* manager(QNetworkAccessManager*& member, const char* finishedSlot);
    QNetworkRequest makeRequest(const QUrl& url, const char* caller);
    void put(QNetworkAccessManager* manager, const QString& baseUrl, const QString& key, const QString& value,
             const char* caller, ReadCallbacks& callbacks, read_message_callback callback);
    static void finishRead(QNetworkReply* reply, ReadCallbacks& callbacks);

    QString m_listUrl;
    QString m_readUrl;
    QString m_readAllUrl;
    QString m_token;
    QMap<QUrl, list_message_callback> m_listCallbacks;
    ReadCallbacks m_readCallbacks;
    ReadCallbacks m_readAllCallbacks;
    QNetworkAccessManager* m_listManager = nullptr;
    QNetworkAccessManager* m_readManager = nullptr;
    QNetworkAccessManager* m_readAllManager = nullptr;
    /// Comes with the first request: making even an empty one loads OpenSSL.
    std::optional<QSslConfiguration> m_ssl;
};
