#include "qzivi/panels/MUiAndStringUtil.h"

#include "qzivi/support/failure.h"
#include "qzivi/support/text.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <utility>

namespace qzivi {

namespace {

bool IsNumber(std::string_view text) {
    return text::ParseNumber(text).has_value();
}

// A value as the system's first language turned numbers into text: at most 15 significant digits.
std::string Digits(double value) {
    char buffer[64];
    const auto [end, error] =
        std::to_chars(buffer, buffer + sizeof buffer, value, std::chars_format::general, 15);
    return error == std::errc() ? std::string(buffer, end) : std::string();
}

struct Prefix {
    double from;
    const char* letter;
    double scale;
};

constexpr Prefix kPrefixes[] = {
    {18, "E", 1e-18}, {15, "P", 1e-15}, {12, "T", 1e-12}, {9, "G", 1e-9},
    {6, "M", 1e-6},   {3, "k", 1e-3},   {0, "", 1},       {-3, "m", 1e3},
    {-6, "u", 1e6},   {-9, "n", 1e9},   {-12, "p", 1e12}, {-15, "f", 1e15},
};

} // namespace

// The number token at the start of `text`: a sign, digits with one point, and an exponent that
// has digits. One pass: a long run of anything costs its length, not its square.
std::string_view NumberToken(std::string_view text) {
    std::size_t i = 0;
    if (i < text.size() && (text[i] == '+' || text[i] == '-')) ++i;
    const std::size_t mantissa = i;
    while (i < text.size() && text[i] >= '0' && text[i] <= '9')
        ++i;
    if (i < text.size() && text[i] == '.') ++i;
    while (i < text.size() && text[i] >= '0' && text[i] <= '9')
        ++i;
    if (i == mantissa || (i == mantissa + 1 && text[mantissa] == '.')) return {};
    if (i < text.size() && (text[i] == 'e' || text[i] == 'E')) {
        std::size_t j = i + 1;
        if (j < text.size() && (text[j] == '+' || text[j] == '-')) ++j;
        const std::size_t digits = j;
        while (j < text.size() && text[j] >= '0' && text[j] <= '9')
            ++j;
        if (j > digits) i = j;
    }
    return text.substr(0, i);
}

// The leading number's token within `text`: what ParseLeadingNumber reads when the whole text is
// no number.
std::string_view LeadingToken(std::string_view text) {
    std::string_view rest;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] < '0' || text[i] > '9') continue;
        // A sign or a point just before the digit belongs to the number; a digit in first place
        // cuts nothing.
        const bool joins =
            i > 0 && (text[i - 1] == '-' || text[i - 1] == '+' || text[i - 1] == '.');
        rest = joins && IsNumber(text.substr(i - 1, 2)) ? text.substr(i - 1) : text.substr(i);
        break;
    }
    return NumberToken(rest);
}

double ParseLeadingNumber(std::string_view text) {
    if (const auto whole = text::ParseNumber(text); whole && std::isfinite(*whole)) return *whole;
    std::string_view token = LeadingToken(text);
    if (token.empty()) return 0;
    const bool negative = token.front() == '-';
    if (token.front() == '+' || negative) token.remove_prefix(1);
    double value = 0;
    const auto [end, error] = std::from_chars(token.data(), token.data() + token.size(), value);
    if (error == std::errc::result_out_of_range) {
        // Too large for a number is infinite, not the digits that happened to fit; too small is 0.
        const bool huge = std::fabs(std::strtod(std::string(token).c_str(), nullptr)) > 1;
        value = huge ? HUGE_VAL : 0;
    }
    (void)end;
    return negative ? -value : value;
}

std::int32_t PrefixExponent(char c) {
    switch (c) {
    case 'E':
        return 18;
    case 'P':
        return 15;
    case 'T':
        return 12;
    case 'G':
        return 9;
    case 'M':
        return 6;
    case 'k':
        return 3;
    case 'm':
        return -3;
    case 'u':
        return -6;
    case 'n':
        return -9;
    case 'p':
        return -12;
    case 'f':
        return -15;
    case 'a':
        return -18;
    default:
        return 0;
    }
}

double Log10Abs(double value, bool zeroGivesZero) {
    if (value == 0) {
        if (zeroGivesZero) return 0;
        RaiseRuntime(5, "Invalid procedure call or argument: the logarithm of 0.");
    }
    // log10 lands on the integer for powers of ten, so 1e6 is 1 M and not 1000 k.
    return std::log10(std::fabs(value));
}

