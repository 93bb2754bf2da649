#include "faults.h"

#include "IviDriverFunctions.h"
#include "qzivi/ivi_common.h"

#include <charconv>
#include <cstdlib>

namespace qzivi::sim {

using ivi::StatusError;
using ivi::Trim;

namespace {

constexpr std::string_view kFunctions[] = {
#define QZSIM_NAME(name, params) #name,
    QZIVI_SPECIFIC_DRIVER_FUNCTIONS(QZSIM_NAME)
#undef QZSIM_NAME
};

[[noreturn]] void Bad(std::string_view item, std::string_view why) {
    throw StatusError(IVI_ERROR_BAD_OPTION_VALUE,
                      "DriverSetup item \"" + std::string(item) + "\": " + std::string(why));
}

std::vector<std::string_view> Split(std::string_view text, std::string_view separators) {
    std::vector<std::string_view> parts;
    size_t start = 0;
    while (start <= text.size()) {
        const auto end = text.find_first_of(separators, start);
        parts.push_back(Trim(text.substr(start, end - start)));
        if (end == std::string_view::npos) break;
        start = end + 1;
    }
    return parts;
}

long long Integer(std::string_view item, std::string_view text) {
    const std::string copy(Trim(text));
    char* end = nullptr;
    const long long value = std::strtoll(copy.c_str(), &end, 0);
    if (copy.empty() || end != copy.c_str() + copy.size())
        Bad(item, "\"" + copy + "\" is no integer");
    return value;
}

ViInt32 Positive(std::string_view item, std::string_view text) {
    const long long value = Integer(item, text);
    if (value < 1 || value > 0x7FFFFFFF) Bad(item, "the value must be from 1 to 2147483647");
    return static_cast<ViInt32>(value);
}

double Real(std::string_view item, std::string_view text) {
    const std::string copy(Trim(text));
    double value = 0;
    const auto [end, error] = std::from_chars(copy.data(), copy.data() + copy.size(), value);
    if (copy.empty() || error != std::errc() || end != copy.data() + copy.size())
        Bad(item, "\"" + copy + "\" is no number");
    return value;
}

ViStatus Status(std::string_view item, std::string_view text) {
    const long long value = Integer(item, text);
    if (value < -0x80000000LL || value > 0xFFFFFFFFLL)
        Bad(item, "the status has more than 32 bits");
    return static_cast<ViStatus>(static_cast<ViUInt32>(value));
}

FunctionFault Function(std::string_view item, std::string_view value, ViStatus fallback) {
    const auto parts = Split(value, ":");
    FunctionFault fault{std::string(parts[0]), fallback, -1};
    bool known = false;
    for (auto name : kFunctions)
        known = known || name == parts[0];
    if (!known) Bad(item, "no driver function is called \"" + fault.function + "\"");
    if (parts.size() > 1) fault.status = Status(item, parts[1]);
    if (parts.size() > 2) fault.remaining = Positive(item, parts[2]);
    if (parts.size() > 3 || fault.status == 0) Bad(item, "expected Function:Status[:Times]");
    return fault;
}

// "1.10" gives 1 and 10: the digits after the point are a number of their own, as driver
// versions count.
std::pair<ViInt32, ViInt32> Version(std::string_view item, std::string_view value) {
    const auto parts = Split(value, ".");
    if (parts.size() > 2) Bad(item, "expected Major[.Minor]");
    const auto major = static_cast<ViInt32>(Integer(item, parts[0]));
    const auto minor = parts.size() > 1 ? static_cast<ViInt32>(Integer(item, parts[1])) : 0;
    return {major, minor};
}

} // namespace

namespace {
// The status of the first fault of `function` that has calls left, counting it down; 0 for none.
ViStatus Meet(std::vector<FunctionFault>& faults, std::string_view function) {
    for (auto& fault : faults)
        if (fault.remaining != 0 && fault.function == function) {
            if (fault.remaining > 0) --fault.remaining;
            return fault.status;
        }
    return 0;
}
} // namespace

ViStatus Faults::Failure(std::string_view function) {
    return Meet(failures, function);
}

ViStatus Faults::Warning(std::string_view function) {
    return Meet(warnings, function);
}

bool Faults::Throws(std::string_view function) {
    return Meet(throws, function) != 0;
}

Faults ParseDriverSetup(std::string_view text) {
    Faults faults;
    for (auto item : Split(text, ";")) {
        if (item.empty()) continue;
        const auto equals = item.find('=');
        if (equals == std::string_view::npos) Bad(item, "expected Key=Value");
        const auto key = Trim(item.substr(0, equals));
        const auto value = Trim(item.substr(equals + 1));
        auto is = [&](std::string_view name) { return ivi::EqualsNoCase(key, name); };
        if (is("Fail")) {
            faults.failures.push_back(Function(item, value, 0));
        } else if (is("Throw")) {
            faults.throws.push_back(Function(item, value, IVI_ERROR_CANNOT_RECOVER));
        } else if (is("Warn")) {
            faults.warnings.push_back(Function(item, value, IVI_WARN_VALUE_COERCED));
        } else if (is("Refuse")) {
            const auto parts = Split(value, ":");
            if (parts.size() != 2) Bad(item, "expected AttributeId:Value");
            faults.refused.push_back(
                {static_cast<ViAttr>(Positive(item, parts[0])), Real(item, parts[1])});
        } else if (is("ClassSpec")) {
            const auto [major, minor] = Version(item, value);
            faults.classSpecMajor = major;
            faults.classSpecMinor = minor;
        } else if (is("Version")) {
            const auto [major, minor] = Version(item, value);
            faults.driverMajor = major;
            faults.driverMinor = minor;
        } else if (is("Prefix")) {
            faults.prefix = std::string(value);
        } else if (is("Groups")) {
            faults.groups.emplace();
            for (auto group : Split(value, ",|"))
                if (!group.empty()) faults.groups->emplace_back(group);
        } else if (is("NoRanges")) {
            faults.noRanges = ivi::ParseBoolOption({std::string(key), std::string(value)});
        } else if (is("RejectEmptyChannel")) {
            faults.rejectEmptyChannel =
                ivi::ParseBoolOption({std::string(key), std::string(value)});
        } else if (is("MaxWaveforms")) {
            faults.limits.maxWaveforms = Positive(item, value);
        } else if (is("Quantum")) {
            faults.limits.waveformQuantum = Positive(item, value);
        } else if (is("MinWaveformSize")) {
            faults.limits.minWaveformSize = Positive(item, value);
        } else if (is("MaxWaveformSize")) {
            faults.limits.maxWaveformSize = Positive(item, value);
        } else if (is("Memory")) {
            faults.limits.memoryPoints = Positive(item, value);
        } else if (is("MaxSequences")) {
            faults.limits.maxSequences = Positive(item, value);
        } else if (is("MinSequenceLength")) {
            faults.limits.minSequenceLength = Positive(item, value);
        } else if (is("MaxSequenceLength")) {
            faults.limits.maxSequenceLength = Positive(item, value);
        } else if (is("MaxLoopCount")) {
            faults.limits.maxLoopCount = Positive(item, value);
        } else {
            Bad(item, "unknown key");
        }
    }
    return faults;
}

} // namespace qzivi::sim
