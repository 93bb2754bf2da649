#include "ScopeView.h"

#include "qzivi/control/QZIviFgen.h"
#include "qzivi/panels/MUiAndStringUtil.h"
#include "qzivi/support/failure.h"

#include <QPainter>
#include <QPainterPath>

#include <algorithm>
#include <cmath>

namespace qzfgen {

namespace {

const QColor kColours[] = {QColor(255, 221, 0), QColor(0, 200, 255), QColor(255, 80, 160),
                           QColor(120, 255, 120)};

// The smallest 1-2-5 step of at least `value`.
double Step125(double value) {
    const double decade = std::pow(10.0, std::floor(std::log10(value)));
    for (const double m : {1.0, 2.0, 5.0, 10.0})
        if (m * decade >= value * (1 - 1e-9)) return m * decade;
    return 10 * decade;
}

QString Si(double value, const char* unit) {
    return QString::fromStdString(qzivi::FormatScale(value, unit));
}

} // namespace

ScopeView::ScopeView(QWidget* parent) : QWidget(parent) {
    setObjectName("scope");
    setAccessibleName(tr("Oscilloscope view of the outputs"));
    setMinimumSize(320, 160);
}

double ScopeView::TimeBaseFor(double frequency) {
    if (!(frequency > 0) || !std::isfinite(frequency)) return 200e-6;
    return std::clamp(Step125(3 / frequency / 10), 100e-9, 1.0);
}

void ScopeView::Capture(qzivi::QZIviFgen& control, double time) {
    m_vTraces.clear();
    m_sNote.clear();
    if (control.SessionHandle() == 0) {
        m_sNote = tr("No session: Init opens one.");
        update();
        return;
    }
    const double span = 10 * m_dSecondsPerDivision;
    const double step = span / kPoints;
    double start = time;
    bool first = true;
    for (const auto& channel : *control.Channels()) {
        try {
            if (first) {
                // Twice the window, to find a rising crossing of the middle in its first half.
                const auto probe =
                    control.Engine().RenderOutput(channel->Name(), time, step, 2 * kPoints);
                const auto [low, high] = std::minmax_element(probe.begin(), probe.end());
                const double middle = (*low + *high) / 2;
                for (int k = 1; k < kPoints; ++k)
                    if (probe[k - 1] < middle && probe[k] >= middle) {
                        start = time + k * step;
                        break;
                    }
                first = false;
            }
            m_vTraces.push_back(
                {QString::fromStdString(channel->Name()),
                 control.Engine().RenderOutput(channel->Name(), start, step, kPoints)});
        } catch (const qzivi::Failure& failure) {
            m_sNote = QString::fromStdString(failure.Description());
        }
    }
    update();
}

void ScopeView::paintEvent(QPaintEvent*) {
    QPainter painter(this);
    painter.fillRect(rect(), Qt::black);
    painter.setRenderHint(QPainter::Antialiasing);
    const QRectF plot = QRectF(rect()).adjusted(8, 8, -8, -24);
    painter.setPen(QPen(QColor(60, 60, 60), 1));
    for (int i = 0; i <= 10; ++i) {
        const double x = plot.left() + plot.width() * i / 10;
        painter.drawLine(QPointF(x, plot.top()), QPointF(x, plot.bottom()));
    }
    for (int j = 0; j <= 8; ++j) {
        const double y = plot.top() + plot.height() * j / 8;
        painter.drawLine(QPointF(plot.left(), y), QPointF(plot.right(), y));
    }
    double peak = 0;
    for (const Trace& trace : m_vTraces)
        for (double v : trace.volts)
            if (std::isfinite(v)) peak = std::max(peak, std::fabs(v));
    const double perDivision = Step125(std::max(peak, 1e-3) / 4);
    int colour = 0;
    for (const Trace& trace : m_vTraces) {
        const QColor c = kColours[colour++ % 4];
        QPainterPath path;
        for (std::size_t k = 0; k < trace.volts.size(); ++k) {
            const double v = std::isfinite(trace.volts[k]) ? trace.volts[k] : 0;
            const QPointF at(plot.left() + plot.width() * static_cast<double>(k) / (kPoints - 1),
                             plot.center().y() - v / perDivision * plot.height() / 8);
            k == 0 ? path.moveTo(at) : path.lineTo(at);
        }
        painter.setPen(QPen(c, 1.5));
        painter.drawPath(path);
        painter.drawText(QPointF(plot.left() + 110 * (colour - 1), height() - 8), trace.name);
    }
    painter.setPen(Qt::lightGray);
    const QString scale =
        tr("%1/div   %2/div").arg(Si(perDivision, "V"), Si(m_dSecondsPerDivision, "s"));
    painter.drawText(QRectF(plot.left(), plot.bottom() + 4, plot.width(), 18),
                     Qt::AlignRight | Qt::AlignVCenter, scale);
    if (!m_sNote.isEmpty())
        painter.drawText(plot.adjusted(12, 12, -12, -12), Qt::AlignCenter | Qt::TextWordWrap,
                         m_sNote);
}

} // namespace qzfgen
