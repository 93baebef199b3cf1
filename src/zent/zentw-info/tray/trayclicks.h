// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QElapsedTimer>
#include <QSystemTrayIcon>

#include <functional>

/// Finds the double clicks on a tray icon whose host reports every click as one of its own. Trays of the X display
/// hand the icon its mouse events, and Qt finds them itself; StatusNotifier hosts only say "activate", twice.
class TrayClicks
{
public:
    using Reason = QSystemTrayIcon::ActivationReason;

    /// Calls `act` with what the click that `icon` has just reported means: `reason`, or DoubleClick for the second of
    /// two that come within the double click's time.
    void pass(const QSystemTrayIcon& icon, Reason reason, const std::function<void(Reason)>& act);

private:
    QElapsedTimer m_sinceFirst;
};
