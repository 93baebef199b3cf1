// SPDX-License-Identifier: Apache-2.0
#include "system/randnum.h"

#include "system/legacyqt.h"

#include <QTime>

int zent::generateRandnum(int a, int b)
{
    zent::legacy::seedRandom(static_cast<unsigned int>(QTime(0, 0).secsTo(QTime::currentTime())));
    const int r = zent::legacy::random();
    return a == b ? b : r % (a - b) + b;
}
