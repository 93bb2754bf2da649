#include "synthesis.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <numbers>

namespace qzivi::sim {

namespace {

double Fraction(double x) {
    return x - std::floor(x);
}

} // namespace

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

namespace {

// A channel's carrier, resolved once for all the samples of a rendering: for arbitrary output,
// the steps of its memory with the sample at which each ends, so that a sample is found by a
// search, not by a walk through the sequence.
class Carrier {
public:
    explicit Carrier(const OutputState& out) : out_(out) {
        const ChannelState& s = out.channel;
        const GlobalState& g = out.global;
        switch (g.outputMode) {
        case IVIFGEN_VAL_OUTPUT_ARB:
            Add(s.waveformHandle, 1);
            rate_ = s.playsAtArbFrequency ? s.arbFrequency * static_cast<double>(Length())
                                          : g.sampleRate;
            break;
        case IVIFGEN_VAL_OUTPUT_SEQ:
            if (const auto seq = out.sequences.find(s.sequenceHandle); seq != out.sequences.end())
                for (std::size_t k = 0; k < seq->second.handles.size(); ++k)
                    Add(seq->second.handles[k], seq->second.loopCounts[k]);
            rate_ = g.sampleRate;
            break;
        default:
            period_ = 1 / s.func.frequency;
            return;
        }
        arbitrary_ = true;
        period_ = Length() == 0 ? 0 : static_cast<double>(Length()) / rate_;
    }

    // One cycle: the whole waveform or sequence for arbitrary output, 0 when there is none.
    double Period() const { return period_; }

    // The carrier `tau` seconds into its waveform, with offsets.
    double At(double tau) const {
        const ChannelState& s = out_.channel;
        if (arbitrary_) return steps_.empty() ? 0 : s.arbGain * PointAt(tau * rate_) + s.arbOffset;
        const FuncSettings& f = s.func;
        if (f.waveform == IVIFGEN_VAL_WFM_DC) return f.offset;
        double cycles = f.frequency * tau + f.startPhase / 360;
        if (s.fmEnabled && s.fmSource == IVIFGEN_VAL_FM_INTERNAL)
            cycles += out_.global.fm.amount * ModulatingIntegral(out_.global.fm, tau);
        return f.offset + f.amplitude / 2 * Shape(f.waveform, Fraction(cycles), f.dutyCycleHigh);
    }

private:
    struct Step {
        const Samples* points;
        long long end; // the sample after the step's last loop
    };

    long long Length() const { return steps_.empty() ? 0 : steps_.back().end; }

    void Add(ViInt32 handle, long long loops) {
        const auto wfm = out_.waveforms.find(handle);
        if (wfm == out_.waveforms.end() || wfm->second.empty() || loops <= 0) return;
        steps_.push_back(
            {&wfm->second, Length() + static_cast<long long>(wfm->second.size()) * loops});
    }

    // The point `position` samples into the memory played as a loop: before generation started
    // too, and far after it, where a double no longer tells samples apart.
    double PointAt(double position) const {
        const long long length = Length();
        double wrapped = std::isfinite(position)
                             ? std::fmod(std::floor(position), static_cast<double>(length))
                             : 0;
        if (wrapped < 0) wrapped += static_cast<double>(length);
        const long long index = std::clamp(static_cast<long long>(wrapped), 0LL, length - 1);
        const auto step = std::upper_bound(steps_.begin(), steps_.end(), index,
                                           [](long long i, const Step& s) { return i < s.end; });
        const long long start = step == steps_.begin() ? 0 : std::prev(step)->end;
        const Samples& points = *step->points;
        return points[static_cast<std::size_t>((index - start) %
                                               static_cast<long long>(points.size()))];
    }

    const OutputState& out_;
    std::vector<Step> steps_;
    double rate_ = 0; // samples a second of arbitrary output
    double period_ = 0;
    bool arbitrary_ = false;
};

// The software triggers that start a burst: one that comes while a burst runs is lost.
std::vector<double> AcceptedTriggers(const OutputState& out, double period,
                                     const std::vector<double>& softwareTriggers) {
    const ChannelState& s = out.channel;
    std::vector<double> accepted;
    if (s.operationMode != IVIFGEN_VAL_OPERATE_BURST ||
        s.triggerSource != IVIFGEN_VAL_SOFTWARE_TRIG)
        return accepted;
    const double burst = period * s.burstCount;
    for (double t : softwareTriggers)
        if (accepted.empty() || t >= accepted.back() + burst) accepted.push_back(t);
    return accepted;
}

// The output at `t` seconds after generation started, given the accepted triggers.
double Sample(const OutputState& out, const Carrier& carrier, double t,
              const std::vector<double>& triggers) {
    const ChannelState& s = out.channel;
    const GlobalState& g = out.global;
    if (!out.generating || !s.outputEnabled) return 0;
    const double idle = g.outputMode == IVIFGEN_VAL_OUTPUT_FUNC ? s.func.offset : s.arbOffset;
    double tau = t;
    if (s.operationMode == IVIFGEN_VAL_OPERATE_BURST) {
        const double burst = carrier.Period() * s.burstCount;
        double start = -1;
        if (s.triggerSource == IVIFGEN_VAL_INTERNAL_TRIGGER) {
            // A trigger that comes while a burst runs is lost, so bursts start every m-th trigger.
            const double every = 1 / g.internalTriggerRate;
            const double m = std::max(1.0, std::ceil(burst / every - 1e-9));
            if (t >= 0) start = std::floor(t / (m * every)) * m * every;
        } else {
            const auto after = std::upper_bound(triggers.begin(), triggers.end(), t);
            if (after != triggers.begin()) start = *(after - 1);
        }
        if (start < 0 || t - start >= burst) return idle;
        tau = t - start;
    }
    double value = carrier.At(tau);
    if (s.amEnabled) {
        const double depth = g.am.amount / 100;
        const double m = s.amSource == IVIFGEN_VAL_AM_INTERNAL ? Modulating(g.am, t) : 0;
        value = idle + (value - idle) * (1 + depth * m) / (1 + depth);
    }
    return value;
}

} // namespace

void Render(const OutputState& out, const std::vector<double>& softwareTriggers, double startTime,
            double timeStep, ViInt32 count, double* volts) {
    const Carrier carrier(out);
    const std::vector<double> triggers = AcceptedTriggers(out, carrier.Period(), softwareTriggers);
    for (ViInt32 k = 0; k < count; ++k)
        volts[k] = Sample(out, carrier, startTime + k * timeStep, triggers);
}

} // namespace qzivi::sim
