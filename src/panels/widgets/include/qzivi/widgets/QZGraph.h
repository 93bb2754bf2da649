// QZGraph: a line plot on a black ground with a grid and two axes. PlotY plots an array against
// its index and replaces what was shown; the axis limits stay as set. A large array is reduced
// to the lowest and highest value of each pixel column once per change of the data or the
// width, so a repaint costs the width of the plot, not the number of points.
#pragma once

#include "qzivi/panels/PlotColumns.h"
#include "qzivi/widgets/QZAxis.h"

#include <QWidget>

#include <memory>
#include <vector>

namespace qzivi {

class QZGraph : public QWidget {
    Q_OBJECT

public:
    explicit QZGraph(QWidget* parent = nullptr);

    // Axes(1) is the horizontal axis, Axes(2) the vertical one.
    QZAxis& Axes(int index) { return index == 1 ? *m_oXAxis : *m_oYAxis; }
    QZAxis& XAxis() { return *m_oXAxis; }
    QZAxis& YAxis() { return *m_oYAxis; }

    // The points are shared, not copied: the graph keeps them until the next PlotY.
    void PlotY(std::shared_ptr<const std::vector<double>> points);
    void PlotY(std::vector<double> points);
    void ClearData();
    const std::shared_ptr<const std::vector<double>>& Data() const { return m_oPoints; }

    // The axis labels, shown where the plot is large enough to carry them (the default).
    void ShowLabels(bool show) {
        m_bLabels = show;
        Invalidate();
    }
    // The plot's area inside the axis labels.
    QRectF PlotArea() const;
    // The columns drawn at the present width, one a device pixel (for tests and the benchmark).
    const std::vector<ColumnRange>& Columns(double devicePixelRatio = 1);

    QSize sizeHint() const override { return {94, 56}; }

protected:
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;

private:
    // Points of the data that the horizontal axis shows, as [first, end).
    std::pair<std::size_t, std::size_t> Visible() const;
    void Invalidate();

    QZAxis* m_oXAxis;
    QZAxis* m_oYAxis;
    std::shared_ptr<const std::vector<double>> m_oPoints;
    std::vector<ColumnRange> m_oColumns;
    bool m_bColumnsValid = false;
    bool m_bLabels = true;
    int m_lColumnsWidth = -1;
};

} // namespace qzivi
