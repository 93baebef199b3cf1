// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QAbstractEventDispatcher>

/// How many timers of so many milliseconds wait that QTimer::singleShot started in this thread.
inline int singleShots(int milliseconds)
{
    const QAbstractEventDispatcher* dispatcher = QAbstractEventDispatcher::instance();
    int count = 0;
    for (QObject* timer : dispatcher->children()) {
        for (const QAbstractEventDispatcher::TimerInfo& info : dispatcher->registeredTimers(timer))
            count += info.interval == milliseconds ? 1 : 0;
    }
    return count;
}
