// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QRegularExpression>
#include <QStringList>

#include <mutex>

/// Collects every log message of the program, of any thread, for as long as it lives.
class LogCapture
{
public:
    LogCapture()
    {
        const std::lock_guard lock(s_mutex);
        s_records.clear();
        m_previous = qInstallMessageHandler(collect);
    }
    ~LogCapture() { qInstallMessageHandler(m_previous); }

    QStringList lines() const { return records().replaceInStrings(QRegularExpression("^\\w+ "), QString()); }
    /// The lines, each with its level before it: "debug", "warning", "critical", "fatal" or "info".
    QStringList records() const
    {
        const std::lock_guard lock(s_mutex);
        return s_records;
    }
    /// How many lines contain `text`.
    int count(const QString& text) const { return lines().filter(text).size(); }
    bool contains(const QString& text) const { return count(text) > 0; }

private:
    static void collect(QtMsgType type, const QMessageLogContext&, const QString& message)
    {
        // What the platform plugin without a screen cannot do.
        if (message.startsWith("This plugin does not support"))
            return;
        static const char* const kLevels[] = {"debug ", "warning ", "critical ", "fatal ", "info "};
        const std::lock_guard lock(s_mutex);
        s_records.append(kLevels[type] + message);
    }

    // The thread sanitizer sees this one, but not Qt's.
    static inline std::mutex s_mutex;
    static inline QStringList s_records;
    QtMessageHandler m_previous;
};
