// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Deprecated Qt calls whose exact behaviour is agreed. Each is called here and nowhere else.
namespace zent::legacy
{

/// Seeds the generator behind random().
void seedRandom(unsigned int seed);

/// The next number of the sequence that seedRandom() began; the same seed gives the same numbers on every terminal.
int random();

} // namespace zent::legacy
