// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>

namespace zent::trayhost
{

/// Whether a tray icon should be made now. That is so when there is a host, or neither an X display nor a session bus
/// on which one could appear later. Asks the session bus and waits up to half a second; a registry that is silent for
/// so long makes it false, whatever else is there. Calls no tray function of Qt.
bool canShowIconNow();

} // namespace zent::trayhost

/// Waits for the first tray host of the session, of either protocol. It calls no tray function of Qt, which decides at
/// its first such call, for the whole process, whether there is a host. Never blocks, and sets no timer.
class TrayHostWatch : public QObject
{
    Q_OBJECT

public:
    /// Starts to watch at once; a host that is already there is announced through the event loop.
    explicit TrayHostWatch(QObject* parent = nullptr);

signals:
    /// A host is there. Emitted once; the watch then rests.
    void hostAppeared();

private slots:
    void look();

private:
    void watchBus();
    void watchDisplay();
    void announce();

    bool m_announced = false;
};
