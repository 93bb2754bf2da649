// The display panel's picture of a standard function: the class of the decade and the shapes.
#include "qzivi/panels/FunctionPreview.h"

#include <gtest/gtest.h>

#include <cmath>

namespace qzivi {
namespace {

TEST(FunctionPreview, TheFifthOfTheDecadeGivesTheCycles) {
    struct Case {
        double frequency;
        std::int32_t cycles;
    };
    for (const auto& c : {Case{1500, 1}, Case{3000, 2}, Case{5000, 3}, Case{7000, 4}, Case{9000, 5},
                          Case{15000, 1}, Case{1000, 1}, Case{0.5, 3}}) {
        EXPECT_EQ(CyclesForFrequency(c.frequency), c.cycles) << c.frequency;
    }
    EXPECT_EQ(FindDecade(1500).bottom, 1000);
    EXPECT_EQ(FindDecade(1500).top, 10000);
}

TEST(FunctionPreview, EachShapeOnItsScale) {
    const auto sine = BuildFunctionPoints(1, 1);
    ASSERT_EQ(sine.points.size(), 50u);
    EXPECT_DOUBLE_EQ(sine.points[10], 20 * std::sin(0.9));
    EXPECT_EQ(sine.yMinimum, -20);

    const auto square = BuildFunctionPoints(2, 5); // half period 4, starting high
    EXPECT_EQ(square.points[0], 20);
    EXPECT_EQ(square.points[2], 20);
    EXPECT_EQ(square.points[3], -20) << "the level changes at the 4th point";
    EXPECT_EQ(square.points[7], 20);

    const auto t3 = BuildFunctionPoints(3, 3);
    EXPECT_EQ((std::vector<double>(t3.points.begin(), t3.points.begin() + 12)),
              (std::vector<double>{4, 8, 12, 16, 20, 24, 28, 32, 36, 40, 36, 32}));
    const auto t5 = BuildFunctionPoints(3, 5);
    EXPECT_EQ((std::vector<double>(t5.points.begin(), t5.points.begin() + 6)),
              (std::vector<double>{10, 20, 30, 40, 30, 20}));
    EXPECT_EQ(t5.yMaximum, 40);

    const auto up = BuildFunctionPoints(4, 2), down = BuildFunctionPoints(5, 2);
    EXPECT_EQ(up.points, down.points);
    EXPECT_FALSE(up.xInverted);
    EXPECT_TRUE(down.xInverted) << "the ramp down mirrors the horizontal axis";
    EXPECT_EQ(up.yMaximum, 58) << "(29 mod 30) times 2";

    const auto dc = BuildFunctionPoints(6, 1, 1.25, -5, 5);
    EXPECT_EQ(dc.points, std::vector<double>(100, 1.25));
    EXPECT_EQ(dc.yMinimum, -5);
    EXPECT_TRUE(BuildFunctionPoints(9, 1).points.empty());
}

} // namespace
} // namespace qzivi
