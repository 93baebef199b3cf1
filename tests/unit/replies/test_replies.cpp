#include "replies.h"

#include <QtTest>

using zent::ReplyState;

Q_DECLARE_METATYPE(ReplyState)

class TestReplies : public QObject
{
    Q_OBJECT

private slots:
    void userReplies_data()
    {
        QTest::addColumn<QByteArray>("body");
        QTest::addColumn<ReplyState>("state");
        QTest::addColumn<QString>("fields");
        const auto user = [](const char* inner) {
            return QByteArray(R"({"code": 0, "data": {"user": )") + inner + "}}";
        };
        QTest::newRow("whole")
            << user(R"({"gecos": "张三,3 层,,A1", "supplementtary_groups": [{"name": "研发"}, {"name": "x"}],
            "id": 7, "client_name": "终端"})")
            << ReplyState::Good << "张三|A1|研发|终端|7";
        QTest::newRow("gecos without commas") << user(R"({"gecos": "张三"})") << ReplyState::Good << "张三|张三|||0";
        QTest::newRow("gecos ends with a comma") << user(R"({"gecos": "张三,"})") << ReplyState::Good << "张三||||0";
        QTest::newRow("no groups") << user(R"({"supplementtary_groups": []})") << ReplyState::Good << "||||0";
        QTest::newRow("wrong types inside") << user(R"({"gecos": 5, "supplementtary_groups": {}, "id": "7",
            "client_name": null})") << ReplyState::Good
                                            << "||||0";
        QTest::newRow("groups of texts") << user(R"({"supplementtary_groups": ["a"]})") << ReplyState::Good << "||||0";
        QTest::newRow("code 1") << QByteArray(R"({"code": 1, "data": {"user": {}}})") << ReplyState::Failed << "";
        QTest::newRow("code a text") << QByteArray(R"({"code": "0", "data": {"user": {}}})") << ReplyState::Failed
                                     << "";
        QTest::newRow("no code") << QByteArray(R"({"data": {"user": {}}})") << ReplyState::Failed << "";
        QTest::newRow("no user") << QByteArray(R"({"code": 0, "data": {}})") << ReplyState::Failed << "";
        QTest::newRow("user an array") << user("[]") << ReplyState::Failed << "";
        QTest::newRow("data null") << QByteArray(R"({"code": 0, "data": null})") << ReplyState::Failed << "";
        QTest::newRow("array") << QByteArray("[]") << ReplyState::Failed << "";
        QTest::newRow("empty") << QByteArray() << ReplyState::NotJson << "";
        QTest::newRow("html") << QByteArray("<html>502</html>") << ReplyState::NotJson << "";
        QTest::newRow("invalid utf-8") << QByteArray("{\"code\": 0, \"x\": \"\xff\xfe\"}") << ReplyState::NotJson << "";
        QTest::newRow("nested too deep") << QByteArray(100000, '[') << ReplyState::NotJson << "";
        QTest::newRow("5 MB of filler") << QByteArray(5 * 1024 * 1024, 'x') << ReplyState::NotJson << "";
    }
    void userReplies()
    {
        QFETCH(QByteArray, body);
        QFETCH(ReplyState, state);
        QFETCH(QString, fields);
        const auto reply = zent::parseUserReply(body);
        QCOMPARE(reply.state, state);
        if (!reply.isGood())
            return;
        const zent::UserData& user = reply.value;
        QCOMPARE(
            QStringList({user.gecosFirst, user.gecosLast, user.groupName, user.clientName, QString::number(user.id)})
                .join('|'),
            fields);
    }

    void nameReplies_data()
    {
        QTest::addColumn<QByteArray>("data");
        QTest::addColumn<ReplyState>("organisation");
        QTest::addColumn<ReplyState>("area");
        QTest::newRow("object") << QByteArray(R"({"name": "公司"})") << ReplyState::Good << ReplyState::Failed;
        QTest::newRow("array") << QByteArray(R"([{"name": "公司"}, {"name": "x"}])") << ReplyState::Failed
                               << ReplyState::Good;
        QTest::newRow("empty array") << QByteArray("[]") << ReplyState::Failed << ReplyState::Failed;
        QTest::newRow("null") << QByteArray("null") << ReplyState::Failed << ReplyState::Failed;
        QTest::newRow("array of texts") << QByteArray(R"(["公司"])") << ReplyState::Failed << ReplyState::Failed;
    }
    void nameReplies()
    {
        QFETCH(QByteArray, data);
        QFETCH(ReplyState, organisation);
        QFETCH(ReplyState, area);
        const QByteArray body = R"({"code": 0, "data": )" + data + "}";
        const auto organisationReply = zent::parseOrganisationReply(body);
        const auto areaReply = zent::parseAreaReply(body);
        QCOMPARE(organisationReply.state, organisation);
        QCOMPARE(areaReply.state, area);
        for (const auto& reply : {organisationReply, areaReply})
            QCOMPARE(reply.value, reply.isGood() ? QStringLiteral("公司") : QString());
    }

    void missingNameIsEmpty()
    {
        const auto reply = zent::parseOrganisationReply(R"({"code": 0, "data": {}})");
        QVERIFY(reply.isGood());
        QVERIFY(reply.value.isEmpty());
    }

    void sceneReplies()
    {
        const auto reply = zent::parseSceneReply(
            R"({"code": 0, "message": [{"scene_name": "内网", "scene_code": "a"}, {"scene_code": 3}, 4]})");
        QVERIFY(reply.isGood());
        QCOMPARE(static_cast<int>(reply.value.size()), 3);
        QCOMPARE(reply.value.front().name + reply.value.front().code, QStringLiteral("内网a"));
        QCOMPARE(reply.value.back().name + reply.value.back().code, QString());
        QCOMPARE(zent::parseSceneReply(R"({"code": 0, "message": {}})").state, ReplyState::Failed);
        QCOMPARE(zent::parseSceneReply(R"({"code": 0})").state, ReplyState::Failed);
        QVERIFY(zent::parseSceneReply(R"({"code": 0, "message": []})").isGood());
    }
};

QTEST_APPLESS_MAIN(TestReplies)
#include "test_replies.moc"
