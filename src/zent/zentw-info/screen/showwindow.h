// SPDX-License-Identifier: Apache-2.0
#pragma once

class QWidget;

namespace zent
{

/// Shows a window above the others and gives it the keyboard, as the answer to what the user or an event has just asked
/// for. Window managers that hold new windows back let this one through.
void showActive(QWidget& window);

} // namespace zent
