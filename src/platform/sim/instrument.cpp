#include "instrument.h"

#include "qzivi/ivi_common.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <numbers>

namespace qzivi::sim {

using ivi::StatusError;

namespace {

constexpr double kVoltageWindow = 5.0; // |offset| + peak, volts, into the matched load
constexpr double kMaxSampleRate = 250e6;
constexpr double kMaxArbFrequency = 25e6;
constexpr double kWideDutyLimit = 10e6; // above it the duty cycle narrows to 20..80 %

enum class Kind { Int32, Real64, Boolean, Session, String };

struct AttrInfo {
    ViAttr id;
    const char* name;
    Kind kind;
    Group group;
    bool perChannel;
    bool writable;
};

constexpr AttrInfo kAttributes[] = {
    {IVI_ATTR_SIMULATE, "IVI_ATTR_SIMULATE", Kind::Boolean, Group::Base, false, false},
    {IVI_ATTR_DRIVER_SETUP, "IVI_ATTR_DRIVER_SETUP", Kind::String, Group::Base, false, false},
    {IVI_ATTR_CHANNEL_COUNT, "IVI_ATTR_CHANNEL_COUNT", Kind::Int32, Group::Base, false, false},
    {IVI_ATTR_SPECIFIC_DRIVER_PREFIX, "IVI_ATTR_SPECIFIC_DRIVER_PREFIX", Kind::String, Group::Base,
     false, false},
    {IVI_ATTR_IO_RESOURCE_DESCRIPTOR, "IVI_ATTR_IO_RESOURCE_DESCRIPTOR", Kind::String, Group::Base,
     false, false},
    {IVI_ATTR_GROUP_CAPABILITIES, "IVI_ATTR_GROUP_CAPABILITIES", Kind::String, Group::Base, false,
     false},
    {IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION, "IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION", Kind::Int32,
     Group::Base, false, false},
    {IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION, "IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION", Kind::Int32,
     Group::Base, false, false},
    {IVI_ATTR_INSTRUMENT_MANUFACTURER, "IVI_ATTR_INSTRUMENT_MANUFACTURER", Kind::String,
     Group::Base, false, false},
    {IVI_ATTR_INSTRUMENT_MODEL, "IVI_ATTR_INSTRUMENT_MODEL", Kind::String, Group::Base, false,
     false},
    {IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION, "IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION", Kind::String,
     Group::Base, false, false},
    {IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION,
     "IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION", Kind::Int32, Group::Base, false, false},
    {IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION,
     "IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION", Kind::Int32, Group::Base, false, false},
    {IVIFGEN_ATTR_OUTPUT_MODE, "IVIFGEN_ATTR_OUTPUT_MODE", Kind::Int32, Group::Base, false, true},
    {IVIFGEN_ATTR_REF_CLOCK_SOURCE, "IVIFGEN_ATTR_REF_CLOCK_SOURCE", Kind::Int32, Group::Base,
     false, true},
    {IVIFGEN_ATTR_OUTPUT_ENABLED, "IVIFGEN_ATTR_OUTPUT_ENABLED", Kind::Boolean, Group::Base, true,
     true},
    {IVIFGEN_ATTR_OUTPUT_IMPEDANCE, "IVIFGEN_ATTR_OUTPUT_IMPEDANCE", Kind::Real64, Group::Base,
     true, true},
    {IVIFGEN_ATTR_OPERATION_MODE, "IVIFGEN_ATTR_OPERATION_MODE", Kind::Int32, Group::Base, true,
     true},
    {IVIFGEN_ATTR_FUNC_WAVEFORM, "IVIFGEN_ATTR_FUNC_WAVEFORM", Kind::Int32, Group::StdFunc, true,
     true},
    {IVIFGEN_ATTR_FUNC_AMPLITUDE, "IVIFGEN_ATTR_FUNC_AMPLITUDE", Kind::Real64, Group::StdFunc, true,
     true},
    {IVIFGEN_ATTR_FUNC_DC_OFFSET, "IVIFGEN_ATTR_FUNC_DC_OFFSET", Kind::Real64, Group::StdFunc, true,
     true},
    {IVIFGEN_ATTR_FUNC_FREQUENCY, "IVIFGEN_ATTR_FUNC_FREQUENCY", Kind::Real64, Group::StdFunc, true,
     true},
    {IVIFGEN_ATTR_FUNC_START_PHASE, "IVIFGEN_ATTR_FUNC_START_PHASE", Kind::Real64, Group::StdFunc,
     true, true},
    {IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, "IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH", Kind::Real64,
     Group::StdFunc, true, true},
    {IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE, "IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE", Kind::Int32,
     Group::ArbWfm, true, true},
    {IVIFGEN_ATTR_ARB_GAIN, "IVIFGEN_ATTR_ARB_GAIN", Kind::Real64, Group::ArbWfm, true, true},
    {IVIFGEN_ATTR_ARB_OFFSET, "IVIFGEN_ATTR_ARB_OFFSET", Kind::Real64, Group::ArbWfm, true, true},
    {IVIFGEN_ATTR_ARB_SAMPLE_RATE, "IVIFGEN_ATTR_ARB_SAMPLE_RATE", Kind::Real64, Group::ArbWfm,
     false, true},
    {IVIFGEN_ATTR_MAX_NUM_WAVEFORMS, "IVIFGEN_ATTR_MAX_NUM_WAVEFORMS", Kind::Int32, Group::ArbWfm,
     false, false},
    {IVIFGEN_ATTR_WAVEFORM_QUANTUM, "IVIFGEN_ATTR_WAVEFORM_QUANTUM", Kind::Int32, Group::ArbWfm,
     false, false},
    {IVIFGEN_ATTR_MIN_WAVEFORM_SIZE, "IVIFGEN_ATTR_MIN_WAVEFORM_SIZE", Kind::Int32, Group::ArbWfm,
     false, false},
    {IVIFGEN_ATTR_MAX_WAVEFORM_SIZE, "IVIFGEN_ATTR_MAX_WAVEFORM_SIZE", Kind::Int32, Group::ArbWfm,
     false, false},
    {IVIFGEN_ATTR_ARB_FREQUENCY, "IVIFGEN_ATTR_ARB_FREQUENCY", Kind::Real64, Group::ArbFrequency,
     true, true},
    {IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE, "IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE", Kind::Int32,
     Group::ArbSeq, true, true},
    {IVIFGEN_ATTR_MAX_NUM_SEQUENCES, "IVIFGEN_ATTR_MAX_NUM_SEQUENCES", Kind::Int32, Group::ArbSeq,
     false, false},
    {IVIFGEN_ATTR_MIN_SEQUENCE_LENGTH, "IVIFGEN_ATTR_MIN_SEQUENCE_LENGTH", Kind::Int32,
     Group::ArbSeq, false, false},
    {IVIFGEN_ATTR_MAX_SEQUENCE_LENGTH, "IVIFGEN_ATTR_MAX_SEQUENCE_LENGTH", Kind::Int32,
     Group::ArbSeq, false, false},
    {IVIFGEN_ATTR_MAX_LOOP_COUNT, "IVIFGEN_ATTR_MAX_LOOP_COUNT", Kind::Int32, Group::ArbSeq, false,
     false},
    {IVIFGEN_ATTR_TRIGGER_SOURCE, "IVIFGEN_ATTR_TRIGGER_SOURCE", Kind::Int32, Group::Trigger, true,
     true},
    {IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, "IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE", Kind::Real64,
     Group::InternalTrigger, false, true},
    {IVIFGEN_ATTR_BURST_COUNT, "IVIFGEN_ATTR_BURST_COUNT", Kind::Int32, Group::Burst, true, true},
    {IVIFGEN_ATTR_AM_ENABLED, "IVIFGEN_ATTR_AM_ENABLED", Kind::Boolean, Group::ModulateAM, true,
     true},
    {IVIFGEN_ATTR_AM_SOURCE, "IVIFGEN_ATTR_AM_SOURCE", Kind::Int32, Group::ModulateAM, true, true},
    {IVIFGEN_ATTR_AM_INTERNAL_DEPTH, "IVIFGEN_ATTR_AM_INTERNAL_DEPTH", Kind::Real64,
     Group::ModulateAM, false, true},
    {IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM, "IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM", Kind::Int32,
     Group::ModulateAM, false, true},
    {IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY, "IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY", Kind::Real64,
     Group::ModulateAM, false, true},
    {IVIFGEN_ATTR_FM_ENABLED, "IVIFGEN_ATTR_FM_ENABLED", Kind::Boolean, Group::ModulateFM, true,
     true},
    {IVIFGEN_ATTR_FM_SOURCE, "IVIFGEN_ATTR_FM_SOURCE", Kind::Int32, Group::ModulateFM, true, true},
    {IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, "IVIFGEN_ATTR_FM_INTERNAL_DEVIATION", Kind::Real64,
     Group::ModulateFM, false, true},
    {IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM, "IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM", Kind::Int32,
     Group::ModulateFM, false, true},
    {IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY, "IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY", Kind::Real64,
     Group::ModulateFM, false, true},
};

constexpr const char* kGroupNames[] = {
    "IviFgenBase",   "IviFgenStdFunc",    "IviFgenArbWfm",          "IviFgenArbFrequency",
    "IviFgenArbSeq", "IviFgenTrigger",    "IviFgenInternalTrigger", "IviFgenSoftwareTrigger",
    "IviFgenBurst",  "IviFgenModulateAM", "IviFgenModulateFM",
};

const AttrInfo* FindAttr(ViAttr id) {
    for (const auto& info : kAttributes)
        if (info.id == id) return &info;
    return nullptr;
}

const char* AttrName(ViAttr id) {
    const AttrInfo* info = FindAttr(id);
    return info != nullptr ? info->name : "attribute";
}

std::string Number(double value) {
    char text[32];
    std::snprintf(text, sizeof text, "%.9g", value);
    return text;
}

[[noreturn]] void Invalid(const std::string& what) {
    throw StatusError(IVI_ERROR_INVALID_VALUE, what);
}

[[noreturn]] void NotSupported(ViAttr attr, ViInt32 value) {
    throw StatusError(IVI_ERROR_VALUE_NOT_SUPPORTED, std::string(AttrName(attr)) + ": value " +
                                                         std::to_string(value) +
                                                         " is not supported by this instrument");
}

double MaxFrequency(ViInt32 waveform) {
    switch (waveform) {
    case IVIFGEN_VAL_WFM_SINE:
        return 50e6;
    case IVIFGEN_VAL_WFM_SQUARE:
        return 25e6;
    default:
        return 1e6; // triangle and ramps
    }
}

// One period of a shape, p from 0 to 1, values from -1 to 1.
double Shape(ViInt32 waveform, double p, double dutyCycleHigh) {
    switch (waveform) {
    case IVIFGEN_VAL_WFM_SINE:
        return std::sin(2 * std::numbers::pi * p);
    case IVIFGEN_VAL_WFM_SQUARE:
        return p < dutyCycleHigh / 100 ? 1.0 : -1.0;
    case IVIFGEN_VAL_WFM_TRIANGLE:
        return p < 0.25 ? 4 * p : p < 0.75 ? 2 - 4 * p : 4 * p - 4;
    case IVIFGEN_VAL_WFM_RAMP_UP:
        return 2 * p - 1;
    case IVIFGEN_VAL_WFM_RAMP_DOWN:
        return 1 - 2 * p;
    default:
        return 1.0; // DC
    }
}

// The integral of Shape over [0, p], for the phase of a frequency-modulated carrier.
double ShapeIntegral(ViInt32 waveform, double p) {
    switch (waveform) {
    case IVIFGEN_VAL_WFM_SINE:
        return (1 - std::cos(2 * std::numbers::pi * p)) / (2 * std::numbers::pi);
    case IVIFGEN_VAL_WFM_SQUARE:
        return p < 0.5 ? p : 1 - p;
    case IVIFGEN_VAL_WFM_TRIANGLE:
        return p < 0.25 ? 2 * p * p : p < 0.75 ? 2 * p - 2 * p * p - 0.25 : 2 * p * p - 4 * p + 2;
    case IVIFGEN_VAL_WFM_RAMP_UP:
        return p * p - p;
    case IVIFGEN_VAL_WFM_RAMP_DOWN:
        return p - p * p;
    default:
        return p;
    }
}

double Fraction(double x) {
    return x - std::floor(x);
}

// The modulating signal of an internal source at time t, and its integral from 0 to t.
double Modulating(const InternalSource& source, double t) {
    return Shape(source.waveform, Fraction(source.frequency * t), 50);
}
double ModulatingIntegral(const InternalSource& source, double t) {
    const double cycles = source.frequency * t;
    const double whole = std::floor(cycles);
    return (whole * ShapeIntegral(source.waveform, 1.0) +
            ShapeIntegral(source.waveform, cycles - whole)) /
           source.frequency;
}

bool IsKnownTriggerSource(ViInt32 source) {
    return (source >= IVIFGEN_VAL_TTL0 && source <= IVIFGEN_VAL_ECL1) ||
           source == IVIFGEN_VAL_PXI_STAR ||
           (source >= IVIFGEN_VAL_RTSI_0 && source <= IVIFGEN_VAL_RTSI_6);
}

} // namespace

Instrument::Instrument(Faults faults, std::string resource, std::string driverSetup)
    : faults_(std::move(faults)), resource_(std::move(resource)),
      driverSetup_(std::move(driverSetup)) {}

void Instrument::Reset() {
    global_ = GlobalState{};
    for (auto& channel : channels_)
        channel = ChannelState{};
    waveforms_.clear();
    sequences_.clear();
    usedPoints_ = 0;
    generating_ = false;
    softwareTriggers_.clear();
}

bool Instrument::Offers(Group group) const {
    if (group == Group::Base || !faults_.groups) return true;
    const char* name = kGroupNames[static_cast<int>(group)];
    return std::find(faults_.groups->begin(), faults_.groups->end(), name) != faults_.groups->end();
}

void Instrument::RequireGroup(Group group, const char* function) const {
    if (!Offers(group))
        throw StatusError(IVI_ERROR_FUNCTION_NOT_SUPPORTED,
                          std::string(function) + " belongs to " +
                              kGroupNames[static_cast<int>(group)] +
                              ", which this instrument does not offer");
}

int Instrument::ChannelIndex(const char* channel) const {
    const std::string_view name = channel != nullptr ? channel : "";
    if (name.empty()) {
        if (faults_.rejectEmptyChannel)
            throw StatusError(IVI_ERROR_UNKNOWN_CHANNEL_NAME,
                              "the empty channel name is refused; name channel \"1\" or \"2\"");
        return 0;
    }
    if (name == "1") return 0;
    if (name == "2") return 1;
    throw StatusError(IVI_ERROR_UNKNOWN_CHANNEL_NAME,
                      "channel \"" + std::string(name) +
                          "\" is unknown; the channels are \"1\" and \"2\"");
}

// ---- Limits ------------------------------------------------------------------------------------

Range Instrument::RangeOf(ViAttr attr, const GlobalState& g, const ChannelState& s) const {
    const double funcPeak = s.func.amplitude / 2;
    switch (attr) {
    case IVIFGEN_ATTR_OUTPUT_IMPEDANCE:
        return {1, 10000};
    case IVIFGEN_ATTR_FUNC_AMPLITUDE:
        return {0.001, std::min(10.0, 2 * (kVoltageWindow - std::fabs(s.func.offset)))};
    case IVIFGEN_ATTR_FUNC_DC_OFFSET:
        if (s.func.waveform == IVIFGEN_VAL_WFM_DC) return {-kVoltageWindow, kVoltageWindow};
        return {-(kVoltageWindow - funcPeak), kVoltageWindow - funcPeak};
    case IVIFGEN_ATTR_FUNC_FREQUENCY:
        return {1e-6, MaxFrequency(s.func.waveform)};
    case IVIFGEN_ATTR_FUNC_START_PHASE:
        return {-360, 360};
    case IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH:
        return s.func.frequency <= kWideDutyLimit ? Range{1, 99} : Range{20, 80};
    case IVIFGEN_ATTR_ARB_GAIN:
        return {0.001, kVoltageWindow - std::fabs(s.arbOffset)};
    case IVIFGEN_ATTR_ARB_OFFSET:
        return {-(kVoltageWindow - s.arbGain), kVoltageWindow - s.arbGain};
    case IVIFGEN_ATTR_ARB_SAMPLE_RATE:
        return {1, kMaxSampleRate};
    case IVIFGEN_ATTR_ARB_FREQUENCY: {
        const auto wfm = waveforms_.find(s.waveformHandle);
        const double size = wfm != waveforms_.end() ? static_cast<double>(wfm->second.size()) : 1;
        return {1e-6, std::min(kMaxArbFrequency, kMaxSampleRate / size)};
    }
    case IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE:
        return {1e-3, 1e6};
    case IVIFGEN_ATTR_AM_INTERNAL_DEPTH:
        return {0, 100};
    case IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY:
        return {2e-3, 20e3};
    case IVIFGEN_ATTR_FM_INTERNAL_DEVIATION:
        return {0, 25e6};
    case IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY:
        return {2e-3, 20e3};
    default:
        break;
    }
    (void)g;
    throw StatusError(IVI_ERROR_INVALID_ATTRIBUTE,
                      std::string(AttrName(attr)) + " has no range of 64-bit float values");
}

Range Instrument::MinMax(ViAttr attr, const char* channel) const {
    const AttrInfo* info = FindAttr(attr);
    if (info == nullptr)
        throw StatusError(IVI_ERROR_INVALID_ATTRIBUTE,
                          "attribute " + std::to_string(attr) + " is unknown");
    if (info->kind != Kind::Real64)
        throw StatusError(IVI_ERROR_TYPES_DO_NOT_MATCH,
                          std::string(info->name) + " is no ViReal64 attribute");
    if (!Offers(info->group))
        throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED,
                          std::string(info->name) + " is not supported");
    if (faults_.noRanges)
        throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED,
                          std::string(info->name) + ": this driver gives no range information");
    return RangeOf(attr, global_, channels_[info->perChannel ? ChannelIndex(channel) : 0]);
}

