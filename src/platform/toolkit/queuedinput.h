// SPDX-License-Identifier: Apache-2.0
#pragma once

/// What the user does while the program is blocked and looks at no event.
namespace queuedinput
{

/**
 * Throws away clicks and keys that nobody has handled yet. The display keeps them while a call blocks, and they would
 * act afterwards. Runs no event loop. The events are told by the X server's time, so without an X server nothing
 * happens.
 */
void discard();

} // namespace queuedinput
