#pragma once

#include <QJsonObject>

#include <initializer_list>
#include <utility>

namespace zent::base
{

/// Whether each of the keys is missing, null or of the given type.
bool hasTypes(const QJsonObject& object, std::initializer_list<std::pair<const char*, QJsonValue::Type>> keys);

} // namespace zent::base