void Instrument::CheckRefused(ViAttr attr, double value) const {
    for (const auto& refused : faults_.refused)
        if (refused.attribute == attr && refused.value == value)
            Invalid(std::string(AttrName(attr)) + ": value " + Number(value) +
                    " is refused (DriverSetup Refuse)");
}

void Instrument::CheckValue(ViAttr attr, double value, Range range, const char* unit) const {
    if (!std::isfinite(value) || value < range.min || value > range.max)
        Invalid(std::string(AttrName(attr)) + ": " + Number(value) + " " + unit +
                " is outside the range " + Number(range.min) + " to " + Number(range.max) + " " +
                unit);
}

void Instrument::Validate(const GlobalState& g, const ChannelState& s) const {
    auto range = [&](ViAttr attr, double value, const char* unit) {
        CheckValue(attr, value, RangeOf(attr, g, s), unit);
    };
    switch (g.outputMode) {
    case IVIFGEN_VAL_OUTPUT_FUNC:
        if (!Offers(Group::StdFunc)) NotSupported(IVIFGEN_ATTR_OUTPUT_MODE, g.outputMode);
        break;
    case IVIFGEN_VAL_OUTPUT_ARB:
        if (!Offers(Group::ArbWfm)) NotSupported(IVIFGEN_ATTR_OUTPUT_MODE, g.outputMode);
        break;
    case IVIFGEN_VAL_OUTPUT_SEQ:
        if (!Offers(Group::ArbSeq)) NotSupported(IVIFGEN_ATTR_OUTPUT_MODE, g.outputMode);
        break;
    default:
        Invalid("IVIFGEN_ATTR_OUTPUT_MODE: " + std::to_string(g.outputMode) + " is no output mode");
    }
    if (g.refClockSource == IVIFGEN_VAL_REF_CLOCK_RTSI_CLOCK)
        NotSupported(IVIFGEN_ATTR_REF_CLOCK_SOURCE, g.refClockSource);
    if (g.refClockSource != IVIFGEN_VAL_REF_CLOCK_INTERNAL &&
        g.refClockSource != IVIFGEN_VAL_REF_CLOCK_EXTERNAL)
        Invalid("IVIFGEN_ATTR_REF_CLOCK_SOURCE: " + std::to_string(g.refClockSource) +
                " is no reference clock source");
    range(IVIFGEN_ATTR_ARB_SAMPLE_RATE, g.sampleRate, "Sa/s");
    range(IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, g.internalTriggerRate, "Hz");
    range(IVIFGEN_ATTR_AM_INTERNAL_DEPTH, g.am.amount, "%");
    range(IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY, g.am.frequency, "Hz");
    range(IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, g.fm.amount, "Hz");
    range(IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY, g.fm.frequency, "Hz");
    for (auto [attr, waveform] : {std::pair{IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM, g.am.waveform},
                                  std::pair{IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM, g.fm.waveform}}) {
        if (waveform == IVIFGEN_VAL_WFM_DC) NotSupported(attr, waveform);
        if (waveform < IVIFGEN_VAL_WFM_SINE || waveform > IVIFGEN_VAL_WFM_DC)
            Invalid(std::string(AttrName(attr)) + ": " + std::to_string(waveform) +
                    " is no waveform");
    }

    range(IVIFGEN_ATTR_OUTPUT_IMPEDANCE, s.impedance, "Ohm");
    if (s.operationMode == IVIFGEN_VAL_OPERATE_BURST && !Offers(Group::Burst))
        NotSupported(IVIFGEN_ATTR_OPERATION_MODE, s.operationMode);
    if (s.operationMode != IVIFGEN_VAL_OPERATE_CONTINUOUS &&
        s.operationMode != IVIFGEN_VAL_OPERATE_BURST)
        Invalid("IVIFGEN_ATTR_OPERATION_MODE: " + std::to_string(s.operationMode) +
                " is no operation mode");
    if (s.func.waveform < IVIFGEN_VAL_WFM_SINE || s.func.waveform > IVIFGEN_VAL_WFM_DC)
        Invalid("IVIFGEN_ATTR_FUNC_WAVEFORM: " + std::to_string(s.func.waveform) +
                " is no waveform");
    if (s.func.waveform != IVIFGEN_VAL_WFM_DC) {
        range(IVIFGEN_ATTR_FUNC_FREQUENCY, s.func.frequency, "Hz");
        range(IVIFGEN_ATTR_FUNC_AMPLITUDE, s.func.amplitude, "Vpp");
    }
    range(IVIFGEN_ATTR_FUNC_DC_OFFSET, s.func.offset, "V");
    range(IVIFGEN_ATTR_FUNC_START_PHASE, s.func.startPhase, "degrees");
    range(IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, s.func.dutyCycleHigh, "%");
    if (s.waveformHandle != 0 && !waveforms_.contains(s.waveformHandle))
        Invalid("IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE: no waveform has the handle " +
                std::to_string(s.waveformHandle));
    if (s.sequenceHandle != 0 && !sequences_.contains(s.sequenceHandle))
        Invalid("IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE: no sequence has the handle " +
                std::to_string(s.sequenceHandle));
    range(IVIFGEN_ATTR_ARB_GAIN, s.arbGain, "");
    range(IVIFGEN_ATTR_ARB_OFFSET, s.arbOffset, "V");
    // The arbitrary frequency is held to the waveform only while the channel plays at it.
    if (s.playsAtArbFrequency) range(IVIFGEN_ATTR_ARB_FREQUENCY, s.arbFrequency, "Hz");
    if (s.triggerSource == IVIFGEN_VAL_SOFTWARE_TRIG && !Offers(Group::SoftwareTrigger))
        NotSupported(IVIFGEN_ATTR_TRIGGER_SOURCE, s.triggerSource);
    if (s.triggerSource == IVIFGEN_VAL_INTERNAL_TRIGGER && !Offers(Group::InternalTrigger))
        NotSupported(IVIFGEN_ATTR_TRIGGER_SOURCE, s.triggerSource);
    if (IsKnownTriggerSource(s.triggerSource))
        NotSupported(IVIFGEN_ATTR_TRIGGER_SOURCE, s.triggerSource);
    if (s.triggerSource < IVIFGEN_VAL_EXTERNAL || s.triggerSource > IVIFGEN_VAL_INTERNAL_TRIGGER)
        Invalid("IVIFGEN_ATTR_TRIGGER_SOURCE: " + std::to_string(s.triggerSource) +
                " is no trigger source");
    if (s.burstCount < 1 || s.burstCount > 1000000)
        Invalid("IVIFGEN_ATTR_BURST_COUNT: " + std::to_string(s.burstCount) +
                " is outside the range 1 to 1000000");
    for (auto [attr, source] : {std::pair{IVIFGEN_ATTR_AM_SOURCE, s.amSource},
                                std::pair{IVIFGEN_ATTR_FM_SOURCE, s.fmSource}})
        if (source != IVIFGEN_VAL_AM_INTERNAL && source != IVIFGEN_VAL_AM_EXTERNAL)
            Invalid(std::string(AttrName(attr)) + ": " + std::to_string(source) +
                    " is no modulation source");
}

