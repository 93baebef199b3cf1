// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "notifymessages.h"
#include "passwordreplies.h"
#include "replies.h"

class TestReplies : public QObject
{
    Q_OBJECT

private slots:
    void userReplies_data() { fixture::addRows("userreplies.json"); }
    void userReplies()
    {
        QFETCH(QJsonObject, row);
        const auto reply = zent::parseUserReply(row["body"].toString().toUtf8());
        const zent::UserData& data = reply.value;
        QJsonValue got = QJsonArray{data.gecosFirst, data.gecosLast, data.groupName, data.clientName, data.id};
        if (!reply.isGood())
            got = reply.state == zent::ReplyState::NotJson ? "not json" : "failed";
        fixture::compare(got, row["got"]);
    }
    void unreadableReplies()
    {
        for (const QByteArray& body : {QByteArray("{\"code\": 0, \"x\": \"\xff\xfe\"}"), QByteArray(100000, '[')})
            QCOMPARE(zent::parseUserReply(body).state, zent::ReplyState::NotJson);
    }

    void whatIsSentBackIsShortOrNothing()
    {
        for (const int length : {1000, 1001}) {
            const QByteArray text(length, 'x');
            const bool good = length == 1000;
            for (const char* key : {"scene_name", "scene_code"}) {
                const QByteArray scene = QByteArray("{\"") + key + "\": \"" + text + "\"}";
                QCOMPARE(zent::parseSceneReply(R"({"code": 0, "message": [)" + scene + "]}").isGood(), good);
            }
            QString uuid;
            for (const NotifyMessage& message : zent::parseMessageList("[{\"uuid\": \"" + text + "\"}]"))
                uuid += message.uuid;
            const QString token = zent::parseNotifyConfig("{\"token\": \"" + text + "\"}")->token;
            const QString renewed =
                zent::parsePasswordServerReply("{\"code\": 0, \"message\": \"" + text + "\"}")->token;
            for (const QString& value : {uuid, token, renewed})
                QCOMPARE(value, good ? QString(text) : QString());
        }
    }
};

QTEST_APPLESS_MAIN(TestReplies)
#include "test_replies.moc"
