#include "legacyqt.h"

#include <QProcess>
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

bool startDetached(const QString& commandLine)
{
    return QProcess::startDetached(commandLine);
}

QT_WARNING_POP

} // namespace zent::legacy
