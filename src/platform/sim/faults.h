// What the DriverSetup option asks of the simulator: injected faults and changed limits.
#pragma once

#include "IviFgen.h"

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qzivi::sim {

struct Limits {
    ViInt32 maxWaveforms = 256;
    ViInt32 waveformQuantum = 1;
    ViInt32 minWaveformSize = 8;
    ViInt32 maxWaveformSize = 4194304;
    ViInt32 memoryPoints = 16777216; // all waveforms together
    ViInt32 maxSequences = 128;
    ViInt32 minSequenceLength = 1;
    ViInt32 maxSequenceLength = 1024;
    ViInt32 maxLoopCount = 65535;
};

struct FunctionFault {
    std::string function; // without prefix, as in IviDriverFunctions.h
    ViStatus status = 0;
    ViInt32 remaining = -1; // how many more calls it hits; -1 for all
};

struct RefusedValue {
    ViAttr attribute = 0;
    double value = 0;
};

struct Faults {
    std::vector<FunctionFault> failures; // the call fails with the status, changing nothing
    std::vector<FunctionFault> warnings; // the call succeeds and returns the status
    std::vector<FunctionFault> throws;   // the call throws an exception of no known type
    std::vector<RefusedValue> refused;   // any call that would give the attribute this value
    std::optional<ViInt32> classSpecMajor, classSpecMinor, driverMajor, driverMinor;
    std::optional<std::string> prefix;
    std::optional<std::vector<std::string>> groups; // replaces the capability groups
    bool noRanges = false;
    bool rejectEmptyChannel = false;
    Limits limits;

    bool Empty() const { return failures.empty() && warnings.empty() && throws.empty(); }

    // The failure or warning a call of `function` meets now, counting it down; 0 for none.
    ViStatus Failure(std::string_view function);
    ViStatus Warning(std::string_view function);
    bool Throws(std::string_view function);
};

// Parses the DriverSetup text: items "Key=Value" separated by ';'. Throws
// qzivi::ivi::StatusError(IVI_ERROR_BAD_OPTION_VALUE) naming the item that is wrong.
Faults ParseDriverSetup(std::string_view text);

} // namespace qzivi::sim
