// Configure and generation control, end to end through the control: the driver calls of each run
// read from the call trace, the refusals that name their property, and what the simulated
// outputs then carry.
#include "../platform/test_support.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/support/failure.h"
#include "qzivi/trace.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <cmath>

namespace qzivi {
namespace {

using ::testing::AnyOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

class EngineTest : public ::testing::Test {
protected:
    EngineTest() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        fgen_ = std::make_unique<QZIviFgen>();
        fgen_->InitProperties();
        fgen_->AmbientChanged("DisplayName"); // no host: an empty name
        c1_ = fgen_->IviError.Connect(
            [this](std::int32_t code, const std::string& source, const std::string& text) {
                errors_.push_back(code);
                lastSource_ = source;
                lastText_ = text;
            });
        c2_ = fgen_->IviWarning.Connect([this](std::int32_t code, const std::string&,
                                               const std::string&) { warnings_.push_back(code); });
        c3_ = fgen_->Configured.Connect([this] { ++configured_; });
    }

    // Opens the session with the simulator's DriverSetup.
    void Open(const std::string& setup = "") {
        fgen_->Init(false, false, setup.empty() ? "" : "DriverSetup=" + setup);
        ASSERT_NE(fgen_->SessionHandle(), 0) << lastText_;
    }
    ViSession Vi() { return static_cast<ViSession>(fgen_->SessionHandle()); }
    std::int32_t State() { return fgen_->Engine().PropSet()->ErrorReport()->state(); }
    std::int32_t Raised(const std::function<void()>& action) {
        try {
            action();
        } catch (const Failure& f) {
            lastRaised_ = f;
            return f.Number();
        }
        return 0;
    }
    std::vector<double> Render(const char* channel, double start, double step, int count) {
        std::vector<double> v(static_cast<std::size_t>(count));
        EXPECT_EQ(QZIvi_RenderOutput(Vi(), channel, start, step, count, v.data()), VI_SUCCESS);
        return v;
    }
    static std::vector<std::string> Without(std::vector<std::string> calls,
                                            const std::string& name) {
        std::erase(calls, name);
        return calls;
    }
    static long Count(const std::vector<std::string>& calls, const std::string& name) {
        return std::count(calls.begin(), calls.end(), name);
    }

    test::StoreScope store_;
    std::unique_ptr<QZIviFgen> fgen_;
    std::vector<std::int32_t> errors_, warnings_;
    std::string lastSource_, lastText_;
    std::optional<Failure> lastRaised_;
    int configured_ = 0;
    Connection c1_, c2_, c3_;
};

TEST_F(EngineTest, TheTypicalRunMakesExactlyItsTwelveCalls) {
    fgen_->Channels()->Add();
    fgen_->Extensions(qzivifgenStdFuncExt);
    Open();
    ivi::TraceRecorder trace;
    fgen_->Configure();
    EXPECT_THAT(trace.Functions(),
                ElementsAre("IviFgen_GetAttributeViString", "IviFgen_AbortGeneration",
                            "IviFgen_ConfigureOutputEnabled", "IviFgen_ConfigureAMEnabled",
                            "IviFgen_ConfigureFMEnabled", "IviFgen_ConfigureOutputMode",
                            "IviFgen_ConfigureRefClockSource", "IviFgen_ConfigureOutputImpedance",
                            "IviFgen_ConfigureOperationMode", "IviFgen_ConfigureStandardWaveform",
                            "IviFgen_ConfigureOutputEnabled", "IviFgen_InitiateGeneration"));
    const auto& r = trace.Records();
    EXPECT_THAT(r[0].arguments, HasSubstr("1050401"));
    EXPECT_THAT(r[2].arguments, ::testing::EndsWith("\"Channel1\", 0"));
    EXPECT_THAT(r[9].arguments, ::testing::EndsWith("\"Channel1\", 1, 2, 0, 1000, 0"));
    EXPECT_THAT(r[10].arguments, ::testing::EndsWith("\"Channel1\", 65535")) << "the stored -1";
    EXPECT_EQ(State(), IviStateConfigured);
    EXPECT_EQ(configured_, 1);
    EXPECT_TRUE(errors_.empty());
}

TEST_F(EngineTest, TheGateHasThreeOutcomes) {
    ivi::TraceRecorder trace;
    fgen_->Enabled(false);
    fgen_->Configure();
    EXPECT_TRUE(trace.Records().empty());
    EXPECT_TRUE(errors_.empty());
    fgen_->Enabled(true);
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -31620);
    EXPECT_EQ(lastRaised_->Description(), "No channels were found. (QZIviFgen.Configure)");
    EXPECT_TRUE(trace.Records().empty()) << "no session was opened";
    fgen_->Channels()->Add();
    fgen_->Extensions(qzivifgenTriggerExt | qzivifgenModulateAMExt);
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -31621);
    EXPECT_EQ(configured_, 0);
}

