// SPDX-License-Identifier: Apache-2.0
#include "startup/signalquit.h"

#include <QCoreApplication>
#include <QDebug>
#include <QSocketNotifier>

#include <csignal>
#include <fcntl.h>
#include <unistd.h>

namespace
{

constexpr int kSignals[] = {SIGTERM, SIGINT};

// A signal handler may only touch what is async-signal-safe, so it wakes the event loop through a pipe.
int pipeEnds[2] = {-1, -1};

void onSignal(int)
{
    const char byte = 0;
    // A full pipe already holds a wake-up, so nothing is lost when this write fails.
    if (write(pipeEnds[1], &byte, 1) < 0)
        return;
}

} // namespace

SignalQuit::SignalQuit(QObject* parent) : QObject(parent)
{
    if (pipe2(pipeEnds, O_CLOEXEC | O_NONBLOCK) != 0) {
        qWarning() << "SignalQuit no pipe, termination signals end the process at once";
        return;
    }
    m_notifier = new QSocketNotifier(pipeEnds[0], QSocketNotifier::Read, this);
    connect(m_notifier, &QSocketNotifier::activated, this, [this] {
        m_notifier->setEnabled(false);
        qInfo() << "SignalQuit termination signal, quitting";
        QCoreApplication::quit();
    });
    struct sigaction action = {};
    action.sa_handler = onSignal;
    action.sa_flags = SA_RESTART;
    for (const int number : kSignals)
        sigaction(number, &action, nullptr);
}

SignalQuit::~SignalQuit()
{
    for (const int number : kSignals)
        std::signal(number, SIG_DFL);
    delete m_notifier;
    for (const int end : pipeEnds)
        close(end);
}
