// SPDX-License-Identifier: Apache-2.0
#include "release/releasereply.h"

#include <QJsonDocument>
#include <QJsonObject>

zent::ReleaseReply zent::parseReleaseReply(const QByteArray& body)
{
    QJsonParseError error;
    const QJsonObject reply = QJsonDocument::fromJson(body, &error).object();
    if (error.error != QJsonParseError::NoError)
        return {};
    const bool result = reply.value(QLatin1String("data")).toObject().value(QLatin1String("result")).toBool();
    if (reply.value(QLatin1String("code")).toInt(-1) == 0 && result)
        return {ReleaseReply::State::Accepted, QString()};
    return {ReleaseReply::State::Refused, reply.value(QLatin1String("msg")).toString()};
}