TEST_F(EngineTest, MissingExtensionsAreNamedAtOnceInTableOrder) {
    fgen_->Channels()->Add();
    fgen_->Extensions(qzivifgenStdFuncExt | qzivifgenTriggerExt | qzivifgenBurstExt |
                      qzivifgenModulateFMExt | qzivifgenModulateAMExt);
    Open("Groups=IviFgenBase,IviFgenStdFunc,IviFgenTrigger");
    ivi::TraceRecorder trace;
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -30717);
    EXPECT_EQ(lastRaised_->Description(),
              "Extension capability not supported by instrument driver.  (Burst, "
              "ModulateAM, ModulateFM)");
    EXPECT_EQ(lastRaised_->Source(), "Configure");
    EXPECT_THAT(trace.Functions(), ElementsAre("IviFgen_GetAttributeViString"))
        << "nothing is configured";
    EXPECT_EQ(State(), IviStateInitialized);
}

// A refused value names the property of its owner and carries the driver's text.
TEST_F(EngineTest, ARefusedValueNamesItsOwnersProperty) {
    struct Case {
        std::function<void(QZIviFgen&)> set;
        std::string source;
    };
    const std::string ch = "QZIviFgen.Channels.Item(\"Channel1\").";
    const std::vector<Case> cases = {
        {[](QZIviFgen& f) { f.OutputMode(7); }, "QZIviFgen.OutputMode"},
        {[](QZIviFgen& f) { f.RefClockSource(55); }, "QZIviFgen.RefClockSource"},
        {[](QZIviFgen& f) { f.Channels()->Item(1)->OutputImpedance(-5); }, ch + "OutputImpedance"},
        {[](QZIviFgen& f) { f.Channels()->Item(1)->OperationMode(9); }, ch + "OperationMode"},
        {[](QZIviFgen& f) { f.Channels()->Item(1)->FuncWaveform(42); }, ch + "FuncWaveform"},
        {[](QZIviFgen& f) { f.Channels()->Item(1)->FuncFrequency(1e9); }, ch + "FuncFrequency"},
        {[](QZIviFgen& f) { f.Channels()->Item(1)->FuncStartPhase(720); }, ch + "FuncStartPhase"},
        {[](QZIviFgen& f) {
             f.Extensions(qzivifgenStdFuncExt | qzivifgenBurstExt);
             f.Channels()->Item(1)->OperationMode(1);
             f.Channels()->Item(1)->BurstCount(0);
         },
         ch + "BurstCount"},
        {[](QZIviFgen& f) {
             f.Extensions(qzivifgenStdFuncExt | qzivifgenTriggerExt);
             f.Channels()->Item(1)->TriggerSource(999);
         },
         ch + "TriggerSource"},
        {[](QZIviFgen& f) {
             f.Extensions(qzivifgenStdFuncExt | qzivifgenModulateAMExt);
             f.Channels()->Item(1)->AMEnabled(true);
             f.Channels()->Item(1)->AMSource(7);
         },
         ch + "AMSource"},
        {[](QZIviFgen& f) {
             f.Extensions(qzivifgenStdFuncExt | qzivifgenModulateAMExt);
             f.Channels()->Item(1)->AMEnabled(true);
             f.Internal()->AMInternalDepth(500);
         },
         "QZIviFgen.Internal.AMInternalDepth"},
        {[](QZIviFgen& f) {
             f.Extensions(qzivifgenStdFuncExt | qzivifgenTriggerExt | qzivifgenInternalTriggerExt);
             f.Channels()->Item(1)->TriggerSource(3);
             f.Internal()->InternalTriggerRate(0);
         },
         "QZIviFgen.Internal.InternalTriggerRate"},
        {[](QZIviFgen& f) {
             f.OutputMode(1);
             f.ArbSampleRate(1e12);
             f.Waveforms()->Add("W")->Data(std::vector<double>(16, 0.5));
         },
         "QZIviFgen.ArbSampleRate"},
        {[](QZIviFgen& f) {
             f.OutputMode(1);
             f.Waveforms()->Add("W")->Data(std::vector<double>(16, 0.5));
             f.Channels()->Item(1)->ArbGain(100);
         },
         ch + "ArbGain"},
        {[](QZIviFgen& f) {
             f.OutputMode(1);
             f.Extensions(qzivifgenArbWfmExt | qzivifgenArbFrequencyExt);
             f.Waveforms()->Add("W")->Data(std::vector<double>(16, 0.5));
             f.Channels()->Item(1)->ArbFrequency(1e9);
         },
         ch + "ArbFrequency"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.source);
        fgen_ = std::make_unique<QZIviFgen>();
        fgen_->InitProperties();
        fgen_->AmbientChanged("DisplayName");
        fgen_->Channels()->Add();
        c.set(*fgen_);
        fgen_->AmbientChanged("DisplayName"); // paths are set again, as a host's load does
        EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -30002);
        EXPECT_EQ(lastRaised_->Source(), "Configure");
        EXPECT_THAT(lastRaised_->Description(),
                    StartsWith("An invalid argument has been passed to a property or method. (" +
                               c.source + ")  "));
        EXPECT_THAT(lastRaised_->Description(), HasSubstr("IVI Error Code:  BFFA00"));
        EXPECT_EQ(State(), IviStateInitialized);
    }
}

