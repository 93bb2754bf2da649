// The driver's operations on the instrument: configure calls that change a proposed state and
// commit it whole, waveform and sequence memory, generation and triggers, and the rendered output.
#include "instrument.h"

#include "qzivi/ivi_common.h"

#include <algorithm>
#include <cmath>

namespace qzivi::sim {

using ivi::StatusError;

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
    // The range check rides on the copy: one pass over a large download.
    Samples points(static_cast<std::size_t>(size));
    bool inRange = true;
    for (ViInt32 k = 0; k < size; ++k) {
        const double x = data[k];
        inRange &= (x >= -1.0) & (x <= 1.0);
        points[static_cast<std::size_t>(k)] = x;
    }
    if (!inRange)
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
    waveforms_.emplace(handle, std::move(points));
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
    sequences_.emplace(
        handle, StoredSequence{{handles, handles + length}, {loopCounts, loopCounts + length}});
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
    ivi::RequireSoftwareTrigger(channels_, generating_);
    softwareTriggers_.push_back(ElapsedSeconds());
}

// ---- The signal --------------------------------------------------------------------------------

void Instrument::Render(const char* channel, double startTime, double timeStep, ViInt32 count,
                        double* volts) const {
    const int i = ChannelIndex(channel);
    if (count < 0) Invalid("the count of samples " + std::to_string(count) + " is negative");
    if (!std::isfinite(startTime) || !std::isfinite(timeStep))
        Invalid("the start time and the time step must be finite");
    if (count > 0 && volts == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER, "the sample buffer is a null pointer");
    sim::Render(Output(i), softwareTriggers_, startTime, timeStep, count, volts);
}

} // namespace qzivi::sim
