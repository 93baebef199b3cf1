#pragma once

#include <QString>

/// Deprecated Qt calls whose exact behaviour the platform relies on. Each is called here and nowhere else.
namespace zent::legacy
{

/// Seeds the generator behind random().
void seedRandom(unsigned int seed);

/// The next number of the sequence that seedRandom() began; the same seed gives the same numbers on every terminal.
int random();

/// Starts one command line, split at blanks, as a detached process; false when nothing was started.
bool startDetached(const QString& commandLine);

} // namespace zent::legacy
