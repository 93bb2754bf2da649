// The simulated generator as an application sees it through the class driver: its identity,
// its attributes and their dependent limits, its memory, and the faults its DriverSetup injects.
#include "test_support.h"

#include <gmock/gmock.h>

#include <vector>

using qzivi::test::LastError;
using qzivi::test::Session;
using qzivi::test::StoreScope;
using ::testing::HasSubstr;
using ::testing::StartsWith;

namespace {

class SimulatorTest : public ::testing::Test {
protected:
    StoreScope store_;
};

std::vector<ViReal64> Ramp(int n) {
    std::vector<ViReal64> data(static_cast<size_t>(n));
    for (int k = 0; k < n; ++k)
        data[static_cast<size_t>(k)] = -1.0 + 2.0 * k / (n - 1);
    return data;
}

ViInt32 CreateWaveform(const Session& s, int n) {
    const auto data = Ramp(n);
    ViInt32 handle = 0;
    EXPECT_EQ(IviFgen_CreateArbWaveform(s.vi(), n, data.data(), &handle), VI_SUCCESS)
        << LastError(s.vi());
    return handle;
}

TEST_F(SimulatorTest, IdentifiesItselfAsASimulatedGeneratorOfTheCurrentClass) {
    Session s;
    ASSERT_EQ(s.OpenStatus(), VI_SUCCESS) << LastError(VI_NULL);
    ViBoolean simulating = VI_FALSE;
    EXPECT_EQ(IviFgen_GetAttributeViBoolean(s.vi(), "", IVI_ATTR_SIMULATE, &simulating),
              VI_SUCCESS);
    EXPECT_EQ(simulating, VI_TRUE);
    EXPECT_EQ(s.Text(IVI_ATTR_SPECIFIC_DRIVER_PREFIX), "QZSimFgen");
    EXPECT_GE(s.Int(IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION), 2);
    EXPECT_EQ(s.Int(IVI_ATTR_CHANNEL_COUNT), 2);
    EXPECT_EQ(
        s.Text(IVI_ATTR_GROUP_CAPABILITIES),
        "IviFgenBase,IviFgenStdFunc,IviFgenArbWfm,IviFgenArbFrequency,IviFgenArbSeq,IviFgenTrigger,"
        "IviFgenInternalTrigger,IviFgenSoftwareTrigger,IviFgenBurst,IviFgenModulateAM,"
        "IviFgenModulateFM");
    EXPECT_EQ(s.Text(IVI_ATTR_LOGICAL_NAME), "SampleFGen");
    EXPECT_EQ(s.Text(QZIVI_ATTR_DRIVER_MODULE), "builtin");
}

TEST_F(SimulatorTest, EveryClassAttributeReadsAndChecks) {
    Session s;
    struct Attr {
        ViAttr id;
        char type; // i, r, b
        const char* channel;
    };
    const Attr attributes[] = {
        {IVIFGEN_ATTR_OUTPUT_MODE, 'i', ""},
        {IVIFGEN_ATTR_REF_CLOCK_SOURCE, 'i', ""},
        {IVIFGEN_ATTR_OUTPUT_ENABLED, 'b', "Channel1"},
        {IVIFGEN_ATTR_OUTPUT_IMPEDANCE, 'r', "Channel1"},
        {IVIFGEN_ATTR_OPERATION_MODE, 'i', "Channel2"},
        {IVIFGEN_ATTR_FUNC_WAVEFORM, 'i', "Channel1"},
        {IVIFGEN_ATTR_FUNC_AMPLITUDE, 'r', "Channel1"},
        {IVIFGEN_ATTR_FUNC_DC_OFFSET, 'r', "Channel1"},
        {IVIFGEN_ATTR_FUNC_FREQUENCY, 'r', "Channel1"},
        {IVIFGEN_ATTR_FUNC_START_PHASE, 'r', "Channel1"},
        {IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, 'r', "Channel1"},
        {IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE, 'i', "Channel1"},
        {IVIFGEN_ATTR_ARB_GAIN, 'r', "Channel1"},
        {IVIFGEN_ATTR_ARB_OFFSET, 'r', "Channel1"},
        {IVIFGEN_ATTR_ARB_SAMPLE_RATE, 'r', ""},
        {IVIFGEN_ATTR_ARB_FREQUENCY, 'r', "Channel1"},
        {IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE, 'i', "Channel2"},
        {IVIFGEN_ATTR_TRIGGER_SOURCE, 'i', "Channel1"},
        {IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, 'r', ""},
        {IVIFGEN_ATTR_BURST_COUNT, 'i', "Channel1"},
        {IVIFGEN_ATTR_AM_ENABLED, 'b', "Channel1"},
        {IVIFGEN_ATTR_AM_SOURCE, 'i', "Channel1"},
        {IVIFGEN_ATTR_AM_INTERNAL_DEPTH, 'r', ""},
        {IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM, 'i', ""},
        {IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY, 'r', ""},
        {IVIFGEN_ATTR_FM_ENABLED, 'b', "Channel2"},
        {IVIFGEN_ATTR_FM_SOURCE, 'i', "Channel2"},
        {IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, 'r', ""},
        {IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM, 'i', ""},
        {IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY, 'r', ""},
    };
    // Reading each value and checking it again must pass: what the instrument holds is valid.
    for (const auto& a : attributes) {
        SCOPED_TRACE(a.id);
        if (a.type == 'i') {
            ViInt32 v = 0;
            ASSERT_EQ(IviFgen_GetAttributeViInt32(s.vi(), a.channel, a.id, &v), VI_SUCCESS)
                << LastError(s.vi());
            EXPECT_EQ(IviFgen_CheckAttributeViInt32(s.vi(), a.channel, a.id, v), VI_SUCCESS)
                << LastError(s.vi());
        } else if (a.type == 'r') {
            ViReal64 v = 0;
            ASSERT_EQ(IviFgen_GetAttributeViReal64(s.vi(), a.channel, a.id, &v), VI_SUCCESS)
                << LastError(s.vi());
            EXPECT_EQ(IviFgen_CheckAttributeViReal64(s.vi(), a.channel, a.id, v), VI_SUCCESS)
                << LastError(s.vi());
            ViReal64 lo = 0, hi = 0;
            ViBoolean hasLo = VI_FALSE, hasHi = VI_FALSE;
            ViSession specific = 0;
            ASSERT_EQ(IviFgen_GetSpecificDriverCHandle(s.vi(), &specific), VI_SUCCESS);
            ASSERT_EQ(
                Ivi_GetAttrMinMaxViReal64(specific, a.channel, a.id, &lo, &hi, &hasLo, &hasHi),
                VI_SUCCESS);
            EXPECT_TRUE(hasLo && hasHi);
            EXPECT_LE(lo, v);
            EXPECT_GE(hi, v);
        } else {
            ViBoolean v = 0;
            ASSERT_EQ(IviFgen_GetAttributeViBoolean(s.vi(), a.channel, a.id, &v), VI_SUCCESS)
                << LastError(s.vi());
            EXPECT_EQ(IviFgen_CheckAttributeViBoolean(s.vi(), a.channel, a.id, v), VI_SUCCESS);
        }
    }
}

TEST_F(SimulatorTest, FrequencyLimitFollowsTheWaveformShape) {
    Session s;
    const ViSession vi = s.vi();
    EXPECT_EQ(
        IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 1, 0, 30e6, 0),
        VI_SUCCESS);
    EXPECT_EQ(
        IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SQUARE, 1, 0, 30e6, 0),
        IVI_ERROR_INVALID_VALUE);
    EXPECT_THAT(s.Elaboration(), HasSubstr("IVIFGEN_ATTR_FUNC_FREQUENCY"));
    // A sine at 30 MHz cannot become a triangle, whose limit is 1 MHz.
    EXPECT_EQ(IviFgen_SetAttributeViInt32(vi, "Channel1", IVIFGEN_ATTR_FUNC_WAVEFORM,
                                          IVIFGEN_VAL_WFM_TRIANGLE),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(s.Int(IVIFGEN_ATTR_FUNC_WAVEFORM, "Channel1"), IVIFGEN_VAL_WFM_SINE);
    EXPECT_DOUBLE_EQ(s.Real(IVIFGEN_ATTR_FUNC_FREQUENCY), 30e6);
    // The refused call changed nothing, and the other channel was never touched.
    EXPECT_DOUBLE_EQ(s.Real(IVIFGEN_ATTR_FUNC_FREQUENCY, "Channel2"), 1000);
    // Above 10 MHz the duty cycle narrows.
    EXPECT_EQ(
        IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SQUARE, 1, 0, 20e6, 0),
        VI_SUCCESS);
    EXPECT_EQ(IviFgen_CheckAttributeViReal64(vi, "Channel1", IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, 10),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_CheckAttributeViReal64(vi, "Channel1", IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, 30),
              VI_SUCCESS);
}

