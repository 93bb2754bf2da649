// Numbers read from text and written with a unit: any text reads without failing and never as
// NaN, and a value written with its digits reads back to itself within them.
#include "qzivi/panels/MUiAndStringUtil.h"
#include "qzivi/support/failure.h"

#include <cmath>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size == 0) return 0;
    const std::int32_t digits = data[0] % 12;
    const std::string text(reinterpret_cast<const char*>(data + 1), size - 1);
    if (std::isnan(qzivi::ParseLeadingNumber(text))) std::abort(); // words like nan are none
    std::string formatted, again;
    double value = 0, back = 0;
    try {
        qzivi::FormatValueWithUnit(text, formatted, value, "Hz", digits);
        qzivi::FormatValueWithUnit(formatted, again, back, "Hz", digits);
    } catch (const qzivi::Failure&) {
        return 0;
    }
    // Past the largest prefix (E) the mantissa grows past 15 digits, which the reader's digit
    // match does not find again: such values are read as written, without their prefix.
    if (!std::isfinite(value) || std::fabs(value) >= 1e21) return 0;
    // Within the written digits, counted in the prefix's scale, down to the smallest prefix (a).
    const double tolerance = (std::fabs(value) + 1e-18) * std::pow(10.0, -digits) * 10;
    if (std::fabs(back - value) > tolerance) std::abort();
    return 0;
}