TEST_F(EngineTest, WithoutAutoStopStartGenerationIsLeftAlone) {
    fgen_->Channels()->Add();
    fgen_->AutoStopStart(false);
    Open();
    ivi::TraceRecorder trace;
    fgen_->Configure();
    const auto calls = trace.Functions();
    EXPECT_EQ(Count(calls, "IviFgen_AbortGeneration"), 0);
    EXPECT_EQ(Count(calls, "IviFgen_InitiateGeneration"), 0);
    EXPECT_EQ(Count(calls, "IviFgen_ConfigureOutputEnabled"), 1)
        << "only the final switch, not the disabling";
}

// A checked call that answers with a warning ends the run as an error would, but raises nothing.
TEST_F(EngineTest, AWarningFromACheckedCallEndsTheRun) {
    fgen_->Channels()->Add();
    Open("Warn=ConfigureStandardWaveform:0x3FFA4001");
    ivi::TraceRecorder trace;
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), 0);
    EXPECT_EQ(warnings_, (std::vector<std::int32_t>{31501}));
    EXPECT_TRUE(errors_.empty());
    EXPECT_EQ(State(), IviStateInitialized);
    EXPECT_EQ(configured_, 0);
    const auto calls = trace.Functions();
    const auto at = std::find(calls.begin(), calls.end(), "IviFgen_ConfigureStandardWaveform");
    ASSERT_NE(at, calls.end());
    for (auto later = at + 1; later != calls.end(); ++later)
        EXPECT_THAT(*later, Not(AnyOf(StartsWith("IviFgen_Configure"),
                                      StartsWith("IviFgen_InitiateGeneration"))))
            << "nothing is sent after the warning";

    // A call that warns outside the checked pattern only fires: the capability read.
    warnings_.clear();
    fgen_->CloseSession();
    Open("Warn=GetAttributeViString:0x3FFA4001:1");
    fgen_->Configure();
    EXPECT_EQ(warnings_, (std::vector<std::int32_t>{31501}));
    EXPECT_EQ(State(), IviStateConfigured);
    EXPECT_EQ(configured_, 1);
}

// A status the mapping does not know ends the run too, with the unexpected failure for an error.
TEST_F(EngineTest, AnUnknownStatusEndsTheRunAndIsReported) {
    fgen_->Channels()->Add();
    Open("Fail=ConfigureStandardWaveform:0xBFFB0001");
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -30000);
    EXPECT_THAT(lastText_, HasSubstr("[IVI Error Code:  BFFB0001]"));
    EXPECT_EQ(State(), IviStateInitialized);
    EXPECT_EQ(configured_, 0);
    fgen_->CloseSession();
    errors_.clear();
    Open("Warn=ConfigureStandardWaveform:0x3FFB0001");
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), 0);
    EXPECT_EQ(warnings_, (std::vector<std::int32_t>{0x3FFB0001}));
    EXPECT_TRUE(errors_.empty());
    EXPECT_EQ(State(), IviStateInitialized);
    EXPECT_EQ(configured_, 0);
}

