// The simulated instrument: its settings, their limits, its memory, and the signal it puts out.
// The attribute catalogue is in attributes.cpp, ranges and validation in limits.cpp, the driver
// operations in operations.cpp, the signal in synthesis.cpp.
#pragma once

#include "attributes.h"
#include "faults.h"
#include "synthesis.h"

#include <chrono>
#include <initializer_list>
#include <string>
#include <vector>

namespace qzivi::sim {

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
    const Faults& ActiveFaults() const { return faults_; }
    const std::string& Resource() const { return resource_; }
    const std::string& DriverSetup() const { return driverSetup_; }
    // The capability groups offered, comma-separated.
    std::string Capabilities() const;

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
    bool Offers(Group group) const;

private:
    int ChannelIndex(const char* channel) const;
    // The row of an attribute this instrument answers, checked against the caller's type.
    const AttrInfo& Row(ViAttr attr, Kind callersKind) const;
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
    Range RangeOf(ViAttr attr, const ChannelState& state) const;
    double ElapsedSeconds() const;
    OutputState Output(int channel) const {
        return {global_, channels_[channel], waveforms_, sequences_, generating_};
    }

    Faults faults_;
    std::string resource_;
    std::string driverSetup_;
    GlobalState global_;
    ChannelState channels_[kChannels];
    WaveformMemory waveforms_;
    SequenceMemory sequences_;
    long long usedPoints_ = 0;
    ViInt32 nextWaveform_ = 10001;
    ViInt32 nextSequence_ = 5000001;
    bool generating_ = false;
    std::chrono::steady_clock::time_point started_;
    std::vector<double> softwareTriggers_; // seconds after the start of generation
};

} // namespace qzivi::sim
