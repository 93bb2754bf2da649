// The root property set: defaults, notices, the bag round trip, clones, and reads that stop.
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/support/failure.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qzivi {
namespace {

class RootSetTest : public ::testing::Test {
protected:
    RootSetTest() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        err_ = std::make_shared<CIviErrorReport>();
        set_ = CIviFgenPropImp::Create();
        set_->Attach(err_);
        notices_ = set_->PropertyChange.Connect(
            [this](const std::string& name) { changed_.push_back(name); });
    }

    // A set with every plain value and the internal settings away from their defaults.
    void Change(CIviFgenPropImp& set) {
        set.ArbSampleRate(2.5e6);
        set.AutoStopStart(false);
        set.Extensions(0x3FF);
        set.OutputMode(2);
        set.RefClockSource(101);
        set.LogicalName("Bench");
        set.AutoConfigure(true);
        set.Enabled(false);
        set.UIStyle(2);
        set.ExceptionOnError(false);
        set.Internal()->AMInternalDepth(80);
        set.Internal()->FMInternalWaveform(3);
        set.Internal()->InternalTriggerRate(25);
    }

    static void ExpectEqual(const CIviFgenPropImp& a, const CIviFgenPropImp& b) {
        EXPECT_EQ(a.ArbSampleRate(), b.ArbSampleRate());
        EXPECT_EQ(a.AutoStopStart(), b.AutoStopStart());
        EXPECT_EQ(a.Extensions(), b.Extensions());
        EXPECT_EQ(a.OutputMode(), b.OutputMode());
        EXPECT_EQ(a.RefClockSource(), b.RefClockSource());
        EXPECT_EQ(a.LogicalName(), b.LogicalName());
        EXPECT_EQ(a.AutoConfigure(), b.AutoConfigure());
        EXPECT_EQ(a.Enabled(), b.Enabled());
        EXPECT_EQ(a.UIStyle(), b.UIStyle());
        EXPECT_EQ(a.ExceptionOnError(), b.ExceptionOnError());
        const auto &x = *a.Internal(), &y = *b.Internal();
        EXPECT_EQ(x.AMInternalDepth(), y.AMInternalDepth());
        EXPECT_EQ(x.AMInternalFrequency(), y.AMInternalFrequency());
        EXPECT_EQ(x.AMInternalWaveform(), y.AMInternalWaveform());
        EXPECT_EQ(x.FMInternalDeviation(), y.FMInternalDeviation());
        EXPECT_EQ(x.FMInternalFrequency(), y.FMInternalFrequency());
        EXPECT_EQ(x.FMInternalWaveform(), y.FMInternalWaveform());
        EXPECT_EQ(x.InternalTriggerRate(), y.InternalTriggerRate());
    }

    std::shared_ptr<CIviErrorReport> err_;
    std::shared_ptr<CIviFgenPropImp> set_;
    std::vector<std::string> changed_;
    Connection notices_;
};

TEST_F(RootSetTest, DefaultsComeThroughThePutsInOrder) {
    Change(*set_);
    changed_.clear();
    set_->InitProperties();
    EXPECT_EQ(changed_, (std::vector<std::string>{"ArbSampleRate", "AutoStopStart", "Extensions",
                                                  "OutputMode", "RefClockSource", "LogicalName",
                                                  "AutoConfigure", "Enabled", "UIStyle",
                                                  "ExceptionOnError"}));
    EXPECT_EQ(set_->ArbSampleRate(), 1000.0);
    EXPECT_TRUE(set_->AutoStopStart());
    EXPECT_EQ(set_->Extensions(), 3);
    EXPECT_EQ(set_->LogicalName(), "SampleFGen");
    EXPECT_EQ(set_->UIStyle(), 1);
    EXPECT_TRUE(set_->ExceptionOnError());
    EXPECT_TRUE(err_->ExceptionOnError()) << "the error report keeps a copy";
    EXPECT_EQ(set_->Internal()->FMInternalDeviation(), 100);
}

TEST_F(RootSetTest, EveryPutTellsEvenWithoutAChange) {
    set_->OutputMode(set_->OutputMode());
    set_->LogicalName(set_->LogicalName());
    EXPECT_EQ(changed_, (std::vector<std::string>{"OutputMode", "LogicalName"}));
}

TEST_F(RootSetTest, UIStyleOutsideItsRangeChangesNothing) {
    set_->SetPath("Fgen1");
    for (int bad : {-1, 3}) {
        try {
            set_->UIStyle(bad);
            FAIL() << bad << " was taken";
        } catch (const Failure& f) {
            EXPECT_EQ(f.Number(), -30002);
            EXPECT_EQ(f.Source(), "Fgen1.UIStyle");
            EXPECT_EQ(
                f.Description(),
                "An invalid argument has been passed to a property or method. (Fgen1.UIStyle)");
        }
    }
    EXPECT_EQ(set_->UIStyle(), 1);
    EXPECT_TRUE(changed_.empty());
}

TEST_F(RootSetTest, WriteThenReadOnOneBagGivesAnEqualTree) {
    Change(*set_);
    set_->DraggingKnob(true);
    PropertyBag bag;
    set_->WriteProperties(bag, "", true);
    EXPECT_EQ(bag.ReadText("Internal_AMInternalDepth", ""), "80");
    auto copy = CIviFgenPropImp::Create();
    copy->Attach(err_);
    copy->ReadProperties(bag, "", true);
    ExpectEqual(*set_, *copy);
    EXPECT_FALSE(copy->DraggingKnob()) << "never persisted";

    // A prefix puts every key under it.
    PropertyBag prefixed;
    set_->WriteProperties(prefixed, "Configurations_Item1_Configuration_", false);
    EXPECT_EQ(prefixed.ReadInt32("Configurations_Item1_Configuration_OutputMode", 0), 2);
    EXPECT_EQ(
        prefixed.ReadDouble("Configurations_Item1_Configuration_Internal_InternalTriggerRate", 0),
        25);
}

TEST_F(RootSetTest, ABagWithNoKeysGivesTheDefaultsAndTheLogicalNameIsAlwaysStored) {
    Change(*set_);
    set_->ReadProperties(PropertyBag(), "", true);
    auto fresh = CIviFgenPropImp::Create();
    fresh->Attach(err_);
    fresh->InitProperties();
    ExpectEqual(*set_, *fresh);
    PropertyBag bag;
    fresh->WriteProperties(bag, "", true);
    EXPECT_EQ(bag.Size(), 1u) << "all values are at their defaults but the logical name";
    EXPECT_EQ(bag.ReadText("LogicalName", ""), "SampleFGen");
}

TEST_F(RootSetTest, AUIStyleOfThreeStopsTheReadThere) {
    PropertyBag bag;
    bag.WriteInt32("OutputMode", 1, 0);
    bag.WriteInt32("UIStyle", 3, 1);
    bag.WriteBool("ExceptionOnError", false, true);
    bag.WriteDouble("Internal_AMInternalDepth", 10, 50);
    EXPECT_THROW(set_->ReadProperties(bag, "", true), Failure);
    EXPECT_EQ(set_->OutputMode(), 1) << "the keys before it were read";
    EXPECT_EQ(set_->UIStyle(), 1);
    EXPECT_TRUE(set_->ExceptionOnError()) << "the keys after it were not";
    EXPECT_EQ(set_->Internal()->AMInternalDepth(), 50);
}

TEST_F(RootSetTest, AClonesHasTheValuesButNotThePathNorTheKnob) {
    Change(*set_);
    set_->SetPath("Fgen1");
    set_->DraggingKnob(true);
    auto clone = set_->Clone(nullptr);
    ExpectEqual(*set_, *clone);
    EXPECT_EQ(clone->ErrorReport(), err_);
    EXPECT_EQ(clone->Path(), "");
    EXPECT_FALSE(clone->DraggingKnob());
    EXPECT_NE(clone->Internal(), set_->Internal());
    clone->Internal()->AMInternalDepth(1);
    EXPECT_EQ(set_->Internal()->AMInternalDepth(), 80) << "the clone's members are its own";

    // Into an existing target: its values are overwritten and its members kept.
    auto target = CIviFgenPropImp::Create();
    const auto internal = target->Internal();
    EXPECT_EQ(set_->Clone(target), target);
    EXPECT_EQ(target->Internal(), internal);
    ExpectEqual(*set_, *target);
}

TEST_F(RootSetTest, PathsJoinAndCollectionChangedPassesThrough) {
    set_->SetPath("Fgen1");
    EXPECT_EQ(set_->Path(), "Fgen1.");
    EXPECT_EQ(set_->Channels()->Path(), "Fgen1.Channels.");
    EXPECT_EQ(set_->Internal()->Path(), "Fgen1.Internal.");
    set_->SetPath("Fgen1.");
    EXPECT_EQ(set_->Waveforms()->Path(), "Fgen1.Waveforms.");
    std::vector<std::int32_t> kinds;
    auto c = set_->CollectionChanged.Connect([&](const std::string& name, const Variant&,
                                                 std::int32_t kind, const Variant& first,
                                                 const Variant&) {
        EXPECT_EQ(name, "QZIviFgenChannels");
        EXPECT_EQ(first.AsInt32(), 3);
        kinds.push_back(kind);
    });
    set_->RaiseCollectionChanged("QZIviFgenChannels", Variant(), 2, 3, "");
    EXPECT_EQ(kinds, (std::vector<std::int32_t>{2}));
    EXPECT_EQ(set_->Internal()->PropSet(), set_);
    set_->Detach();
    EXPECT_EQ(set_->Internal()->PropSet(), nullptr);
    EXPECT_EQ(set_->Configurations()->PropSet(), set_.get())
        << "the get tells the collection its owner";
}

} // namespace
} // namespace qzivi