// ---- Attributes --------------------------------------------------------------------------------

namespace {

// The value of a settable attribute in a proposed state, as a number.
double NumberOf(ViAttr attr, const GlobalState& g, const ChannelState& s) {
    switch (attr) {
    case IVIFGEN_ATTR_OUTPUT_MODE:
        return g.outputMode;
    case IVIFGEN_ATTR_REF_CLOCK_SOURCE:
        return g.refClockSource;
    case IVIFGEN_ATTR_OUTPUT_ENABLED:
        return s.outputEnabled;
    case IVIFGEN_ATTR_OUTPUT_IMPEDANCE:
        return s.impedance;
    case IVIFGEN_ATTR_OPERATION_MODE:
        return s.operationMode;
    case IVIFGEN_ATTR_FUNC_WAVEFORM:
        return s.func.waveform;
    case IVIFGEN_ATTR_FUNC_AMPLITUDE:
        return s.func.amplitude;
    case IVIFGEN_ATTR_FUNC_DC_OFFSET:
        return s.func.offset;
    case IVIFGEN_ATTR_FUNC_FREQUENCY:
        return s.func.frequency;
    case IVIFGEN_ATTR_FUNC_START_PHASE:
        return s.func.startPhase;
    case IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH:
        return s.func.dutyCycleHigh;
    case IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE:
        return s.waveformHandle;
    case IVIFGEN_ATTR_ARB_GAIN:
        return s.arbGain;
    case IVIFGEN_ATTR_ARB_OFFSET:
        return s.arbOffset;
    case IVIFGEN_ATTR_ARB_SAMPLE_RATE:
        return g.sampleRate;
    case IVIFGEN_ATTR_ARB_FREQUENCY:
        return s.arbFrequency;
    case IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE:
        return s.sequenceHandle;
    case IVIFGEN_ATTR_TRIGGER_SOURCE:
        return s.triggerSource;
    case IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE:
        return g.internalTriggerRate;
    case IVIFGEN_ATTR_BURST_COUNT:
        return s.burstCount;
    case IVIFGEN_ATTR_AM_ENABLED:
        return s.amEnabled;
    case IVIFGEN_ATTR_AM_SOURCE:
        return s.amSource;
    case IVIFGEN_ATTR_AM_INTERNAL_DEPTH:
        return g.am.amount;
    case IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM:
        return g.am.waveform;
    case IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY:
        return g.am.frequency;
    case IVIFGEN_ATTR_FM_ENABLED:
        return s.fmEnabled;
    case IVIFGEN_ATTR_FM_SOURCE:
        return s.fmSource;
    case IVIFGEN_ATTR_FM_INTERNAL_DEVIATION:
        return g.fm.amount;
    case IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM:
        return g.fm.waveform;
    case IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY:
        return g.fm.frequency;
    default:
        return 0;
    }
}

// Stores a number into the settable attribute of a proposed state.
void Store(ViAttr attr, double v, GlobalState& g, ChannelState& s) {
    const auto i = static_cast<ViInt32>(v);
    switch (attr) {
    case IVIFGEN_ATTR_OUTPUT_MODE:
        g.outputMode = i;
        break;
    case IVIFGEN_ATTR_REF_CLOCK_SOURCE:
        g.refClockSource = i;
        break;
    case IVIFGEN_ATTR_OUTPUT_ENABLED:
        s.outputEnabled = v != 0;
        break;
    case IVIFGEN_ATTR_OUTPUT_IMPEDANCE:
        s.impedance = v;
        break;
    case IVIFGEN_ATTR_OPERATION_MODE:
        s.operationMode = i;
        break;
    case IVIFGEN_ATTR_FUNC_WAVEFORM:
        s.func.waveform = i;
        break;
    case IVIFGEN_ATTR_FUNC_AMPLITUDE:
        s.func.amplitude = v;
        break;
    case IVIFGEN_ATTR_FUNC_DC_OFFSET:
        s.func.offset = v;
        break;
    case IVIFGEN_ATTR_FUNC_FREQUENCY:
        s.func.frequency = v;
        break;
    case IVIFGEN_ATTR_FUNC_START_PHASE:
        s.func.startPhase = v;
        break;
    case IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH:
        s.func.dutyCycleHigh = v;
        break;
    case IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE:
        s.waveformHandle = i;
        break;
    case IVIFGEN_ATTR_ARB_GAIN:
        s.arbGain = v;
        break;
    case IVIFGEN_ATTR_ARB_OFFSET:
        s.arbOffset = v;
        break;
    case IVIFGEN_ATTR_ARB_SAMPLE_RATE:
        g.sampleRate = v;
        break;
    case IVIFGEN_ATTR_ARB_FREQUENCY:
        s.arbFrequency = v;
        break;
    case IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE:
        s.sequenceHandle = i;
        break;
    case IVIFGEN_ATTR_TRIGGER_SOURCE:
        s.triggerSource = i;
        break;
    case IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE:
        g.internalTriggerRate = v;
        break;
    case IVIFGEN_ATTR_BURST_COUNT:
        s.burstCount = i;
        break;
    case IVIFGEN_ATTR_AM_ENABLED:
        s.amEnabled = v != 0;
        break;
    case IVIFGEN_ATTR_AM_SOURCE:
        s.amSource = i;
        break;
    case IVIFGEN_ATTR_AM_INTERNAL_DEPTH:
        g.am.amount = v;
        break;
    case IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM:
        g.am.waveform = i;
        break;
    case IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY:
        g.am.frequency = v;
        break;
    case IVIFGEN_ATTR_FM_ENABLED:
        s.fmEnabled = v != 0;
        break;
    case IVIFGEN_ATTR_FM_SOURCE:
        s.fmSource = i;
        break;
    case IVIFGEN_ATTR_FM_INTERNAL_DEVIATION:
        g.fm.amount = v;
        break;
    case IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM:
        g.fm.waveform = i;
        break;
    case IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY:
        g.fm.frequency = v;
        break;
    default:
        break;
    }
}

Kind KindOf(const AttrValue& value) {
    return static_cast<Kind>(value.index());
}

const char* KindName(Kind kind) {
    constexpr const char* names[] = {"ViInt32", "ViReal64", "ViBoolean", "ViSession", "ViString"};
    return names[static_cast<int>(kind)];
}

} // namespace

