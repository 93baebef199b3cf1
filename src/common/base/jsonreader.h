#pragma once

#include <QJsonArray>
#include <QJsonObject>
#include <QString>

namespace zent::base
{

/// Reads values out of a JSON object of somebody else's. A value that is missing or null reads as an empty one; one of
/// another type than it should have, or no object at all, makes the whole reading bad.
class JsonReader
{
public:
    explicit JsonReader(const QJsonValue& value);

    bool flag(const char* key);
    QString text(const char* key);
    QJsonArray array(const char* key);
    /// The first text of an array; empty when there is none.
    QString firstText(const char* key);
    /// An object within, whose own faults are not this one's.
    QJsonObject object(const char* key);

    /// Whether everything read so far had its type.
    bool isGood() const { return m_good; }

private:
    QJsonValue take(const char* key, QJsonValue::Type type);

    QJsonObject m_object;
    bool m_good;
};

} // namespace zent::base
