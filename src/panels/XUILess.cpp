#include "qzivi/panels/XUILess.h"

#include "qzivi/panels/CUiSizingTool.h"
#include "qzivi/panels/Pictures.h"

#include <QPainter>

namespace qzivi {

namespace {
int FixedPixels() {
    return static_cast<int>(TwipsToPixels(XUILess::kSizeTwips));
}
} // namespace

XUILess::XUILess(QWidget* parent) : QWidget(parent) {
    setFixedSize(FixedPixels(), FixedPixels());
    setAccessibleName(tr("Function generator control"));
}

void XUILess::Size(float, float) {
    resize(FixedPixels(), FixedPixels());
}

void XUILess::resizeEvent(QResizeEvent* event) {
    if (width() != FixedPixels() || height() != FixedPixels()) resize(FixedPixels(), FixedPixels());
    QWidget::resizeEvent(event);
}

void XUILess::SetNewIcon(std::int32_t id) {
    m_lIcon = id;
    update();
}

void XUILess::paintEvent(QPaintEvent*) {
    QPainter p(this);
    p.drawPixmap(0, 0, PictureFromHandle(m_lIcon, size(), devicePixelRatioF()));
}

} // namespace qzivi