AttrValue Instrument::Get(ViAttr attr, const char* channel, const AttrValue& type) const {
    const AttrInfo* info = FindAttr(attr);
    if (info == nullptr)
        throw StatusError(IVI_ERROR_INVALID_ATTRIBUTE,
                          "attribute " + std::to_string(attr) + " is unknown");
    if (info->kind != KindOf(type))
        throw StatusError(IVI_ERROR_TYPES_DO_NOT_MATCH, std::string(info->name) + " is of type " +
                                                            KindName(info->kind) + ", not " +
                                                            KindName(KindOf(type)));
    if (!Offers(info->group))
        throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED,
                          std::string(info->name) + " is not supported");
    const ChannelState& s = channels_[info->perChannel ? ChannelIndex(channel) : 0];
    switch (attr) {
    case IVI_ATTR_SIMULATE:
        return ViBoolean{VI_TRUE};
    case IVI_ATTR_DRIVER_SETUP:
        return driverSetup_;
    case IVI_ATTR_CHANNEL_COUNT:
        return ViInt32{kChannels};
    case IVI_ATTR_SPECIFIC_DRIVER_PREFIX:
        return faults_.prefix.value_or("QZSimFgen");
    case IVI_ATTR_IO_RESOURCE_DESCRIPTOR:
        return resource_;
    case IVI_ATTR_GROUP_CAPABILITIES: {
        std::string text;
        for (int g = 0; g <= static_cast<int>(Group::ModulateFM); ++g)
            if (Offers(static_cast<Group>(g)))
                text += (text.empty() ? "" : ",") + std::string(kGroupNames[g]);
        return text;
    }
    case IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION:
        return faults_.driverMajor.value_or(1);
    case IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION:
        return faults_.driverMinor.value_or(0);
    case IVI_ATTR_INSTRUMENT_MANUFACTURER:
        return std::string("Quartzline");
    case IVI_ATTR_INSTRUMENT_MODEL:
        return std::string("QZ-AFG2050 (simulated)");
    case IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION:
        return std::string("Simulated two-channel 50 MHz arbitrary function generator");
    case IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION:
        return faults_.classSpecMajor.value_or(3);
    case IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION:
        return faults_.classSpecMinor.value_or(0);
    case IVIFGEN_ATTR_MAX_NUM_WAVEFORMS:
        return faults_.limits.maxWaveforms;
    case IVIFGEN_ATTR_WAVEFORM_QUANTUM:
        return faults_.limits.waveformQuantum;
    case IVIFGEN_ATTR_MIN_WAVEFORM_SIZE:
        return faults_.limits.minWaveformSize;
    case IVIFGEN_ATTR_MAX_WAVEFORM_SIZE:
        return faults_.limits.maxWaveformSize;
    case IVIFGEN_ATTR_MAX_NUM_SEQUENCES:
        return faults_.limits.maxSequences;
    case IVIFGEN_ATTR_MIN_SEQUENCE_LENGTH:
        return faults_.limits.minSequenceLength;
    case IVIFGEN_ATTR_MAX_SEQUENCE_LENGTH:
        return faults_.limits.maxSequenceLength;
    case IVIFGEN_ATTR_MAX_LOOP_COUNT:
        return faults_.limits.maxLoopCount;
    default:
        break;
    }
    const double number = NumberOf(attr, global_, s);
    switch (info->kind) {
    case Kind::Boolean:
        return ViBoolean(number != 0 ? VI_TRUE : VI_FALSE);
    case Kind::Int32:
        return static_cast<ViInt32>(number);
    default:
        return number;
    }
}

