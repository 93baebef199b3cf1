#pragma once

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusPendingCall>
#include <QDBusPendingCallWatcher>
#include <QMap>
#include <QSignalSpy>
#include <QXmlStreamReader>

/// Two connections to the room's session bus: one that exports an object, and one that meets it as a peer.
class BusPeer
{
public:
    explicit BusPeer(const QString& path) : m_path(path) {}

    QDBusConnection host = QDBusConnection::connectToBus(QDBusConnection::SessionBus, "host");
    QDBusConnection peer = QDBusConnection::connectToBus(QDBusConnection::SessionBus, "peer");

    /// Calls a method of the exported object and waits for the answer, while the object may run.
    QDBusMessage call(const QString& interface, const QString& method, const QVariantList& arguments = {})
    {
        QDBusMessage question = QDBusMessage::createMethodCall(host.baseService(), m_path, interface, method);
        question.setArguments(arguments);
        QDBusPendingCallWatcher watcher(peer.asyncCall(question));
        QSignalSpy finished(&watcher, &QDBusPendingCallWatcher::finished);
        return finished.wait() ? watcher.reply() : QDBusMessage::createError("none", "no reply");
    }

    /// The members of every interface in an introspection text, each as "method Name(iss)" or "signal Name(iss)".
    static QMap<QString, QStringList> members(const QString& xml)
    {
        QMap<QString, QStringList> interfaces;
        QString interface;
        QXmlStreamReader reader(xml);
        while (!reader.atEnd()) {
            const auto token = reader.readNext();
            const QStringRef element = reader.name();
            if (token == QXmlStreamReader::StartElement) {
                const QXmlStreamAttributes attributes = reader.attributes();
                if (element == "interface")
                    interface = attributes.value("name").toString();
                else if (element == "method" || element == "signal" || element == "property")
                    interfaces[interface].append(element + ' ' + attributes.value("name") + '(');
                else if (element == "arg") {
                    QString& member = interfaces[interface].last();
                    // A signal's arguments can only go out, whether that is written or not.
                    const bool result = attributes.value("direction") == "out" && member.startsWith("method");
                    member += (result ? ">" : "") + attributes.value("type").toString();
                }
            } else if (token == QXmlStreamReader::EndElement && (element == "method" || element == "signal")) {
                interfaces[interface].last() += ')';
            }
        }
        for (QStringList& list : interfaces)
            list.sort();
        return reader.hasError() ? QMap<QString, QStringList>() : interfaces;
    }

private:
    QString m_path;
};
