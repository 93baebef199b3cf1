#include "replies.h"

#include <QtTest>

class TestReplies : public QObject
{
    Q_OBJECT

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
            {user(R"({"gecos": "张三,"})"), "张三||||0"},
            {user(R"({"gecos": null, "id": "7", "client_name": null})"), "||||0"},
            {user(R"({"gecos": 5})"), "failed"},
            {user(R"({"supplementtary_groups": ["a"]})"), "failed"},
            {R"({"code": "0", "data": {"user": {}}})", "failed"},
            {R"({"data": {"user": {}}})", "failed"},
            {R"({"code": 0, "data": null})", "failed"},
            {"", "not json"},
            {"{\"code\": 0, \"x\": \"\xff\xfe\"}", "not json"},
            {QByteArray(100000, '['), "not json"},
        };
        for (auto row = cases.begin(); row != cases.end(); ++row) {
            const auto reply = zent::parseUserReply(row.key());
            const zent::UserData& data = reply.value;
            const QStringList texts = {data.gecosFirst, data.gecosLast, data.groupName, data.clientName};
            QString text = texts.join('|') + '|' + QString::number(data.id);
            if (!reply.isGood())
                text = reply.state == zent::ReplyState::NotJson ? "not json" : "failed";
            QCOMPARE(text, row.value());
        }
    }
};

QTEST_APPLESS_MAIN(TestReplies)
#include "test_replies.moc"
