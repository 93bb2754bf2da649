// What the simulated outputs carry: the rendered voltages, read the way a scope would.
#include "test_support.h"

#include <algorithm>
#include <cmath>
#include <numeric>
#include <vector>

using qzivi::test::LastError;
using qzivi::test::Session;
using qzivi::test::StoreScope;

namespace {

class RenderTest : public ::testing::Test {
protected:
    std::vector<ViReal64> Render(const char* channel, double start, double step, int count) {
        std::vector<ViReal64> volts(static_cast<size_t>(count));
        EXPECT_EQ(QZIvi_RenderOutput(s_.vi(), channel, start, step, count, volts.data()),
                  VI_SUCCESS)
            << LastError(s_.vi());
        return volts;
    }
    void Ok(ViStatus status) { ASSERT_EQ(status, VI_SUCCESS) << LastError(s_.vi()); }

    StoreScope store_;
    Session s_;
};

double Rms(const std::vector<ViReal64>& v) {
    return std::sqrt(std::inner_product(v.begin(), v.end(), v.begin(), 0.0) /
                     static_cast<double>(v.size()));
}

// Indexes where the signal goes from at most `level` to above it.
std::vector<size_t> RisingCrossings(const std::vector<ViReal64>& v, double level = 0) {
    std::vector<size_t> at;
    for (size_t k = 1; k < v.size(); ++k)
        if (v[k - 1] <= level && v[k] > level) at.push_back(k);
    return at;
}

TEST_F(RenderTest, SineOfTwoVoltsPeakToPeakHasItsPeriodAndRms) {
    const ViSession vi = s_.vi();
    Ok(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 2.0, 0.0, 1000.0,
                                         0.0));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_InitiateGeneration(vi));
    const auto v = Render("Channel1", 0.5e-6, 1e-6, 10000); // ten whole periods, between edges
    EXPECT_NEAR(Rms(v), 1 / std::sqrt(2.0), 1e-6);
    EXPECT_NEAR(*std::max_element(v.begin(), v.end()), 1.0, 1e-5) << "amplitude is peak to peak";
    const auto rising = RisingCrossings(v);
    ASSERT_GE(rising.size(), 9u);
    for (size_t k = 1; k < rising.size(); ++k)
        EXPECT_EQ(rising[k] - rising[k - 1], 1000u) << "one period is 1 ms";
}

TEST_F(RenderTest, SilentWhenTheOutputIsOffOrGenerationStopped) {
    const ViSession vi = s_.vi();
    Ok(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 2.0, 1.0, 1000.0,
                                         0.0));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE));
    auto v = Render("Channel1", 0, 1e-5, 200);
    EXPECT_EQ(Rms(v), 0.0) << "not yet initiated";
    Ok(IviFgen_InitiateGeneration(vi));
    EXPECT_GT(Rms(Render("Channel1", 0, 1e-5, 200)), 1.0);
    EXPECT_EQ(Rms(Render("Channel2", 0, 1e-5, 200)), 0.0) << "channel 2's output is off";
    Ok(IviFgen_AbortGeneration(vi));
    EXPECT_EQ(Rms(Render("Channel1", 0, 1e-5, 200)), 0.0);
}

TEST_F(RenderTest, SquareWaveHasItsDutyCycleAndLevels) {
    const ViSession vi = s_.vi();
    Ok(IviFgen_SetAttributeViReal64(vi, "Channel2", IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, 25.0));
    Ok(IviFgen_ConfigureStandardWaveform(vi, "Channel2", IVIFGEN_VAL_WFM_SQUARE, 4.0, 0.5, 2000.0,
                                         0.0));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel2", VI_TRUE));
    Ok(IviFgen_InitiateGeneration(vi));
    const auto v = Render("Channel2", 0.25e-6, 1e-6, 5000); // ten periods of 500 us
    const auto high =
        std::count_if(v.begin(), v.end(), [](double x) { return std::fabs(x - 2.5) < 1e-9; });
    const auto low =
        std::count_if(v.begin(), v.end(), [](double x) { return std::fabs(x + 1.5) < 1e-9; });
    EXPECT_EQ(high, 1250);
    EXPECT_EQ(low, 3750);
    const auto rising = RisingCrossings(v, 0.5);
    ASSERT_GE(rising.size(), 2u);
    EXPECT_EQ(rising[1] - rising[0], 500u);
}

