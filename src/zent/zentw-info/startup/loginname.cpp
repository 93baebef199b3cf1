#include "loginname.h"

#include <pwd.h>
#include <unistd.h>

QString sessionLoginName()
{
    const passwd* entry = getpwuid(getuid());
    return entry ? QString::fromLocal8Bit(entry->pw_name) : QString();
}
