// Text helpers of the object model: comparisons that ignore case, and number texts that read the
// same under any locale.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace qzivi::text {

std::string Lower(std::string_view text);
bool EqualsNoCase(std::string_view a, std::string_view b);
std::string_view Trim(std::string_view text);

// The whole text as a number (white space around it allowed), or nothing.
std::optional<double> ParseNumber(std::string_view text);

// The shortest text that reads back as the same double.
std::string FormatNumber(double value);

} // namespace qzivi::text
