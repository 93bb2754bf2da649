// The property pages' link to the control: one working copy shared by the open pages, the apply
// that clones it into the live set, and the change counter that tells a page to reload.
#include "../platform/test_support.h"
#include "fake_host.h"
#include "qzivi/control/PageLink.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/support/failure.h"

#include <gmock/gmock.h>

namespace qzivi {
namespace {

class PageLinkTest : public ::testing::Test {
protected:
    PageLinkTest() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        host_.control = &control_;
        control_.InitProperties();
        control_.Channels()->Add("Channel1");
    }
    ~PageLinkTest() override { host_.control = nullptr; }

    static PropertyBag BagOf(CIviFgenPropImp& set) {
        PropertyBag bag;
        set.WriteProperties(bag, "", true);
        return bag;
    }
    PropertyBag LiveBag() {
        PropertyBag bag;
        control_.WriteProperties(bag);
        return bag;
    }

    test::StoreScope store_;
    PanelHost host_;
    QZIviFgen control_{&host_};
};

TEST_F(PageLinkTest, TwoPagesShareOneCopyAndTheOtherReloadsOnceAfterAnAlertingApply) {
    CPPObjWrapper general, channels;
    general.SelectionChanged(control_);
    channels.SelectionChanged(control_);
    const auto copy = general.Props();
    ASSERT_NE(copy, nullptr);
    EXPECT_EQ(channels.Props(), copy) << "one copy for every open page";
    EXPECT_FALSE(general.CheckForChanges());
    EXPECT_FALSE(channels.CheckForChanges());

    copy->Channels()->Add("Channel2");
    EXPECT_EQ(control_.Channels()->Count(), 1) << "the live set waits for the apply";
    channels.ApplyChanges(true);
    EXPECT_EQ(control_.LastChangeIndex(), 1);
    EXPECT_EQ(control_.Channels()->Count(), 2);
    EXPECT_NE(control_.Channels(), copy->Channels()) << "the live set is a clone, not the copy";
    EXPECT_EQ(general.Props(), copy) << "the copy stays in use";

    EXPECT_FALSE(channels.CheckForChanges()) << "its own alert";
    EXPECT_TRUE(general.CheckForChanges());
    EXPECT_FALSE(general.CheckForChanges()) << "once";

    // Without the alert the live set changes and no page hears of it.
    copy->OutputMode(qzivifgenOutputArb);
    general.ApplyChanges(false);
    EXPECT_EQ(control_.OutputMode(), qzivifgenOutputArb);
    EXPECT_FALSE(general.CheckForChanges());
    EXPECT_FALSE(channels.CheckForChanges());
    EXPECT_EQ(host_.changed.back(), "") << "the host asks for everything again";
}

TEST_F(PageLinkTest, ThePageThatStoodBehindWhenItAlertedReloadsToo) {
    CPPObjWrapper a, b;
    a.SelectionChanged(control_);
    b.SelectionChanged(control_);
    a.AlertChanges(); // counter 1, a at 1, b at 0
    b.AlertChanges(); // counter 2, b at 1
    EXPECT_TRUE(a.CheckForChanges()) << "b moved the counter past it";
    EXPECT_TRUE(b.CheckForChanges());
    EXPECT_EQ(control_.LastChangeIndex(), 2);
}

TEST_F(PageLinkTest, TheCounterRunsFromOneToTheLargestAndBackToOne) {
    static_assert(NextChangeIndex(0) == 1);
    static_assert(NextChangeIndex(0x7FFFFFFE) == 0x7FFFFFFF);
    static_assert(NextChangeIndex(0x7FFFFFFF) == 1);
    EXPECT_EQ(control_.IncrementLastChangeIndex(), 1);
    EXPECT_EQ(control_.IncrementLastChangeIndex(), 2);
}

TEST_F(PageLinkTest, TheLastLinkToGoDropsTheCopyAndTheNextMakesItAfresh) {
    auto first = std::make_unique<CPPObjWrapper>();
    auto second = std::make_unique<CPPObjWrapper>();
    first->SelectionChanged(control_);
    second->SelectionChanged(control_);
    const auto copy = first->Props();
    copy->ArbSampleRate(1e6);
    first.reset(); // two users: the copy stays
    EXPECT_EQ(second->Props(), copy);
    second.reset(); // the last: dropped
    EXPECT_EQ(control_.PropCopy(), nullptr);
    control_.ReleaseCopy(false); // one release too many does no harm
    CPPObjWrapper again;
    again.SelectionChanged(control_);
    ASSERT_NE(again.Props(), nullptr);
    EXPECT_NE(again.Props()->ArbSampleRate(), 1e6) << "made from the live set";
}

TEST_F(PageLinkTest, CancelLeavesTheLiveTreeAsItWas) {
    const PropertyBag before = LiveBag();
    {
        CPPObjWrapper page;
        page.SelectionChanged(control_);
        page.Props()->Channels()->Item(1)->FuncFrequency(12345);
        page.Props()->Waveforms()->Add("Unused");
        page.Props()->UIStyle(2);
    }
    EXPECT_TRUE(LiveBag() == before);
    EXPECT_EQ(control_.PropCopy(), nullptr);
}

TEST_F(PageLinkTest, TwoAppliesInARowGiveTwoLiveSetsEqualToTheCopy) {
    CPPObjWrapper page;
    page.SelectionChanged(control_);
    page.Props()->Channels()->Item(1)->FuncAmplitude(3.5);
    page.ApplyChanges(false);
    const auto firstChannels = control_.Channels();
    const PropertyBag first = LiveBag();
    page.ApplyChanges(false);
    EXPECT_NE(control_.Channels(), firstChannels);
    EXPECT_TRUE(LiveBag() == first);
    EXPECT_EQ(control_.Channels()->Item(1)->FuncAmplitude(), 3.5);
}

// The live set that an apply makes refers to its own waveforms and sequences, not to the copy's:
// Configure sets the instrument's handles on those, and the copy goes when the pages close.
TEST_F(PageLinkTest, AnAppliedTreeStandsAloneAndConfiguresAfterTheCopyIsGone) {
    const std::string file =
        store_.Write("levels.txt", "0.5\n0.25\n0.5\n0.25\n0.5\n0.25\n0.5\n0.25\n");
    control_.Channels()->Item(1)->Name("1");
    {
        CPPObjWrapper page;
        page.SelectionChanged(control_);
        auto& copy = *page.Props();
        copy.Extensions(0x3FF);
        copy.OutputMode(qzivifgenOutputSeq);
        const auto waveform = copy.Waveforms()->Add("Levels", qzivifgenASCIIFile, file);
        const auto sequence = copy.Sequences()->Add("Twice");
        sequence->Add(waveform, 2);
        copy.Channels()->Item(1)->ArbWaveform(waveform);
        copy.Channels()->Item(1)->Sequence(sequence);
        page.ApplyChanges(false);
    }
    auto& live = *control_.Channels()->Item(1);
    EXPECT_EQ(live.ArbWaveform(), control_.Waveforms()->Item(1));
    EXPECT_EQ(live.Sequence(), control_.Sequences()->Item(1));
    EXPECT_EQ(control_.Sequences()->Item(1)->SequenceItem(1)->Waveform(),
              control_.Waveforms()->Item(1));
    control_.Init();
    control_.Configure();
    EXPECT_NE(control_.Waveforms()->Item(1)->WaveformHandle(), 0);
    EXPECT_NE(control_.Sequences()->Item(1)->SequenceHandle(), 0);
    EXPECT_EQ(control_.Engine().RenderOutput("1", 0, 0, 1).size(), 1u);
}

TEST_F(PageLinkTest, AnApplyThatChangesTheStyleSwapsThePanelOntoTheNewSet) {
    control_.UIStyle(1);
    ASSERT_NE(host_.panel, nullptr);
    EXPECT_EQ(host_.panel->className, "QZIviFgenLib.XUIFgen1");
    CPPObjWrapper page;
    page.SelectionChanged(control_);
    page.Props()->UIStyle(2);
    page.Props()->Enabled(false);
    page.ApplyChanges(true);
    ASSERT_NE(host_.panel, nullptr);
    EXPECT_EQ(host_.panel->className, "QZIviFgenLib.XUIFgen2");
    EXPECT_EQ(host_.panel->propSet->UIStyle(), 2) << "constructed on the new live set";
    EXPECT_FALSE(host_.panel->enabled);
    EXPECT_EQ(control_.UIStyle(), 2);
}

TEST_F(PageLinkTest, ALinkWithoutASelectionRaisesAndEndsQuietly) {
    CPPObjWrapper page;
    try {
        page.Props();
        FAIL() << "no link";
    } catch (const Failure& failure) {
        EXPECT_EQ(failure.Number(), 91);
    }
    EXPECT_THROW(page.ApplyChanges(true), Failure);
}

} // namespace
} // namespace qzivi
