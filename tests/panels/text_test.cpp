// The text helpers: typed texts to values and values to texts with units and prefixes.
#include "qzivi/panels/MUiAndStringUtil.h"
#include "qzivi/support/failure.h"

#include <gtest/gtest.h>

#include <clocale>
#include <cmath>

namespace qzivi {
namespace {

struct Formatted {
    std::string text;
    double value;
};

Formatted Format(const std::string& input, const std::string& unit, int decimals) {
    Formatted f;
    FormatValueWithUnit(input, f.text, f.value, unit, decimals);
    return f;
}

TEST(FormatValueWithUnit, GivesTheExamples) {
    struct Case {
        const char* input;
        const char* unit;
        int decimals;
        double value;
        const char* text;
    };
    for (const auto& c :
         {Case{"2.5 k", "Hz", 6, 2500, "2.500000 kHz"}, Case{"0.25", "V", 2, 0.25, "250.00 mV"},
          Case{"1500", "V", 2, 1500, "1.50 kV"}, Case{"-3 m", "V", 2, -0.003, "-3.00 mV"},
          Case{"50", "%", 2, 50, "50.00 %"}, Case{"1 M", "Hz", 3, 1e6, "1.000 MHz"},
          Case{"1 m", "Hz", 3, 1e-3, "1.000 mHz"}, Case{"  12.5 Volts", "V", 1, 12.5, "12.5 V"},
          Case{".25", "V", 2, 0.25, "250.00 mV"}, Case{"0", "V", 2, 0, "0.00 V"}}) {
        SCOPED_TRACE(c.input);
        const auto f = Format(c.input, c.unit, c.decimals);
        EXPECT_DOUBLE_EQ(f.value, c.value);
        EXPECT_EQ(f.text, c.text);
    }
    EXPECT_DOUBLE_EQ(Format("5 Amp", "A", 2).value, 5e-3) << "a prefix letter inside a word counts";
    EXPECT_DOUBLE_EQ(Format("7 Hz", "Hz", 2).value, 7) << "a typed unit is skipped";
    // Numbers whose fifteen digits are written with an exponent keep their prefix too, so what
    // is written reads back (found by the fuzzer: "0.0000513000 aHz" read as 5.13e-05).
    EXPECT_DOUBLE_EQ(Format("0.00005 m", "V", 2).value, 5e-8);
    const auto small = Format("0.0000513000 aHz", "Hz", 10);
    EXPECT_DOUBLE_EQ(small.value, 5.13e-23);
    EXPECT_DOUBLE_EQ(Format(small.text, "Hz", 10).value, small.value);
}

TEST(ParseLeadingNumber, ReadsTheNumberAtTheStart) {
    EXPECT_EQ(ParseLeadingNumber("  12.5 V"), 12.5);
    EXPECT_EQ(ParseLeadingNumber("volts"), 0);
    EXPECT_EQ(ParseLeadingNumber(""), 0);
    EXPECT_EQ(ParseLeadingNumber("-5x"), -5);
    EXPECT_EQ(ParseLeadingNumber("-.5"), -0.5);
    EXPECT_EQ(ParseLeadingNumber("x-.5"), 0.5)
        << "only one character before the digit is looked at";
    EXPECT_EQ(ParseLeadingNumber("1e3 Hz"), 1000);
}

TEST(FormatEngineering, PicksThePrefixByTheComputedLogarithm) {
    EXPECT_EQ(FormatEngineering(0, 2), " 0.00 ");
    EXPECT_EQ(FormatEngineering(2.5e9, 1), " 2.5 G");
    EXPECT_EQ(FormatEngineering(-4.7e-7, 0), "-470 n");
    EXPECT_EQ(FormatEngineering(3e-17, 1), " 30.0 a");
    EXPECT_EQ(FormatEngineering(3e-20, 1), " 0.0 a") << "below atto the scale stays";
    EXPECT_EQ(FormatEngineering(1000, 2), " 1.00 k") << "a power of ten takes its own prefix";
    EXPECT_EQ(FormatEngineering(1e19, 1), " 10.0 E");
    EXPECT_EQ(PrefixExponent('k'), 3);
    EXPECT_EQ(PrefixExponent('K'), 0) << "case matters";
    EXPECT_EQ(PrefixExponent('u'), -6);
    EXPECT_EQ(Log10Abs(0, true), 0);
    EXPECT_THROW(Log10Abs(0, false), Failure);
    EXPECT_EQ(RepeatChar("xyz", 3), "xxx");
}

TEST(FormatScale, WritesAScopesScales) {
    EXPECT_EQ(FormatScale(2e-4, "s/div"), "200 \u00b5s/div");
    EXPECT_EQ(FormatScale(2.5e6, "S/s"), "2.5 MS/s");
    EXPECT_EQ(FormatScale(0.9999999, "V"), "1 V") << "a hair below a unit is the unit";
    EXPECT_EQ(FormatScale(-0.5, "V"), "-500 mV");
    EXPECT_EQ(FormatScale(0, "V"), "0 V");
    EXPECT_EQ(FormatScale(3e-12, "s"), "3e-12 s") << "below nano no prefix";
}

TEST(FormatEngineering, ReadsBackTheSameUnderAnyLocale) {
    const char* previous = std::setlocale(LC_NUMERIC, nullptr);
    const std::string saved = previous != nullptr ? previous : "C";
    const bool german = std::setlocale(LC_NUMERIC, "de_DE.UTF-8") != nullptr;
    for (double v : {1234.5678, -0.000321, 5e7, 42.0}) {
        const std::string text = FormatEngineering(v, 6);
        EXPECT_EQ(text.find(','), std::string::npos) << text;
        EXPECT_NEAR(Format(text, "", 6).value, v, std::fabs(v) * 1e-6);
    }
    std::setlocale(LC_NUMERIC, saved.c_str());
    if (!german)
        GTEST_LOG_(INFO) << "no German locale here; the text was checked under the C locale";
}

TEST(SelectComboEntry, ChoosesByTextDataOrNumber) {
    const std::vector<ComboEntry> waveforms = {{"Sine", 1}, {"Square", 2}, {"DC", 6}};
    EXPECT_EQ(SelectComboEntry(waveforms, 6, false, false).select, 2) << "by item data";
    EXPECT_EQ(SelectComboEntry(waveforms, "Square", false, false).select, 1) << "by text";
    const auto none = SelectComboEntry(waveforms, 9, false, false);
    EXPECT_EQ(none.select, -1);
    EXPECT_EQ(none.text, "9");
    EXPECT_EQ(SelectComboEntry(waveforms, 9, false, true).select, 0) << "the first as fallback";
    const std::vector<ComboEntry> rates = {{"100 Hz", std::nullopt}, {"1000 Hz", std::nullopt}};
    EXPECT_EQ(SelectComboEntry(rates, 1000, true, false).select, 1) << "as numbers";
    EXPECT_EQ(SelectComboEntry(rates, 1000, false, false).select, -1);
    EXPECT_EQ(SelectComboEntry({}, "free", false, true).text, "free")
        << "an empty list takes the text";
}

} // namespace
} // namespace qzivi