std::string RepeatChar(std::string_view text, std::int32_t count) {
    if (text.empty() || count < 0) RaiseRuntime(5, "Invalid procedure call or argument.");
    return std::string(static_cast<std::size_t>(count), text.front());
}

std::string FormatEngineering(double value, std::int32_t decimals) {
    if (std::isnan(value)) return " NaN ";
    if (std::isinf(value)) return value > 0 ? " Inf " : "-Inf ";
    const double e = Log10Abs(value, true);
    const char* letter = "a";
    double scale = 1e18;
    for (const auto& p : kPrefixes)
        if (e >= p.from) {
            letter = p.letter;
            scale = p.scale;
            break;
        }
    // At most 100 decimals: the largest double scaled down to exa still fits the buffer with them.
    char number[512];
    const auto [end, error] = std::to_chars(number, number + sizeof number, value * scale,
                                            std::chars_format::fixed, std::clamp(decimals, 0, 100));
    std::string text = value >= 0 ? " " : "";
    text.append(number, error == std::errc() ? end : number);
    return text + " " + letter;
}

void FormatValueWithUnit(std::string_view input, std::string& text, double& value,
                         std::string_view unit, std::int32_t decimals) {
    const double v = ParseLeadingNumber(input);
    const std::string digits = Digits(v);
    std::size_t next = !digits.empty() && digits.front() == '0' ? 1 : 0; // 0-based
    std::int32_t exponent = 0;
    if (v != 0) {
        // Find where the number ends in the input, though blanks or a leading zero differ.
        std::size_t end = std::string_view::npos;
        for (std::size_t i = 0; i < input.size(); ++i) {
            if (next < digits.size() && input[i] == digits[next]) ++next;
            if (next >= digits.size()) {
                end = i;
                break;
            }
        }
        // A number whose 15 digits are written with an exponent ("5.13e-05") is not found so;
        // its token is, and a prefix after it counts as after any other number.
        if (const auto token = LeadingToken(input); end == std::string_view::npos && !token.empty())
            end = static_cast<std::size_t>(token.data() - input.data()) + token.size() - 1;
        if (end != std::string_view::npos && end + 1 < input.size())
            for (std::size_t i = end; i < input.size() && exponent == 0; ++i)
                exponent = PrefixExponent(input[i]);
    }
    value = v * std::pow(10.0, exponent);
    text = FormatEngineering(value, decimals).append(unit);
    if (text.empty() || text.front() != '-') text.erase(0, 1);
}

ComboChoice SelectComboEntry(const std::vector<ComboEntry>& entries, const Variant& value,
                             bool asNumbers, bool firstAsFallback) {
    const auto asText = [&] {
        return value.IsEmpty() || value.IsMissing() ? std::string() : value.AsText();
    };
    if (entries.empty()) return {-1, asText()};
    ComboChoice choice;
    if (!value.IsNumber()) {
        const std::string wanted = asText();
        for (std::size_t i = 0; i < entries.size() && choice.select < 0; ++i)
            if (entries[i].text == wanted) choice.select = static_cast<std::int32_t>(i);
    } else {
        const double wanted = value.AsDouble();
        for (std::size_t i = 0; i < entries.size() && choice.select < 0; ++i)
            if (entries[i].data && *entries[i].data == wanted)
                choice.select = static_cast<std::int32_t>(i);
        for (std::size_t i = 0; asNumbers && i < entries.size() && choice.select < 0; ++i)
            if (ParseLeadingNumber(entries[i].text) == wanted)
                choice.select = static_cast<std::int32_t>(i);
    }
    if (choice.select < 0) {
        if (firstAsFallback)
            choice.select = 0;
        else
            choice.text = asText();
    }
    return choice;
}

std::string FormatScale(double value, std::string_view unit) {
    static const std::pair<double, const char*> kPrefixes[] = {
        {1e6, "M"}, {1e3, "k"}, {1, ""}, {1e-3, "m"}, {1e-6, "\u00b5"}, {1e-9, "n"}};
    double scaled = value;
    const char* prefix = "";
    for (const auto& [scale, letter] : kPrefixes)
        if (std::fabs(value) >= scale * 0.999) {
            scaled = value / scale;
            prefix = letter;
            break;
        }
    char number[32];
    const auto end =
        std::to_chars(number, number + sizeof number, scaled, std::chars_format::general, 3).ptr;
    return std::string(number, end) + " " + prefix + std::string(unit);
}

} // namespace qzivi
