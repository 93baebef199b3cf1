// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "xwindows.h"

#include <QTest>
#include <QWidget>

inline const char kBlurProperty[] = "_KDE_NET_WM_BLUR_BEHIND_REGION";

/// Stands in for a compositing manager for as long as it lives, one that blurs.
class Compositor
{
public:
    Compositor()
    {
        m_window.winId();
        xwindows::setProperty(QX11Info::appRootWindow(), kBlurProperty, {1});
        own(xcb_window_t(m_window.winId()));
    }
    ~Compositor() { own(XCB_NONE); }

private:
    static void own(xcb_window_t owner)
    {
        xcb_set_selection_owner(QX11Info::connection(), owner, xwindows::atom("_NET_WM_CM_S0"), XCB_CURRENT_TIME);
        xcb_flush(QX11Info::connection());
        if (!QTest::qWaitFor([owner] { return QX11Info::isCompositingManagerRunning() == (owner != XCB_NONE); }))
            qFatal("Qt does not see the compositing manager");
    }
    QWidget m_window;
};
