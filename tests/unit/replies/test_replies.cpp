#include "replies.h"

#include <QtTest>

using zent::ReplyState;

class TestReplies : public QObject
{
    Q_OBJECT

    /// What a reply gives: "failed", "not json", or its value as a text.
    template <typename T, typename Text>
    static QString found(const zent::Reply<T>& reply, Text text)
    {
        if (reply.state == ReplyState::NotJson)
            return "not json";
        return reply.state == ReplyState::Failed ? "failed" : text(reply.value);
    }

private slots:
    void userReplies()
    {
        const auto user = [](const char* inner) {
            return QByteArray(R"({"code": 0, "data": {"user": )") + inner + "}}";
        };
        const QMap<QByteArray, QString> cases = {
            {user(R"({"gecos": "张三,3 层,,A1", "supplementtary_groups": [{"name": "研发"}, {"name": "x"}],
                "id": 7, "client_name": "终端"})"),
             "张三|A1|研发|终端|7"},
            {user(R"({"gecos": "张三"})"), "张三|张三|||0"},
            {user(R"({"gecos": "张三,"})"), "张三||||0"},
            {user(R"({"supplementtary_groups": []})"), "||||0"},
            {user(R"({"gecos": null, "id": "7", "client_name": null})"), "||||0"},
            {user(R"({"gecos": 5})"), "failed"},
            {user(R"({"client_name": []})"), "failed"},
            {user(R"({"supplementtary_groups": {}})"), "failed"},
            {user(R"({"supplementtary_groups": ["a"]})"), "failed"},
            {user("[]"), "failed"},
            {R"({"code": 1, "data": {"user": {}}})", "failed"},
            {R"({"code": "0", "data": {"user": {}}})", "failed"},
            {R"({"data": {"user": {}}})", "failed"},
            {R"({"code": 0, "data": null})", "failed"},
            {"[]", "failed"},
            {"", "not json"},
            {"<html>502</html>", "not json"},
            {"{\"code\": 0, \"x\": \"\xff\xfe\"}", "not json"},
            {QByteArray(100000, '['), "not json"},
        };
        for (auto row = cases.begin(); row != cases.end(); ++row) {
            QCOMPARE(found(zent::parseUserReply(row.key()),
                           [](const zent::UserData& data) {
                               return QStringList({data.gecosFirst, data.gecosLast, data.groupName, data.clientName,
                                                   QString::number(data.id)})
                                   .join('|');
                           }),
                     row.value());
        }
    }

    void nameReplies()
    {
        struct Row {
            QByteArray data;
            QString organisation;
            QString area;
        };
        const QList<Row> rows = {
            {R"({"name": "公司"})", "公司", "failed"},
            {R"([{"name": "公司"}, {"name": "x"}])", "failed", "公司"},
            {"{}", "", "failed"},
            {R"({"name": 1})", "failed", "failed"},
            {R"([{"name": {}}])", "failed", "failed"},
            {"[]", "failed", "failed"},
            {"null", "failed", "failed"},
            {R"(["公司"])", "failed", "failed"},
        };
        const auto name = [](const QString& value) { return value; };
        for (const Row& row : rows) {
            const QByteArray body = R"({"code": 0, "data": )" + row.data + "}";
            QCOMPARE(found(zent::parseOrganisationReply(body), name), row.organisation);
            QCOMPARE(found(zent::parseAreaReply(body), name), row.area);
        }
    }

    void sceneReplies()
    {
        const auto scenes = [](const QByteArray& body) {
            return found(zent::parseSceneReply(body), [](const std::vector<zent::Scene>& list) {
                QString text;
                for (const zent::Scene& scene : list)
                    text += scene.name + '|' + scene.code + ';';
                return text;
            });
        };
        QCOMPARE(scenes(R"({"code": 0, "message": [{"scene_name": "内网", "scene_code": "a"}, {}]})"),
                 QString("内网|a;|;"));
        for (const char* odd : {"4", R"({"scene_code": 3})", R"({"scene_name": []})"})
            QCOMPARE(scenes(R"({"code": 0, "message": [{}, )" + QByteArray(odd) + "]}"), QString("failed"));
        QCOMPARE(scenes(R"({"code": 0, "message": {}})"), QString("failed"));
        QCOMPARE(scenes(R"({"code": 0, "message": []})"), QString());
    }
};

QTEST_APPLESS_MAIN(TestReplies)
#include "test_replies.moc"
