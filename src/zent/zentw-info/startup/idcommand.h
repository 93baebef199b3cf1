#pragma once

#include <QString>

/// What the program "id" prints about the session user, decoded as local 8-bit text. Waits up to 30 s; empty when the
/// program does not start, crashes or does not end in time.
QString idCommandOutput();