TEST_F(EngineTest, ACallFromAnEventHandlerDuringARunIsRefused) {
    fgen_->Channels()->Add();
    Open("Warn=GetAttributeViString");
    std::int32_t inner = 0;
    auto c = fgen_->IviWarning.Connect([&](std::int32_t, const std::string&, const std::string&) {
        inner = Raised([&] { fgen_->Configure(); });
    });
    fgen_->Configure();
    EXPECT_EQ(inner, -31602);
    EXPECT_EQ(State(), IviStateConfigured)
        << "the outer run finished and its state was not disturbed";
    EXPECT_EQ(configured_, 1);
}

// The engine renders the output for programs and panels, so none of them holds a raw session.
TEST_F(EngineTest, RenderOutputNeedsASessionAndGivesTheDriversSamples) {
    auto& engine = fgen_->Engine();
    EXPECT_THROW(engine.RenderOutput("Channel1", 0, 1e-4, 4), Failure);
    fgen_->Channels()->Add("Channel1")->FuncWaveform(qzivifgenWaveformDC);
    fgen_->Channels()->Item(1)->FuncDCOffset(1.5);
    fgen_->Configure();
    EXPECT_EQ(engine.RenderOutput("Channel1", 0, 1e-4, 4), Render("Channel1", 0, 1e-4, 4));
    EXPECT_EQ(engine.RenderOutput("Channel1", 0, 1e-4, 2), (std::vector<double>{1.5, 1.5}));
    try {
        engine.RenderOutput("Channel7", 0, 1e-4, 2);
        ADD_FAILURE() << "an unknown channel renders nothing";
    } catch (const Failure& f) {
        EXPECT_EQ(f.Source(), "QZIviFgen.RenderOutput");
    }
}

TEST_F(EngineTest, GenerationControlNeedsAConfiguredSession) {
    fgen_->Channels()->Add();
    EXPECT_EQ(Raised([&] { fgen_->Initiate(); }), -31600);
    Open();
    EXPECT_EQ(Raised([&] { fgen_->Initiate(); }), -31601);
    EXPECT_EQ(lastRaised_->Description(),
              "To access this property or method, you must first configure the device by "
              "calling the Configure method. (QZIviFgen.Initiate)");
    EXPECT_EQ(Raised([&] { fgen_->SendSoftwareTrigger(); }), -31601);
    EXPECT_EQ(Raised([&] { fgen_->Abort(); }), 0) << "Abort works on an initialized session";
    EXPECT_EQ(State(), IviStateInitialized);
    fgen_->Configure();
    fgen_->Abort();
    fgen_->Initiate();
    EXPECT_EQ(State(), IviStateConfigured) << "generation control does not change the state";
    fgen_->Enabled(false);
    ivi::TraceRecorder trace;
    fgen_->Abort();
    EXPECT_TRUE(trace.Records().empty());
}

TEST_F(EngineTest, AFailedRunFallsBackAndKeepsWhatWasSent) {
    fgen_->Channels()->Add();
    fgen_->Channels()->Add();
    fgen_->Channels()->Item(1)->FuncFrequency(2500);
    fgen_->Channels()->Item(2)->FuncFrequency(1e9);
    Open();
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -30002);
    EXPECT_EQ(State(), IviStateInitialized);
    ViReal64 frequency = 0;
    IviFgen_GetAttributeViReal64(Vi(), "Channel1", IVIFGEN_ATTR_FUNC_FREQUENCY, &frequency);
    EXPECT_EQ(frequency, 2500) << "the first channel stays configured";
    ViBoolean enabled = VI_TRUE;
    IviFgen_GetAttributeViBoolean(Vi(), "Channel1", IVIFGEN_ATTR_OUTPUT_ENABLED, &enabled);
    EXPECT_EQ(enabled, VI_FALSE) << "the outputs stay disabled after a failure behind the stop";
    EXPECT_EQ(Raised([&] { fgen_->Initiate(); }), -31601);
}

