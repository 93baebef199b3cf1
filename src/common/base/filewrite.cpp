#include "filewrite.h"

#include <QSaveFile>

namespace zent::base
{

WriteResult replaceFile(const QString& path, const QByteArray& content)
{
    QSaveFile file(path);
    file.setDirectWriteFallback(true);
    if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate))
        return WriteResult::NotOpened;
    file.write(content);
    return file.commit() ? WriteResult::Done : WriteResult::Short;
}

} // namespace zent::base
