// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QTest>
#include <QWidget>
#include <QX11Info>

#include <cstdlib>
#include <cstring>
#include <memory>
#include <xcb/xcb.h>

/// Windows on an X display, as the server knows them.
namespace xwindows
{

inline const char kBlurProperty[] = "_KDE_NET_WM_BLUR_BEHIND_REGION";

template <typename Reply>
std::unique_ptr<Reply, decltype(&std::free)> owned(Reply* reply)
{
    return {reply, &std::free};
}

inline xcb_atom_t atom(const char* name)
{
    const auto cookie = xcb_intern_atom(QX11Info::connection(), 0, uint16_t(strlen(name)), name);
    return owned(xcb_intern_atom_reply(QX11Info::connection(), cookie, nullptr))->atom;
}

} // namespace xwindows

/// Stands in for a compositing manager for as long as it lives, one that blurs.
class Compositor
{
public:
    Compositor()
    {
        m_window.winId();
        const quint32 blurs = 1;
        xcb_change_property(QX11Info::connection(), XCB_PROP_MODE_REPLACE, QX11Info::appRootWindow(),
                            xwindows::atom(xwindows::kBlurProperty), XCB_ATOM_CARDINAL, 32, 1, &blurs);
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
