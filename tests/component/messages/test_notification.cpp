#include "notification.h"
#include "platformcontrol.h"
#include "testrows.h"

#include <QRegularExpression>

namespace
{

const QString kUser = QStringLiteral("a&b");

} // namespace

class TestNotification : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<QNotification> m_client;
    int m_answers = 0;
    bool m_ok = false;
    NotifyMessageResponse m_response;

    /// Asks for the newest unread message and waits for the answer.
    void list()
    {
        m_client->getNotifyMessageList(kUser, true, 0, 1, [this](bool ok, const NotifyMessageResponse& response) {
            ++m_answers;
            m_ok = ok;
            m_response = response;
        });
        QTRY_COMPARE(m_answers, 1);
        m_answers = 0;
        QVERIFY(m_response.is_not_read);
        QCOMPARE(m_client->pendingRequests(), 0);
    }

private slots:
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        m_client = std::make_unique<QNotification>();
        m_answers = 0;
    }

    void listRequest()
    {
        m_platform.setUnread(150, kUser);
        list();
        QVERIFY(m_ok);
        QCOMPARE(m_response.total, 150);
        QCOMPARE(m_response.limit, 1);
        QCOMPARE(m_response.messages.size(), 1);
        QCOMPARE(m_response.messages.first().title, QStringLiteral("<i>通知</i> 149 %2"));

        const QJsonObject request = m_platform.record("http").value(0);
        QCOMPARE(request.value("scheme").toString(), QStringLiteral("https"));
        const QString query = request.value("raw_query").toString();
        const QRegularExpression expected(
            "^uid=a%26b&is_not_read=1&limit=1&offset=0&order=create_at&desc=1&timestaps=\\d+$");
        QVERIFY2(expected.match(query).hasMatch(), qPrintable(query));
        const QJsonObject headers = request.value("headers").toObject();
        QCOMPARE(headers.value("x-lumo-version").toString(), QStringLiteral("v2"));
        QCOMPARE(headers.value("content-type").toString(), QStringLiteral("application/json"));
        QCOMPARE(headers.value("x-xsrf-token").toString(), m_platform.state().value("token").toString());
    }

    void readingTakesMessagesOff()
    {
        m_platform.setUnread(3, kUser);
        int read = 0;
        const auto callback = [&read](bool ok, const QString&) { read += ok ? 1 : 100; };
        m_client->readNotifyMessage("2", callback);
        QTRY_COMPARE(read, 1);
        const QJsonObject request = m_platform.record("http").last();
        QCOMPARE(request.value("method").toString(), QStringLiteral("PUT"));
        QCOMPARE(request.value("path").toString(), QStringLiteral("/notification/v2/read"));
        QCOMPARE(request.value("body").toString(), QStringLiteral("{\"uuid\":\"2\"}"));
        m_client->readAllNotifyMessage(kUser, callback);
        QTRY_COMPARE(read, 2);
        list();
        QCOMPARE(m_response.total, 0);
    }

    void oddAnswers_data()
    {
        addColumns<QJsonObject, bool, int, int>("fault", "ok", "total", "messages");
        const auto answer = [](int status, const char* body, const char* count = "7") {
            return QJsonObject{{"status", status}, {"body", body}, {"headers", QJsonObject{{"X-Total-Count", count}}}};
        };
        addRow("count without messages", answer(200, ""), true, 7, 0);
        addRow("count that is no number", answer(200, "[{}, {}]", "many"), true, 0, 2);
        addRow("object", answer(200, "{}"), true, 7, 0);
        addRow("status 500", answer(500, "[{}]"), false, 0, 0);
        addRow("status 201", answer(201, "[{}]"), false, 0, 0);
        addRow("refused", QJsonObject{{"drop", "before"}}, false, 0, 0);
        addRow("cut off", QJsonObject{{"drop", "mid"}}, false, 0, 0);
    }
    void oddAnswers()
    {
        QFETCH(QJsonObject, fault);
        m_platform.addFault({{"path", "/notification/v2/list"}}, fault);
        list();
        QTEST(m_ok, "ok");
        QTEST(m_response.total, "total");
        QTEST(m_response.messages.size(), "messages");
    }

    void certificatesOfAnotherAuthorityAreRefused()
    {
        m_platform.patchState({{"tls", QJsonObject{{"certificate", "other_ca"}}}});
        list();
        m_platform.patchState({{"tls", QJsonObject{{"certificate", "server"}}}});
        QVERIFY(!m_ok);
    }
};

QTEST_GUILESS_MAIN(TestNotification)
#include "test_notification.moc"
