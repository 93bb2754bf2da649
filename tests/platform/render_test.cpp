// What the simulated outputs carry, read through the class driver as a scope would: what the
// driver's state adds to the signal (generation, outputs, arbitrary frequency, the internal
// trigger's clock) and the refusals of the render call. The shapes themselves are measured
// against their exact values by the synthesis tests; the control's tests render them end to end.
#include "test_support.h"

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

TEST_F(RenderTest, AnArbitraryWaveformTakesTheSampleRateOrItsOwnFrequency) {
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
