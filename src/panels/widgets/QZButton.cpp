#include "qzivi/widgets/QZButton.h"

#include <QAccessible>
#include <QKeyEvent>
#include <QMouseEvent>
#include <QPainter>

namespace qzivi {

QZButton::QZButton(QWidget* parent) : QWidget(parent) {
    setFocusPolicy(Qt::StrongFocus);
    setAttribute(Qt::WA_Hover);
    setCursor(Qt::PointingHandCursor);
}

void QZButton::Value(bool value) {
    m_bValue = value;
    update();
    QAccessible::State changed;
    changed.checked = true;
    QAccessibleStateChangeEvent event(this, changed);
    QAccessible::updateAccessibility(&event);
}

void QZButton::OnPicture(QIcon picture) {
    m_oOnPicture = std::move(picture);
    update();
}

void QZButton::OffPicture(QIcon picture) {
    m_oOffPicture = std::move(picture);
    update();
}

void QZButton::OperatorClick() {
    Value(!m_bValue);
    emit Click(m_lIndex);
}

void QZButton::mousePressEvent(QMouseEvent* event) {
    if (event->button() != Qt::LeftButton) return QWidget::mousePressEvent(event);
    m_bDown = true;
    update();
}

void QZButton::mouseReleaseEvent(QMouseEvent* event) {
    if (!m_bDown || event->button() != Qt::LeftButton) return QWidget::mouseReleaseEvent(event);
    m_bDown = false;
    update();
    if (rect().contains(event->position().toPoint())) OperatorClick();
}

void QZButton::keyPressEvent(QKeyEvent* event) {
    if (event->key() == Qt::Key_Space || event->key() == Qt::Key_Return ||
        event->key() == Qt::Key_Enter) {
        OperatorClick();
        event->accept();
        return;
    }
    QWidget::keyPressEvent(event);
}

void QZButton::enterEvent(QEnterEvent* event) {
    m_bHover = true;
    update();
    QWidget::enterEvent(event);
}

void QZButton::leaveEvent(QEvent* event) {
    m_bHover = false;
    update();
    QWidget::leaveEvent(event);
}

void QZButton::paintEvent(QPaintEvent*) {
    QPainter p(this);
    p.setRenderHint(QPainter::Antialiasing);
    const bool on = isEnabled();
    const QRectF key = QRectF(rect()).adjusted(1.5, 1.5, -1.5, -1.5);
    const double radius = std::min(key.height(), key.width()) * 0.18;

    // The key: a light face, raised when up and sunk when pressed or on.
    QLinearGradient face(key.topLeft(), key.bottomLeft());
    const bool sunk = m_bDown || m_bValue;
    face.setColorAt(0, sunk ? QColor(0xb9, 0xbe, 0xc5) : QColor(0xf2, 0xf3, 0xf5));
    face.setColorAt(1, sunk ? QColor(0xd3, 0xd7, 0xdc) : QColor(0xc8, 0xcc, 0xd2));
    if (!on) {
        face.setColorAt(0, QColor(0xd8, 0xd8, 0xd8));
        face.setColorAt(1, QColor(0xcc, 0xcc, 0xcc));
    }
    p.setPen(QPen(hasFocus() ? palette().color(QPalette::Highlight) : QColor(0x1a, 0x1c, 0x1f),
                  hasFocus() ? 2.0 : 1.2));
    p.setBrush(face);
    p.drawRoundedRect(key, radius, radius);
    if (m_bHover && on && !sunk) {
        p.setPen(Qt::NoPen);
        p.setBrush(QColor(255, 255, 255, 60));
        p.drawRoundedRect(key, radius, radius);
    }
    // The lamp of a pressed function, along the top edge.
    const QRectF lamp(key.left() + key.width() * 0.3, key.top() + 2.5, key.width() * 0.4, 2.5);
    p.setPen(Qt::NoPen);
    p.setBrush(m_bValue && on ? QColor(0x22, 0xc5, 0x5e) : QColor(0x8d, 0x93, 0x9b));
    p.drawRoundedRect(lamp, 1, 1);

    const QIcon& picture = m_bValue ? m_oOnPicture : m_oOffPicture;
    if (!picture.isNull()) {
        const QRectF area = key.adjusted(key.width() * 0.16, key.height() * 0.24,
                                         -key.width() * 0.16, -key.height() * 0.1);
        const QRect target = area.toAlignedRect().translated(sunk ? QPoint(0, 1) : QPoint());
        picture.paint(&p, target, Qt::AlignCenter, on ? QIcon::Normal : QIcon::Disabled);
    }
}

} // namespace qzivi
