// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>

/// How much of a text that somebody else sent is shown: laying out a text without blanks takes the square of its
/// length.
namespace zent::display
{

/// The most characters shown of a message's content, of a scene's name, and of every other value.
constexpr int kContentLength = 50000;
constexpr int kSceneNameLength = 200;
constexpr int kValueLength = 1000;

/// The text as it is shown: whole, or its first characters and "…" where it has more than `length`.
QString cut(const QString& text, int length = kValueLength);

} // namespace zent::display
