// SPDX-License-Identifier: Apache-2.0
#include "tray/sizedicon.h"

#include <QGuiApplication>
#include <QImageReader>
#include <QPixmap>
#include <QScreen>

#include <set>

namespace zent
{

QIcon sizedIcon(const QString& path)
{
    std::set<int> sizes;
    const QList<QScreen*> screens = QGuiApplication::screens();
    for (int size : {16, 22, 24, 32, 48, 64}) {
        sizes.insert(size);
        for (const QScreen* screen : screens)
            sizes.insert(qRound(size * screen->devicePixelRatio()));
    }
    QIcon icon;
    for (int size : sizes) {
        QImageReader reader(path);
        reader.setScaledSize({size, size});
        icon.addPixmap(QPixmap::fromImageReader(&reader));
    }
    return icon;
}

} // namespace zent
