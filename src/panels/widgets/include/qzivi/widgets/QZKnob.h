// QZKnob: a rotary knob with one pointer over a scale of 270 degrees, as on a bench instrument.
// The operator turns it with the mouse (dragging around its centre), the wheel or the keys;
// ValueChanged fires while it turns and ValueCommitted once when the operator lets go. A put of
// Value moves the pointer and fires nothing.
#pragma once

#include "qzivi/widgets/QZAxis.h"

#include <QWidget>

namespace qzivi {

class QZKnob : public QWidget {
    Q_OBJECT
    Q_PROPERTY(double value READ Value WRITE Value)
    Q_PROPERTY(double minimum READ Minimum WRITE Minimum)
    Q_PROPERTY(double maximum READ Maximum WRITE Maximum)
    Q_PROPERTY(int index READ Index WRITE Index)

public:
    explicit QZKnob(QWidget* parent = nullptr);

    double Value() const { return m_dValue; }
    // Stored as given; the pointer stops at the ends of the axis.
    void Value(double value);
    QZAxis& Axis() { return *m_oAxis; }
    const QZAxis& Axis() const { return *m_oAxis; }
    double Minimum() const { return m_oAxis->Minimum(); }
    void Minimum(double value) { m_oAxis->Minimum(value); }
    double Maximum() const { return m_oAxis->Maximum(); }
    void Maximum(double value) { m_oAxis->Maximum(value); }
    // The position in a control array; passed with every event.
    int Index() const { return m_lIndex; }
    void Index(int value) { m_lIndex = value; }
    // One step of the keys and the wheel, as a fraction of the axis.
    static constexpr double kStep = 0.01;

    QSize sizeHint() const override { return {70, 62}; }
    QSize minimumSizeHint() const override { return {32, 32}; }

signals:
    // While the operator turns the knob.
    void ValueChanged(int index, double value);
    // Once, when the operator ends a change.
    void ValueCommitted(int index, double value);
    void Pressed(int index);
    void Released(int index);

protected:
    void paintEvent(QPaintEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void wheelEvent(QWheelEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void focusInEvent(QFocusEvent* event) override;
    void focusOutEvent(QFocusEvent* event) override;

private:
    // The dial: centre and radius of the knob body, inside the scale and its labels.
    QPointF Centre() const;
    double Radius() const;
    int LabelPixels() const;
    // The value at the angle of a point, held to the scale.
    double ValueAtPoint(const QPointF& point) const;
    // An operator's change: the value, the pointer, the event.
    void Turn(double value);
    void Step(double fractions);

    QZAxis* m_oAxis;
    double m_dValue = 0;
    int m_lIndex = -1;
    bool m_bDragging = false;
};

} // namespace qzivi
