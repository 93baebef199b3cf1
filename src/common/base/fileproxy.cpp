#include "fileproxy.h"

#include <QDebug>

namespace zent::base
{

FileProxy::FileProxy(QObject* parent) : QObject(parent)
{
}

bool FileProxy::open(const QString& path, QIODevice::OpenMode mode)
{
    m_file.setFileName(path);
    if (m_file.open(mode))
        return true;
    qWarning() << "open file failed, file:" << path << ", mode:" << mode << ", exist:" << m_file.exists();
    return false;
}

QByteArray FileProxy::readAll()
{
    return m_file.isOpen() ? m_file.readAll() : QByteArray();
}

} // namespace zent::base
