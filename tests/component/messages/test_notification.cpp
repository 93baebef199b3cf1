#include "notification.h"
#include "paths.h"
#include "platformcontrol.h"
#include "testfiles.h"

#include <QtTest>

namespace
{

const QString kUser = QStringLiteral("a&b");
const QString kListPath = QStringLiteral("/notification/v2/list");
const QString kReadPath = QStringLiteral("/notification/v2/read");

} // namespace

class TestNotification : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<QNotification> m_client;

    struct ListResult {
        int calls = 0;
        bool ok = false;
        NotifyMessageResponse response;
    };
    struct ReadResult {
        int calls = 0;
        bool ok = false;
    };

    void list(ListResult& result)
    {
        m_client->getNotifyMessageList(kUser, true, 0, 1, [&result](bool ok, const NotifyMessageResponse& response) {
            result = {result.calls + 1, ok, response};
        });
    }
    void setMessages(int count)
    {
        QJsonArray messages;
        for (int i = 0; i < count; ++i)
            messages.append(
                QJsonObject{{"uuid", QString::number(i)},
                            {"uid", kUser},
                            {"send_uid", "admin"},
                            {"title", QStringLiteral("%1 <b>%2</b>")},
                            {"content", "c"},
                            {"created_at", QStringLiteral("2026-11-24T08:%1:00Z").arg(i % 60, 2, 10, QChar('0'))},
                            {"read_at", ""}});
        m_platform.patchState({{"messages", messages}});
    }

private slots:
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        m_client = std::make_unique<QNotification>();
    }

    void listRequest()
    {
        setMessages(150);
        ListResult result;
        list(result);
        QTRY_COMPARE(result.calls, 1);
        QVERIFY(result.ok);
        QCOMPARE(result.response.total, 150);
        QCOMPARE(result.response.limit, 1);
        QVERIFY(result.response.is_not_read);
        QCOMPARE(result.response.messages.size(), 1);
        QCOMPARE(result.response.messages.first().title, QStringLiteral("%1 <b>%2</b>"));
        QCOMPARE(m_client->pendingRequests(), 0);

        const QJsonObject request = m_platform.record("http").value(0);
        QCOMPARE(request.value("scheme").toString(), QStringLiteral("https"));
        const QString query = request.value("raw_query").toString();
        QVERIFY2(QRegularExpression("^uid=a%26b&is_not_read=1&limit=1&offset=0&order=create_at&desc=1&timestaps=\\d+$")
                     .match(query)
                     .hasMatch(),
                 qPrintable(query));
        const QJsonObject headers = request.value("headers").toObject();
        QCOMPARE(headers.value("x-lumo-version").toString(), QStringLiteral("v2"));
        QCOMPARE(headers.value("content-type").toString(), QStringLiteral("application/json"));
        QCOMPARE(headers.value("x-xsrf-token").toString(), m_platform.state().value("token").toString());
    }

    void readingTakesMessagesOff()
    {
        setMessages(3);
        ListResult before;
        list(before);
        QTRY_COMPARE(before.calls, 1);
        ReadResult read;
        const auto callback = [&read](bool ok, const QString&) { read = {read.calls + 1, ok}; };
        m_client->readNotifyMessage(before.response.messages.value(0).uuid, callback);
        QTRY_COMPARE(read.calls, 1);
        QVERIFY(read.ok);
        const QJsonObject request = m_platform.record("http").last();
        QCOMPARE(request.value("method").toString(), QStringLiteral("PUT"));
        QCOMPARE(request.value("path").toString(), kReadPath);
        QCOMPARE(request.value("body").toString(), QStringLiteral("{\"uuid\":\"2\"}"));
        m_client->readAllNotifyMessage(kUser, callback);
        QTRY_COMPARE(read.calls, 2);
        ListResult after;
        list(after);
        QTRY_COMPARE(after.calls, 1);
        QCOMPARE(after.response.total, 0);
    }

    void oddAnswers_data()
    {
        QTest::addColumn<QJsonObject>("fault");
        QTest::addColumn<bool>("ok");
        QTest::addColumn<int>("total");
        QTest::addColumn<int>("messages");
        const QJsonObject count{{"X-Total-Count", "7"}};
        QTest::newRow("count without messages")
            << QJsonObject{{"status", 200}, {"body", ""}, {"headers", count}} << true << 7 << 0;
        QTest::newRow("messages without count") << QJsonObject{{"status", 200}, {"body", "[{}, {}]"}} << true << 0 << 2;
        QTest::newRow("object") << QJsonObject{{"status", 200}, {"body", "{}"}, {"headers", count}} << true << 7 << 0;
        QTest::newRow("status 500") << QJsonObject{{"status", 500}, {"body", "[{}]"}, {"headers", count}} << false << 0
                                    << 0;
        QTest::newRow("status 201") << QJsonObject{{"status", 201}, {"body", "[{}]"}, {"headers", count}} << false << 0
                                    << 0;
        QTest::newRow("dropped") << QJsonObject{{"drop", "mid"}} << false << 0 << 0;
    }
    void oddAnswers()
    {
        QFETCH(QJsonObject, fault);
        QFETCH(bool, ok);
        QFETCH(int, total);
        QFETCH(int, messages);
        m_platform.addFault({{"path", kListPath}}, fault);
        ListResult result;
        list(result);
        QTRY_COMPARE(result.calls, 1);
        QCOMPARE(result.ok, ok);
        QCOMPARE(result.response.total, total);
        QCOMPARE(result.response.messages.size(), messages);
        QVERIFY(result.response.is_not_read);
        QCOMPARE(m_client->pendingRequests(), 0);
    }

    void certificatesOfAnotherAuthorityAreRefused()
    {
        m_platform.patchState({{"tls", QJsonObject{{"certificate", "other_ca"}}}});
        ListResult result;
        list(result);
        QTRY_COMPARE(result.calls, 1);
        QVERIFY(!result.ok);
        m_platform.patchState({{"tls", QJsonObject{{"certificate", "server"}}}});
    }

    void aReplyAfterTheReceiverIsGone()
    {
        m_platform.addFault({{"path", kListPath}}, {{"delay_ms", 300}});
        ListResult result;
        list(result);
        m_client.reset();
        m_platform.clearFaults();
        QCOMPARE(result.calls, 0);
    }

    void manyPollsAgainstFailuresLeaveNothing()
    {
        setMessages(2);
        const QList<QJsonObject> faults{{},
                                        {{"status", 500}},
                                        {{"drop", "before"}},
                                        {{"drop", "mid"}},
                                        {{"status", 200}, {"body", "{"}},
                                        {{"body_bytes", 100000}}};
        int calls = 0;
        for (int i = 0; i < 1000; ++i) {
            if (i % 20 == 0) {
                m_platform.clearFaults();
                const QJsonObject fault = faults.at(i / 20 % faults.size());
                if (!fault.isEmpty())
                    m_platform.addFault({{"path", "/notification/v2/*"}}, fault);
            }
            NotifyMessageOption option;
            // Unlike users make unlike URLs within one second.
            option.uid = QString::number(i);
            QEventLoop loop;
            m_client->getNotifyMessageList(option, [&](bool, const NotifyMessageResponse&) {
                ++calls;
                loop.quit();
            });
            loop.exec();
            QCOMPARE(calls, i + 1);
        }
        QCOMPARE(m_client->pendingRequests(), 0);
    }
};

QTEST_GUILESS_MAIN(TestNotification)
#include "test_notification.moc"