void Instrument::SetAttribute(ViAttr attr, const char* channel, const AttrValue& value,
                              bool checkOnly) {
    const AttrInfo* info = FindAttr(attr);
    if (info == nullptr)
        throw StatusError(IVI_ERROR_INVALID_ATTRIBUTE,
                          "attribute " + std::to_string(attr) + " is unknown");
    if (info->kind != KindOf(value))
        throw StatusError(IVI_ERROR_TYPES_DO_NOT_MATCH, std::string(info->name) + " is of type " +
                                                            KindName(info->kind) + ", not " +
                                                            KindName(KindOf(value)));
    if (!Offers(info->group))
        throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED,
                          std::string(info->name) + " is not supported");
    if (!info->writable)
        throw StatusError(IVI_ERROR_ATTR_NOT_WRITABLE, std::string(info->name) + " is read-only");
    const int index = info->perChannel ? ChannelIndex(channel) : 0;
    GlobalState g = global_;
    ChannelState s = channels_[index];
    double number = 0;
    switch (info->kind) {
    case Kind::Int32:
        number = std::get<ViInt32>(value);
        break;
    case Kind::Real64:
        number = std::get<ViReal64>(value);
        break;
    case Kind::Boolean:
        number = std::get<ViBoolean>(value) != VI_FALSE;
        break;
    default:
        break;
    }
    Store(attr, number, g, s);
    if (attr == IVIFGEN_ATTR_ARB_FREQUENCY) s.playsAtArbFrequency = true;
    CheckRefused(attr, number);
    Validate(g, s);
    if (checkOnly) return;
    global_ = g;
    channels_[index] = s;
    if (attr == IVIFGEN_ATTR_ARB_SAMPLE_RATE)
        for (auto& channelState : channels_)
            channelState.playsAtArbFrequency = false;
}

