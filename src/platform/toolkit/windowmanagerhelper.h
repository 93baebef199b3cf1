#pragma once

/** What the window manager of the running session can do. Ask after the application object exists. */
class WindowManagerHelper
{
public:
    static WindowManagerHelper* instance();

    /// Whether the window manager blurs what lies behind a translucent window that asks for it.
    bool hasBlurWindow() const;

    /// Whether windows are composited, that is, whether a translucent window shows what lies behind it.
    bool hasComposite() const;

private:
    WindowManagerHelper() = default;
};