TEST_F(EngineTest, InternalSourcesGoOutOnceAfterTheLoopOnlyWhenAsked) {
    fgen_->Extensions(qzivifgenStdFuncExt | qzivifgenTriggerExt | qzivifgenInternalTriggerExt |
                      qzivifgenModulateAMExt | qzivifgenModulateFMExt);
    const auto a = fgen_->Channels()->Add();
    const auto b = fgen_->Channels()->Add();
    Open();
    ivi::TraceRecorder trace;
    fgen_->Configure();
    auto calls = trace.Functions();
    EXPECT_EQ(Count(calls, "IviFgen_ConfigureAMInternal") +
                  Count(calls, "IviFgen_ConfigureFMInternal") +
                  Count(calls, "IviFgen_ConfigureInternalTriggerRate"),
              0)
        << "no channel asks";
    EXPECT_EQ(Count(calls, "IviFgen_ConfigureAMSource"), 0) << "AM off: no source";
    a->TriggerSource(3);
    a->AMEnabled(true);
    b->FMEnabled(true);
    trace.Clear();
    fgen_->Configure();
    calls = trace.Functions();
    const auto tail = std::vector<std::string>(
        std::find(calls.begin(), calls.end(), "IviFgen_ConfigureAMInternal"), calls.end());
    EXPECT_THAT(tail, ElementsAre("IviFgen_ConfigureAMInternal", "IviFgen_ConfigureFMInternal",
                                  "IviFgen_ConfigureInternalTriggerRate",
                                  "IviFgen_ConfigureOutputEnabled",
                                  "IviFgen_ConfigureOutputEnabled", "IviFgen_InitiateGeneration"));
}

// ---- Waveforms and sequences --------------------------------------------------------------------

TEST_F(EngineTest, WaveformsGoDownOnceAndKeepTheirHandles) {
    fgen_->OutputMode(1);
    const auto ch = fgen_->Channels()->Add();
    const auto w1 = fgen_->Waveforms()->Add("W1");
    w1->Data({0, 0.5, 1, 0.5, 0, -0.5, -1, -0.5});
    fgen_->Waveforms()->Add("W2")->Data(std::vector<double>(8, 0.25));
    Open();
    ivi::TraceRecorder trace;
    fgen_->Configure();
    fgen_->Configure();
    EXPECT_EQ(Count(trace.Functions(), "IviFgen_CreateArbWaveform"), 2)
        << "once per waveform in all";
    EXPECT_EQ(ch->ArbWaveform(), w1) << "a channel without one gets the first, and keeps it";
    EXPECT_NE(w1->WaveformHandle(), 0);
    EXPECT_EQ(Count(trace.Functions(), "IviFgen_ClearArbWaveform"), 1) << "the clear-all, once";
    fgen_->OutputMode(0);
    fgen_->Configure();
    EXPECT_NE(w1->WaveformHandle(), 0) << "kept over modes";
    EXPECT_TRUE(w1->ForceReload());
    fgen_->OutputMode(1);
    trace.Clear();
    fgen_->Configure();
    EXPECT_EQ(Count(trace.Functions(), "IviFgen_CreateArbWaveform"), 1) << "only the reloaded one";
}

TEST_F(EngineTest, NoWaveformAtAllStopsTheFirstChannel) {
    fgen_->OutputMode(1);
    fgen_->Channels()->Add();
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -31622);
    EXPECT_EQ(lastRaised_->Description(), "No waveform found. (QZIviFgen.Configure)");
    fgen_->Extensions(qzivifgenArbWfmExt);
    fgen_->OutputMode(0);
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -31628) << "mode 0 without its extension";
}

TEST_F(EngineTest, ARefusedClearStaysQueuedAndIsTriedAgain) {
    fgen_->OutputMode(1);
    fgen_->Channels()->Add();
    fgen_->Waveforms()->Add("Keep")->Data(std::vector<double>(8, 0.5));
    const auto gone = fgen_->Waveforms()->Add("Gone");
    gone->Data(std::vector<double>(8, -0.5));
    Open("Fail=ClearArbWaveform:0xBFFA2008:2"); // the clear-all, then the first try below
    fgen_->Configure();
    const std::int32_t handle = gone->WaveformHandle();
    fgen_->Waveforms()->Remove("Gone");
    EXPECT_EQ(fgen_->Waveforms()->DeletedHandleCount(), 1);
    ivi::TraceRecorder trace;
    fgen_->Configure();
    std::vector<ViStatus> clears;
    for (const auto& r : trace.Records())
        if (r.function == "IviFgen_ClearArbWaveform") {
            EXPECT_THAT(r.arguments, ::testing::EndsWith(std::to_string(handle)));
            clears.push_back(r.status);
        }
    EXPECT_EQ(clears, (std::vector<ViStatus>{IVIFGEN_ERROR_WFM_IN_USE, VI_SUCCESS}))
        << "refused, then cleared";
    EXPECT_EQ(fgen_->Waveforms()->DeletedHandleCount(), 0);
}

