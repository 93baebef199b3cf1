// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QStringList>
#include <QtGlobal>

#include <mutex>

/// Collects every Qt log message, of any thread, for as long as it lives.
class LogCapture
{
public:
    LogCapture()
    {
        {
            const std::lock_guard lock(store().mutex);
            store().lines.clear();
        }
        m_previous = qInstallMessageHandler(collect);
    }
    ~LogCapture() { qInstallMessageHandler(m_previous); }

    QStringList lines() const
    {
        const std::lock_guard lock(store().mutex);
        return store().lines;
    }
    /// How many lines contain `text`.
    int count(const QString& text) const { return lines().filter(text).size(); }
    bool contains(const QString& text) const { return count(text) > 0; }

private:
    struct Store {
        // The thread sanitizer sees this one, but not Qt's.
        std::mutex mutex;
        QStringList lines;
    };
    static Store& store()
    {
        static Store store;
        return store;
    }
    static void collect(QtMsgType, const QMessageLogContext&, const QString& message)
    {
        const std::lock_guard lock(store().mutex);
        store().lines.append(message);
    }

    QtMessageHandler m_previous;
};
