// The sizing tool: rectangles and fonts from the design snapshot by each control's flags.
#include "qzivi/panels/CUiSizingTool.h"

#include <gtest/gtest.h>

#include <memory>

namespace qzivi {
namespace {

struct Rect {
    std::int32_t left, top, width, height;
    bool operator==(const Rect&) const = default;
};

class FakeControl : public ISizedControl {
public:
    FakeControl(std::string name, std::string tag, Rect rect, double font = 10,
                std::int32_t index = -1)
        : name_(std::move(name)), tag_(std::move(tag)), rect(rect), font(font), index_(index) {}
    std::string Name() const override { return name_; }
    std::int32_t Index() const override { return index_; }
    std::string Tag() const override { return tag_; }
    std::int32_t Left() const override { return rect.left; }
    std::int32_t Top() const override { return rect.top; }
    std::int32_t Width() const override { return rect.width; }
    std::int32_t Height() const override { return rect.height; }
    double FontSize() const override { return font; }
    void SetFontSize(double size) override { font = size; }
    void Move(std::int32_t l, std::int32_t t, std::int32_t w, std::int32_t h) override {
        rect = {l, t, w, h};
        ++moves;
    }

    std::string name_, tag_;
    Rect rect;
    double font;
    std::int32_t index_;
    int moves = 0;
};

// The design of the interactive panel's size, 7785 by 6510 twips, with controls of each word.
class SizingTest : public ::testing::Test {
protected:
    SizingTest() {
        for (auto* c : {&all_, &fixedFont_, &fixedTop_, &shape_, &rightAnchor_, &margins_,
                        &untagged_, &texted_, &first_, &second_})
            controls_.push_back(c);
        tool_.Store(controls_, kH, kW);
    }
    static constexpr std::int32_t kW = 7785, kH = 6510;
    FakeControl all_{"lblA", "31", {120, 3120, 765, 465}};
    FakeControl fixedFont_{"lblB", "15", {645, 4275, 1050, 930}};
    FakeControl fixedTop_{"lblC", "29", {300, 390, 1410, 840}};
    FakeControl shape_{"picD", "915", {3375, 390, 1410, 840}};
    FakeControl rightAnchor_{"cmdE", "36", {7000, 100, 600, 300}}; // keep right, scale width
    FakeControl margins_{"txtF", "768", {100, 100, 7585, 6310}};   // both margins
    FakeControl untagged_{"lblG", "", {10, 10, 20, 20}};
    FakeControl texted_{"lblH", "left", {30, 30, 20, 20}};
    FakeControl first_{"knob", "31", {100, 100, 200, 200}, 10, 0};
    FakeControl second_{"knob", "31", {400, 100, 200, 200}, 10, 1};
    std::vector<ISizedControl*> controls_;
    CUiSizingTool tool_;
};

TEST_F(SizingTest, HalfAndBackGivesTheDesignRectanglesExactly) {
    std::vector<Rect> design;
    for (auto* c : controls_)
        design.push_back(static_cast<FakeControl*>(c)->rect);
    tool_.Resize(controls_, kH / 2, kW / 2);
    EXPECT_EQ(all_.rect, (Rect{60, 1560, 382, 232})) << "halves round to even";
    EXPECT_EQ(margins_.rect, (Rect{100, 100, kW / 2 - 200, kH / 2 - 200})) << "the margins kept";
    tool_.Resize(controls_, kH, kW);
    for (std::size_t i = 0; i < controls_.size(); ++i)
        EXPECT_EQ(static_cast<FakeControl*>(controls_[i])->rect, design[i]) << controls_[i]->Name();
    EXPECT_EQ(all_.font, 10);
}

TEST_F(SizingTest, EachWordScalesItsOwnWay) {
    tool_.Resize(controls_, kH, 2 * kW); // twice as wide, as high as designed
    EXPECT_EQ(all_.rect, (Rect{240, 3120, 1530, 465}));
    EXPECT_EQ(all_.font, 10) << "the smaller factor wins";
    EXPECT_EQ(fixedTop_.rect.top, 390) << "29 keeps its top";
    EXPECT_EQ(shape_.rect.width, 1410) << "915 keeps its shape: the common factor is 1";
    EXPECT_EQ(shape_.rect.height, 840);
    EXPECT_EQ(shape_.rect.left, 6750);
    EXPECT_EQ(rightAnchor_.rect.left + rightAnchor_.rect.width, 2 * kW - (kW - 7600))
        << "the right margin kept";
    EXPECT_EQ(margins_.rect.width, 2 * kW - 200);
    EXPECT_EQ(untagged_.moves + texted_.moves, 0) << "no flags, never moved";
    EXPECT_NE(first_.rect.left, second_.rect.left) << "array members keep their own records";

    tool_.Resize(controls_, 2 * kH, 2 * kW);
    EXPECT_EQ(all_.font, 20);
    EXPECT_EQ(fixedFont_.font, 10) << "15 keeps its font";
    EXPECT_DOUBLE_EQ(tool_.ScaleX(100), 200);
    EXPECT_DOUBLE_EQ(tool_.ScaleY(100, kH), 100);
}

TEST(Sizing, TheTableGrowsByTenAndAReadOfTheTagAloneKeepsTheSnapshot) {
    std::vector<std::unique_ptr<FakeControl>> many;
    std::vector<ISizedControl*> controls;
    for (int i = 0; i < 26; ++i) {
        many.push_back(
            std::make_unique<FakeControl>("c" + std::to_string(i), "31", Rect{i, i, 10, 10}));
        controls.push_back(many.back().get());
    }
    CUiSizingTool tool;
    tool.Store(controls, 100, 100);
    EXPECT_EQ(tool.Capacity(), 35u);
    EXPECT_EQ(tool.Records().size(), 26u);
    EXPECT_EQ(tool.Find("c25", -1), 26);
    EXPECT_EQ(tool.Records()[0].Left, 0) << "nothing lost";
    many[3]->tag_ = "0";
    many[3]->rect = {50, 50, 50, 50};
    tool.Add(*many[3], true);
    EXPECT_EQ(tool.Records()[3].Flags, 0);
    EXPECT_EQ(tool.Records()[3].Left, 3) << "tag only: the snapshot stays";
    tool.Resize(controls, 50, 50);
    EXPECT_EQ(many[3]->rect, (Rect{50, 50, 50, 50})) << "flags 0: passed over";
}

} // namespace
} // namespace qzivi
