// The generator's attributes: one table names each settable attribute and the piece of state it
// is, so that reading, setting and naming an attribute cannot disagree; then the model's ranges
// and the checks a whole state must pass before it is sent.
#include "generator.h"

#include "qzivi/ivi_common.h"

#include <algorithm>
#include <cmath>
#include <type_traits>
#include <variant>

namespace qzivi::scpi {

using ivi::StatusError;

struct Generator::Field {
    ViAttr attr;
    const char* word;
    std::variant<double Global::*, ViInt32 Global::*, double Channel::*, ViInt32 Channel::*,
                 bool Channel::*>
        member;

    // The piece of state a member is: the global state's or the channel's, const or not.
    template <class T, class G, class C>
    static auto& Slot(T Global::*m, G& global, C&) {
        return global.*m;
    }
    template <class T, class G, class C>
    static auto& Slot(T Channel::*m, G&, C& channel) {
        return channel.*m;
    }
    template <class T>
    static constexpr bool InGlobal(T Global::*) {
        return true;
    }
    template <class T>
    static constexpr bool InGlobal(T Channel::*) {
        return false;
    }
    template <class T, class S>
    static constexpr Type TypeOf(T S::*) {
        return std::is_same_v<T, bool>     ? Type::Boolean
               : std::is_same_v<T, double> ? Type::Real64
                                           : Type::Int32;
    }

    bool IsGlobal() const {
        return std::visit([](auto m) { return InGlobal(m); }, member);
    }
    Type OwnType() const {
        return std::visit([](auto m) { return TypeOf(m); }, member);
    }
};

const Generator::Field* Generator::FindField(ViAttr attr) {
#define QZSCPI_FIELD(name, scope, member)                                                          \
    Field {                                                                                        \
        name, #name, &scope::member                                                                \
    }
    static constexpr Field kFields[] = {
        QZSCPI_FIELD(IVIFGEN_ATTR_OUTPUT_MODE, Global, outputMode),
        QZSCPI_FIELD(IVIFGEN_ATTR_REF_CLOCK_SOURCE, Global, refClock),
        QZSCPI_FIELD(IVIFGEN_ATTR_ARB_SAMPLE_RATE, Global, sampleRate),
        QZSCPI_FIELD(IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, Global, triggerRate),
        QZSCPI_FIELD(IVIFGEN_ATTR_AM_INTERNAL_DEPTH, Global, amDepth),
        QZSCPI_FIELD(IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM, Global, amWaveform),
        QZSCPI_FIELD(IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY, Global, amFrequency),
        QZSCPI_FIELD(IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, Global, fmDeviation),
        QZSCPI_FIELD(IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM, Global, fmWaveform),
        QZSCPI_FIELD(IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY, Global, fmFrequency),
        QZSCPI_FIELD(IVIFGEN_ATTR_OUTPUT_ENABLED, Channel, enabled),
        QZSCPI_FIELD(IVIFGEN_ATTR_OUTPUT_IMPEDANCE, Channel, impedance),
        QZSCPI_FIELD(IVIFGEN_ATTR_OPERATION_MODE, Channel, operationMode),
        QZSCPI_FIELD(IVIFGEN_ATTR_FUNC_WAVEFORM, Channel, waveform),
        QZSCPI_FIELD(IVIFGEN_ATTR_FUNC_AMPLITUDE, Channel, amplitude),
        QZSCPI_FIELD(IVIFGEN_ATTR_FUNC_DC_OFFSET, Channel, offset),
        QZSCPI_FIELD(IVIFGEN_ATTR_FUNC_FREQUENCY, Channel, frequency),
        QZSCPI_FIELD(IVIFGEN_ATTR_FUNC_START_PHASE, Channel, phase),
        QZSCPI_FIELD(IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, Channel, dutyCycle),
        QZSCPI_FIELD(IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE, Channel, arbHandle),
        QZSCPI_FIELD(IVIFGEN_ATTR_ARB_GAIN, Channel, arbGain),
        QZSCPI_FIELD(IVIFGEN_ATTR_ARB_OFFSET, Channel, arbOffset),
        QZSCPI_FIELD(IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE, Channel, sequenceHandle),
        QZSCPI_FIELD(IVIFGEN_ATTR_TRIGGER_SOURCE, Channel, triggerSource),
        QZSCPI_FIELD(IVIFGEN_ATTR_BURST_COUNT, Channel, burstCount),
        QZSCPI_FIELD(IVIFGEN_ATTR_AM_ENABLED, Channel, am),
        QZSCPI_FIELD(IVIFGEN_ATTR_AM_SOURCE, Channel, amSource),
        QZSCPI_FIELD(IVIFGEN_ATTR_FM_ENABLED, Channel, fm),
        QZSCPI_FIELD(IVIFGEN_ATTR_FM_SOURCE, Channel, fmSource),
    };
#undef QZSCPI_FIELD
    for (const Field& field : kFields)
        if (field.attr == attr) return &field;
    return nullptr;
}

void Generator::RequireType(ViAttr attr, Type type) {
    const Field* field = FindField(attr);
    // The attributes outside the table are the memory's limits, all integers.
    const Type own = field != nullptr ? field->OwnType() : Type::Int32;
    if (type == own) return;
    static constexpr const char* kNames[] = {"ViInt32", "ViReal64", "ViBoolean"};
    throw StatusError(IVI_ERROR_TYPES_DO_NOT_MATCH,
                      (field != nullptr ? std::string(field->word) : std::to_string(attr)) +
                          " is of type " + kNames[int(own)] + ", not " + kNames[int(type)]);
}

double Generator::Get(ViAttr attr, const std::string& channel) const {
    switch (attr) {
    case IVIFGEN_ATTR_MAX_NUM_WAVEFORMS:
        return kMaxWaveforms;
    case IVIFGEN_ATTR_WAVEFORM_QUANTUM:
        return 1;
    case IVIFGEN_ATTR_MIN_WAVEFORM_SIZE:
        return 8;
    case IVIFGEN_ATTR_MAX_WAVEFORM_SIZE:
        return model_->maxPoints;
    case IVIFGEN_ATTR_MAX_NUM_SEQUENCES:
        return kMaxSequences;
    case IVIFGEN_ATTR_MIN_SEQUENCE_LENGTH:
        return 1;
    case IVIFGEN_ATTR_MAX_SEQUENCE_LENGTH:
        return kMaxSequenceLength;
    case IVIFGEN_ATTR_MAX_LOOP_COUNT:
        return kMaxLoopCount;
    default:
        break;
    }
    const Field* field = FindField(attr);
    if (field == nullptr)
        throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED,
                          "attribute " + std::to_string(attr) + " is not supported");
    const Channel& c = channels_[field->IsGlobal() ? 0 : std::size_t(Index(channel))];
    return std::visit(
        [&](auto member) { return static_cast<double>(Field::Slot(member, global_, c)); },
        field->member);
}

