#include "qzivi/panels/CPaintFlickerFree.h"

#include "qzivi/panels/Pictures.h"

#include <QWidget>

namespace qzivi {

QPainter* CPaintFlickerFree::BeginPainting(QPainter& target, const QWidget& widget) {
    StopPainting();
    const qreal ratio = widget.devicePixelRatioF();
    m_oTarget = &target;
    m_oPalette = widget.palette();
    m_oPixmap = QPixmap(widget.size() * ratio);
    m_oPixmap.setDevicePixelRatio(ratio);
    m_oPainter.emplace(&m_oPixmap);
    return &*m_oPainter;
}

void CPaintFlickerFree::EraseBackground(std::uint32_t colour) {
    if (m_oPainter)
        m_oPainter->fillRect(QRectF(QPointF(0, 0), m_oPixmap.deviceIndependentSize()),
                             ResolveColor(colour, m_oPalette));
}

void CPaintFlickerFree::StopPainting() {
    if (!m_oPainter) return;
    m_oPainter.reset();
    m_oTarget->drawPixmap(0, 0, m_oPixmap);
    m_oTarget = nullptr;
    m_oPixmap = QPixmap();
}

} // namespace qzivi
