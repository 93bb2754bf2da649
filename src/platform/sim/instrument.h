// The simulated instrument: its settings, their limits, its memory, and the signal it puts out.
#pragma once

#include "faults.h"

#include <chrono>
#include <initializer_list>
#include <map>
#include <string>
#include <variant>
#include <vector>

namespace qzivi::sim {

enum class Group {
    Base,
    StdFunc,
    ArbWfm,
    ArbFrequency,
    ArbSeq,
    Trigger,
    InternalTrigger,
    SoftwareTrigger,
    Burst,
    ModulateAM,
    ModulateFM,
};

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

using AttrValue = std::variant<ViInt32, ViReal64, ViBoolean, ViSession, std::string>;

struct Range {
    double min;
    double max;
};

class Instrument {
public:
    static constexpr int kChannels = 2;

    Instrument(Faults faults, std::string resource, std::string driverSetup);

    void Reset();
    Faults& ActiveFaults() { return faults_; }

    void ConfigureOutputMode(ViInt32 mode);
    void ConfigureRefClockSource(ViInt32 source);
    void ConfigureOutputImpedance(const char* channel, double impedance);
    void ConfigureOperationMode(const char* channel, ViInt32 mode);
    void ConfigureOutputEnabled(const char* channel, bool enabled);
    void ConfigureStandardWaveform(const char* channel, const FuncSettings& wanted);

    void QueryArbWfmCapabilities(ViInt32* maxNum, ViInt32* quantum, ViInt32* minSize,
                                 ViInt32* maxSize) const;
    ViInt32 CreateArbWaveform(ViInt32 size, const double* data);
    void ClearArbWaveform(ViInt32 handle);
    void ConfigureArbWaveform(const char* channel, ViInt32 handle, double gain, double offset);
    void ConfigureSampleRate(double rate);
    void ConfigureArbFrequency(const char* channel, double frequency);

    void QueryArbSeqCapabilities(ViInt32* maxNum, ViInt32* minLength, ViInt32* maxLength,
                                 ViInt32* maxLoopCount) const;
    ViInt32 CreateArbSequence(ViInt32 length, const ViInt32* handles, const ViInt32* loopCounts);
    void ClearArbSequence(ViInt32 handle);
    void ConfigureArbSequence(const char* channel, ViInt32 handle, double gain, double offset);

    void ConfigureTriggerSource(const char* channel, ViInt32 source);
    void ConfigureInternalTriggerRate(double rate);
    void SendSoftwareTrigger();
    void ConfigureBurstCount(const char* channel, ViInt32 count);

    void ConfigureAMEnabled(const char* channel, bool enabled);
    void ConfigureAMSource(const char* channel, ViInt32 source);
    void ConfigureAMInternal(double depth, ViInt32 waveform, double frequency);
    void ConfigureFMEnabled(const char* channel, bool enabled);
    void ConfigureFMSource(const char* channel, ViInt32 source);
    void ConfigureFMInternal(double deviation, ViInt32 waveform, double frequency);

    void InitiateGeneration();
    void AbortGeneration();

    // `T` is the type of the caller's function; a different type of the attribute is refused.
    template <typename T>
    T GetAttribute(ViAttr attr, const char* channel) const {
        return std::get<T>(Get(attr, channel, AttrValue(T{})));
    }
    void SetAttribute(ViAttr attr, const char* channel, const AttrValue& value, bool checkOnly);
    Range MinMax(ViAttr attr, const char* channel) const;

    void Render(const char* channel, double startTime, double timeStep, ViInt32 count,
                double* volts) const;

    // Refuses a call of a function whose group the instrument does not offer.
    void RequireGroup(Group group, const char* function) const;

private:
    struct Sequence {
        std::vector<ViInt32> handles;
        std::vector<ViInt32> loopCounts;
    };

    int ChannelIndex(const char* channel) const;
    bool Offers(Group group) const;
    AttrValue Get(ViAttr attr, const char* channel, const AttrValue& type) const;
    // Every change goes through here: checks the whole state it would leave, then keeps it.
    void Commit(const GlobalState& global, int channel, const ChannelState& state, bool checkOnly);
    void Validate(const GlobalState& global, const ChannelState& state) const;
    void CheckValue(ViAttr attr, double value, Range range, const char* unit) const;
    void CheckRefused(ViAttr attr, double value) const;
    // The refusals a configure call meets: each attribute it sets, with its new value.
    struct Touch {
        ViAttr attr;
        double value;
    };
    void CheckRefusals(std::initializer_list<Touch> touches) const;
    Range RangeOf(ViAttr attr, const GlobalState& global, const ChannelState& state) const;
    double ElapsedSeconds() const;
    double Sample(const ChannelState& state, double t, const std::vector<double>& triggers) const;
    double Carrier(const ChannelState& state, double tau, double* period) const;
    std::vector<double> AcceptedTriggers(const ChannelState& state) const;

    Faults faults_;
    std::string resource_;
    std::string driverSetup_;
    GlobalState global_;
    ChannelState channels_[kChannels];
    std::map<ViInt32, std::vector<double>> waveforms_;
    std::map<ViInt32, Sequence> sequences_;
    long long usedPoints_ = 0;
    ViInt32 nextWaveform_ = 10001;
    ViInt32 nextSequence_ = 5000001;
    bool generating_ = false;
    std::chrono::steady_clock::time_point started_;
    std::vector<double> softwareTriggers_; // seconds after the start of generation
};

} // namespace qzivi::sim
