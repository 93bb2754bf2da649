// A plot's points reduced to what `columns` pixel columns can show: the lowest and highest value of
// the points that fall in each column. A line drawn down each column and across to the next is
// the line through every point, so a ten-million-point waveform repaints at the cost of the
// plot's width; the reduction itself runs once per data change.
#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qzivi {

struct ColumnRange {
    double low;
    double high;
    double first; // the first and last point of the column, where the line enters and leaves
    double last;
};

// Point i of n falls in column i * columns / n. With as many columns as points or more, each
// point is a column of its own.
std::vector<ColumnRange> ReduceToColumns(std::span<const double> points, std::size_t columns);

} // namespace qzivi