TEST_F(SimulatorTest, AmplitudeAndOffsetShareTheVoltageWindow) {
    Session s;
    const ViSession vi = s.vi();
    EXPECT_EQ(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 8, 1, 1e3, 0),
              VI_SUCCESS);
    EXPECT_EQ(
        IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 8, 1.5, 1e3, 0),
        IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_DC, 8, 4.5, 1e3, 0),
              VI_SUCCESS)
        << "a DC level ignores the amplitude";
    ViSession specific = 0;
    ASSERT_EQ(IviFgen_GetSpecificDriverCHandle(vi, &specific), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 2, 3, 1e3, 0),
              VI_SUCCESS);
    ViReal64 lo = 0, hi = 0;
    ViBoolean hasLo = 0, hasHi = 0;
    ASSERT_EQ(Ivi_GetAttrMinMaxViReal64(specific, "Channel1", IVIFGEN_ATTR_FUNC_AMPLITUDE, &lo, &hi,
                                        &hasLo, &hasHi),
              VI_SUCCESS);
    EXPECT_DOUBLE_EQ(hi, 4.0) << "with 3 V offset only 4 Vpp fit";
    ASSERT_EQ(Ivi_GetAttrMinMaxViReal64(specific, "Channel1", IVIFGEN_ATTR_FUNC_DC_OFFSET, &lo, &hi,
                                        &hasLo, &hasHi),
              VI_SUCCESS);
    EXPECT_DOUBLE_EQ(lo, -4.0);
    EXPECT_DOUBLE_EQ(hi, 4.0);
}

