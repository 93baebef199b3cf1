// SPDX-License-Identifier: Apache-2.0
#include "private/httpthread.h"

#include "private/speaker.h"

#include <QThread>

namespace zent::http
{

namespace
{

/// Only a file that blocks its reader can hold up the end for so long.
constexpr unsigned long kEndMs = 1000;

} // namespace

HttpThread::HttpThread() = default;

HttpThread::~HttpThread()
{
    stop();
}

void HttpThread::send(const std::shared_ptr<Exchange>& exchange)
{
    if (!keep())
        start();
    const auto arrive = [speaker = m_speaker, state = m_state, exchange] {
        {
            const std::lock_guard lock(state->mutex);
            --state->underWay;
        }
        speaker->send(exchange);
    };
    QMetaObject::invokeMethod(m_speaker, arrive, Qt::QueuedConnection);
}

bool HttpThread::keep()
{
    if (!m_state)
        return false;
    const std::lock_guard lock(m_state->mutex);
    if (!m_state->ended)
        ++m_state->underWay;
    return !m_state->ended;
}

void HttpThread::start()
{
    stop();
    m_state = std::make_shared<State>();
    m_thread = std::make_unique<QThread>();
    m_thread->setObjectName(QStringLiteral("http"));
    m_speaker = new Speaker([state = m_state] {
        const std::lock_guard lock(state->mutex);
        state->ended = state->underWay == 0;
        if (state->ended)
            QThread::currentThread()->quit();
    });
    m_speaker->moveToThread(m_thread.get());
    QObject::connect(m_thread.get(), &QThread::finished, m_speaker, &QObject::deleteLater);
    m_thread->start();
}

void HttpThread::abandon(const std::shared_ptr<Exchange>& exchange)
{
    const std::lock_guard lock(m_state->mutex);
    if (!m_state->ended)
        QMetaObject::invokeMethod(
            m_speaker, [speaker = m_speaker, exchange] { speaker->abandon(exchange); }, Qt::QueuedConnection);
}

void HttpThread::stop()
{
    if (!m_thread)
        return;
    m_thread->quit();
    if (!m_thread->wait(kEndMs))
        static_cast<void>(m_thread.release());
    m_thread.reset();
    m_state.reset();
}

} // namespace zent::http
