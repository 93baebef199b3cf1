// SPDX-License-Identifier: Apache-2.0
#include "baseutils.h"

#include <QDebug>

namespace zent::base
{

namespace
{

bool holdsKey(const QJsonObject& object, const QString& key, const QString& caller)
{
    if (object.contains(key))
        return true;
    qWarning() << caller << "can not get json key:" << key;
    return false;
}

} // namespace

template <>
bool BaseUtils::getJsonObjectValue<bool>(const QJsonObject& object, const QString& key, bool& out,
                                         const QString& caller)
{
    if (!holdsKey(object, key, caller))
        return false;
    out = object.value(key).toBool();
    return true;
}

template <>
bool BaseUtils::getJsonObjectValue<QString>(const QJsonObject& object, const QString& key, QString& out,
                                            const QString& caller)
{
    if (!holdsKey(object, key, caller))
        return false;
    out = object.value(key).toString();
    return true;
}

void BaseUtils::openFailedLog(const QString& caller)
{
    qWarning() << caller << "open file failed!";
}

} // namespace zent::base
