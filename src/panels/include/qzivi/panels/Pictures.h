// The pictures of the system, SVG files in a Qt resource keyed by the system's resource ids, drawn
// at the size asked for and the screen's pixel ratio so that they stay sharp.
#pragma once

#include <QIcon>
#include <QPixmap>

namespace qzivi {

// The picture of resource `id`; a null icon for an id that has none.
QIcon LoadPictureFromResource(int id);
// The same, drawn to a pixmap of `size` device-independent pixels at `devicePixelRatio`.
QPixmap PictureFromHandle(int id, QSize size, qreal devicePixelRatio = 1);

} // namespace qzivi
