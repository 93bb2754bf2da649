#include "qzivi/panels/Pictures.h"

#include <QFile>
#include <QPainter>
#include <QSvgRenderer>

// The resource lives in a static library: it is registered once, at its first use.
static void InitResources() {
    static const bool registered = [] {
        Q_INIT_RESOURCE(qzivi);
        return true;
    }();
    (void)registered;
}

namespace qzivi {

namespace {
QString PathOf(int id) {
    InitResources();
    return QStringLiteral(":/qzivi/pictures/%1.svg").arg(id);
}
} // namespace

QIcon LoadPictureFromResource(int id) {
    const QString path = PathOf(id);
    return QFile::exists(path) ? QIcon(path) : QIcon();
}

QPixmap PictureFromHandle(int id, QSize size, qreal devicePixelRatio) {
    QSvgRenderer renderer(PathOf(id));
    if (!renderer.isValid()) return {};
    QPixmap pixmap(size * devicePixelRatio);
    pixmap.setDevicePixelRatio(devicePixelRatio);
    pixmap.fill(Qt::transparent);
    QPainter painter(&pixmap);
    renderer.render(&painter, QRectF(QPointF(0, 0), QSizeF(size)));
    return pixmap;
}

QColor ResolveColor(std::uint32_t value, const QPalette& palette) {
    if ((value & 0x80000000u) == 0)
        return QColor(static_cast<int>(value & 0xFF), static_cast<int>((value >> 8) & 0xFF),
                      static_cast<int>((value >> 16) & 0xFF));
    switch (value & 0x7FFFFFFFu) {
    case 5: // window
        return palette.color(QPalette::Base);
    case 8: // window text
    case 7: // menu text
        return palette.color(QPalette::Text);
    case 13: // highlight
        return palette.color(QPalette::Highlight);
    case 14: // highlighted text
        return palette.color(QPalette::HighlightedText);
    case 16: // button shadow
        return palette.color(QPalette::Mid);
    case 17: // grey text
        return palette.color(QPalette::Disabled, QPalette::Text);
    case 18: // button text
        return palette.color(QPalette::ButtonText);
    case 20: // button highlight
        return palette.color(QPalette::Light);
    case 21: // dark shadow
        return palette.color(QPalette::Shadow);
    case 15: // button face
    default:
        return palette.color(QPalette::Button);
    }
}

} // namespace qzivi
