// SPDX-License-Identifier: Apache-2.0
#include "jsonreader.h"

namespace zent::base
{

namespace
{

constexpr int kLongestIdentifier = 1000;

} // namespace

QString identifierIn(const QJsonValue& value)
{
    const QString text = value.toString();
    return text.size() <= kLongestIdentifier ? text : QString();
}

JsonReader::JsonReader(const QJsonValue& value) : m_object(value.toObject()), m_good(value.isObject())
{
}

QJsonValue JsonReader::take(const char* key, QJsonValue::Type type)
{
    QJsonValue value = m_object.value(QLatin1String(key));
    m_good = m_good && (value.isUndefined() || value.isNull() || value.type() == type);
    return value;
}

bool JsonReader::flag(const char* key)
{
    return take(key, QJsonValue::Bool).toBool();
}

QString JsonReader::text(const char* key)
{
    return take(key, QJsonValue::String).toString();
}

QString JsonReader::identifier(const char* key)
{
    QString whole = text(key);
    m_good = m_good && whole.size() <= kLongestIdentifier;
    return whole;
}

QJsonArray JsonReader::array(const char* key)
{
    return take(key, QJsonValue::Array).toArray();
}

QString JsonReader::firstText(const char* key)
{
    const QJsonArray texts = array(key);
    m_good = m_good && (texts.isEmpty() || texts.first().isString());
    return texts.first().toString();
}

QJsonObject JsonReader::object(const char* key)
{
    return take(key, QJsonValue::Object).toObject();
}

} // namespace zent::base
