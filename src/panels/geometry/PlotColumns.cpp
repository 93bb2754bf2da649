#include "qzivi/panels/PlotColumns.h"

#include <algorithm>

namespace qzivi {

std::vector<ColumnRange> ReduceToColumns(std::span<const double> points, std::size_t columns) {
    const std::size_t n = points.size();
    if (n == 0 || columns == 0) return {};
    columns = std::min(columns, n);
    std::vector<ColumnRange> result(columns);
    std::size_t i = 0;
    for (std::size_t c = 0; c < columns; ++c) {
        // The points of column c: from the first i with i * columns / n == c.
        const std::size_t end = ((c + 1) * n + columns - 1) / columns;
        const double first = points[i];
        double low = first, high = first;
        for (std::size_t k = i + 1; k < end; ++k) {
            low = std::min(low, points[k]);
            high = std::max(high, points[k]);
        }
        result[c] = {low, high, first, points[end - 1]};
        i = end;
    }
    return result;
}

} // namespace qzivi