void Instrument::Commit(const GlobalState& g, int channel, const ChannelState& s, bool checkOnly) {
    Validate(g, s);
    if (checkOnly) return;
    global_ = g;
    channels_[channel] = s;
}

// ---- Configure functions -----------------------------------------------------------------------

void Instrument::CheckRefusals(std::initializer_list<Touch> touches) const {
    for (const Touch& touch : touches)
        CheckRefused(touch.attr, touch.value);
}

void Instrument::ConfigureOutputMode(ViInt32 mode) {
    CheckRefusals({{IVIFGEN_ATTR_OUTPUT_MODE, double(mode)}});
    GlobalState g = global_;
    g.outputMode = mode;
    Commit(g, 0, channels_[0], false);
}

void Instrument::ConfigureRefClockSource(ViInt32 source) {
    CheckRefusals({{IVIFGEN_ATTR_REF_CLOCK_SOURCE, double(source)}});
    GlobalState g = global_;
    g.refClockSource = source;
    Commit(g, 0, channels_[0], false);
}

void Instrument::ConfigureOutputImpedance(const char* channel, double impedance) {
    const int i = ChannelIndex(channel);
    CheckRefusals({{IVIFGEN_ATTR_OUTPUT_IMPEDANCE, impedance}});
    ChannelState s = channels_[i];
    s.impedance = impedance;
    Commit(global_, i, s, false);
}

void Instrument::ConfigureOperationMode(const char* channel, ViInt32 mode) {
    const int i = ChannelIndex(channel);
    CheckRefusals({{IVIFGEN_ATTR_OPERATION_MODE, double(mode)}});
    ChannelState s = channels_[i];
    s.operationMode = mode;
    Commit(global_, i, s, false);
}

void Instrument::ConfigureOutputEnabled(const char* channel, bool enabled) {
    const int i = ChannelIndex(channel);
    CheckRefusals({{IVIFGEN_ATTR_OUTPUT_ENABLED, double(enabled)}});
    ChannelState s = channels_[i];
    s.outputEnabled = enabled;
    Commit(global_, i, s, false);
}

void Instrument::ConfigureStandardWaveform(const char* channel, const FuncSettings& wanted) {
    const int i = ChannelIndex(channel);
    CheckRefusals({{IVIFGEN_ATTR_FUNC_WAVEFORM, double(wanted.waveform)},
                   {IVIFGEN_ATTR_FUNC_AMPLITUDE, wanted.amplitude},
                   {IVIFGEN_ATTR_FUNC_DC_OFFSET, wanted.offset},
                   {IVIFGEN_ATTR_FUNC_FREQUENCY, wanted.frequency},
                   {IVIFGEN_ATTR_FUNC_START_PHASE, wanted.startPhase}});
    ChannelState s = channels_[i];
    const double duty = s.func.dutyCycleHigh;
    s.func = wanted;
    s.func.dutyCycleHigh = duty;
    Commit(global_, i, s, false);
}

void Instrument::QueryArbWfmCapabilities(ViInt32* maxNum, ViInt32* quantum, ViInt32* minSize,
                                         ViInt32* maxSize) const {
    if (maxNum) *maxNum = faults_.limits.maxWaveforms;
    if (quantum) *quantum = faults_.limits.waveformQuantum;
    if (minSize) *minSize = faults_.limits.minWaveformSize;
    if (maxSize) *maxSize = faults_.limits.maxWaveformSize;
}

ViInt32 Instrument::CreateArbWaveform(ViInt32 size, const double* data) {
    const Limits& limits = faults_.limits;
    if (size < limits.minWaveformSize || size > limits.maxWaveformSize)
        Invalid("waveform size " + std::to_string(size) + " is outside the range " +
                std::to_string(limits.minWaveformSize) + " to " +
                std::to_string(limits.maxWaveformSize));
    if (size % limits.waveformQuantum != 0)
        Invalid("waveform size " + std::to_string(size) + " is not a multiple of the quantum " +
                std::to_string(limits.waveformQuantum));
    if (data == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER, "the waveform data is a null pointer");
    for (ViInt32 k = 0; k < size; ++k)
        if (!(data[k] >= -1.0 && data[k] <= 1.0))
            Invalid("waveform point " + std::to_string(k) + " is " + Number(data[k]) +
                    ", outside the range -1 to 1");
    if (static_cast<ViInt32>(waveforms_.size()) >= limits.maxWaveforms)
        throw StatusError(IVIFGEN_ERROR_NO_WFMS_AVAILABLE, "all " +
                                                               std::to_string(limits.maxWaveforms) +
                                                               " waveform slots are in use");
    if (usedPoints_ + size > limits.memoryPoints)
        throw StatusError(IVIFGEN_ERROR_NO_WFMS_AVAILABLE,
                          "the waveform needs " + std::to_string(size) + " points, but only " +
                              std::to_string(limits.memoryPoints - usedPoints_) + " of " +
                              std::to_string(limits.memoryPoints) + " are free");
    const ViInt32 handle = nextWaveform_++;
    waveforms_.emplace(handle, std::vector<double>(data, data + size));
    usedPoints_ += size;
    return handle;
}

void Instrument::ClearArbWaveform(ViInt32 handle) {
    auto inUse = [&](ViInt32 h) -> std::string {
        for (const auto& [seqHandle, seq] : sequences_)
            if (std::find(seq.handles.begin(), seq.handles.end(), h) != seq.handles.end())
                return "sequence " + std::to_string(seqHandle) + " uses it";
        if (generating_ && global_.outputMode == IVIFGEN_VAL_OUTPUT_ARB)
            for (int c = 0; c < kChannels; ++c)
                if (channels_[c].waveformHandle == h)
                    return "channel \"" + std::to_string(c + 1) + "\" is generating it";
        return {};
    };
    if (handle == IVIFGEN_VAL_ALL_WAVEFORMS) {
        for (const auto& [h, data] : waveforms_)
            if (auto why = inUse(h); !why.empty())
                throw StatusError(IVIFGEN_ERROR_WFM_IN_USE,
                                  "waveform " + std::to_string(h) + ": " + why);
        waveforms_.clear();
        usedPoints_ = 0;
        for (auto& channel : channels_)
            channel.waveformHandle = 0;
        return;
    }
    const auto found = waveforms_.find(handle);
    if (found == waveforms_.end()) Invalid("no waveform has the handle " + std::to_string(handle));
    if (auto why = inUse(handle); !why.empty())
        throw StatusError(IVIFGEN_ERROR_WFM_IN_USE,
                          "waveform " + std::to_string(handle) + ": " + why);
    usedPoints_ -= static_cast<long long>(found->second.size());
    waveforms_.erase(found);
    for (auto& channel : channels_)
        if (channel.waveformHandle == handle) channel.waveformHandle = 0;
}

