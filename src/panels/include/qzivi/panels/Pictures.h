// The drawing tools of the panels: the pictures of the system, SVG files in a Qt resource keyed
// by the system's resource ids and drawn at the size asked for and the screen's pixel ratio so
// that they stay sharp; and the system's colour values.
#pragma once

#include <QColor>
#include <QIcon>
#include <QPalette>
#include <QPixmap>

#include <cstdint>

namespace qzivi {

// The picture of resource `id`; a null icon for an id that has none.
QIcon LoadPictureFromResource(int id);
// The same, drawn to a pixmap of `size` device-independent pixels at `devicePixelRatio`.
QPixmap PictureFromHandle(int id, QSize size, qreal devicePixelRatio = 1);

// A colour of the system: 0x00BBGGRR, or with the top bit set a system colour index (15 the face
// of a button, 18 its text, ...), taken from the palette.
QColor ResolveColor(std::uint32_t value, const QPalette& palette);

} // namespace qzivi
