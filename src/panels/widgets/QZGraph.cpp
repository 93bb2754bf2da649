#include "qzivi/widgets/QZGraph.h"

#include <QPainter>
#include <QPainterPath>

#include <algorithm>
#include <cmath>

namespace qzivi {

namespace {
// Below this many points a column, the line goes through every point.
constexpr double kPointsPerColumn = 2;
} // namespace

QZGraph::QZGraph(QWidget* parent)
    : QWidget(parent), m_oXAxis(new QZAxis(0, 100, this)), m_oYAxis(new QZAxis(-20, 20, this)) {
    setAttribute(Qt::WA_OpaquePaintEvent);
    connect(m_oXAxis, &QZAxis::Changed, this, [this] { Invalidate(); });
    connect(m_oYAxis, &QZAxis::Changed, this, qOverload<>(&QWidget::update));
    setAccessibleName(tr("Waveform preview"));
}

void QZGraph::Invalidate() {
    m_bColumnsValid = false;
    update();
}

void QZGraph::PlotY(std::shared_ptr<const std::vector<double>> points) {
    m_oPoints = std::move(points);
    Invalidate();
}

void QZGraph::PlotY(std::vector<double> points) {
    PlotY(std::make_shared<const std::vector<double>>(std::move(points)));
}

void QZGraph::ClearData() {
    m_oPoints.reset();
    Invalidate();
}

void QZGraph::resizeEvent(QResizeEvent* event) {
    Invalidate();
    QWidget::resizeEvent(event);
}

QRectF QZGraph::PlotArea() const {
    // Room for the labels only where the plot is large enough to carry them.
    const bool labels = m_bLabels && width() >= 160 && height() >= 90;
    const double left = labels ? fontMetrics().horizontalAdvance(QStringLiteral("-20.0m")) + 6 : 1;
    const double top = labels ? fontMetrics().height() / 2.0 + 1 : 1;
    const double bottom = labels ? fontMetrics().height() + 4 : 1;
    return QRectF(left, top, width() - left - 2, height() - top - bottom - 1);
}

std::pair<std::size_t, std::size_t> QZGraph::Visible() const {
    if (!m_oPoints || m_oPoints->empty()) return {0, 0};
    const double n = static_cast<double>(m_oPoints->size());
    const double lo = std::min(m_oXAxis->Minimum(), m_oXAxis->Maximum());
    const double hi = std::max(m_oXAxis->Minimum(), m_oXAxis->Maximum());
    const auto first = static_cast<std::size_t>(std::clamp(std::ceil(lo), 0.0, n));
    const auto end = static_cast<std::size_t>(std::clamp(std::floor(hi) + 1, 0.0, n));
    return {first, std::max(first, end)};
}

const std::vector<ColumnRange>& QZGraph::Columns(double devicePixelRatio) {
    // One column a device pixel, so that a sharp screen shows a solid trace.
    const int columns = std::max(1, static_cast<int>(PlotArea().width() * devicePixelRatio));
    if (!m_bColumnsValid || m_lColumnsWidth != columns) {
        const auto [first, end] = Visible();
        m_oColumns = m_oPoints && end - first > kPointsPerColumn * columns
                         ? ReduceToColumns(std::span(m_oPoints->data() + first, end - first),
                                           static_cast<std::size_t>(columns))
                         : std::vector<ColumnRange>();
        m_bColumnsValid = true;
        m_lColumnsWidth = columns;
    }
    return m_oColumns;
}

void QZGraph::paintEvent(QPaintEvent*) {
    QPainter p(this);
    p.fillRect(rect(), Qt::black);
    const QRectF area = PlotArea();
    const bool labels = area.left() > 1;

    // The grid: ten by eight divisions, the centre lines brighter.
    for (int k = 0; k <= 10; ++k) {
        const double x = area.left() + area.width() * k / 10;
        p.setPen(QPen(QColor(k == 5 ? 0x3c : 0x26, k == 5 ? 0x48 : 0x2e, k == 5 ? 0x3c : 0x26), 1,
                      k == 0 || k == 10 ? Qt::SolidLine : Qt::DotLine));
        p.drawLine(QPointF(x, area.top()), QPointF(x, area.bottom()));
    }
    for (int k = 0; k <= 8; ++k) {
        const double y = area.top() + area.height() * k / 8;
        p.setPen(QPen(QColor(k == 4 ? 0x3c : 0x26, k == 4 ? 0x48 : 0x2e, k == 4 ? 0x3c : 0x26), 1,
                      k == 0 || k == 8 ? Qt::SolidLine : Qt::DotLine));
        p.drawLine(QPointF(area.left(), y), QPointF(area.right(), y));
    }
    if (labels) {
        p.setPen(QColor(0x9a, 0xa8, 0x9a));
        const QFontMetrics fm = fontMetrics();
        for (int k = 0; k <= 4; ++k) {
            const double y = area.top() + area.height() * k / 4;
            const QString text = AxisLabel(m_oYAxis->ValueAt(1 - k / 4.0));
            p.drawText(QRectF(0, y - fm.height() / 2.0, area.left() - 4, fm.height()),
                       Qt::AlignRight | Qt::AlignVCenter, text);
        }
        for (int k = 0; k <= 2; ++k) {
            const double x = area.left() + area.width() * k / 2;
            const QString text = AxisLabel(m_oXAxis->ValueAt(k / 2.0));
            const Qt::Alignment align = k == 0   ? Qt::AlignLeft
                                        : k == 2 ? Qt::AlignRight
                                                 : Qt::AlignHCenter;
            p.drawText(
                QRectF(k == 0 ? x : x - 60, area.bottom() + 2, k == 1 ? 120 : 60, fm.height()),
                align | Qt::AlignTop, text);
        }
    }

    if (!m_oPoints || m_oPoints->empty()) return;
    p.setClipRect(area.adjusted(-1, -1, 1, 1));
    p.setRenderHint(QPainter::Antialiasing);
    p.setPen(QPen(QColor(0xf5, 0xe0, 0x3c), 1.3));
    auto y = [&](double value) {
        return area.bottom() - m_oYAxis->Fraction(value) * area.height() +
               (value > std::max(m_oYAxis->Minimum(), m_oYAxis->Maximum()) ? -2 : 0);
    };
    const auto& columns = Columns(std::max(1.0, std::fabs(p.deviceTransform().m11())));
    if (!columns.empty()) {
        // Down each column from its highest to its lowest point, and on to the next one: lines of
        // one device pixel, which the rasteriser draws without stroking a path.
        std::vector<QLineF> lines;
        lines.reserve(2 * columns.size());
        double previous = 0;
        for (std::size_t c = 0; c < columns.size(); ++c) {
            const double x = area.left() + (static_cast<double>(c) + 0.5) * area.width() /
                                               static_cast<double>(columns.size());
            if (c > 0) lines.emplace_back(previous, y(columns[c - 1].last), x, y(columns[c].first));
            lines.emplace_back(x, y(columns[c].high), x, y(columns[c].low));
            previous = x;
        }
        QPen pen(QColor(0xf5, 0xe0, 0x3c), 1);
        pen.setCosmetic(true);
        p.setPen(pen);
        p.setRenderHint(QPainter::Antialiasing, false);
        p.drawLines(lines.data(), static_cast<int>(lines.size()));
        return;
    }
    const auto [first, end] = Visible();
    if (end <= first) return;
    QPolygonF line;
    line.reserve(static_cast<qsizetype>(end - first));
    const auto& data = *m_oPoints;
    for (std::size_t i = first; i < end; ++i)
        line.append(QPointF(area.left() + m_oXAxis->Fraction(static_cast<double>(i)) * area.width(),
                            y(data[i])));
    p.drawPolyline(line);
}

} // namespace qzivi
