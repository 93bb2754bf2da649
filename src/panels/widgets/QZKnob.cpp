#include "qzivi/widgets/QZKnob.h"

#include <QAccessible>
#include <QKeyEvent>
#include <QMouseEvent>
#include <QPainter>
#include <QPainterPath>
#include <QWheelEvent>

#include <algorithm>
#include <cmath>
#include <numbers>

namespace qzivi {

namespace {

// The scale runs clockwise from 225 degrees (lower left) to -45 degrees (lower right).
constexpr double kStartDegrees = 225;
constexpr double kSweepDegrees = 270;

QPointF OnCircle(const QPointF& centre, double radius, double degrees) {
    const double a = degrees * std::numbers::pi / 180;
    return centre + QPointF(radius * std::cos(a), -radius * std::sin(a));
}

} // namespace

QZKnob::QZKnob(QWidget* parent) : QWidget(parent), m_oAxis(new QZAxis(0, 10, this)) {
    setFocusPolicy(Qt::StrongFocus);
    setAttribute(Qt::WA_Hover);
    connect(m_oAxis, &QZAxis::Changed, this, qOverload<>(&QWidget::update));
    setAccessibleName(tr("Knob"));
}

void QZKnob::Value(double value) {
    m_dValue = value;
    update();
    QAccessibleValueChangeEvent event(this, value);
    QAccessible::updateAccessibility(&event);
}

QPointF QZKnob::Centre() const {
    return {width() / 2.0, height() / 2.0};
}

double QZKnob::Radius() const {
    // Room for the scale around the body, and below its ends for their labels.
    const double room = std::min(width() * 0.5, height() * 0.5);
    const double labels = LabelPixels() + 2;
    return std::max(4.0, std::min(room / 1.36, (height() * 0.5 - labels) / 0.94));
}

int QZKnob::LabelPixels() const {
    return std::clamp(static_cast<int>(std::min(width(), height()) * 0.13), 8, 12);
}

double QZKnob::ValueAtPoint(const QPointF& point) const {
    const QPointF d = point - Centre();
    double degrees = std::atan2(-d.y(), d.x()) * 180 / std::numbers::pi; // -180..180
    // Degrees travelled clockwise from the start of the scale, 0..360.
    double travelled = std::fmod(kStartDegrees - degrees + 720, 360);
    if (travelled > kSweepDegrees) // the gap at the bottom: the nearer end
        travelled = travelled - kSweepDegrees < (360 - kSweepDegrees) / 2 ? kSweepDegrees : 0;
    return m_oAxis->ValueAt(travelled / kSweepDegrees);
}

void QZKnob::Turn(double value) {
    if (value == m_dValue) return;
    Value(value);
    emit ValueChanged(m_lIndex, value);
}

void QZKnob::Step(double fractions) {
    const double span = Maximum() - Minimum();
    const double value = std::clamp(m_dValue + fractions * kStep * span,
                                    std::min(Minimum(), Maximum()), std::max(Minimum(), Maximum()));
    Turn(value);
    emit ValueCommitted(m_lIndex, m_dValue);
}

void QZKnob::mousePressEvent(QMouseEvent* event) {
    if (event->button() != Qt::LeftButton) return QWidget::mousePressEvent(event);
    m_bDragging = true;
    emit Pressed(m_lIndex);
    Turn(ValueAtPoint(event->position()));
}

void QZKnob::mouseMoveEvent(QMouseEvent* event) {
    if (m_bDragging) Turn(ValueAtPoint(event->position()));
}

void QZKnob::mouseReleaseEvent(QMouseEvent* event) {
    if (!m_bDragging || event->button() != Qt::LeftButton) return QWidget::mouseReleaseEvent(event);
    m_bDragging = false;
    Turn(ValueAtPoint(event->position()));
    emit ValueCommitted(m_lIndex, m_dValue);
    emit Released(m_lIndex);
}

void QZKnob::wheelEvent(QWheelEvent* event) {
    const int notches = event->angleDelta().y() / 120;
    if (notches == 0) return QWidget::wheelEvent(event);
    Step(notches);
    event->accept();
}

void QZKnob::keyPressEvent(QKeyEvent* event) {
    switch (event->key()) {
    case Qt::Key_Up:
    case Qt::Key_Right:
        Step(1);
        break;
    case Qt::Key_Down:
    case Qt::Key_Left:
        Step(-1);
        break;
    case Qt::Key_PageUp:
        Step(10);
        break;
    case Qt::Key_PageDown:
        Step(-10);
        break;
    case Qt::Key_Home:
        Step(-1 / kStep);
        break;
    case Qt::Key_End:
        Step(1 / kStep);
        break;
    default:
        return QWidget::keyPressEvent(event);
    }
    event->accept();
}

void QZKnob::focusInEvent(QFocusEvent* event) {
    update();
    QWidget::focusInEvent(event);
}

void QZKnob::focusOutEvent(QFocusEvent* event) {
    update();
    QWidget::focusOutEvent(event);
}

void QZKnob::paintEvent(QPaintEvent*) {
    QPainter p(this);
    p.setRenderHint(QPainter::Antialiasing);
    const QPointF c = Centre();
    const double r = Radius();
    const bool on = isEnabled();
    const QColor ink =
        palette().color(on ? QPalette::Active : QPalette::Disabled, QPalette::WindowText);

    // The scale: eleven ticks, the ends and the middle longer and labelled.
    QFont small = font();
    small.setPixelSize(LabelPixels());
    p.setFont(small);
    for (int k = 0; k <= 10; ++k) {
        const double degrees = kStartDegrees - kSweepDegrees * k / 10.0;
        const bool major = k % 5 == 0;
        p.setPen(QPen(ink, major ? 1.4 : 0.8));
        p.drawLine(OnCircle(c, r * 1.12, degrees), OnCircle(c, r * (major ? 1.32 : 1.24), degrees));
        if (k == 0 || k == 10) {
            // Under the end of the scale, inside the knob's own rectangle.
            const QString label = AxisLabel(m_oAxis->ValueAt(k / 10.0));
            const double top = OnCircle(c, r * 1.32, degrees).y() + 1;
            const QRectF box = k == 0 ? QRectF(0, top, c.x() - 1, height() - top)
                                      : QRectF(c.x() + 1, top, width() - c.x() - 1, height() - top);
            p.drawText(box, (k == 0 ? Qt::AlignLeft : Qt::AlignRight) | Qt::AlignTop, label);
        }
    }

    // The body: a ridged metal cap.
    QRadialGradient body(c - QPointF(r * 0.35, r * 0.35), r * 1.6);
    body.setColorAt(0, on ? QColor(0x8a, 0x90, 0x99) : QColor(0xb0, 0xb0, 0xb0));
    body.setColorAt(1, on ? QColor(0x22, 0x25, 0x2a) : QColor(0x70, 0x70, 0x70));
    p.setPen(QPen(QColor(0x10, 0x10, 0x12), 1.2));
    p.setBrush(body);
    p.drawEllipse(c, r, r);
    QLinearGradient cap(c - QPointF(0, r * 0.7), c + QPointF(0, r * 0.7));
    cap.setColorAt(0, on ? QColor(0x5d, 0x63, 0x6b) : QColor(0x9a, 0x9a, 0x9a));
    cap.setColorAt(1, on ? QColor(0x2c, 0x2f, 0x34) : QColor(0x80, 0x80, 0x80));
    p.setBrush(cap);
    p.setPen(Qt::NoPen);
    p.drawEllipse(c, r * 0.72, r * 0.72);

    // The pointer.
    const double degrees = kStartDegrees - kSweepDegrees * m_oAxis->Fraction(m_dValue);
    const QColor accent = on ? QColor(0xff, 0x9a, 0x1f) : QColor(0xd0, 0xd0, 0xd0);
    p.setPen(QPen(accent, std::max(1.5, r * 0.12), Qt::SolidLine, Qt::RoundCap));
    p.drawLine(OnCircle(c, r * 0.25, degrees), OnCircle(c, r * 0.9, degrees));

    if (hasFocus()) {
        p.setBrush(Qt::NoBrush);
        p.setPen(QPen(palette().color(QPalette::Highlight), 1.5, Qt::DotLine));
        p.drawEllipse(c, r + 2.5, r + 2.5);
    }
}

} // namespace qzivi