TEST_F(SimulatorTest, ArbitraryFrequencyLimitFollowsTheWaveformOnlyWhileInUse) {
    Session s;
    const ViSession vi = s.vi();
    const ViInt32 big = CreateWaveform(s, 1000000); // 250 MSa/s allow 250 Hz for it
    EXPECT_EQ(IviFgen_ConfigureArbWaveform(vi, "Channel1", big, 1, 0), VI_SUCCESS)
        << "the channel plays at the sample rate; its arbitrary frequency of 1 kHz is not in use";
    EXPECT_EQ(IviFgen_ConfigureArbFrequency(vi, "Channel1", 1000), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_ConfigureArbFrequency(vi, "Channel1", 200), VI_SUCCESS);
    const ViInt32 small = CreateWaveform(s, 100);
    EXPECT_EQ(IviFgen_ConfigureArbWaveform(vi, "Channel1", small, 1, 0), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ConfigureArbFrequency(vi, "Channel1", 1e6), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ConfigureArbWaveform(vi, "Channel1", big, 1, 0), IVI_ERROR_INVALID_VALUE)
        << "now it plays at 1 MHz, which the big waveform cannot";
}

TEST_F(SimulatorTest, RefusesWhatNoInstrumentTakes) {
    Session s;
    const ViSession vi = s.vi();
    ViInt32 i = 0;
    ViReal64 r = 0;
    EXPECT_EQ(IviFgen_GetAttributeViInt32(vi, "Channel1", IVIFGEN_ATTR_FUNC_FREQUENCY, &i),
              IVI_ERROR_TYPES_DO_NOT_MATCH);
    EXPECT_EQ(IviFgen_GetAttributeViReal64(vi, "", 1250999, &r), IVI_ERROR_INVALID_ATTRIBUTE);
    EXPECT_EQ(IviFgen_SetAttributeViInt32(vi, "", IVIFGEN_ATTR_MAX_NUM_WAVEFORMS, 3),
              IVI_ERROR_ATTR_NOT_WRITABLE);
    EXPECT_EQ(IviFgen_ConfigureOutputImpedance(vi, "Channel3", 50), IVI_ERROR_UNKNOWN_CHANNEL_NAME);
    EXPECT_THAT(s.Elaboration(), HasSubstr("\"Channel3\""));
    EXPECT_EQ(IviFgen_ConfigureOutputImpedance(vi, "2", 75), VI_SUCCESS)
        << "physical names pass as they are";
    EXPECT_DOUBLE_EQ(s.Real(IVIFGEN_ATTR_OUTPUT_IMPEDANCE, "Channel2"), 75);
    EXPECT_EQ(IviFgen_ConfigureRefClockSource(vi, IVIFGEN_VAL_REF_CLOCK_RTSI_CLOCK),
              IVI_ERROR_VALUE_NOT_SUPPORTED);
    EXPECT_EQ(IviFgen_ConfigureTriggerSource(vi, "Channel1", IVIFGEN_VAL_TTL0),
              IVI_ERROR_VALUE_NOT_SUPPORTED);
    EXPECT_EQ(IviFgen_ConfigureTriggerSource(vi, "Channel1", 999), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_ConfigureBurstCount(vi, "Channel1", 0), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_ConfigureAMInternal(vi, 50, IVIFGEN_VAL_WFM_DC, 100),
              IVI_ERROR_VALUE_NOT_SUPPORTED);
    EXPECT_EQ(IviFgen_ConfigureOutputMode(vi, 7), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_GetAttributeViReal64(vi, "Channel1", IVIFGEN_ATTR_FUNC_FREQUENCY, nullptr),
              IVI_ERROR_NULL_POINTER);
}

