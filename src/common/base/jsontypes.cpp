#include "jsontypes.h"

#include <algorithm>

namespace zent::base
{

bool hasTypes(const QJsonObject& object, std::initializer_list<std::pair<const char*, QJsonValue::Type>> keys)
{
    return std::all_of(keys.begin(), keys.end(), [&object](const auto& key) {
        const QJsonValue value = object.value(QLatin1String(key.first));
        return value.isUndefined() || value.isNull() || value.type() == key.second;
    });
}

} // namespace zent::base
