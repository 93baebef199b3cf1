// SPDX-License-Identifier: Apache-2.0
#include "displaytext.h"

QString zent::display::cut(const QString& text, int length)
{
    if (text.size() <= length)
        return text;
    // Not through the middle of a character.
    const int end = text.at(length - 1).isHighSurrogate() ? length - 1 : length;
    return text.left(end) + QChar(0x2026);
}