TEST_F(SimulatorTest, WaveformMemoryKeepsItsLimitsAndHandles) {
    Session s("DriverSetup=Memory=100; MaxWaveforms=3; Quantum=4; MinWaveformSize=8");
    ASSERT_EQ(s.OpenStatus(), VI_SUCCESS) << LastError(VI_NULL);
    const ViSession vi = s.vi();
    ViInt32 maxNum = 0, quantum = 0, minSize = 0, maxSize = 0;
    ASSERT_EQ(IviFgen_QueryArbWfmCapabilities(vi, &maxNum, &quantum, &minSize, &maxSize),
              VI_SUCCESS);
    EXPECT_EQ(maxNum, 3);
    EXPECT_EQ(quantum, 4);
    EXPECT_EQ(minSize, 8);
    EXPECT_EQ(s.Int(IVIFGEN_ATTR_WAVEFORM_QUANTUM), 4);

    ViInt32 handle = 0;
    auto ten = Ramp(10);
    EXPECT_EQ(IviFgen_CreateArbWaveform(vi, 10, ten.data(), &handle), IVI_ERROR_INVALID_VALUE)
        << "not a multiple of 4";
    EXPECT_THAT(s.Elaboration(), HasSubstr("quantum"));
    auto loud = Ramp(8);
    loud[3] = 1.5;
    EXPECT_EQ(IviFgen_CreateArbWaveform(vi, 8, loud.data(), &handle), IVI_ERROR_INVALID_VALUE)
        << "not normalized";
    EXPECT_THAT(s.Elaboration(), HasSubstr("point 3"));

    const ViInt32 a = CreateWaveform(s, 48);
    const ViInt32 b = CreateWaveform(s, 48);
    EXPECT_NE(a, b);
    auto more = Ramp(8);
    EXPECT_EQ(IviFgen_CreateArbWaveform(vi, 8, more.data(), &handle),
              IVIFGEN_ERROR_NO_WFMS_AVAILABLE)
        << "memory full";
    EXPECT_EQ(IviFgen_ClearArbWaveform(vi, a), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ClearArbWaveform(vi, a), IVI_ERROR_INVALID_VALUE)
        << "a cleared handle is gone";
    const ViInt32 c = CreateWaveform(s, 8);
    CreateWaveform(s, 8);
    EXPECT_EQ(IviFgen_CreateArbWaveform(vi, 8, more.data(), &handle),
              IVIFGEN_ERROR_NO_WFMS_AVAILABLE)
        << "3 slots";
    EXPECT_EQ(IviFgen_ClearArbWaveform(vi, IVIFGEN_VAL_ALL_WAVEFORMS), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ConfigureArbWaveform(vi, "Channel1", c, 1, 0), IVI_ERROR_INVALID_VALUE);
    CreateWaveform(s, 96);
}