namespace qzivi {
namespace {

// What a hostile or careless text gives: the number it holds, infinite where it is too large,
// and never the part of a number that happened to fit.
TEST(ParseLeadingNumber, TooLargeIsInfiniteAndWordsAreNoNumbers) {
    EXPECT_EQ(ParseLeadingNumber("1e400"), HUGE_VAL);
    EXPECT_EQ(ParseLeadingNumber("-1e400 V"), -HUGE_VAL);
    EXPECT_EQ(ParseLeadingNumber("1e-400"), 0);
    EXPECT_EQ(ParseLeadingNumber("nan"), 0);
    EXPECT_EQ(ParseLeadingNumber("inf Hz"), 0);
    EXPECT_EQ(ParseLeadingNumber("2e Hz"), 2) << "an exponent needs digits";
    EXPECT_EQ(ParseLeadingNumber("1.5.3"), 1.5);
    const std::string blanks = std::string(1'000'000, ' ') + "7 V";
    EXPECT_EQ(ParseLeadingNumber(blanks), 7);
}

TEST(FormatEngineering, HugeDigitCountsAndNonNumbersStayWhole) {
    const std::string many = FormatEngineering(1.5e300, 100000);
    ASSERT_FALSE(many.empty());
    EXPECT_EQ(many.substr(0, 4), " 150") << "1.5e282 exa, its digits kept";
    EXPECT_EQ(many.size(), 1u + 283 + 1 + 100 + 2) << "at 100 decimals at most";
    EXPECT_EQ(many.back(), 'E');
    EXPECT_EQ(FormatEngineering(NAN, 2), " NaN ");
    EXPECT_EQ(FormatEngineering(-INFINITY, 2), "-Inf ");
    std::string text;
    double value = 0;
    FormatValueWithUnit("nan", text, value, "Hz", 2);
    EXPECT_EQ(text, "0.00 Hz") << "a word is no number";
}

} // namespace
} // namespace qzivi
