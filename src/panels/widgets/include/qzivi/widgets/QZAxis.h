// The axis of a knob or a graph: the range of its values and its direction.
#pragma once

#include <QObject>

namespace qzivi {

class QZAxis : public QObject {
    Q_OBJECT
    Q_PROPERTY(double minimum READ Minimum WRITE Minimum NOTIFY Changed)
    Q_PROPERTY(double maximum READ Maximum WRITE Maximum NOTIFY Changed)
    Q_PROPERTY(bool inverted READ Inverted WRITE Inverted NOTIFY Changed)

public:
    QZAxis(double minimum, double maximum, QObject* parent = nullptr)
        : QObject(parent), m_dMinimum(minimum), m_dMaximum(maximum) {}

    double Minimum() const { return m_dMinimum; }
    void Minimum(double value) { Set(m_dMinimum, value); }
    double Maximum() const { return m_dMaximum; }
    void Maximum(double value) { Set(m_dMaximum, value); }
    bool Inverted() const { return m_bInverted; }
    void Inverted(bool value) {
        m_bInverted = value;
        emit Changed();
    }

    // Where `value` lies between the limits, 0 at Minimum and 1 at Maximum (the other way when
    // inverted), held to 0..1.
    double Fraction(double value) const;
    // The value at a fraction of the axis.
    double ValueAt(double fraction) const;

signals:
    void Changed();

private:
    void Set(double& field, double value) {
        field = value;
        emit Changed();
    }

    double m_dMinimum;
    double m_dMaximum;
    bool m_bInverted = false;
};

// A short text of an axis value: three digits with an SI prefix ("1.5k", "20m", "-10").
QString AxisLabel(double value);

} // namespace qzivi