void Generator::Set(ViAttr attr, const std::string& channel, double value, bool checkOnly) {
    const Field* field = FindField(attr);
    if (field == nullptr)
        throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED, "attribute " + std::to_string(attr) +
                                                                 " cannot be set on the " +
                                                                 std::string(model_->name));
    const std::string word = field->word;
    // The model's range first: a value no model of the series takes is refused here, named.
    const Range range = HasRange(attr) ? MinMax(attr, channel) : Range{-HUGE_VAL, HUGE_VAL};
    if (!(value >= range.min && value <= range.max))
        throw StatusError(IVI_ERROR_INVALID_VALUE,
                          word + ": " + Number(value) + " is outside the range " +
                              Number(range.min) + " to " + Number(range.max));
    Global g = global_;
    std::vector<Channel> channels = channels_;
    const int index = field->IsGlobal() ? -1 : Index(channel);
    std::visit(
        [&](auto member) {
            auto& slot = Field::Slot(member, g, channels[std::size_t(std::max(index, 0))]);
            using T = std::remove_reference_t<decltype(slot)>;
            if constexpr (std::is_same_v<T, bool>)
                slot = value != 0;
            else
                slot = static_cast<T>(value);
        },
        field->member);
    try {
        for (const Channel& c : channels)
            Validate(g, c);
        if (checkOnly) return;
        const Global oldGlobal = global_;
        const std::vector<Channel> oldChannels = channels_;
        global_ = g;
        channels_ = channels;
        try {
            if (attr == IVIFGEN_ATTR_REF_CLOCK_SOURCE) Send(GlobalCommands());
            for (int i = 0; i < model_->channels; ++i)
                if (index < 0 || i == index) Send(ChannelCommands(i));
        } catch (...) {
            global_ = oldGlobal;
            channels_ = oldChannels;
            throw;
        }
    } catch (const StatusError& e) {
        throw StatusError(e.Status(), word + ": " + Number(value) + ": " + e.what());
    }
}

