// SPDX-License-Identifier: Apache-2.0
#pragma once

/** What the window manager of the running session can do. Ask after the application object exists. */
class WindowManagerHelper
{
public:
    static WindowManagerHelper* instance();

    /// Whether the window manager blurs what lies behind a translucent window that asks for it.
    bool hasBlurWindow() const;

    /// Takes the display's present time for that of the user's last action, before a window is activated. Window
    /// managers compare the two, and what reaches the client over the session bus has no time.
    static void takePresentTime();

    /// Whether windows are composited, that is, whether a translucent window shows what lies behind it.
    bool hasComposite() const;

private:
    WindowManagerHelper() = default;
};