TEST_F(RenderTest, ArbitraryWaveformIsScaledByGainAndOffset) {
    const ViSession vi = s_.vi();
    const ViReal64 data[8] = {0, 0.5, 1, 0.5, 0, -0.5, -1, -0.5};
    ViInt32 handle = 0;
    Ok(IviFgen_CreateArbWaveform(vi, 8, data, &handle));
    Ok(IviFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_ARB));
    Ok(IviFgen_ConfigureSampleRate(vi, 1e6));
    Ok(IviFgen_ConfigureArbWaveform(vi, "Channel1", handle, 2.0, 0.5));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_InitiateGeneration(vi));
    const auto v = Render("Channel1", 0.5e-6, 1e-6, 16); // the middle of each sample, two passes
    for (size_t k = 0; k < v.size(); ++k)
        EXPECT_DOUBLE_EQ(v[k], 2.0 * data[k % 8] + 0.5) << k;

    // At an arbitrary frequency the whole waveform takes one period of it.
    Ok(IviFgen_ConfigureArbFrequency(vi, "Channel1", 1000.0));
    const auto slow = Render("Channel1", 62.5e-6, 125e-6, 8);
    for (size_t k = 0; k < slow.size(); ++k)
        EXPECT_DOUBLE_EQ(slow[k], 2.0 * data[k] + 0.5) << k;
}

TEST_F(RenderTest, SequencePlaysItsItemsInOrderAndCount) {
    const ViSession vi = s_.vi();
    const ViReal64 up[8] = {0.5, 0.5, 0.5, 0.5, 0.5, 0.5, 0.5, 0.5};
    const ViReal64 down[8] = {-1, -1, -1, -1, -1, -1, -1, -1};
    ViInt32 a = 0, b = 0, seq = 0;
    Ok(IviFgen_CreateArbWaveform(vi, 8, up, &a));
    Ok(IviFgen_CreateArbWaveform(vi, 8, down, &b));
    const ViInt32 handles[] = {a, b};
    const ViInt32 loops[] = {2, 1};
    Ok(IviFgen_CreateArbSequence(vi, 2, handles, loops, &seq));
    Ok(IviFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_SEQ));
    Ok(IviFgen_ConfigureSampleRate(vi, 1e6));
    Ok(IviFgen_ConfigureArbSequence(vi, "Channel1", seq, 1.0, 0.0));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_InitiateGeneration(vi));
    const auto v = Render("Channel1", 0.5e-6, 1e-6, 48); // two passes of 24 samples
    for (size_t k = 0; k < v.size(); ++k)
        EXPECT_DOUBLE_EQ(v[k], k % 24 < 16 ? 0.5 : -1.0) << k;
}

TEST_F(RenderTest, BurstOfCyclesFollowsTheSoftwareTrigger) {
    const ViSession vi = s_.vi();
    Ok(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 2.0, 0.0, 1000.0,
                                         0.0));
    Ok(IviFgen_ConfigureOperationMode(vi, "Channel1", IVIFGEN_VAL_OPERATE_BURST));
    Ok(IviFgen_ConfigureTriggerSource(vi, "Channel1", IVIFGEN_VAL_SOFTWARE_TRIG));
    Ok(IviFgen_ConfigureBurstCount(vi, "Channel1", 3));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_InitiateGeneration(vi));
    EXPECT_EQ(Rms(Render("Channel1", 0, 1e-5, 10000)), 0.0) << "no trigger, no signal";
    Ok(IviFgen_SendSoftwareTrigger(vi));
    const auto v = Render("Channel1", 0, 1e-6, 100000); // the trigger came within these 100 ms
    EXPECT_EQ(RisingCrossings(v, 0).size(), 3u) << "three cycles";
    std::vector<size_t> busy;
    for (size_t k = 0; k < v.size(); ++k)
        if (std::fabs(v[k]) > 1e-3) busy.push_back(k);
    ASSERT_FALSE(busy.empty());
    EXPECT_NEAR(static_cast<double>(busy.back() - busy.front()), 3000.0, 3.0)
        << "the burst lasts 3 ms";
}

