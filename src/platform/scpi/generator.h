// A bench generator of the 33500 series behind a transport, in the IVI class's terms: the driver
// keeps the class's state, sends each change as the series' SCPI commands, and after each
// configuring call reads the instrument's error queue, so that a refused value comes back as an
// IVI error with the instrument's own words.
#pragma once

#include "IviFgen.h"
#include "transport.h"

#include <chrono>
#include <initializer_list>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace qzivi::scpi {

// What a model of the series can do; the model is what *IDN? names.
struct Model {
    const char* name;
    int channels;
    double maxFrequency;  // sine and square, Hz
    double maxSampleRate; // Sa/s
    ViInt32 maxPoints;    // per arbitrary waveform
};
// A value as the series reads it, to 15 digits.
std::string Number(double value);

// The model of an *IDN? answer ("maker,33522B,serial,version"), or null.
const Model* FindModel(std::string_view identity);

class Generator {
public:
    // Connects, asks *IDN?, and refuses a model it does not know; with `reset` also *RST.
    Generator(const std::string& resource, std::chrono::milliseconds timeout, bool reset);

    const Model& ModelInfo() const { return *model_; }
    const std::string& Identity() const { return identity_; }
    const std::string& Resource() const { return resource_; }

    // Refuses a caller's type other than the attribute's, as the class requires.
    enum class Type { Int32, Real64, Boolean };
    static void RequireType(ViAttr attr, Type type);

    // Attributes by IVI id; `channel` the physical name "1", "2" (empty for the session's own).
    double Get(ViAttr attr, const std::string& channel) const;
    void Set(ViAttr attr, const std::string& channel, double value, bool checkOnly);
    struct Range {
        double min, max;
    };
    Range MinMax(ViAttr attr, const std::string& channel) const;
    static bool HasRange(ViAttr attr);

    void ConfigureStandardWaveform(const std::string& channel, ViInt32 waveform, double amplitude,
                                   double offset, double frequency, double phase);
    ViInt32 CreateArbWaveform(ViInt32 size, const ViReal64* data);
    void ClearArbWaveform(ViInt32 handle);
    void ConfigureArb(const std::string& channel, ViInt32 handle, double gain, double offset,
                      bool sequence);
    ViInt32 CreateArbSequence(ViInt32 length, const ViInt32* handles, const ViInt32* loops);
    void ClearArbSequence(ViInt32 handle);
    void SendSoftwareTrigger();
    void InitiateGeneration();
    void AbortGeneration();
    // The voltages the output carries, from an instrument that can tell them (the emulator).
    void Render(const std::string& channel, double start, double step, ViInt32 count,
                ViReal64* volts);

    static constexpr ViInt32 kMaxWaveforms = 32;
    static constexpr ViInt32 kMaxSequences = 8;
    static constexpr ViInt32 kMaxSequenceLength = 512;
    static constexpr ViInt32 kMaxLoopCount = 1000000;

private:
    struct Channel {
        bool enabled = false;
        double impedance = 50;
        ViInt32 operationMode = IVIFGEN_VAL_OPERATE_CONTINUOUS;
        ViInt32 waveform = IVIFGEN_VAL_WFM_SINE;
        double amplitude = 0.1, offset = 0, frequency = 1e3, phase = 0, dutyCycle = 50;
        ViInt32 arbHandle = 0, sequenceHandle = 0;
        double arbGain = 0.05, arbOffset = 0;
        ViInt32 triggerSource = IVIFGEN_VAL_INTERNAL_TRIGGER;
        ViInt32 burstCount = 1;
        bool am = false, fm = false;
        ViInt32 amSource = IVIFGEN_VAL_AM_INTERNAL, fmSource = IVIFGEN_VAL_FM_INTERNAL;
    };
    struct Global {
        ViInt32 outputMode = IVIFGEN_VAL_OUTPUT_FUNC;
        ViInt32 refClock = IVIFGEN_VAL_REF_CLOCK_INTERNAL;
        double sampleRate = 1e6, triggerRate = 100;
        double amDepth = 100, amFrequency = 100, fmDeviation = 100, fmFrequency = 10;
        ViInt32 amWaveform = IVIFGEN_VAL_WFM_SINE, fmWaveform = IVIFGEN_VAL_WFM_SINE;
    };

    // A settable attribute: its name and the piece of state it is.
    struct Field;
    static const Field* FindField(ViAttr attr);

    int Index(const std::string& channel) const;
    // Sends the commands, then reads the error queue: its first entry is thrown.
    void Send(const std::string& commands);
    // The same, written piece by piece: a waveform's block goes out as it is.
    void SendParts(std::initializer_list<std::string_view> parts);
    std::string Query(const std::string& query);
    // Everything of one channel, as the state holds it.
    std::string ChannelCommands(int index) const;
    std::string GlobalCommands() const;
    void Validate(const Global& g, const Channel& c) const;

    std::unique_ptr<Transport> transport_;
    std::string resource_, identity_;
    const Model* model_ = nullptr;
    Global global_;
    std::vector<Channel> channels_;
    bool generating_ = false;
    ViInt32 nextHandle_ = 1;
    std::map<ViInt32, ViInt32> waveforms_;              // handle: points
    std::map<ViInt32, std::vector<ViInt32>> sequences_; // handle: the waveforms it plays
};

} // namespace qzivi::scpi
