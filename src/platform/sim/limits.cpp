// The instrument's limits: which channel a name means, which groups it offers, the range of
// each setting in a given state, and the check of a whole state before it is kept.
#include "instrument.h"

#include "qzivi/ivi_common.h"

#include <algorithm>
#include <cmath>

namespace qzivi::sim {

using ivi::StatusError;

namespace {

constexpr double kVoltageWindow = 5.0; // |offset| + peak, volts, into the matched load
constexpr double kMaxSampleRate = 250e6;
constexpr double kMaxArbFrequency = 25e6;
constexpr double kWideDutyLimit = 10e6; // above it the duty cycle narrows to 20..80 %

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

bool IsKnownTriggerSource(ViInt32 source) {
    return (source >= IVIFGEN_VAL_TTL0 && source <= IVIFGEN_VAL_ECL1) ||
           source == IVIFGEN_VAL_PXI_STAR ||
           (source >= IVIFGEN_VAL_RTSI_0 && source <= IVIFGEN_VAL_RTSI_6);
}

} // namespace

bool Instrument::Offers(Group group) const {
    if (group == Group::Base || !faults_.groups) return true;
    return std::find(faults_.groups->begin(), faults_.groups->end(), GroupName(group)) !=
           faults_.groups->end();
}

void Instrument::RequireGroup(Group group, const char* function) const {
    if (!Offers(group))
        throw StatusError(IVI_ERROR_FUNCTION_NOT_SUPPORTED,
                          std::string(function) + " belongs to " + GroupName(group) +
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

Range Instrument::RangeOf(ViAttr attr, const ChannelState& s) const {
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
    return RangeOf(attr, channels_[info->perChannel ? ChannelIndex(channel) : 0]);
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
        CheckValue(attr, value, RangeOf(attr, s), unit);
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

} // namespace qzivi::sim
