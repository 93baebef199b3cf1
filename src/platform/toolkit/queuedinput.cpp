// SPDX-License-Identifier: Apache-2.0
#include "queuedinput.h"

#include <QCoreApplication>
#include <QDeadlineTimer>
#include <QInputEvent>
#include <QX11Info>

namespace
{

/// What was queued has been fetched long before; after that, times that have wrapped around must not look old.
constexpr int kFetchedAfterMs = 60000;

bool isInput(const QEvent* event)
{
    switch (event->type()) {
    case QEvent::KeyPress:
    case QEvent::KeyRelease:
    case QEvent::ShortcutOverride:
    case QEvent::MouseButtonPress:
    case QEvent::MouseButtonRelease:
    case QEvent::MouseButtonDblClick:
    case QEvent::Wheel:
    case QEvent::TouchBegin:
    case QEvent::TouchUpdate:
    case QEvent::TouchEnd:
        return true;
    default:
        return false;
    }
}

/// Keeps input up to a moment from every object of the program.
class OldInputFilter : public QObject
{
public:
    using QObject::QObject;

    void dropUntil(quint32 serverTime)
    {
        m_until = serverTime;
        m_deadline.setRemainingTime(kFetchedAfterMs);
        QCoreApplication::instance()->installEventFilter(this);
    }

    bool eventFilter(QObject*, QEvent* event) override
    {
        if (!isInput(event))
            return false;
        const auto time = quint32(static_cast<QInputEvent*>(event)->timestamp());
        // The server's time wraps around after seven weeks.
        if (!m_deadline.hasExpired() && time != 0 && qint32(time - m_until) <= 0)
            return true;
        if (event->spontaneous())
            QCoreApplication::instance()->removeEventFilter(this);
        return false;
    }

private:
    quint32 m_until = 0;
    QDeadlineTimer m_deadline;
};

} // namespace

void queuedinput::discard()
{
    if (!QX11Info::isPlatformX11())
        return;
    static auto* const filter = new OldInputFilter(QCoreApplication::instance());
    filter->dropUntil(quint32(QX11Info::getTimestamp()));
}
