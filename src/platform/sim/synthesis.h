// The signal a channel puts out, as pure functions of its settings: shapes, the carrier of each
// output mode, internal modulation, bursts, and the sampled output.
#pragma once

#include "IviFgen.h"

#include <map>
#include <memory>
#include <utility>
#include <vector>

namespace qzivi::sim {

struct FuncSettings {
    ViInt32 waveform = IVIFGEN_VAL_WFM_SINE;
    double amplitude = 0.1; // volts peak to peak
    double offset = 0;
    double frequency = 1000;
    double startPhase = 0; // degrees
    double dutyCycleHigh = 50;
};

struct ChannelState {
    bool outputEnabled = false;
    double impedance = 50;
    ViInt32 operationMode = IVIFGEN_VAL_OPERATE_CONTINUOUS;
    FuncSettings func;
    ViInt32 waveformHandle = 0;
    ViInt32 sequenceHandle = 0;
    double arbGain = 1;
    double arbOffset = 0;
    double arbFrequency = 1000;
    bool playsAtArbFrequency = false; // the last of sample rate and arb frequency set wins
    ViInt32 triggerSource = IVIFGEN_VAL_EXTERNAL;
    ViInt32 burstCount = 1;
    bool amEnabled = false;
    ViInt32 amSource = IVIFGEN_VAL_AM_INTERNAL;
    bool fmEnabled = false;
    ViInt32 fmSource = IVIFGEN_VAL_FM_INTERNAL;
};

struct InternalSource {
    double amount; // AM depth in percent, FM deviation in hertz
    ViInt32 waveform;
    double frequency;
};

struct GlobalState {
    ViInt32 outputMode = IVIFGEN_VAL_OUTPUT_FUNC;
    ViInt32 refClockSource = IVIFGEN_VAL_REF_CLOCK_INTERNAL;
    double sampleRate = 1e6;
    double internalTriggerRate = 1000;
    InternalSource am{50, IVIFGEN_VAL_WFM_SINE, 100};
    InternalSource fm{100, IVIFGEN_VAL_WFM_SINE, 10};
};

// Room for points that are written right after they are made: no zeroing pass first.
template <typename T>
struct Uninitialized : std::allocator<T> {
    using std::allocator<T>::allocator;
    template <typename U>
    void construct(U* p) noexcept {
        ::new (static_cast<void*>(p)) U;
    }
    template <typename U, typename... Args>
    void construct(U* p, Args&&... args) {
        ::new (static_cast<void*>(p)) U(std::forward<Args>(args)...);
    }
};
using Samples = std::vector<double, Uninitialized<double>>;

struct StoredSequence {
    std::vector<ViInt32> handles;
    std::vector<ViInt32> loopCounts;
};
using WaveformMemory = std::map<ViInt32, Samples>;
using SequenceMemory = std::map<ViInt32, StoredSequence>;

// Everything the output of one channel depends on.
struct OutputState {
    const GlobalState& global;
    const ChannelState& channel;
    const WaveformMemory& waveforms;
    const SequenceMemory& sequences;
    bool generating;
};

// One period of a shape, p from 0 to 1, values from -1 to 1.
double Shape(ViInt32 waveform, double p, double dutyCycleHigh);
// The integral of Shape over [0, p], for the phase of a frequency-modulated carrier.
double ShapeIntegral(ViInt32 waveform, double p);
// The modulating signal of an internal source at time t, and its integral from 0 to t.
double Modulating(const InternalSource& source, double t);
double ModulatingIntegral(const InternalSource& source, double t);

// `count` samples from `startTime`, `timeStep` apart.
void Render(const OutputState& out, const std::vector<double>& softwareTriggers, double startTime,
            double timeStep, ViInt32 count, double* volts);

} // namespace qzivi::sim
