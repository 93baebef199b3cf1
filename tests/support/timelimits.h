// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QAbstractEventDispatcher>

#include <ctime>

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

/// The processor time of this thread: the machine may be busy with something else.
inline double processorMs()
{
    timespec now{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) * 1e3 + static_cast<double>(now.tv_nsec) / 1e6;
}