TEST_F(EngineTest, SequenceModePrepassesOnceAndDownloadsEverythingOnce) {
    fgen_->Extensions(qzivifgenArbWfmExt | qzivifgenArbSeqExt);
    fgen_->OutputMode(2);
    const auto ch = fgen_->Channels()->Add();
    const auto a = fgen_->Waveforms()->Add("A");
    a->Data(std::vector<double>(8, 0.5));
    const auto b = fgen_->Waveforms()->Add("B");
    b->Data(std::vector<double>(8, -1.0));
    const auto seq = fgen_->Sequences()->Add("S");
    seq->Add(a, 2);
    seq->Add(b, 1);
    Open();
    std::vector<std::string> modes;
    auto notices = fgen_->Engine().PropSet()->PropertyChange.Connect(
        [&](const std::string& n) { modes.push_back(n); });
    ivi::TraceRecorder trace;
    fgen_->Configure();
    const auto calls = trace.Functions();
    EXPECT_EQ(Count(calls, "IviFgen_GetAttributeViString"), 2) << "two complete runs";
    EXPECT_EQ(Count(calls, "IviFgen_CreateArbWaveform"), 2);
    EXPECT_EQ(Count(calls, "IviFgen_CreateArbSequence"), 1);
    EXPECT_EQ(configured_, 1);
    EXPECT_EQ(modes, (std::vector<std::string>{"OutputMode", "OutputMode"}));
    EXPECT_EQ(fgen_->OutputMode(), 2);
    EXPECT_EQ(ch->Sequence(), seq);
    trace.Clear();
    fgen_->Configure();
    EXPECT_EQ(Count(trace.Functions(), "IviFgen_CreateArbSequence"), 0);
    EXPECT_EQ(Count(trace.Functions(), "IviFgen_GetAttributeViString"), 1) << "no second pre-pass";

    // A new session starts afresh: pre-pass and downloads again.
    fgen_->CloseSession();
    EXPECT_EQ(a->WaveformHandle(), 0);
    EXPECT_EQ(seq->SequenceHandle(), 0);
    Open();
    trace.Clear();
    fgen_->Configure();
    EXPECT_EQ(Count(trace.Functions(), "IviFgen_CreateArbWaveform"), 2);
    EXPECT_EQ(Count(trace.Functions(), "IviFgen_CreateArbSequence"), 1);
}

TEST_F(EngineTest, AFailedPrepassLeavesTheModeAsTheUserSetIt) {
    fgen_->Extensions(qzivifgenArbSeqExt);
    fgen_->OutputMode(2);
    fgen_->Channels()->Add();
    fgen_->Waveforms()->Add("A")->Data(std::vector<double>(8, 0.5));
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -31628)
        << "the pre-pass in mode 1 lacks its extension";
    EXPECT_EQ(fgen_->OutputMode(), 2);
    EXPECT_EQ(Raised([&] { fgen_->Configure(); }), -31616)
        << "no pre-pass again; the sequence is missing";
}

TEST_F(EngineTest, NothingCrashesWhicheverCallTheDriverFails) {
    const char* functions[] = {
        "GetAttributeViString", "AbortGeneration",          "ConfigureOutputEnabled",
        "ConfigureAMEnabled",   "ConfigureFMEnabled",       "ConfigureOutputMode",
        "ClearArbWaveform",     "CreateArbWaveform",        "ConfigureRefClockSource",
        "ConfigureSampleRate",  "ConfigureOutputImpedance", "ConfigureOperationMode",
        "ConfigureArbWaveform", "ConfigureTriggerSource",   "ConfigureBurstCount",
        "InitiateGeneration",   "CheckAttributeViReal64",   "CheckAttributeViInt32"};
    for (const char* function : functions) {
        SCOPED_TRACE(function);
        fgen_ = std::make_unique<QZIviFgen>();
        fgen_->InitProperties();
        fgen_->ExceptionOnError(false);
        fgen_->OutputMode(1);
        fgen_->Extensions(qzivifgenArbWfmExt | qzivifgenTriggerExt | qzivifgenBurstExt);
        fgen_->Channels()->Add()->OperationMode(1);
        fgen_->Waveforms()->Add("W")->Data(std::vector<double>(8, 0.5));
        fgen_->Init(false, false, std::string("DriverSetup=Fail=") + function + ":0xBFFA0001");
        fgen_->Configure();
        EXPECT_TRUE(State() == IviStateConfigured || State() == IviStateInitialized);
        fgen_->Configure();
        fgen_->Initiate();
        fgen_->Abort();
    }
}

