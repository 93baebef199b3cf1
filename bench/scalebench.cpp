// SPDX-License-Identifier: Apache-2.0
// What one large reply costs: scalebench KIND COUNT prints microseconds of parsing and the growth of the peak resident
// size in KiB. KIND: scenes (COUNT entries), message (a body of COUNT bytes), connections (COUNT of them).

#include "activeconnections.h"
#include "notifymessages.h"
#include "replies.h"

#include <QCoreApplication>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTextStream>

#include <chrono>
#include <functional>

#include <sys/resource.h>

namespace
{

using Connections = std::vector<zent::ActiveConnection>;

long peakKib()
{
    rusage usage{};
    getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss;
}

QByteArray joined(const QByteArray& entry, int count)
{
    QByteArray text;
    text.reserve((entry.size() + 1) * count);
    for (int i = 0; i < count; ++i)
        text += (i == 0 ? QByteArray() : QByteArrayLiteral(",")) + entry;
    return text;
}

struct Case {
    QByteArray body;
    /// Returns the number of things found, to show that the reply was really read.
    std::function<int(const QByteArray&)> parse;
};

Case makeCase(const QString& kind, int count)
{
    if (kind == QLatin1String("scenes"))
        return {R"({"code":0,"message":[)" + joined(R"({"scene_name":"scene","scene_code":"code-0123456789"})", count) +
                    "]}",
                [](const QByteArray& body) { return static_cast<int>(zent::parseSceneReply(body).value.size()); }};
    if (kind == QLatin1String("message"))
        return {R"([{"uuid":"1","title":"t","content":")" + QByteArray(count, 'x') + R"("}])",
                [](const QByteArray& body) { return zent::parseMessageList(body).value(0).content.size(); }};
    return {"[" +
                joined(R"({"IsPrimaryConnection":true,"HwAddress":"5C:3A:45:1E:7B:90","Ip4":{"Address":"10.0.0.1"}})",
                       count) +
                "]",
            [](const QByteArray& body) {
                const auto array = zent::parseConnectionArray(body).value_or(QJsonArray());
                return static_cast<int>(zent::primaryConnections(array).value_or(Connections()).size());
            }};
}

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    const QStringList arguments = QCoreApplication::arguments();
    if (arguments.size() != 3)
        return 2;
    const int count = arguments[2].toInt();
    const Case reply = makeCase(arguments[1], count);
    const long before = peakKib();
    const auto start = std::chrono::steady_clock::now();
    const int found = reply.parse(reply.body);
    const std::chrono::duration<double, std::micro> spent = std::chrono::steady_clock::now() - start;
    if (found != count)
        qFatal("%d of %d found", found, count);
    QTextStream(stdout) << spent.count() << ' ' << peakKib() - before << '\n';
    return 0;
}
