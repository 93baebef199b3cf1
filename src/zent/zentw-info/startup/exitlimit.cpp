// SPDX-License-Identifier: Apache-2.0
#include "startup/exitlimit.h"

#include <csignal>
#include <sys/time.h>
#include <unistd.h>

namespace
{

/// A request that blocks when the end is asked for takes up to 1.5 s for connecting; 2 s are allowed in all.
constexpr suseconds_t kLimitUs = 300'000;

volatile std::sig_atomic_t exitStatus = 0;

void setTimer(suseconds_t time)
{
    const itimerval timer = {{0, 0}, {0, time}};
    setitimer(ITIMER_REAL, &timer, nullptr);
}

} // namespace

ExitLimit::~ExitLimit()
{
    setTimer(0);
}

void ExitLimit::start(int status)
{
    exitStatus = status;
    std::signal(SIGALRM, [](int) { _exit(exitStatus); });
    setTimer(kLimitUs);
}
