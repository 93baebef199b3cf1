// SPDX-License-Identifier: Apache-2.0
#include "jsonmutator.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <random>

namespace fuzz
{

namespace
{

using Random = std::minstd_rand;

int below(Random& random, int bound)
{
    return std::uniform_int_distribution<int>(0, bound - 1)(random);
}

QJsonValue oddValue(Random& random)
{
    static const QJsonArray values{
        QJsonValue(),
        true,
        false,
        0,
        1,
        -1,
        0.5,
        443,
        2147483648.0,
        -1e300,
        QString(),
        QStringLiteral("0"),
        QStringLiteral("张三,,A1"),
        QStringLiteral("2026-11-24T16:30:00Z"),
        QStringLiteral("{\"regular_expression\": \"/[a-z]{1,9}/\"}"),
        QString(3000, QLatin1Char('x')),
        QString(QChar(0)) + QChar(0xd800),
        QJsonArray(),
        QJsonObject(),
        QJsonArray{QJsonObject{{"name", "x"}}},
        QJsonObject{{"name", 7}},
    };
    return values.at(below(random, values.size()));
}

QJsonValue mutateValue(const QJsonValue& value, Random& random);

QJsonValue mutateArray(QJsonArray array, Random& random)
{
    const int index = below(random, array.size());
    switch (below(random, 6)) {
    case 0:
        array.removeAt(index);
        break;
    case 1:
        array.insert(index, QJsonValue(array.at(index)));
        break;
    default:
        array.replace(index, mutateValue(array.at(index), random));
        break;
    }
    return array;
}

QJsonValue mutateObject(QJsonObject object, Random& random)
{
    const QString key = object.keys().at(below(random, object.size()));
    if (below(random, 6) == 0)
        object.remove(key);
    else
        object.insert(key, mutateValue(object.value(key), random));
    return object;
}

QJsonValue mutateValue(const QJsonValue& value, Random& random)
{
    if (below(random, 4) == 0)
        return oddValue(random);
    if (value.isArray() && !value.toArray().isEmpty())
        return mutateArray(value.toArray(), random);
    if (value.isObject() && !value.toObject().isEmpty())
        return mutateObject(value.toObject(), random);
    return oddValue(random);
}

} // namespace

QByteArray mutateJson(const QByteArray& json, unsigned int seed)
{
    const QJsonDocument document = QJsonDocument::fromJson(json);
    if (document.isNull())
        return {};
    Random random(seed);
    const QJsonValue changed =
        mutateValue(document.isArray() ? QJsonValue(document.array()) : QJsonValue(document.object()), random);
    if (changed.isArray())
        return QJsonDocument(changed.toArray()).toJson(QJsonDocument::Compact);
    return QJsonDocument(changed.toObject()).toJson(QJsonDocument::Compact);
}

} // namespace fuzz
