// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>

class QSocketNotifier;

/// Ends the event loop cleanly on SIGTERM and SIGINT for as long as it lives.
class SignalQuit : public QObject
{
    Q_OBJECT

public:
    explicit SignalQuit(QObject* parent = nullptr);
    ~SignalQuit() override;

private:
    QSocketNotifier* m_notifier = nullptr;
};
