// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QIcon>

namespace zent
{

/// An icon drawn from an SVG image, with a picture for each size that trays use, at the scale of each screen. Platform
/// plugins of some desktops hand to the tray only the sizes that an icon names, and one of a bare SVG names none.
QIcon sizedIcon(const QString& path);

} // namespace zent
