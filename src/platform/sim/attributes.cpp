#include "attributes.h"

#include "instrument.h"
#include "qzivi/ivi_common.h"

#include <cstdio>

namespace qzivi::sim {

using ivi::StatusError;

namespace {

using G = GlobalState;
using C = ChannelState;

// Settings of the channel or of the whole instrument, as numbers.
#define QZSIM_SETTING(expr, type)                                                                  \
    [](const G& g, const C& s) -> double {                                                         \
        (void)g;                                                                                   \
        (void)s;                                                                                   \
        return static_cast<double>(expr);                                                          \
    },                                                                                             \
        [](G& g, C& s, double v) {                                                                 \
            (void)g;                                                                               \
            (void)s;                                                                               \
            expr = static_cast<type>(v);                                                           \
        },                                                                                         \
        nullptr

// A fact the instrument answers.
#define QZSIM_FACT(expr)                                                                           \
    nullptr, nullptr, [](const Instrument& i) -> AttrValue {                                       \
        (void)i;                                                                                   \
        return expr;                                                                               \
    }

const ViInt32& Limit(const Instrument& i, ViInt32 Limits::*limit) {
    return i.ActiveFaults().limits.*limit;
}

constexpr AttrInfo kAttributes[] = {
    // clang-format off
    {IVI_ATTR_SIMULATE, "IVI_ATTR_SIMULATE", Kind::Boolean, Group::Base, false,
     QZSIM_FACT(ViBoolean{VI_TRUE})},
    {IVI_ATTR_DRIVER_SETUP, "IVI_ATTR_DRIVER_SETUP", Kind::String, Group::Base, false,
     QZSIM_FACT(i.DriverSetup())},
    {IVI_ATTR_CHANNEL_COUNT, "IVI_ATTR_CHANNEL_COUNT", Kind::Int32, Group::Base, false,
     QZSIM_FACT(ViInt32{Instrument::kChannels})},
    {IVI_ATTR_SPECIFIC_DRIVER_PREFIX, "IVI_ATTR_SPECIFIC_DRIVER_PREFIX", Kind::String, Group::Base,
     false, QZSIM_FACT(i.ActiveFaults().prefix.value_or("QZSimFgen"))},
    {IVI_ATTR_IO_RESOURCE_DESCRIPTOR, "IVI_ATTR_IO_RESOURCE_DESCRIPTOR", Kind::String, Group::Base,
     false, QZSIM_FACT(i.Resource())},
    {IVI_ATTR_GROUP_CAPABILITIES, "IVI_ATTR_GROUP_CAPABILITIES", Kind::String, Group::Base, false,
     QZSIM_FACT(i.Capabilities())},
    {IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION, "IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION", Kind::Int32,
     Group::Base, false, QZSIM_FACT(i.ActiveFaults().driverMajor.value_or(1))},
    {IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION, "IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION", Kind::Int32,
     Group::Base, false, QZSIM_FACT(i.ActiveFaults().driverMinor.value_or(0))},
    {IVI_ATTR_INSTRUMENT_MANUFACTURER, "IVI_ATTR_INSTRUMENT_MANUFACTURER", Kind::String,
     Group::Base, false, QZSIM_FACT(std::string("Quartzline"))},
    {IVI_ATTR_INSTRUMENT_MODEL, "IVI_ATTR_INSTRUMENT_MODEL", Kind::String, Group::Base, false,
     QZSIM_FACT(std::string("QZ-AFG2050 (simulated)"))},
    {IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION, "IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION", Kind::String,
     Group::Base, false,
     QZSIM_FACT(std::string("Simulated two-channel 50 MHz arbitrary function generator"))},
    {IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION,
     "IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION", Kind::Int32, Group::Base, false,
     QZSIM_FACT(i.ActiveFaults().classSpecMajor.value_or(3))},
    {IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION,
     "IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION", Kind::Int32, Group::Base, false,
     QZSIM_FACT(i.ActiveFaults().classSpecMinor.value_or(0))},
    {IVIFGEN_ATTR_OUTPUT_MODE, "IVIFGEN_ATTR_OUTPUT_MODE", Kind::Int32, Group::Base, false,
     QZSIM_SETTING(g.outputMode, ViInt32)},
    {IVIFGEN_ATTR_REF_CLOCK_SOURCE, "IVIFGEN_ATTR_REF_CLOCK_SOURCE", Kind::Int32, Group::Base,
     false, QZSIM_SETTING(g.refClockSource, ViInt32)},
    {IVIFGEN_ATTR_OUTPUT_ENABLED, "IVIFGEN_ATTR_OUTPUT_ENABLED", Kind::Boolean, Group::Base, true,
     QZSIM_SETTING(s.outputEnabled, bool)},
    {IVIFGEN_ATTR_OUTPUT_IMPEDANCE, "IVIFGEN_ATTR_OUTPUT_IMPEDANCE", Kind::Real64, Group::Base,
     true, QZSIM_SETTING(s.impedance, double)},
    {IVIFGEN_ATTR_OPERATION_MODE, "IVIFGEN_ATTR_OPERATION_MODE", Kind::Int32, Group::Base, true,
     QZSIM_SETTING(s.operationMode, ViInt32)},
    {IVIFGEN_ATTR_FUNC_WAVEFORM, "IVIFGEN_ATTR_FUNC_WAVEFORM", Kind::Int32, Group::StdFunc, true,
     QZSIM_SETTING(s.func.waveform, ViInt32)},
    {IVIFGEN_ATTR_FUNC_AMPLITUDE, "IVIFGEN_ATTR_FUNC_AMPLITUDE", Kind::Real64, Group::StdFunc, true,
     QZSIM_SETTING(s.func.amplitude, double)},
    {IVIFGEN_ATTR_FUNC_DC_OFFSET, "IVIFGEN_ATTR_FUNC_DC_OFFSET", Kind::Real64, Group::StdFunc, true,
     QZSIM_SETTING(s.func.offset, double)},
    {IVIFGEN_ATTR_FUNC_FREQUENCY, "IVIFGEN_ATTR_FUNC_FREQUENCY", Kind::Real64, Group::StdFunc, true,
     QZSIM_SETTING(s.func.frequency, double)},
    {IVIFGEN_ATTR_FUNC_START_PHASE, "IVIFGEN_ATTR_FUNC_START_PHASE", Kind::Real64, Group::StdFunc,
     true, QZSIM_SETTING(s.func.startPhase, double)},
    {IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, "IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH", Kind::Real64,
     Group::StdFunc, true, QZSIM_SETTING(s.func.dutyCycleHigh, double)},
    {IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE, "IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE", Kind::Int32,
     Group::ArbWfm, true, QZSIM_SETTING(s.waveformHandle, ViInt32)},
    {IVIFGEN_ATTR_ARB_GAIN, "IVIFGEN_ATTR_ARB_GAIN", Kind::Real64, Group::ArbWfm, true,
     QZSIM_SETTING(s.arbGain, double)},
    {IVIFGEN_ATTR_ARB_OFFSET, "IVIFGEN_ATTR_ARB_OFFSET", Kind::Real64, Group::ArbWfm, true,
     QZSIM_SETTING(s.arbOffset, double)},
    {IVIFGEN_ATTR_ARB_SAMPLE_RATE, "IVIFGEN_ATTR_ARB_SAMPLE_RATE", Kind::Real64, Group::ArbWfm,
     false, QZSIM_SETTING(g.sampleRate, double)},
    {IVIFGEN_ATTR_MAX_NUM_WAVEFORMS, "IVIFGEN_ATTR_MAX_NUM_WAVEFORMS", Kind::Int32, Group::ArbWfm,
     false, QZSIM_FACT(Limit(i, &Limits::maxWaveforms))},
    {IVIFGEN_ATTR_WAVEFORM_QUANTUM, "IVIFGEN_ATTR_WAVEFORM_QUANTUM", Kind::Int32, Group::ArbWfm,
     false, QZSIM_FACT(Limit(i, &Limits::waveformQuantum))},
    {IVIFGEN_ATTR_MIN_WAVEFORM_SIZE, "IVIFGEN_ATTR_MIN_WAVEFORM_SIZE", Kind::Int32, Group::ArbWfm,
     false, QZSIM_FACT(Limit(i, &Limits::minWaveformSize))},
    {IVIFGEN_ATTR_MAX_WAVEFORM_SIZE, "IVIFGEN_ATTR_MAX_WAVEFORM_SIZE", Kind::Int32, Group::ArbWfm,
     false, QZSIM_FACT(Limit(i, &Limits::maxWaveformSize))},
    {IVIFGEN_ATTR_ARB_FREQUENCY, "IVIFGEN_ATTR_ARB_FREQUENCY", Kind::Real64, Group::ArbFrequency,
     true, QZSIM_SETTING(s.arbFrequency, double)},
    {IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE, "IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE", Kind::Int32,
     Group::ArbSeq, true, QZSIM_SETTING(s.sequenceHandle, ViInt32)},
    {IVIFGEN_ATTR_MAX_NUM_SEQUENCES, "IVIFGEN_ATTR_MAX_NUM_SEQUENCES", Kind::Int32, Group::ArbSeq,
     false, QZSIM_FACT(Limit(i, &Limits::maxSequences))},
    {IVIFGEN_ATTR_MIN_SEQUENCE_LENGTH, "IVIFGEN_ATTR_MIN_SEQUENCE_LENGTH", Kind::Int32,
     Group::ArbSeq, false, QZSIM_FACT(Limit(i, &Limits::minSequenceLength))},
    {IVIFGEN_ATTR_MAX_SEQUENCE_LENGTH, "IVIFGEN_ATTR_MAX_SEQUENCE_LENGTH", Kind::Int32,
     Group::ArbSeq, false, QZSIM_FACT(Limit(i, &Limits::maxSequenceLength))},
    {IVIFGEN_ATTR_MAX_LOOP_COUNT, "IVIFGEN_ATTR_MAX_LOOP_COUNT", Kind::Int32, Group::ArbSeq, false,
     QZSIM_FACT(Limit(i, &Limits::maxLoopCount))},
    {IVIFGEN_ATTR_TRIGGER_SOURCE, "IVIFGEN_ATTR_TRIGGER_SOURCE", Kind::Int32, Group::Trigger, true,
     QZSIM_SETTING(s.triggerSource, ViInt32)},
    {IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, "IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE", Kind::Real64,
     Group::InternalTrigger, false, QZSIM_SETTING(g.internalTriggerRate, double)},
    {IVIFGEN_ATTR_BURST_COUNT, "IVIFGEN_ATTR_BURST_COUNT", Kind::Int32, Group::Burst, true,
     QZSIM_SETTING(s.burstCount, ViInt32)},
    {IVIFGEN_ATTR_AM_ENABLED, "IVIFGEN_ATTR_AM_ENABLED", Kind::Boolean, Group::ModulateAM, true,
     QZSIM_SETTING(s.amEnabled, bool)},
    {IVIFGEN_ATTR_AM_SOURCE, "IVIFGEN_ATTR_AM_SOURCE", Kind::Int32, Group::ModulateAM, true,
     QZSIM_SETTING(s.amSource, ViInt32)},
    {IVIFGEN_ATTR_AM_INTERNAL_DEPTH, "IVIFGEN_ATTR_AM_INTERNAL_DEPTH", Kind::Real64,
     Group::ModulateAM, false, QZSIM_SETTING(g.am.amount, double)},
    {IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM, "IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM", Kind::Int32,
     Group::ModulateAM, false, QZSIM_SETTING(g.am.waveform, ViInt32)},
    {IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY, "IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY", Kind::Real64,
     Group::ModulateAM, false, QZSIM_SETTING(g.am.frequency, double)},
    {IVIFGEN_ATTR_FM_ENABLED, "IVIFGEN_ATTR_FM_ENABLED", Kind::Boolean, Group::ModulateFM, true,
     QZSIM_SETTING(s.fmEnabled, bool)},
    {IVIFGEN_ATTR_FM_SOURCE, "IVIFGEN_ATTR_FM_SOURCE", Kind::Int32, Group::ModulateFM, true,
     QZSIM_SETTING(s.fmSource, ViInt32)},
    {IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, "IVIFGEN_ATTR_FM_INTERNAL_DEVIATION", Kind::Real64,
     Group::ModulateFM, false, QZSIM_SETTING(g.fm.amount, double)},
    {IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM, "IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM", Kind::Int32,
     Group::ModulateFM, false, QZSIM_SETTING(g.fm.waveform, ViInt32)},
    {IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY, "IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY", Kind::Real64,
     Group::ModulateFM, false, QZSIM_SETTING(g.fm.frequency, double)},
    // clang-format on
};

#undef QZSIM_SETTING
#undef QZSIM_FACT

constexpr const char* kGroupNames[] = {
    "IviFgenBase",   "IviFgenStdFunc",    "IviFgenArbWfm",          "IviFgenArbFrequency",
    "IviFgenArbSeq", "IviFgenTrigger",    "IviFgenInternalTrigger", "IviFgenSoftwareTrigger",
    "IviFgenBurst",  "IviFgenModulateAM", "IviFgenModulateFM",
};

} // namespace

const char* GroupName(Group group) {
    return kGroupNames[static_cast<int>(group)];
}

const char* KindName(Kind kind) {
    constexpr const char* names[] = {"ViInt32", "ViReal64", "ViBoolean", "ViSession", "ViString"};
    return names[static_cast<int>(kind)];
}

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

void Invalid(const std::string& what) {
    throw StatusError(IVI_ERROR_INVALID_VALUE, what);
}

void NotSupported(ViAttr attr, ViInt32 value) {
    throw StatusError(IVI_ERROR_VALUE_NOT_SUPPORTED, std::string(AttrName(attr)) + ": value " +
                                                         std::to_string(value) +
                                                         " is not supported by this instrument");
}

// ---- The instrument's attribute access ---------------------------------------------------------

std::string Instrument::Capabilities() const {
    std::string text;
    for (int g = 0; g <= static_cast<int>(Group::ModulateFM); ++g)
        if (Offers(static_cast<Group>(g)))
            text += (text.empty() ? "" : ",") + std::string(kGroupNames[g]);
    return text;
}

const AttrInfo& Instrument::Row(ViAttr attr, Kind callersKind) const {
    const AttrInfo* info = FindAttr(attr);
    if (info == nullptr)
        throw StatusError(IVI_ERROR_INVALID_ATTRIBUTE,
                          "attribute " + std::to_string(attr) + " is unknown");
    if (info->kind != callersKind)
        throw StatusError(IVI_ERROR_TYPES_DO_NOT_MATCH, std::string(info->name) + " is of type " +
                                                            KindName(info->kind) + ", not " +
                                                            KindName(callersKind));
    if (!Offers(info->group))
        throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED,
                          std::string(info->name) + " is not supported");
    return *info;
}

AttrValue Instrument::Get(ViAttr attr, const char* channel, const AttrValue& type) const {
    const AttrInfo& info = Row(attr, KindOf(type));
    if (info.fact != nullptr) return info.fact(*this);
    const double number =
        info.read(global_, channels_[info.perChannel ? ChannelIndex(channel) : 0]);
    switch (info.kind) {
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
    const AttrInfo& info = Row(attr, KindOf(value));
    if (info.write == nullptr)
        throw StatusError(IVI_ERROR_ATTR_NOT_WRITABLE, std::string(info.name) + " is read-only");
    const int index = info.perChannel ? ChannelIndex(channel) : 0;
    GlobalState g = global_;
    ChannelState s = channels_[index];
    double number = 0;
    switch (info.kind) {
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
    info.write(g, s, number);
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

} // namespace qzivi::sim
