// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "boxcloser.h"
#include "fixture.h"
#include "mainwindow.h"
#include "noticedialog.h"
#include "notification.h"
#include "platformcontrol.h"

/// What the tests of the windows share: the simulated platform behind them, the boxes they open, what they log.
class WindowTest : public QObject
{
protected:
    PlatformControl m_platform;
    // Without it a box that nobody expects would stop the test instead of failing it.
    BoxCloser m_boxes;
    /// The log of the test function.
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<MainWindow> m_window;

    void startAnew()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        m_boxes.texts.clear();
        // The earlier one goes first, so that it leaves Qt's own handler behind.
        m_log.reset();
        m_log = std::make_unique<LogCapture>();
    }
    void makeWindow(int unread)
    {
        m_platform.setUnread(unread);
        MainWindow::unreadMessageCount = 0;
        m_window = std::make_unique<MainWindow>(nullptr, 1029);
    }
    NoticeDialog* notice() const { return m_window->findChild<NoticeDialog*>(); }
};
