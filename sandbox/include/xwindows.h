// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QVector>
#include <QX11Info>

#include <cstdlib>
#include <cstring>
#include <memory>
#include <xcb/xcb.h>

/// Windows on an X display, as the server knows them.
namespace xwindows
{

/// A reply of the server, which is freed with the pointer.
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

/// The numbers of a property; none where the window has no such property.
inline QVector<quint32> property(quint64 window, const char* name)
{
    const auto cookie = xcb_get_property(QX11Info::connection(), 0, xcb_window_t(window), atom(name),
                                         XCB_GET_PROPERTY_TYPE_ANY, 0, 1000);
    const auto reply = owned(xcb_get_property_reply(QX11Info::connection(), cookie, nullptr));
    const auto* values = static_cast<const quint32*>(xcb_get_property_value(reply.get()));
    return {values, values + xcb_get_property_value_length(reply.get()) / 4};
}

inline void setProperty(quint64 window, const char* name, const QVector<quint32>& values)
{
    xcb_change_property(QX11Info::connection(), XCB_PROP_MODE_REPLACE, xcb_window_t(window), atom(name),
                        XCB_ATOM_CARDINAL, 32, uint32_t(values.size()), values.constData());
}

} // namespace xwindows
