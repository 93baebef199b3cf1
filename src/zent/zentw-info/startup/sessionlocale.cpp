// SPDX-License-Identifier: Apache-2.0
#include "startup/sessionlocale.h"

#include <clocale>

void zent::initLocale()
{
    if (!std::setlocale(LC_ALL, "") && !std::setlocale(LC_CTYPE, ""))
        std::setlocale(LC_CTYPE, "C.UTF-8");
}
