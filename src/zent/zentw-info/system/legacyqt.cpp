// SPDX-License-Identifier: Apache-2.0
#include "system/legacyqt.h"

#include <QtGlobal>

namespace zent::legacy
{

QT_WARNING_PUSH
QT_WARNING_DISABLE_DEPRECATED

void seedRandom(unsigned int seed)
{
    qsrand(seed);
}

int random()
{
    return qrand();
}

QT_WARNING_POP

} // namespace zent::legacy
