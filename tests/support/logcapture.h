#pragma once

#include <QStringList>
#include <QtGlobal>

/// Collects every Qt log message for as long as it lives.
class LogCapture
{
public:
    LogCapture() { s_lines().clear(), m_previous = qInstallMessageHandler(collect); }
    ~LogCapture() { qInstallMessageHandler(m_previous); }

    QStringList lines() const { return s_lines(); }
    /// How many lines contain `text`.
    int count(const QString& text) const { return lines().filter(text).size(); }
    bool contains(const QString& text) const { return count(text) > 0; }

private:
    static QStringList& s_lines()
    {
        static QStringList lines;
        return lines;
    }
    static void collect(QtMsgType, const QMessageLogContext&, const QString& message) { s_lines().append(message); }

    QtMessageHandler m_previous;
};
