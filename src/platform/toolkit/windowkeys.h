#pragma once

class QKeyEvent;
class QWidget;

/** What the keys mean in every window of the toolkit, where the widget that has the focus leaves them alone. */
namespace windowkeys
{

/// Esc closes @p window, Return presses the button in it that has the focus. Returns whether the key meant either;
/// the window may be gone then.
bool handle(QWidget* window, const QKeyEvent* event);

} // namespace windowkeys
