// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QJsonArray>
#include <QJsonObject>
#include <QString>

namespace zent::base
{

/// A text that is sent back, written or compared; empty for another type, and for one of over 1,000 characters.
QString identifierIn(const QJsonValue& value);

/// Reads values from a JSON object that another program wrote. A value that is missing or null reads as an empty one. A
/// value of a wrong type, or no object at all, makes the whole reading bad.
class JsonReader
{
public:
    explicit JsonReader(const QJsonValue& value);

    bool flag(const char* key);
    QString text(const char* key);
    /// A text that is sent back, written or compared: one of over 1,000 characters counts as a value of a wrong type.
    QString identifier(const char* key);
    QJsonArray array(const char* key);
    /// The first text of an array; empty when there is none.
    QString firstText(const char* key);
    /// A nested object. Values of a wrong type inside it do not make this reading bad.
    QJsonObject object(const char* key);

    /// Whether everything read so far had its type.
    bool isGood() const { return m_good; }

private:
    QJsonValue take(const char* key, QJsonValue::Type type);

    QJsonObject m_object;
    bool m_good;
};

} // namespace zent::base