TEST_F(SimulatorTest, AWaveformInUseCannotBeCleared) {
    Session s;
    const ViSession vi = s.vi();
    const ViInt32 a = CreateWaveform(s, 100);
    const ViInt32 b = CreateWaveform(s, 100);
    const ViInt32 handles[] = {a, b, a};
    const ViInt32 loops[] = {1, 3, 2};
    ViInt32 seq = 0;
    ASSERT_EQ(IviFgen_CreateArbSequence(vi, 3, handles, loops, &seq), VI_SUCCESS) << LastError(vi);
    EXPECT_EQ(IviFgen_ClearArbWaveform(vi, b), IVIFGEN_ERROR_WFM_IN_USE);
    EXPECT_THAT(s.Elaboration(), HasSubstr("sequence"));
    EXPECT_EQ(IviFgen_ClearArbWaveform(vi, IVIFGEN_VAL_ALL_WAVEFORMS), IVIFGEN_ERROR_WFM_IN_USE);

    ASSERT_EQ(IviFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_SEQ), VI_SUCCESS);
    ASSERT_EQ(IviFgen_ConfigureArbSequence(vi, "Channel1", seq, 1, 0), VI_SUCCESS);
    ASSERT_EQ(IviFgen_InitiateGeneration(vi), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ClearArbSequence(vi, seq), IVIFGEN_ERROR_SEQ_IN_USE) << "channel 1 plays it";
    ASSERT_EQ(IviFgen_AbortGeneration(vi), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ClearArbSequence(vi, seq), VI_SUCCESS);
    EXPECT_EQ(s.Int(IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE, "Channel1"), 0);

    ASSERT_EQ(IviFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_ARB), VI_SUCCESS);
    ASSERT_EQ(IviFgen_ConfigureArbWaveform(vi, "Channel2", b, 1, 0), VI_SUCCESS);
    ASSERT_EQ(IviFgen_InitiateGeneration(vi), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ClearArbWaveform(vi, b), IVIFGEN_ERROR_WFM_IN_USE)
        << "channel 2 generates it";
    EXPECT_EQ(IviFgen_ClearArbWaveform(vi, a), VI_SUCCESS) << "nothing uses a any more";
}

TEST_F(SimulatorTest, SequencesKeepTheirLimits) {
    Session s("DriverSetup=MaxSequences=1; MaxLoopCount=10; MaxSequenceLength=2");
    const ViSession vi = s.vi();
    const ViInt32 a = CreateWaveform(s, 16);
    ViInt32 seq = 0;
    const ViInt32 twice[] = {a, a};
    const ViInt32 thrice[] = {a, a, a};
    const ViInt32 ok[] = {1, 10};
    const ViInt32 tooMany[] = {1, 11};
    const ViInt32 unknown[] = {a, a + 1000};
    EXPECT_EQ(IviFgen_CreateArbSequence(vi, 3, thrice, ok, &seq), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_CreateArbSequence(vi, 2, twice, tooMany, &seq), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_CreateArbSequence(vi, 2, unknown, ok, &seq), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_CreateArbSequence(vi, 2, twice, ok, &seq), VI_SUCCESS);
    EXPECT_EQ(IviFgen_CreateArbSequence(vi, 2, twice, ok, &seq), IVIFGEN_ERROR_NO_SEQS_AVAILABLE);
    ViInt32 maxNum = 0, minLen = 0, maxLen = 0, maxLoop = 0;
    ASSERT_EQ(IviFgen_QueryArbSeqCapabilities(vi, &maxNum, &minLen, &maxLen, &maxLoop), VI_SUCCESS);
    EXPECT_EQ(maxNum, 1);
    EXPECT_EQ(minLen, 1);
    EXPECT_EQ(maxLen, 2);
    EXPECT_EQ(maxLoop, 10);
}

TEST_F(SimulatorTest, SoftwareTriggerNeedsABurstChannelWaitingForIt) {
    Session s;
    const ViSession vi = s.vi();
    EXPECT_EQ(IviFgen_SendSoftwareTrigger(vi), IVIFGEN_ERROR_TRIGGER_NOT_SOFTWARE);
    ASSERT_EQ(IviFgen_ConfigureOperationMode(vi, "Channel1", IVIFGEN_VAL_OPERATE_BURST),
              VI_SUCCESS);
    ASSERT_EQ(IviFgen_ConfigureTriggerSource(vi, "Channel1", IVIFGEN_VAL_SOFTWARE_TRIG),
              VI_SUCCESS);
    EXPECT_EQ(IviFgen_SendSoftwareTrigger(vi), IVIFGEN_ERROR_NOT_GENERATING);
    ASSERT_EQ(IviFgen_InitiateGeneration(vi), VI_SUCCESS);
    EXPECT_EQ(IviFgen_SendSoftwareTrigger(vi), VI_SUCCESS);
}

