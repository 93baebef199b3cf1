// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QStringList>
#include <QtGlobal>

#include <mutex>

/// Collects every log message of the program, of any thread, for as long as it lives.
class LogCapture
{
public:
    LogCapture()
    {
        {
            const std::lock_guard lock(store().mutex);
            store().lines.clear();
            store().records.clear();
        }
        m_previous = qInstallMessageHandler(collect);
    }
    ~LogCapture() { qInstallMessageHandler(m_previous); }

    QStringList lines() const
    {
        const std::lock_guard lock(store().mutex);
        return store().lines;
    }
    /// The lines, each with its level before it: "debug", "warning", "critical", "fatal" or "info".
    QStringList records() const
    {
        const std::lock_guard lock(store().mutex);
        return store().records;
    }
    /// How many lines contain `text`.
    int count(const QString& text) const { return lines().filter(text).size(); }
    bool contains(const QString& text) const { return count(text) > 0; }

private:
    struct Store {
        // The thread sanitizer sees this one, but not Qt's.
        std::mutex mutex;
        QStringList lines;
        QStringList records;
    };
    static Store& store()
    {
        static Store store;
        return store;
    }
    static void collect(QtMsgType type, const QMessageLogContext&, const QString& message)
    {
        // What the platform plugin without a screen cannot do.
        if (message.startsWith("This plugin does not support"))
            return;
        static const char* const kLevels[] = {"debug ", "warning ", "critical ", "fatal ", "info "};
        const std::lock_guard lock(store().mutex);
        store().lines.append(message);
        store().records.append(kLevels[type] + message);
    }

    QtMessageHandler m_previous;
};
