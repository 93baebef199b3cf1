// SPDX-License-Identifier: Apache-2.0
#include "system/loginname.h"

#include <pwd.h>
#include <unistd.h>

QString sessionLoginName()
{
    // Once: the directory may be far away, and the polls ask every few seconds.
    static QString name;
    if (name.isEmpty()) {
        const passwd* entry = getpwuid(getuid());
        name = entry ? QString::fromLocal8Bit(entry->pw_name) : QString();
    }
    return name;
}