// ---- What the outputs carry ---------------------------------------------------------------------

TEST_F(EngineTest, TheOutputsCarryWhatTheTreeDescribes) {
    const auto square = fgen_->Channels()->Add();
    square->FuncWaveform(qzivifgenWaveformSquare);
    square->FuncFrequency(2000);
    square->FuncAmplitude(4);
    square->FuncDCOffset(0.5);
    Open();
    fgen_->Configure();
    const auto v = Render("Channel1", 0.25e-6, 1e-6, 5000);
    const auto high =
        std::count_if(v.begin(), v.end(), [](double x) { return std::fabs(x - 2.5) < 1e-9; });
    const auto low =
        std::count_if(v.begin(), v.end(), [](double x) { return std::fabs(x + 1.5) < 1e-9; });
    EXPECT_EQ(high, 2500) << "period 500 us, the instrument's duty cycle of 50 %";
    EXPECT_EQ(low, 2500);
    fgen_->Abort();
    const auto stopped = Render("Channel1", 0, 1e-5, 100);
    EXPECT_TRUE(std::all_of(stopped.begin(), stopped.end(), [](double x) { return x == 0; }))
        << "nothing after Abort";
}

TEST_F(EngineTest, AnArbitraryWaveformIsScaledAndASequencePlaysInOrder) {
    const std::vector<double> points = {0, 0.5, 1, 0.5, 0, -0.5, -1, -0.5};
    fgen_->Extensions(qzivifgenArbWfmExt | qzivifgenArbSeqExt);
    fgen_->OutputMode(1);
    fgen_->ArbSampleRate(1e6);
    const auto ch = fgen_->Channels()->Add();
    ch->ArbGain(2);
    ch->ArbOffset(0.5);
    const auto w = fgen_->Waveforms()->Add("W");
    w->Data(points);
    Open();
    fgen_->Configure();
    const auto arb = Render("Channel1", 0.5e-6, 1e-6, 16);
    for (std::size_t k = 0; k < arb.size(); ++k)
        EXPECT_DOUBLE_EQ(arb[k], 2 * points[k % 8] + 0.5);

    const auto flat = fgen_->Waveforms()->Add("Flat");
    flat->Data(std::vector<double>(8, -1.0));
    const auto seq = fgen_->Sequences()->Add("S");
    seq->Add(w, 2);
    seq->Add(flat, 3);
    ch->ArbGain(1);
    ch->ArbOffset(0);
    fgen_->OutputMode(2);
    fgen_->Configure();
    const auto played = Render("Channel1", 0.5e-6, 1e-6, 40);
    for (std::size_t k = 0; k < played.size(); ++k)
        EXPECT_DOUBLE_EQ(played[k], k < 16 ? points[k % 8] : -1.0) << k;
}

TEST_F(EngineTest, ABurstOfCyclesFollowsTheSoftwareTrigger) {
    fgen_->Extensions(qzivifgenStdFuncExt | qzivifgenTriggerExt | qzivifgenSoftwareTriggerExt |
                      qzivifgenBurstExt);
    const auto ch = fgen_->Channels()->Add();
    ch->OperationMode(qzivifgenOperateBurst);
    ch->TriggerSource(qzivifgenSoftwareTrigger);
    ch->BurstCount(4);
    Open();
    fgen_->Configure();
    fgen_->SendSoftwareTrigger();
    const auto v = Render("Channel1", 0, 1e-6, 100000);
    std::size_t rising = 0;
    for (std::size_t k = 1; k < v.size(); ++k)
        rising += v[k - 1] <= 0 && v[k] > 0;
    EXPECT_EQ(rising, 4u);
    EXPECT_EQ(State(), IviStateConfigured);
}

// ---- Capability queries -------------------------------------------------------------------------

