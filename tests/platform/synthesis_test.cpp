// The simulator's signal as pure functions of a channel's settings: what the rendered samples
// measure (RMS, duty cycle, AM depth, FM deviation, bursts) against the exact values.
#include "synthesis.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numeric>
#include <vector>

namespace qzivi::sim {
namespace {

// A generating channel with its output on, to be set up by each test.
struct Bench {
    GlobalState global;
    ChannelState channel;
    WaveformMemory waveforms;
    SequenceMemory sequences;

    Bench() { channel.outputEnabled = true; }

    std::vector<double> Render(double rate, double seconds, std::vector<double> triggers = {}) {
        return RenderFrom(0, rate, seconds, std::move(triggers));
    }
    std::vector<double> RenderFrom(double start, double rate, double seconds,
                                   std::vector<double> triggers = {}) {
        std::vector<double> v(static_cast<std::size_t>(std::llround(rate * seconds)));
        sim::Render({global, channel, waveforms, sequences, true}, triggers, start, 1 / rate,
                    static_cast<ViInt32>(v.size()), v.data());
        return v;
    }
};

double Rms(const std::vector<double>& v, double around = 0) {
    double sum = 0;
    for (double x : v)
        sum += (x - around) * (x - around);
    return std::sqrt(sum / static_cast<double>(v.size()));
}

double Mean(const std::vector<double>& v) {
    return std::accumulate(v.begin(), v.end(), 0.0) / static_cast<double>(v.size());
}

// Times of upward zero crossings, interpolated between samples.
std::vector<double> RisingCrossings(const std::vector<double>& v, double rate, double level) {
    std::vector<double> times;
    for (std::size_t k = 1; k < v.size(); ++k)
        if (v[k - 1] < level && v[k] >= level)
            times.push_back((static_cast<double>(k - 1) + (level - v[k - 1]) / (v[k] - v[k - 1])) /
                            rate);
    return times;
}

TEST(Synthesis, StandardShapesHaveTheirExactRmsAndLevel) {
    struct Case {
        ViInt32 waveform;
        double rmsPerPeak; // RMS of the shape for a peak of 1
    };
    const Case cases[] = {{IVIFGEN_VAL_WFM_SINE, 1 / std::sqrt(2.0)},
                          {IVIFGEN_VAL_WFM_SQUARE, 1.0},
                          {IVIFGEN_VAL_WFM_TRIANGLE, 1 / std::sqrt(3.0)},
                          {IVIFGEN_VAL_WFM_RAMP_UP, 1 / std::sqrt(3.0)},
                          {IVIFGEN_VAL_WFM_RAMP_DOWN, 1 / std::sqrt(3.0)}};
    for (const auto& c : cases) {
        Bench b;
        b.channel.func = {c.waveform, 4.0, 0.5, 1000, 0, 50}; // 4 Vpp around 0.5 V
        const auto v = b.Render(1e6, 0.05);                   // 50 whole periods
        EXPECT_NEAR(Mean(v), 0.5, 2e-3) << c.waveform;        // a ramp is off by one sample's step
        EXPECT_NEAR(Rms(v, 0.5), 2.0 * c.rmsPerPeak, 2e-3) << c.waveform;
        EXPECT_NEAR(*std::max_element(v.begin(), v.end()), 2.5, 1e-2) << c.waveform;
    }
    Bench dc;
    dc.channel.func = {IVIFGEN_VAL_WFM_DC, 4.0, -1.25, 1000, 0, 50};
    const auto v = dc.Render(1e5, 0.01);
    EXPECT_EQ(*std::min_element(v.begin(), v.end()), -1.25);
    EXPECT_EQ(*std::max_element(v.begin(), v.end()), -1.25);
}

TEST(Synthesis, ASquareIsHighForItsDutyCycleAndStartsAtItsPhase) {
    for (double duty : {10.0, 30.0, 50.0, 85.0}) {
        Bench b;
        b.channel.func = {IVIFGEN_VAL_WFM_SQUARE, 2.0, 0, 1000, 0, duty};
        const auto v = b.Render(1e6, 0.02);
        const auto high = std::count_if(v.begin(), v.end(), [](double x) { return x > 0; });
        EXPECT_NEAR(100.0 * static_cast<double>(high) / static_cast<double>(v.size()), duty, 0.1);
    }
    Bench b;
    b.channel.func = {IVIFGEN_VAL_WFM_SINE, 2.0, 0, 1000, 90, 50};
    EXPECT_NEAR(b.Render(1e6, 1e-6)[0], 1.0, 1e-12) << "90 degrees starts at the crest";
}

TEST(Synthesis, InternalAmHasTheDepthSetAndKeepsThePeak) {
    for (double depth : {20.0, 50.0, 100.0}) {
        Bench b;
        b.channel.func = {IVIFGEN_VAL_WFM_SINE, 2.0, 0, 10e3, 0, 50};
        b.channel.amEnabled = true;
        b.global.am = {depth, IVIFGEN_VAL_WFM_SINE, 100};
        const auto v = b.Render(2e6, 0.02); // two periods of the modulation
        // The envelope: the peak of each carrier period.
        std::vector<double> peaks;
        for (std::size_t k = 0; k + 200 <= v.size(); k += 200)
            peaks.push_back(*std::max_element(v.begin() + static_cast<long>(k),
                                              v.begin() + static_cast<long>(k + 200)));
        const double high = *std::max_element(peaks.begin(), peaks.end());
        const double low = *std::min_element(peaks.begin(), peaks.end());
        EXPECT_NEAR(100 * (high - low) / (high + low), depth, 0.5);
        EXPECT_NEAR(high, 1.0, 1e-3) << "the peak stays within the amplitude set";
    }
}

TEST(Synthesis, InternalFmSweepsByTheDeviationSet) {
    Bench b;
    b.channel.func = {IVIFGEN_VAL_WFM_SINE, 2.0, 0, 10e3, 0, 50};
    b.channel.fmEnabled = true;
    b.global.fm = {2000, IVIFGEN_VAL_WFM_SINE, 20};
    const double rate = 4e6;
    const auto t = RisingCrossings(b.Render(rate, 0.1), rate, 0); // two periods of the modulation
    ASSERT_GT(t.size(), 100u);
    double fastest = 0, slowest = 1e12;
    for (std::size_t k = 1; k < t.size(); ++k) {
        fastest = std::max(fastest, 1 / (t[k] - t[k - 1]));
        slowest = std::min(slowest, 1 / (t[k] - t[k - 1]));
    }
    EXPECT_NEAR((fastest - slowest) / 2, 2000, 20);
    EXPECT_NEAR((fastest + slowest) / 2, 10e3, 20);
}

TEST(Synthesis, ABurstPlaysItsCyclesOnEachTriggerThatFindsItIdle) {
    Bench b;
    b.channel.func = {IVIFGEN_VAL_WFM_SINE, 2.0, 0, 1000, 0, 50};
    b.channel.operationMode = IVIFGEN_VAL_OPERATE_BURST;
    b.channel.triggerSource = IVIFGEN_VAL_SOFTWARE_TRIG;
    b.channel.burstCount = 3;
    const double rate = 1e6;
    // The trigger at 4 ms comes while the first burst runs and is lost.
    const auto v = b.Render(rate, 0.02, {0.002, 0.004, 0.010});
    const auto starts = RisingCrossings(v, rate, 0.5);
    ASSERT_EQ(starts.size(), 6u) << "two bursts of three cycles";
    EXPECT_NEAR(starts[0], 0.002, 1e-4);
    EXPECT_NEAR(starts[3], 0.010, 1e-4);
    EXPECT_EQ(v[static_cast<std::size_t>(0.0055 * rate)], 0) << "idle between the bursts";
}

TEST(Synthesis, ArbitraryOutputPlaysItsPointsAndASequenceItsStepsInOrder) {
    Bench b;
    b.global.outputMode = IVIFGEN_VAL_OUTPUT_ARB;
    b.global.sampleRate = 1000;
    b.waveforms[1] = {0, 0.5, 1, -1};
    b.waveforms[2] = {-0.25, 0.25};
    b.channel.waveformHandle = 1;
    b.channel.arbGain = 2;
    b.channel.arbOffset = 0.1;
    EXPECT_EQ(b.Render(1000, 0.006), (std::vector<double>{0.1, 1.1, 2.1, -1.9, 0.1, 1.1}));

    b.global.outputMode = IVIFGEN_VAL_OUTPUT_SEQ;
    b.sequences[7] = {{2, 1}, {2, 1}};
    b.channel.sequenceHandle = 7;
    b.channel.arbGain = 1;
    b.channel.arbOffset = 0;
    EXPECT_EQ(b.Render(1000, 0.009),
              (std::vector<double>{-0.25, 0.25, -0.25, 0.25, 0, 0.5, 1, -1, -0.25}));
}

// A view may start before generation did, or hours after it: the memory plays on as a loop.
TEST(Synthesis, ArbitraryMemoryLoopsForAnyStartTime) {
    Bench b;
    b.global.outputMode = IVIFGEN_VAL_OUTPUT_ARB;
    b.global.sampleRate = 1000;
    b.waveforms[1] = {0, 0.5, 1, -1};
    b.channel.waveformHandle = 1;
    EXPECT_EQ(b.RenderFrom(-0.003, 1000, 0.006), (std::vector<double>{0.5, 1, -1, 0, 0.5, 1}));

    b.global.outputMode = IVIFGEN_VAL_OUTPUT_SEQ;
    b.sequences[7] = {{1}, {1}};
    b.channel.sequenceHandle = 7;
    EXPECT_EQ(b.RenderFrom(-0.001, 1000, 0.002), (std::vector<double>{-1, 0}));
    for (double start : {-1e300, 1e300, 9.3e15}) {
        const auto v = b.RenderFrom(start, 1000, 0.004);
        for (double x : v)
            EXPECT_TRUE(x == 0 || x == 0.5 || x == 1 || x == -1) << start << ": " << x;
    }
}

TEST(Synthesis, NothingComesOutUntilGenerationRunsWithTheOutputOn) {
    Bench b;
    b.channel.func = {IVIFGEN_VAL_WFM_DC, 1, 2.0, 1000, 0, 50};
    double volts[3] = {9, 9, 9};
    Render({b.global, b.channel, b.waveforms, b.sequences, false}, {}, 0, 1e-3, 3, volts);
    EXPECT_EQ(volts[1], 0);
    b.channel.outputEnabled = false;
    EXPECT_EQ(b.Render(1000, 0.003), (std::vector<double>{0, 0, 0}));
}

} // namespace
} // namespace qzivi::sim
