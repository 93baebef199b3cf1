// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "lunarcalendar.h"
#include "notifymessages.h"
#include "passwordreplies.h"
#include "replies.h"

/// What is computed alone, without files, bus or servers.
class TestValues : public QObject
{
    Q_OBJECT

    /// What is said of a day, "unknown" before the rest where there is nothing to say.
    static QString lunarDay(const QDate& date)
    {
        QString monthDay, year, month, day, solarTerm, festival;
        const bool known = GetLunarDay(date, monthDay, year, month, day, solarTerm, festival);
        return ((known ? "" : "unknown ") + QStringList{monthDay, year, month, day, solarTerm, festival}.join(' '))
            .trimmed();
    }

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

    void everyDayIsAsPublished()
    {
        // With leap months, without a festival in the copy, and one that reaches into the next Gregorian year; New
        // Year's Eve in a short last month, and the 29th day of a long one. The day before Qingming may meet a lunar
        // festival, which then follows without a separator. Days of other years are unknown.
        const QJsonObject data = fixture::read("lunar.json");
        const QJsonObject days = data["days"].toObject();
        for (auto day = days.begin(); day != days.end(); ++day)
            QCOMPARE(day.key() + ' ' + lunarDay(QDate::fromString(day.key(), Qt::ISODate)),
                     day.key() + ' ' + day->toString());
        // Of the tables that were compared with published calendars; a change of any day shows here.
        QCryptographicHash all(QCryptographicHash::Sha256);
        for (QDate date(1901, 1, 1); date <= QDate(2099, 12, 31); date = date.addDays(1))
            all.addData(lunarDay(date).toUtf8());
        fixture::compare(QString(all.result().toHex()), data["checksum"]);
    }
};

QTEST_APPLESS_MAIN(TestValues)
#include "test_values.moc"