TEST_F(RenderTest, InternalTriggerRepeatsTheBurst) {
    const ViSession vi = s_.vi();
    Ok(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 2.0, 0.0, 1000.0,
                                         0.0));
    Ok(IviFgen_ConfigureOperationMode(vi, "Channel1", IVIFGEN_VAL_OPERATE_BURST));
    Ok(IviFgen_ConfigureTriggerSource(vi, "Channel1", IVIFGEN_VAL_INTERNAL_TRIGGER));
    Ok(IviFgen_ConfigureInternalTriggerRate(vi, 100.0));
    Ok(IviFgen_ConfigureBurstCount(vi, "Channel1", 2));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_InitiateGeneration(vi));
    const auto v = Render("Channel1", 0.25e-3, 2.5e-3, 9); // 0.25, 2.75, 5.25, 7.75, 10.25 ms, ...
    EXPECT_NEAR(v[0], 1.0, 1e-9);
    EXPECT_EQ(v[2], 0.0) << "after two cycles the output rests";
    EXPECT_NEAR(v[4], 1.0, 1e-9) << "the next trigger, 10 ms later";
}

TEST_F(RenderTest, AmplitudeModulationShapesTheEnvelope) {
    const ViSession vi = s_.vi();
    Ok(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 2.0, 0.0, 10000.0,
                                         0.0));
    Ok(IviFgen_ConfigureAMInternal(vi, 100.0, IVIFGEN_VAL_WFM_SINE, 100.0));
    Ok(IviFgen_ConfigureAMSource(vi, "Channel1", IVIFGEN_VAL_AM_INTERNAL));
    Ok(IviFgen_ConfigureAMEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_InitiateGeneration(vi));
    auto peak = [&](double from) {
        const auto v = Render("Channel1", from, 1e-6, 200);
        return std::fabs(*std::max_element(
            v.begin(), v.end(), [](double a, double b) { return std::fabs(a) < std::fabs(b); }));
    };
    EXPECT_NEAR(peak(2.4e-3), 1.0, 0.01) << "crest of the modulating sine";
    EXPECT_LT(peak(7.4e-3), 0.02) << "trough at 100 % depth";
}

TEST_F(RenderTest, FrequencyModulationShiftsTheCycleCount) {
    const ViSession vi = s_.vi();
    Ok(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 2.0, 0.0, 1000.0,
                                         0.0));
    Ok(IviFgen_ConfigureFMInternal(vi, 500.0, IVIFGEN_VAL_WFM_SINE, 10.0));
    Ok(IviFgen_ConfigureFMEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE));
    Ok(IviFgen_InitiateGeneration(vi));
    // While the modulating sine is positive the carrier runs faster: 50 + 500 / (10 pi) cycles.
    const auto first = RisingCrossings(Render("Channel1", 1e-7, 1e-6, 50000));
    const auto second = RisingCrossings(Render("Channel1", 50e-3 + 1e-7, 1e-6, 50000));
    EXPECT_NEAR(static_cast<double>(first.size()), 65.9, 1.0);
    EXPECT_NEAR(static_cast<double>(second.size()), 34.1, 1.0);
}

TEST_F(RenderTest, RefusesNonsenseRequests) {
    std::vector<ViReal64> v(4);
    EXPECT_EQ(QZIvi_RenderOutput(s_.vi(), "Channel1", 0, 1e-6, -1, v.data()),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(QZIvi_RenderOutput(s_.vi(), "Channel1", NAN, 1e-6, 4, v.data()),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(QZIvi_RenderOutput(s_.vi(), "Channel1", 0, 1e-6, 4, nullptr), IVI_ERROR_NULL_POINTER);
    EXPECT_EQ(QZIvi_RenderOutput(s_.vi(), "Channel9", 0, 1e-6, 4, v.data()),
              IVI_ERROR_UNKNOWN_CHANNEL_NAME);
}

} // namespace