// ---- Faults the DriverSetup option injects ------------------------------------------------------

TEST_F(SimulatorTest, FailsANamedFunctionAsOftenAsAsked) {
    Session s("DriverSetup=Fail=ConfigureOutputImpedance:0xBFFA0001:2");
    const ViSession vi = s.vi();
    EXPECT_EQ(IviFgen_ConfigureOutputImpedance(vi, "Channel1", 75), IVI_ERROR_INSTRUMENT_STATUS);
    EXPECT_THAT(s.Elaboration(), HasSubstr("injected"));
    EXPECT_EQ(IviFgen_ConfigureOutputImpedance(vi, "Channel1", 75), IVI_ERROR_INSTRUMENT_STATUS);
    EXPECT_DOUBLE_EQ(s.Real(IVIFGEN_ATTR_OUTPUT_IMPEDANCE), 50) << "a failed call changes nothing";
    EXPECT_EQ(IviFgen_ConfigureOutputImpedance(vi, "Channel1", 75), VI_SUCCESS);
    EXPECT_DOUBLE_EQ(s.Real(IVIFGEN_ATTR_OUTPUT_IMPEDANCE), 75);
}

// No C++ exception crosses a C entry: one of a type nobody knows becomes an IVI error with its
// text, on the session's record, and the session goes on working.
TEST_F(SimulatorTest, AnExceptionOfUnknownTypeBecomesAnErrorStatus) {
    Session s("DriverSetup=Throw=ConfigureOutputImpedance:1:1");
    const ViSession vi = s.vi();
    EXPECT_EQ(IviFgen_ConfigureOutputImpedance(vi, "Channel1", 75), IVI_ERROR_CANNOT_RECOVER);
    EXPECT_EQ(s.Elaboration(), "ConfigureOutputImpedance: an exception of an unknown type");
    ViStatus code = 0;
    ViChar text[256] = {};
    IviFgen_GetError(vi, &code, sizeof text, text);
    EXPECT_EQ(code, IVI_ERROR_CANNOT_RECOVER);
    EXPECT_THAT(text, StartsWith("Unrecoverable failure. ConfigureOutputImpedance: an exception"));
    EXPECT_DOUBLE_EQ(s.Real(IVIFGEN_ATTR_OUTPUT_IMPEDANCE), 50) << "the call changed nothing";
    EXPECT_EQ(IviFgen_ConfigureOutputImpedance(vi, "Channel1", 75), VI_SUCCESS);

    // At the open, without a session yet: the thread's record answers.
    ViSession none = 0;
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE,
                                      "DriverSetup=Throw=InitWithOptions", &none),
              IVI_ERROR_CANNOT_RECOVER);
    EXPECT_EQ(none, 0);
    EXPECT_THAT(LastError(VI_NULL), HasSubstr("an exception of an unknown type"));
}

TEST_F(SimulatorTest, RefusesAGivenValueWhereverItIsSet) {
    Session s("DriverSetup=Refuse=1250104:5000");
    const ViSession vi = s.vi();
    EXPECT_EQ(
        IviFgen_ConfigureStandardWaveform(vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 1, 0, 5000, 0),
        IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_CheckAttributeViReal64(vi, "Channel2", IVIFGEN_ATTR_FUNC_FREQUENCY, 5000),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_SetAttributeViReal64(vi, "Channel2", IVIFGEN_ATTR_FUNC_FREQUENCY, 5001),
              VI_SUCCESS);
    EXPECT_EQ(IviFgen_ConfigureOutputImpedance(vi, "Channel1", 50), VI_SUCCESS)
        << "other values are untouched";
}

TEST_F(SimulatorTest, AnswersWithAWarningAndStillActs) {
    Session s("DriverSetup=Warn=ConfigureOutputEnabled:0x3FFA4001");
    const ViSession vi = s.vi();
    EXPECT_EQ(IviFgen_ConfigureOutputEnabled(vi, "Channel1", VI_TRUE), IVI_WARN_VALUE_COERCED);
    ViBoolean enabled = VI_FALSE;
    ASSERT_EQ(IviFgen_GetAttributeViBoolean(vi, "Channel1", IVIFGEN_ATTR_OUTPUT_ENABLED, &enabled),
              VI_SUCCESS);
    EXPECT_EQ(enabled, VI_TRUE);
}

