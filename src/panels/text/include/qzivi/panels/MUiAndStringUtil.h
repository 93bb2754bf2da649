// Text helpers of the panels and pages: a typed text to a value, a value to a text with a unit and
// an engineering prefix, and the choice of a list entry. Locale-independent: a text made here
// reads back as the same value whatever the program's locale is.
#pragma once

#include "qzivi/support/variant.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qzivi {

// The number at the start of a text that may hold more: "  12.5 V" gives 12.5, letters give 0.
double ParseLeadingNumber(std::string_view text);

// Parses `input` (a number, maybe an engineering prefix, maybe a unit) into `value`, and writes it
// anew into `text` with the prefix and `unit`: "2.5 k", "Hz", 6 give 2500 and "2.500000 kHz".
void FormatValueWithUnit(std::string_view input, std::string& text, double& value,
                         std::string_view unit, std::int32_t decimals);

// A blank for a value of 0 or more, the value scaled under `decimals`, a blank, the prefix.
std::string FormatEngineering(double value, std::int32_t decimals);

// A scale as a scope writes it: three significant digits and an SI prefix from nano to mega,
// UTF-8: 2e-4, "s/div" give "200 µs/div"; 2.5e6, "S/s" give "2.5 MS/s".
std::string FormatScale(double value, std::string_view unit);

// The exponent of an engineering prefix letter, case sensitive; 0 for any other character.
std::int32_t PrefixExponent(char c);

// The decimal logarithm of |value|; 0 for 0 when `zeroGivesZero`.
double Log10Abs(double value, bool zeroGivesZero);

// The first character of `text`, `count` times.
std::string RepeatChar(std::string_view text, std::int32_t count);

// One entry of a list: its text and its item data.
struct ComboEntry {
    std::string text;
    std::optional<std::int32_t> data;
};

// What SelectComboEntry does to a list: select an entry, or set the list's text.
struct ComboChoice {
    std::int32_t select = -1;        // the entry to select, -1 for none
    std::optional<std::string> text; // the text to set when nothing is selected
};

ComboChoice SelectComboEntry(const std::vector<ComboEntry>& entries, const Variant& value,
                             bool asNumbers, bool firstAsFallback);

} // namespace qzivi