void Instrument::ConfigureArbWaveform(const char* channel, ViInt32 handle, double gain,
                                      double offset) {
    const int i = ChannelIndex(channel);
    CheckRefusals({{IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE, double(handle)},
                   {IVIFGEN_ATTR_ARB_GAIN, gain},
                   {IVIFGEN_ATTR_ARB_OFFSET, offset}});
    if (!waveforms_.contains(handle))
        Invalid("no waveform has the handle " + std::to_string(handle));
    ChannelState s = channels_[i];
    s.waveformHandle = handle;
    s.arbGain = gain;
    s.arbOffset = offset;
    Commit(global_, i, s, false);
}

void Instrument::ConfigureSampleRate(double rate) {
    SetAttribute(IVIFGEN_ATTR_ARB_SAMPLE_RATE, "", AttrValue(rate), false);
}

void Instrument::ConfigureArbFrequency(const char* channel, double frequency) {
    SetAttribute(IVIFGEN_ATTR_ARB_FREQUENCY, channel, AttrValue(frequency), false);
}

void Instrument::QueryArbSeqCapabilities(ViInt32* maxNum, ViInt32* minLength, ViInt32* maxLength,
                                         ViInt32* maxLoopCount) const {
    if (maxNum) *maxNum = faults_.limits.maxSequences;
    if (minLength) *minLength = faults_.limits.minSequenceLength;
    if (maxLength) *maxLength = faults_.limits.maxSequenceLength;
    if (maxLoopCount) *maxLoopCount = faults_.limits.maxLoopCount;
}

ViInt32 Instrument::CreateArbSequence(ViInt32 length, const ViInt32* handles,
                                      const ViInt32* loopCounts) {
    const Limits& limits = faults_.limits;
    if (length < limits.minSequenceLength || length > limits.maxSequenceLength)
        Invalid("sequence length " + std::to_string(length) + " is outside the range " +
                std::to_string(limits.minSequenceLength) + " to " +
                std::to_string(limits.maxSequenceLength));
    if (handles == nullptr || loopCounts == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER,
                          "the sequence's handles or loop counts are a null pointer");
    for (ViInt32 k = 0; k < length; ++k) {
        if (!waveforms_.contains(handles[k]))
            Invalid("sequence entry " + std::to_string(k) + ": no waveform has the handle " +
                    std::to_string(handles[k]));
        if (loopCounts[k] < 1 || loopCounts[k] > limits.maxLoopCount)
            Invalid("sequence entry " + std::to_string(k) + ": loop count " +
                    std::to_string(loopCounts[k]) + " is outside the range 1 to " +
                    std::to_string(limits.maxLoopCount));
    }
    if (static_cast<ViInt32>(sequences_.size()) >= limits.maxSequences)
        throw StatusError(IVIFGEN_ERROR_NO_SEQS_AVAILABLE, "all " +
                                                               std::to_string(limits.maxSequences) +
                                                               " sequence slots are in use");
    const ViInt32 handle = nextSequence_++;
    sequences_.emplace(handle,
                       Sequence{{handles, handles + length}, {loopCounts, loopCounts + length}});
    return handle;
}

void Instrument::ClearArbSequence(ViInt32 handle) {
    auto inUse = [&](ViInt32 h) -> std::string {
        if (generating_ && global_.outputMode == IVIFGEN_VAL_OUTPUT_SEQ)
            for (int c = 0; c < kChannels; ++c)
                if (channels_[c].sequenceHandle == h)
                    return "channel \"" + std::to_string(c + 1) + "\" is generating it";
        return {};
    };
    if (handle == IVIFGEN_VAL_ALL_SEQUENCES) {
        for (const auto& [h, seq] : sequences_)
            if (auto why = inUse(h); !why.empty())
                throw StatusError(IVIFGEN_ERROR_SEQ_IN_USE,
                                  "sequence " + std::to_string(h) + ": " + why);
        sequences_.clear();
        for (auto& channel : channels_)
            channel.sequenceHandle = 0;
        return;
    }
    if (!sequences_.contains(handle))
        Invalid("no sequence has the handle " + std::to_string(handle));
    if (auto why = inUse(handle); !why.empty())
        throw StatusError(IVIFGEN_ERROR_SEQ_IN_USE,
                          "sequence " + std::to_string(handle) + ": " + why);
    sequences_.erase(handle);
    for (auto& channel : channels_)
        if (channel.sequenceHandle == handle) channel.sequenceHandle = 0;
}

void Instrument::ConfigureArbSequence(const char* channel, ViInt32 handle, double gain,
                                      double offset) {
    const int i = ChannelIndex(channel);
    CheckRefusals({{IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE, double(handle)},
                   {IVIFGEN_ATTR_ARB_GAIN, gain},
                   {IVIFGEN_ATTR_ARB_OFFSET, offset}});
    if (!sequences_.contains(handle))
        Invalid("no sequence has the handle " + std::to_string(handle));
    ChannelState s = channels_[i];
    s.sequenceHandle = handle;
    s.arbGain = gain;
    s.arbOffset = offset;
    Commit(global_, i, s, false);
}

void Instrument::ConfigureTriggerSource(const char* channel, ViInt32 source) {
    SetAttribute(IVIFGEN_ATTR_TRIGGER_SOURCE, channel, AttrValue(source), false);
}

void Instrument::ConfigureInternalTriggerRate(double rate) {
    SetAttribute(IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, "", AttrValue(rate), false);
}

void Instrument::ConfigureBurstCount(const char* channel, ViInt32 count) {
    SetAttribute(IVIFGEN_ATTR_BURST_COUNT, channel, AttrValue(count), false);
}

void Instrument::ConfigureAMEnabled(const char* channel, bool enabled) {
    SetAttribute(IVIFGEN_ATTR_AM_ENABLED, channel, AttrValue(ViBoolean(enabled)), false);
}

void Instrument::ConfigureAMSource(const char* channel, ViInt32 source) {
    SetAttribute(IVIFGEN_ATTR_AM_SOURCE, channel, AttrValue(source), false);
}

void Instrument::ConfigureAMInternal(double depth, ViInt32 waveform, double frequency) {
    CheckRefusals({{IVIFGEN_ATTR_AM_INTERNAL_DEPTH, depth},
                   {IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM, double(waveform)},
                   {IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY, frequency}});
    GlobalState g = global_;
    g.am = {depth, waveform, frequency};
    Commit(g, 0, channels_[0], false);
}

void Instrument::ConfigureFMEnabled(const char* channel, bool enabled) {
    SetAttribute(IVIFGEN_ATTR_FM_ENABLED, channel, AttrValue(ViBoolean(enabled)), false);
}

void Instrument::ConfigureFMSource(const char* channel, ViInt32 source) {
    SetAttribute(IVIFGEN_ATTR_FM_SOURCE, channel, AttrValue(source), false);
}