TEST_F(SimulatorTest, ReportsAnotherIdentityWhenTold) {
    Session s("DriverSetup=ClassSpec=1; Prefix=vxFgen33; Version=1.10");
    EXPECT_EQ(s.Int(IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION), 1);
    EXPECT_EQ(s.Text(IVI_ATTR_SPECIFIC_DRIVER_PREFIX), "vxFgen33");
    EXPECT_EQ(s.Int(IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION), 1);
    EXPECT_EQ(s.Int(IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION), 10);
}

TEST_F(SimulatorTest, OffersOnlyTheGroupsItIsGiven) {
    Session s("DriverSetup=Groups=IviFgenBase,IviFgenStdFunc");
    const ViSession vi = s.vi();
    EXPECT_EQ(s.Text(IVI_ATTR_GROUP_CAPABILITIES), "IviFgenBase,IviFgenStdFunc");
    ViInt32 handle = 0;
    const ViReal64 data[8] = {};
    EXPECT_EQ(IviFgen_CreateArbWaveform(vi, 8, data, &handle), IVI_ERROR_FUNCTION_NOT_SUPPORTED);
    EXPECT_EQ(IviFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_ARB),
              IVI_ERROR_VALUE_NOT_SUPPORTED);
    ViReal64 depth = 0;
    EXPECT_EQ(IviFgen_GetAttributeViReal64(vi, "", IVIFGEN_ATTR_AM_INTERNAL_DEPTH, &depth),
              IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED);
    EXPECT_EQ(IviFgen_ConfigureOperationMode(vi, "Channel1", IVIFGEN_VAL_OPERATE_BURST),
              IVI_ERROR_VALUE_NOT_SUPPORTED);
}

TEST_F(SimulatorTest, CanWithholdRangesAndRefuseTheEmptyChannelName) {
    Session s("DriverSetup=NoRanges=1; RejectEmptyChannel=1");
    const ViSession vi = s.vi();
    ViSession specific = 0;
    ASSERT_EQ(IviFgen_GetSpecificDriverCHandle(vi, &specific), VI_SUCCESS);
    ViReal64 lo = 0, hi = 0;
    ViBoolean hasLo = 0, hasHi = 0;
    EXPECT_LT(Ivi_GetAttrMinMaxViReal64(specific, "Channel1", IVIFGEN_ATTR_FUNC_AMPLITUDE, &lo, &hi,
                                        &hasLo, &hasHi),
              0);
    EXPECT_EQ(
        IviFgen_CheckAttributeViInt32(vi, "", IVIFGEN_ATTR_FUNC_WAVEFORM, IVIFGEN_VAL_WFM_SINE),
        IVI_ERROR_UNKNOWN_CHANNEL_NAME);
    EXPECT_EQ(
        IviFgen_CheckAttributeViInt32(vi, "1", IVIFGEN_ATTR_FUNC_WAVEFORM, IVIFGEN_VAL_WFM_SINE),
        VI_SUCCESS);
}

TEST_F(SimulatorTest, AWrongDriverSetupKeepsTheSessionClosedAndSaysWhy) {
    ViSession vi = 123;
    EXPECT_EQ(
        IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "DriverSetup=Explode=1", &vi),
        IVI_ERROR_BAD_OPTION_VALUE);
    EXPECT_EQ(vi, 0u);
    EXPECT_THAT(LastError(VI_NULL), HasSubstr("Explode"));
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE,
                                      "DriverSetup=Fail=Nothing:0xBFFA0001", &vi),
              IVI_ERROR_BAD_OPTION_VALUE);
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "Colour=blue", &vi),
              IVI_ERROR_BAD_OPTION_NAME);
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "Simulate=perhaps", &vi),
              IVI_ERROR_BAD_OPTION_VALUE);
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE,
                                      "DriverSetup=Fail=InitWithOptions:0xBFFA0001", &vi),
              IVI_ERROR_INSTRUMENT_STATUS);
    EXPECT_EQ(vi, 0u);
}

} // namespace
