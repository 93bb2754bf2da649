// The property tables: each is the order of its class's bag keys and notices, its defaults are
// what a fresh object stores, and a table round trip through a bag keeps every value.
#include "qzivi/model/PropertyBag.h"
#include "tree_fixture.h"

#include <gmock/gmock.h>

#include <set>

namespace qzivi::test {
namespace {

// A value of the row's kind that is not its default.
PropertyValue Other(const PropertyInfo& row) {
    return std::visit(
        [](const auto& v) -> PropertyValue {
            using T = std::decay_t<decltype(v)>;
            if constexpr (std::is_same_v<T, bool>)
                return !v;
            else if constexpr (std::is_same_v<T, std::string>)
                return v + "x";
            else if constexpr (std::is_same_v<T, double>)
                return v + 0.25;
            else
                return v + 1;
        },
        row.initial);
}

template <typename Owner>
std::vector<std::string> RowNames(std::span<const PropertyRow<Owner>> rows,
                                  const std::string& prefix) {
    std::vector<std::string> names;
    for (const auto& row : rows)
        names.push_back(prefix + std::string(row.name));
    return names;
}

// Every row set away from its default, through its own put.
template <typename Owner>
void SetAllAway(std::span<const PropertyRow<Owner>> rows, Owner& owner) {
    for (const auto& row : rows)
        if (row.put) row.put(owner, Other(row));
}

class PropertyTableTest : public TreeTest {};

TEST_F(PropertyTableTest, TheChannelTableIsTheOrderOfItsBagKeys) {
    const auto wfm = tree_->Waveforms()->Add("W");
    wfm->Data(std::vector<double>{0, 1});
    const auto seq = tree_->Sequences()->Add("S");
    const auto ch = tree_->Channels()->Add("Channel1");
    SetAllAway(QZIviFgenChannel::Properties(), *ch);
    ch->ArbWaveform(wfm);
    ch->Sequence(seq);
    PropertyBag bag;
    ch->WriteProperties(bag, "");
    const std::vector<std::string> keys = {
        "Channel_Name",          "Channel_AMEnabled",      "Channel_AMSource",
        "Channel_ArbFrequency",  "Channel_ArbGain",        "Channel_ArbOffset",
        "Channel_BurstCount",    "Channel_FMEnabled",      "Channel_FMSource",
        "Channel_FuncAmplitude", "Channel_FuncDCOffset",   "Channel_FuncDutyCycleHigh",
        "Channel_FuncFrequency", "Channel_FuncStartPhase", "Channel_FuncWaveform",
        "Channel_OperationMode", "Channel_OutputEnabled",  "Channel_OutputImpedance",
        "Channel_TriggerSource", "Channel_ArbWaveform",    "Channel_Sequence"};
    EXPECT_EQ(bag.Names(), keys);
    EXPECT_EQ(RowNames(QZIviFgenChannel::Properties(), "Channel_"), keys);
}

TEST_F(PropertyTableTest, TheInternalAndRootTablesAreTheOrderOfTheirBagKeys) {
    auto& internal = *tree_->Internal();
    SetAllAway(QZIviFgenInternalConfig::Properties(), internal);
    PropertyBag inner;
    internal.WriteProperties(inner, "");
    const std::vector<std::string> innerKeys = {
        "Internal_AMInternalDepth",     "Internal_AMInternalFrequency",
        "Internal_AMInternalWaveform",  "Internal_FMInternalDeviation",
        "Internal_FMInternalFrequency", "Internal_FMInternalWaveform",
        "Internal_InternalTriggerRate"};
    EXPECT_EQ(inner.Names(), innerKeys);
    EXPECT_EQ(RowNames(QZIviFgenInternalConfig::Properties(), "Internal_"), innerKeys);

    auto fresh = CIviFgenPropImp::Create();
    fresh->Attach(err_);
    fresh->InitProperties();
    SetAllAway(CIviFgenPropImp::Properties(), *fresh);
    PropertyBag root;
    fresh->WriteProperties(root, "", false);
    const std::vector<std::string> rootKeys = {
        "ArbSampleRate", "AutoStopStart", "Extensions", "OutputMode", "RefClockSource",
        "LogicalName",   "AutoConfigure", "Enabled",    "UIStyle",    "ExceptionOnError"};
    auto names = root.Names();
    names.resize(rootKeys.size());
    EXPECT_EQ(names, rootKeys);
    EXPECT_EQ(RowNames(CIviFgenPropImp::Properties(), ""), rootKeys);
}

TEST_F(PropertyTableTest, TheRootNoticesFollowTheTableOnInitReadAndClone) {
    std::vector<std::string> notices;
    auto c = tree_->PropertyChange.Connect([&](const std::string& n) { notices.push_back(n); });
    const auto expected = RowNames(CIviFgenPropImp::Properties(), "");
    tree_->InitProperties();
    EXPECT_EQ(notices, expected);
    notices.clear();
    tree_->ReadProperties(PropertyBag(), "", false);
    EXPECT_EQ(notices, expected);
    auto target = CIviFgenPropImp::Create();
    auto t = target->PropertyChange.Connect([&](const std::string& n) { notices.push_back(n); });
    notices.clear();
    tree_->Clone(target);
    EXPECT_EQ(notices, expected);
}

TEST_F(PropertyTableTest, FreshObjectsHoldTheTableDefaultsAndStoreNothing) {
    QZIviFgenChannel channel;
    for (const auto& row : QZIviFgenChannel::Properties())
        if (row.get) {
            EXPECT_EQ(row.get(channel), row.initial) << row.name;
        }
    QZIviFgenInternalConfig internal;
    for (const auto& row : QZIviFgenInternalConfig::Properties())
        EXPECT_EQ(row.get(internal), row.initial) << row.name;
    PropertyBag bag;
    channel.WriteProperties(bag, "");
    internal.WriteProperties(bag, "");
    EXPECT_EQ(bag.Size(), 0u);
}

TEST_F(PropertyTableTest, EveryValueSurvivesWriteReadAndClone) {
    const auto ch = tree_->Channels()->Add("Channel1");
    SetAllAway(QZIviFgenChannel::Properties(), *ch);
    PropertyBag bag;
    ch->WriteProperties(bag, "");
    const auto back = tree_->Channels()->Add();
    back->ReadProperties(bag, "");
    QZIviFgenChannel clone;
    ch->Clone(clone);
    for (const auto& row : QZIviFgenChannel::Properties()) {
        if (!row.get) continue;
        EXPECT_EQ(row.get(*back), row.get(*ch)) << row.name;
        EXPECT_EQ(row.get(clone), row.get(*ch)) << row.name;
        EXPECT_NE(row.get(*ch), row.initial) << row.name;
    }
}

// The engine names a refused value by the row of its attribute, so no attribute may have two.
TEST_F(PropertyTableTest, AnAttributeNamesOneRowAtMost) {
    auto check = [](auto rows) {
        std::set<ViAttr> seen;
        for (const auto& row : rows)
            if (row.attribute != 0) {
                EXPECT_TRUE(seen.insert(row.attribute).second) << row.name;
            }
    };
    check(QZIviFgenChannel::Properties());
    check(QZIviFgenInternalConfig::Properties());
    check(CIviFgenPropImp::Properties());
}

} // namespace
} // namespace qzivi::test