void Instrument::ConfigureFMInternal(double deviation, ViInt32 waveform, double frequency) {
    CheckRefusals({{IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, deviation},
                   {IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM, double(waveform)},
                   {IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY, frequency}});
    GlobalState g = global_;
    g.fm = {deviation, waveform, frequency};
    Commit(g, 0, channels_[0], false);
}

// ---- Generation --------------------------------------------------------------------------------

void Instrument::InitiateGeneration() {
    if (generating_) return;
    generating_ = true;
    started_ = std::chrono::steady_clock::now();
    softwareTriggers_.clear();
}

void Instrument::AbortGeneration() {
    generating_ = false;
    softwareTriggers_.clear();
}

double Instrument::ElapsedSeconds() const {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - started_).count();
}

void Instrument::SendSoftwareTrigger() {
    bool waiting = false;
    for (const auto& channel : channels_)
        waiting = waiting || (channel.operationMode == IVIFGEN_VAL_OPERATE_BURST &&
                              channel.triggerSource == IVIFGEN_VAL_SOFTWARE_TRIG);
    if (!waiting)
        throw StatusError(IVIFGEN_ERROR_TRIGGER_NOT_SOFTWARE,
                          "no channel is in burst mode with the software trigger as its source");
    if (!generating_)
        throw StatusError(IVIFGEN_ERROR_NOT_GENERATING,
                          "a trigger needs generation to be initiated first");
    softwareTriggers_.push_back(ElapsedSeconds());
}

// ---- The signal --------------------------------------------------------------------------------

namespace {
// Length in samples of one pass through a sequence.
long long SequenceSamples(const std::vector<ViInt32>& handles, const std::vector<ViInt32>& loops,
                          const std::map<ViInt32, std::vector<double>>& waveforms) {
    long long total = 0;
    for (size_t k = 0; k < handles.size(); ++k) {
        const auto wfm = waveforms.find(handles[k]);
        if (wfm != waveforms.end()) total += static_cast<long long>(wfm->second.size()) * loops[k];
    }
    return total;
}
} // namespace

// The channel's carrier at `tau` seconds into its waveform, with offsets; `period` gets the time
// of one cycle (the whole waveform or sequence for arbitrary output).
double Instrument::Carrier(const ChannelState& s, double tau, double* period) const {
    switch (global_.outputMode) {
    case IVIFGEN_VAL_OUTPUT_ARB: {
        const auto wfm = waveforms_.find(s.waveformHandle);
        if (wfm == waveforms_.end()) {
            *period = 0;
            return 0;
        }
        const auto& data = wfm->second;
        const double n = static_cast<double>(data.size());
        const double rate = s.playsAtArbFrequency ? s.arbFrequency * n : global_.sampleRate;
        *period = n / rate;
        const auto index =
            static_cast<long long>(std::floor(tau * rate)) % static_cast<long long>(data.size());
        return s.arbGain * data[static_cast<size_t>(index)] + s.arbOffset;
    }
    case IVIFGEN_VAL_OUTPUT_SEQ: {
        const auto seq = sequences_.find(s.sequenceHandle);
        const long long total =
            seq == sequences_.end()
                ? 0
                : SequenceSamples(seq->second.handles, seq->second.loopCounts, waveforms_);
        if (total == 0) {
            *period = 0;
            return 0;
        }
        *period = static_cast<double>(total) / global_.sampleRate;
        long long index = static_cast<long long>(std::floor(tau * global_.sampleRate)) % total;
        for (size_t k = 0; k < seq->second.handles.size(); ++k) {
            const auto& data = waveforms_.at(seq->second.handles[k]);
            const long long span = static_cast<long long>(data.size()) * seq->second.loopCounts[k];
            if (index < span)
                return s.arbGain *
                           data[static_cast<size_t>(index % static_cast<long long>(data.size()))] +
                       s.arbOffset;
            index -= span;
        }
        return s.arbOffset;
    }
    default: {
        const FuncSettings& f = s.func;
        *period = 1 / f.frequency;
        if (f.waveform == IVIFGEN_VAL_WFM_DC) return f.offset;
        double cycles = f.frequency * tau + f.startPhase / 360;
        if (s.fmEnabled && s.fmSource == IVIFGEN_VAL_FM_INTERNAL)
            cycles += global_.fm.amount * ModulatingIntegral(global_.fm, tau);
        return f.offset + f.amplitude / 2 * Shape(f.waveform, Fraction(cycles), f.dutyCycleHigh);
    }
    }
}

std::vector<double> Instrument::AcceptedTriggers(const ChannelState& s) const {
    std::vector<double> accepted;
    if (s.operationMode != IVIFGEN_VAL_OPERATE_BURST ||
        s.triggerSource != IVIFGEN_VAL_SOFTWARE_TRIG)
        return accepted;
    double period = 0;
    Carrier(s, 0, &period);
    const double burst = period * s.burstCount;
    for (double t : softwareTriggers_)
        if (accepted.empty() || t >= accepted.back() + burst) accepted.push_back(t);
    return accepted;
}

double Instrument::Sample(const ChannelState& s, double t,
                          const std::vector<double>& triggers) const {
    if (!generating_ || !s.outputEnabled) return 0;
    const double idle = global_.outputMode == IVIFGEN_VAL_OUTPUT_FUNC ? s.func.offset : s.arbOffset;
    double tau = t;
    double period = 0;
    Carrier(s, 0, &period);
    if (s.operationMode == IVIFGEN_VAL_OPERATE_BURST) {
        const double burst = period * s.burstCount;
        double start = -1;
        if (s.triggerSource == IVIFGEN_VAL_INTERNAL_TRIGGER) {
            // A trigger that comes while a burst runs is lost, so bursts start every m-th trigger.
            const double every = 1 / global_.internalTriggerRate;
            const double m = std::max(1.0, std::ceil(burst / every - 1e-9));
            if (t >= 0) start = std::floor(t / (m * every)) * m * every;
        } else {
            const auto after = std::upper_bound(triggers.begin(), triggers.end(), t);
            if (after != triggers.begin()) start = *(after - 1);
        }
        if (start < 0 || t - start >= burst) return idle;
        tau = t - start;
    }
    double value = Carrier(s, tau, &period);
    if (s.amEnabled) {
        const double depth = global_.am.amount / 100;
        const double m = s.amSource == IVIFGEN_VAL_AM_INTERNAL ? Modulating(global_.am, t) : 0;
        value = idle + (value - idle) * (1 + depth * m) / (1 + depth);
    }
    return value;
}

void Instrument::Render(const char* channel, double startTime, double timeStep, ViInt32 count,
                        double* volts) const {
    const int i = ChannelIndex(channel);
    if (count < 0) Invalid("the count of samples " + std::to_string(count) + " is negative");
    if (!std::isfinite(startTime) || !std::isfinite(timeStep))
        Invalid("the start time and the time step must be finite");
    if (count > 0 && volts == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER, "the sample buffer is a null pointer");
    const ChannelState& s = channels_[i];
    const std::vector<double> triggers = AcceptedTriggers(s);
    for (ViInt32 k = 0; k < count; ++k)
        volts[k] = Sample(s, startTime + k * timeStep, triggers);
}

} // namespace qzivi::sim
