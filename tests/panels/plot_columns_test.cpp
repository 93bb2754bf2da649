// The plot's column reduction against a plain count of which points fall in which column.
#include "qzivi/panels/PlotColumns.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>

namespace qzivi {
namespace {

TEST(PlotColumns, EachColumnHoldsTheRangeOfItsPoints) {
    std::mt19937 random(3);
    std::normal_distribution<double> noise;
    for (const std::size_t n : {1u, 7u, 999u, 1000u, 1001u, 123457u}) {
        std::vector<double> points(n);
        for (double& p : points)
            p = noise(random);
        for (const std::size_t columns : {1u, 3u, 640u, 1000u}) {
            const auto reduced = ReduceToColumns(points, columns);
            ASSERT_EQ(reduced.size(), std::min(n, columns)) << n << " " << columns;
            const std::size_t used = reduced.size();
            std::vector<ColumnRange> expected(used, {INFINITY, -INFINITY, NAN, NAN});
            for (std::size_t i = 0; i < n; ++i) {
                auto& e = expected[i * used / n];
                if (std::isnan(e.first)) e.first = points[i];
                e.last = points[i];
                e.low = std::min(e.low, points[i]);
                e.high = std::max(e.high, points[i]);
            }
            for (std::size_t c = 0; c < used; ++c) {
                EXPECT_EQ(reduced[c].low, expected[c].low) << n << " " << columns << " " << c;
                EXPECT_EQ(reduced[c].high, expected[c].high);
                EXPECT_EQ(reduced[c].first, expected[c].first);
                EXPECT_EQ(reduced[c].last, expected[c].last);
            }
        }
    }
    EXPECT_TRUE(ReduceToColumns({}, 100).empty());
}

TEST(PlotColumns, ASingleSpikeSurvivesTheReduction) {
    std::vector<double> points(10'000'000, 0.0);
    points[7'654'321] = 5.0;
    const auto reduced = ReduceToColumns(points, 1000);
    EXPECT_EQ(reduced[765].high, 5.0);
    EXPECT_EQ(reduced[764].high, 0.0);
}

} // namespace
} // namespace qzivi
