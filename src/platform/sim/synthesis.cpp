#include "synthesis.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace qzivi::sim {

namespace {

double Fraction(double x) {
    return x - std::floor(x);
}

// Length in samples of one pass through a sequence.
long long SequenceSamples(const StoredSequence& sequence, const WaveformMemory& waveforms) {
    long long total = 0;
    for (size_t k = 0; k < sequence.handles.size(); ++k) {
        const auto wfm = waveforms.find(sequence.handles[k]);
        if (wfm != waveforms.end())
            total += static_cast<long long>(wfm->second.size()) * sequence.loopCounts[k];
    }
    return total;
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

double Carrier(const OutputState& out, double tau, double* period) {
    const ChannelState& s = out.channel;
    const GlobalState& g = out.global;
    switch (g.outputMode) {
    case IVIFGEN_VAL_OUTPUT_ARB: {
        const auto wfm = out.waveforms.find(s.waveformHandle);
        if (wfm == out.waveforms.end()) {
            *period = 0;
            return 0;
        }
        const auto& data = wfm->second;
        const double n = static_cast<double>(data.size());
        const double rate = s.playsAtArbFrequency ? s.arbFrequency * n : g.sampleRate;
        *period = n / rate;
        const auto index =
            static_cast<long long>(std::floor(tau * rate)) % static_cast<long long>(data.size());
        return s.arbGain * data[static_cast<size_t>(index)] + s.arbOffset;
    }
    case IVIFGEN_VAL_OUTPUT_SEQ: {
        const auto seq = out.sequences.find(s.sequenceHandle);
        const long long total =
            seq == out.sequences.end() ? 0 : SequenceSamples(seq->second, out.waveforms);
        if (total == 0) {
            *period = 0;
            return 0;
        }
        *period = static_cast<double>(total) / g.sampleRate;
        long long index = static_cast<long long>(std::floor(tau * g.sampleRate)) % total;
        for (size_t k = 0; k < seq->second.handles.size(); ++k) {
            const auto& data = out.waveforms.at(seq->second.handles[k]);
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
            cycles += g.fm.amount * ModulatingIntegral(g.fm, tau);
        return f.offset + f.amplitude / 2 * Shape(f.waveform, Fraction(cycles), f.dutyCycleHigh);
    }
    }
}

std::vector<double> AcceptedTriggers(const OutputState& out,
                                     const std::vector<double>& softwareTriggers) {
    const ChannelState& s = out.channel;
    std::vector<double> accepted;
    if (s.operationMode != IVIFGEN_VAL_OPERATE_BURST ||
        s.triggerSource != IVIFGEN_VAL_SOFTWARE_TRIG)
        return accepted;
    double period = 0;
    Carrier(out, 0, &period);
    const double burst = period * s.burstCount;
    for (double t : softwareTriggers)
        if (accepted.empty() || t >= accepted.back() + burst) accepted.push_back(t);
    return accepted;
}

double Sample(const OutputState& out, double t, const std::vector<double>& triggers) {
    double period = 0;
    Carrier(out, 0, &period);
    return Sample(out, t, triggers, period);
}

double Sample(const OutputState& out, double t, const std::vector<double>& triggers,
              double period) {
    const ChannelState& s = out.channel;
    const GlobalState& g = out.global;
    if (!out.generating || !s.outputEnabled) return 0;
    const double idle = g.outputMode == IVIFGEN_VAL_OUTPUT_FUNC ? s.func.offset : s.arbOffset;
    double tau = t;
    if (s.operationMode == IVIFGEN_VAL_OPERATE_BURST) {
        const double burst = period * s.burstCount;
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
    double value = Carrier(out, tau, &period);
    if (s.amEnabled) {
        const double depth = g.am.amount / 100;
        const double m = s.amSource == IVIFGEN_VAL_AM_INTERNAL ? Modulating(g.am, t) : 0;
        value = idle + (value - idle) * (1 + depth * m) / (1 + depth);
    }
    return value;
}

void Render(const OutputState& out, const std::vector<double>& softwareTriggers, double startTime,
            double timeStep, ViInt32 count, double* volts) {
    const std::vector<double> triggers = AcceptedTriggers(out, softwareTriggers);
    double period = 0; // the same for every sample: found once
    Carrier(out, 0, &period);
    for (ViInt32 k = 0; k < count; ++k)
        volts[k] = Sample(out, startTime + k * timeStep, triggers, period);
}

} // namespace qzivi::sim
