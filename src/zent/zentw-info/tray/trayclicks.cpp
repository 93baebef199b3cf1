// SPDX-License-Identifier: Apache-2.0
#include "tray/trayclicks.h"

#include <QApplication>

void TrayClicks::pass(const QSystemTrayIcon& icon, Reason reason, const std::function<void(Reason)>& act)
{
    // Only an icon in a tray of the X display knows its place.
    const bool clicksComeSingly = icon.geometry().isEmpty();
    const bool isSecond = m_sinceFirst.isValid() && !m_sinceFirst.hasExpired(QApplication::doubleClickInterval());
    m_sinceFirst.invalidate();
    if (!clicksComeSingly || reason != QSystemTrayIcon::Trigger) {
        act(reason);
    } else if (isSecond) {
        act(QSystemTrayIcon::DoubleClick);
    } else {
        act(reason);
        // From here: a report has no time of its own, and the second one waits while the panel is being shown.
        m_sinceFirst.start();
    }
}
