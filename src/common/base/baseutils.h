// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QJsonObject>
#include <QString>

namespace zent::base
{

/// Small helpers of the terminal info store.
class BaseUtils
{
public:
    /// Sets `out` to the value of `key` and returns true when `object` holds the key. Otherwise logs `caller` and the
    /// key, leaves `out` as it was and returns false. Defined for bool and QString; a value of another JSON type
    /// gives false or an empty string.
    template <typename T>
    static bool getJsonObjectValue(const QJsonObject& object, const QString& key, T& out, const QString& caller);

    /// Logs that `caller` could not open its file.
    static void openFailedLog(const QString& caller);
};

template <>
bool BaseUtils::getJsonObjectValue<bool>(const QJsonObject& object, const QString& key, bool& out,
                                         const QString& caller);
template <>
bool BaseUtils::getJsonObjectValue<QString>(const QJsonObject& object, const QString& key, QString& out,
                                            const QString& caller);

} // namespace zent::base
