// SPDX-License-Identifier: Apache-2.0
#include "fileproxy.h"

#include <QDebug>

namespace zent::base
{

FileProxy::FileProxy(QObject* parent) : QObject(parent)
{
}

bool FileProxy::open(const QString& path, QIODevice::OpenMode mode)
{
    if (openSilently(path, mode))
        return true;
    qWarning() << "open file failed, file:" << path << ", mode:" << mode << ", exist:" << m_file.exists();
    return false;
}

bool FileProxy::openSilently(const QString& path, QIODevice::OpenMode mode)
{
    m_file.setFileName(path);
    return m_file.open(mode);
}

FileError FileProxy::error() const
{
    return {m_file.error(), m_file.errorString()};
}

QByteArray FileProxy::readAll()
{
    return m_file.isOpen() ? m_file.readAll() : QByteArray();
}

} // namespace zent::base
