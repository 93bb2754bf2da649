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

} // namespace qzivi
