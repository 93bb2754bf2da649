// The tagged value's conversions and the events' delivery rules.
#include "qzivi/support/event.h"
#include "qzivi/support/failure.h"
#include "qzivi/support/text.h"
#include "qzivi/support/variant.h"

#include <gtest/gtest.h>

#include <limits>

namespace qzivi {
namespace {

std::int32_t FailureNumber(const std::function<void()>& action) {
    try {
        action();
    } catch (const Failure& f) {
        return f.Number();
    }
    return 0;
}

TEST(Variant, ConvertsAsTheSystemsValuesDo) {
    EXPECT_EQ(Variant(2.5).AsInt32(), 2) << "halves round to even";
    EXPECT_EQ(Variant(3.5).AsInt32(), 4);
    EXPECT_EQ(Variant(" 42 ").AsInt32(), 42);
    EXPECT_EQ(Variant("1e3").AsDouble(), 1000.0);
    EXPECT_EQ(Variant(true).AsInt32(), -1) << "true is stored as -1";
    EXPECT_TRUE(Variant("True").AsBool());
    EXPECT_EQ(Variant(0.1).AsText(), "0.1");
    EXPECT_EQ(Variant().AsDouble(), 0.0) << "empty reads as 0";
    EXPECT_TRUE(Variant("12").IsNumeric());
    EXPECT_FALSE(Variant("12a").IsNumeric());
    EXPECT_FALSE(Variant::Missing().IsNumeric());
}

TEST(Variant, RaisesWrongTypeAndOverflowExplicitly) {
    EXPECT_EQ(FailureNumber([] { Variant("twelve").AsDouble(); }), runtime::kWrongType);
    EXPECT_EQ(FailureNumber([] { Variant::Array({1, 2}).AsInt32(); }), runtime::kWrongType);
    EXPECT_EQ(FailureNumber([] { Variant(3e9).AsInt32(); }), runtime::kOverflow);
    EXPECT_EQ(FailureNumber([] { Variant(40000).AsInt16(); }), runtime::kOverflow);
    EXPECT_EQ(FailureNumber([] { Variant(std::numeric_limits<double>::quiet_NaN()).AsInt32(); }),
              runtime::kOverflow);
    EXPECT_EQ(Variant(-32768).AsInt16(), -32768);
}

TEST(Variant, HoldsObjectsByTypeAndTables) {
    auto number = std::make_shared<int>(7);
    const Variant v = Variant::Object(number);
    EXPECT_EQ(v.AsObject<int>(), number);
    EXPECT_EQ(v.AsObject<double>(), nullptr) << "another type gives nothing";
    const Variant table = Variant::Array({"Sine", "Square", 1, 2}, 2);
    EXPECT_EQ(table.Columns(), 2u);
    EXPECT_EQ(table.At(0, 1).AsText(), "Square");
    EXPECT_EQ(table.At(1, 1).AsInt32(), 2);
    EXPECT_EQ(table, Variant::Array({"Sine", "Square", 1, 2}, 2));
    EXPECT_FALSE(table == Variant::Array({"Sine", "Square", 1, 2}));
}

TEST(Text, ParsesWholeNumbersOnlyWhateverTheLocale) {
    EXPECT_EQ(text::ParseNumber("+1.5e-3"), 1.5e-3);
    EXPECT_EQ(text::ParseNumber("1,5"), std::nullopt);
    EXPECT_EQ(text::ParseNumber(""), std::nullopt);
    EXPECT_EQ(text::ParseNumber(text::FormatNumber(0.1 + 0.2)), 0.1 + 0.2);
    EXPECT_TRUE(text::EqualsNoCase("Channel1", "CHANNEL1"));
}

TEST(Event, DeliversInConnectionOrderAndHonoursDisconnection) {
    Event<int> event;
    std::vector<std::string> calls;
    Connection second;
    Connection first = event.Connect([&](int v) {
        calls.push_back("first " + std::to_string(v));
        second.Disconnect(); // a handler may cut another while the event fires
    });
    second = event.Connect([&](int v) { calls.push_back("second " + std::to_string(v)); });
    Connection third = event.Connect([&](int v) { calls.push_back("third " + std::to_string(v)); });
    event(1);
    EXPECT_EQ(calls, (std::vector<std::string>{"first 1", "third 1"}));
    {
        Connection scoped = event.Connect([&](int) { calls.push_back("scoped"); });
    }
    calls.clear();
    event(2);
    EXPECT_EQ(calls, (std::vector<std::string>{"first 2", "third 2"}))
        << "a dropped connection ends";
    first.Disconnect();
    third.Disconnect();
    EXPECT_FALSE(event.HasHandlers());
}

TEST(Event, AHandlerMayDropItsOwnConnection) {
    Event<> event;
    int calls = 0;
    Connection self;
    self = event.Connect([&] {
        ++calls;
        self.Disconnect();
    });
    event();
    event();
    EXPECT_EQ(calls, 1);
}

} // namespace
} // namespace qzivi
