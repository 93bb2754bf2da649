// ScopeView: an oscilloscope's screen for the generator's outputs. Each channel's samples are drawn
// in its own colour over a grid of 10 by 8 divisions, the scale chosen to fit; the window starts
// at a rising crossing of the first channel, so a periodic output stands still as on a scope.
#pragma once

#include <QWidget>

#include <string>
#include <vector>

namespace qzivi {
class QZIviFgen;
}

namespace qzfgen {

class ScopeView : public QWidget {
    Q_OBJECT

public:
    explicit ScopeView(QWidget* parent = nullptr);

    struct Trace {
        QString name;
        std::vector<double> volts;
    };
    // Renders every channel of the control from `time` seconds on, for 10 divisions of
    // `secondsPerDivision`; a channel the driver cannot render is left out, and without a
    // session the screen is blank with a note.
    void Capture(qzivi::QZIviFgen& control, double time);
    void SecondsPerDivision(double seconds) { m_dSecondsPerDivision = seconds; }
    double SecondsPerDivision() const { return m_dSecondsPerDivision; }
    // A time base that shows about three periods of `frequency`, on the 1-2-5 steps.
    static double TimeBaseFor(double frequency);
    const std::vector<Trace>& Traces() const { return m_vTraces; }
    QSize sizeHint() const override { return {520, 260}; }

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    static constexpr int kPoints = 1000;
    std::vector<Trace> m_vTraces;
    QString m_sNote;
    double m_dSecondsPerDivision = 200e-6;
};

} // namespace qzfgen
