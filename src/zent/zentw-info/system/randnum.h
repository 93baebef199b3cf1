// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

namespace zent
{

/// A random integer in [b, a); b when both are equal. Seeded with the seconds since midnight, so that calls within one
/// second give the same number.
int generateRandnum(int a, int b);

/// Where the polls take their intervals from, in milliseconds: a number in [earliest, latest).
using RandomInterval = std::function<int(int latest, int earliest)>;

} // namespace zent