bool Generator::HasRange(ViAttr attr) {
    switch (attr) {
    case IVIFGEN_ATTR_FUNC_FREQUENCY:
    case IVIFGEN_ATTR_FUNC_AMPLITUDE:
    case IVIFGEN_ATTR_FUNC_DC_OFFSET:
    case IVIFGEN_ATTR_ARB_OFFSET:
    case IVIFGEN_ATTR_ARB_GAIN:
    case IVIFGEN_ATTR_FUNC_START_PHASE:
    case IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH:
    case IVIFGEN_ATTR_OUTPUT_IMPEDANCE:
    case IVIFGEN_ATTR_ARB_SAMPLE_RATE:
    case IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE:
    case IVIFGEN_ATTR_AM_INTERNAL_DEPTH:
    case IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY:
    case IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY:
    case IVIFGEN_ATTR_FM_INTERNAL_DEVIATION:
        return true;
    default:
        return false;
    }
}

Generator::Range Generator::MinMax(ViAttr attr, const std::string& channel) const {
    switch (attr) {
    case IVIFGEN_ATTR_FUNC_FREQUENCY: {
        const ViInt32 w = channels_[static_cast<std::size_t>(Index(channel))].waveform;
        const bool slow = w == IVIFGEN_VAL_WFM_TRIANGLE || w == IVIFGEN_VAL_WFM_RAMP_UP ||
                          w == IVIFGEN_VAL_WFM_RAMP_DOWN;
        return {1e-6, slow ? 200e3 : model_->maxFrequency};
    }
    case IVIFGEN_ATTR_FUNC_AMPLITUDE:
        return {1e-3, 10};
    case IVIFGEN_ATTR_FUNC_DC_OFFSET:
    case IVIFGEN_ATTR_ARB_OFFSET:
        return {-5, 5};
    case IVIFGEN_ATTR_ARB_GAIN:
        return {0.5e-3, 5};
    case IVIFGEN_ATTR_FUNC_START_PHASE:
        return {-360, 360};
    case IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH:
        return {0.01, 99.99};
    case IVIFGEN_ATTR_OUTPUT_IMPEDANCE:
        return {1, 10e3};
    case IVIFGEN_ATTR_ARB_SAMPLE_RATE:
        return {1e-6, model_->maxSampleRate};
    case IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE:
        return {1.0 / 8000, 1e6};
    case IVIFGEN_ATTR_AM_INTERNAL_DEPTH:
        return {0, 120};
    case IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY:
    case IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY:
        return {1e-6, model_->maxFrequency};
    case IVIFGEN_ATTR_FM_INTERNAL_DEVIATION:
        return {1e-6, model_->maxFrequency / 2};
    default:
        throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED,
                          "attribute " + std::to_string(attr) + " has no range");
    }
}

void Generator::Validate(const Global& g, const Channel& c) const {
    auto refuse = [](const std::string& what) { throw StatusError(IVI_ERROR_INVALID_VALUE, what); };
    if (g.outputMode < IVIFGEN_VAL_OUTPUT_FUNC || g.outputMode > IVIFGEN_VAL_OUTPUT_SEQ)
        refuse("output mode " + std::to_string(g.outputMode) + " is none of the class's");
    if (c.waveform < IVIFGEN_VAL_WFM_SINE || c.waveform > IVIFGEN_VAL_WFM_DC)
        refuse("waveform " + std::to_string(c.waveform) + " is no standard waveform");
    if (!(g.triggerRate > 0)) refuse("the internal trigger rate must be above 0");
    if (c.triggerSource != IVIFGEN_VAL_EXTERNAL && c.triggerSource != IVIFGEN_VAL_SOFTWARE_TRIG &&
        c.triggerSource != IVIFGEN_VAL_INTERNAL_TRIGGER)
        throw StatusError(IVI_ERROR_VALUE_NOT_SUPPORTED, "trigger source " +
                                                             std::to_string(c.triggerSource) +
                                                             " is not on the " + model_->name);
    if (c.arbHandle != 0 && waveforms_.count(c.arbHandle) == 0)
        refuse("no waveform has the handle " + std::to_string(c.arbHandle));
    if (c.sequenceHandle != 0 && sequences_.count(c.sequenceHandle) == 0)
        refuse("no sequence has the handle " + std::to_string(c.sequenceHandle));
}

} // namespace qzivi::scpi