TEST_F(EngineTest, RangesComeFromTheDriverOrFromTheFallbacks) {
    fgen_->Channels()->Add();
    Open();
    auto& io = fgen_->Engine();
    EXPECT_EQ(io.IviFgenGetRanges(IVIFGEN_ATTR_FUNC_AMPLITUDE, "Channel1"),
              (std::vector<double>{0.001, 10}));
    EXPECT_EQ(io.IviFgenGetRanges(IVIFGEN_ATTR_FUNC_FREQUENCY, "Channel1"),
              (std::vector<double>{1e-6, 50e6}));
    fgen_->Init(false, false, "DriverSetup=NoRanges=1", qziviCloseAndInit);
    EXPECT_EQ(io.IviFgenGetRanges(IVIFGEN_ATTR_FUNC_AMPLITUDE, "Channel1"),
              (std::vector<double>{-10, 10}));
    EXPECT_EQ(io.IviFgenGetRanges(IVIFGEN_ATTR_ARB_GAIN, "Channel1"),
              (std::vector<double>{0.1, 5}));
    EXPECT_EQ(io.IviFgenGetRanges(IVIFGEN_ATTR_FUNC_START_PHASE, "Channel1"),
              (std::vector<double>{0, 0}))
        << "no fallback for it";
    EXPECT_TRUE(errors_.empty() && warnings_.empty()) << "nothing is reported";
}

TEST_F(EngineTest, ValidFunctionsAskTheDriverAndTheCollections) {
    fgen_->Extensions(qzivifgenStdFuncExt | qzivifgenArbWfmExt | qzivifgenArbSeqExt);
    fgen_->Channels()->Add();
    Open("RejectEmptyChannel=1");
    auto& io = fgen_->Engine();
    auto values = [](const std::vector<Variant>& table) {
        std::vector<int> v;
        for (const auto& entry : table)
            v.push_back(entry.IsEmpty() ? -1 : entry.AsInt32());
        return v;
    };
    EXPECT_EQ(values(io.IVIFgenGetValidFunctions(true)),
              (std::vector<int>{-1, -1, -1, -1, -1, -1, 0, 0}))
        << "kept entries are empty before any first call";
    EXPECT_EQ(values(io.IVIFgenGetValidFunctions(false)),
              (std::vector<int>{1, 1, 1, 1, 1, 1, 0, 0}))
        << "channel \"1\" answers where \"\" is refused; no waveforms, no sequences yet";
    fgen_->Waveforms()->Add("W");
    fgen_->Sequences()->Add("S");
    EXPECT_EQ(values(io.IVIFgenGetValidFunctions(true)),
              (std::vector<int>{1, 1, 1, 1, 1, 1, 1, 1}));
    fgen_->Init(false, false,
                "DriverSetup=Fail=CheckAttributeViInt32:0xBFFA0011; Groups=IviFgenBase",
                qziviCloseAndInit);
    EXPECT_EQ(values(io.IVIFgenGetValidFunctions(false)),
              (std::vector<int>{1, 1, 1, 1, 1, 1, 0, 0}))
        << "a check the driver lacks counts as taken; without the groups no arbitrary output";
    fgen_->Extensions(qzivifgenArbWfmExt);
    EXPECT_EQ(values(io.IVIFgenGetValidFunctions(false)),
              (std::vector<int>{0, 0, 0, 0, 0, 0, 0, 0}));
}

TEST_F(EngineTest, AttributesReadInEveryTypeAndReadFailuresRaise) {
    fgen_->Channels()->Add();
    Open();
    auto& io = fgen_->Engine();
    EXPECT_EQ(io.GetAttributeVi(AttrType::String, IVI_ATTR_SPECIFIC_DRIVER_PREFIX, "").AsText(),
              "QZSimFgen");
    EXPECT_EQ(io.GetAttributeVi(AttrType::Int32, IVIFGEN_ATTR_FUNC_WAVEFORM, "Channel1").AsInt32(),
              1);
    EXPECT_EQ(io.GetAttributeVi(AttrType::Boolean, IVI_ATTR_SIMULATE, "").AsInt32(), 1);
    EXPECT_EQ(
        io.GetAttributeVi(AttrType::Real64, IVIFGEN_ATTR_OUTPUT_IMPEDANCE, "Channel2").AsDouble(),
        50);
    EXPECT_TRUE(
        io.CheckAttributeVi(AttrType::Real64, IVIFGEN_ATTR_FUNC_FREQUENCY, 2e7, "Channel1"));
    EXPECT_FALSE(
        io.CheckAttributeVi(AttrType::Real64, IVIFGEN_ATTR_FUNC_FREQUENCY, 2e8, "Channel1"));
    EXPECT_EQ(Raised([&] { io.GetAttributeVi(AttrType::Int32, 1259999, ""); }), -30712);
    EXPECT_EQ(lastRaised_->Source(), "QZIviFgen.GetAttribute");
}

} // namespace
} // namespace qzivi
