// The call trace: what the class driver records, in order, to the in-process sink and to a file.
#include "qzivi/trace.h"
#include "test_support.h"

#include <gmock/gmock.h>

#include <fstream>

using qzivi::ivi::TraceRecorder;
using qzivi::test::Session;
using qzivi::test::StoreScope;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::StartsWith;

namespace {

std::vector<std::string> Lines(const std::string& path) {
    std::ifstream file(path);
    std::vector<std::string> lines;
    for (std::string line; std::getline(file, line);)
        lines.push_back(line);
    return lines;
}

TEST(Trace, RecordsEveryCallInOrderWithArgumentsAndStatus) {
    StoreScope scope;
    TraceRecorder recorder;
    {
        Session s;
        IviFgen_ConfigureStandardWaveform(s.vi(), "Channel1", IVIFGEN_VAL_WFM_SINE, 2, 0, 1e3, 0);
        IviFgen_ConfigureOutputImpedance(s.vi(), "Channel9", 50);
        ViReal64 frequency = 0;
        IviFgen_GetAttributeViReal64(s.vi(), "Channel1", IVIFGEN_ATTR_FUNC_FREQUENCY, &frequency);
    }
    EXPECT_THAT(recorder.Functions(),
                ElementsAre("IviFgen_InitWithOptions", "IviFgen_ConfigureStandardWaveform",
                            "IviFgen_ConfigureOutputImpedance", "IviFgen_GetAttributeViReal64",
                            "IviFgen_close"));
    const auto& r = recorder.Records();
    EXPECT_EQ(r[0].arguments.substr(0, 25), "\"SampleFGen\", 0, 1, \"\", &");
    EXPECT_EQ(r[1].arguments, r[1].arguments.substr(0, r[1].arguments.find(',')) +
                                  ", \"Channel1\", 1, 2, 0, 1000, 0");
    EXPECT_EQ(r[1].status, VI_SUCCESS);
    EXPECT_EQ(r[2].status, IVI_ERROR_UNKNOWN_CHANNEL_NAME);
    EXPECT_THAT(r[2].Line(), ::testing::HasSubstr(") = 0xBFFA0020 ["));
    EXPECT_THAT(r[3].arguments, ::testing::EndsWith("\"Channel1\", 1250104, &1000"));
    for (const auto& record : r)
        EXPECT_THAT(record.Line(), StartsWith(record.function + "("));
}

// A value the trace shows is the value the driver got: short where fifteen digits give it back,
// all seventeen where they would not.
TEST(Trace, ShowsRealsExactly) {
    StoreScope scope;
    Session s;
    TraceRecorder recorder;
    const double knob = 1234.5678901234567;
    IviFgen_ConfigureStandardWaveform(s.vi(), "Channel1", IVIFGEN_VAL_WFM_SINE, 0.1, 0, knob, 0);
    const std::string args = recorder.Records().at(0).arguments;
    EXPECT_THAT(args, HasSubstr(", 1, 0.1, 0, "));
    const std::string shown = args.substr(args.rfind(", ", args.size() - 4) + 2);
    EXPECT_EQ(std::stod(shown), knob) << shown;
}

// A download shows its points by their count and the values at both ends, so that the trace tells
// which waveform went to the instrument.
TEST(Trace, ShowsArraysByLengthAndTheirEnds) {
    StoreScope scope;
    Session s;
    std::vector<ViReal64> points;
    for (int k = 0; k < 10; ++k)
        points.push_back(k / 10.0);
    TraceRecorder recorder;
    ViInt32 wfm = 0, seq = 0;
    ASSERT_EQ(IviFgen_CreateArbWaveform(s.vi(), 10, points.data(), &wfm), VI_SUCCESS);
    const ViInt32 handles[] = {wfm, wfm}, loops[] = {3, 1};
    ASSERT_EQ(IviFgen_CreateArbSequence(s.vi(), 2, handles, loops, &seq), VI_SUCCESS);
    const ViStatus refused = IviFgen_CreateArbWaveform(s.vi(), 2, points.data(), &wfm);
    ASSERT_LT(refused, 0);
    const auto& r = recorder.Records();
    ASSERT_EQ(r.size(), 3u);
    EXPECT_THAT(r[0].arguments,
                HasSubstr(", 10, [10: 0, 0.1, 0.2 ... 0.7, 0.8, 0.9], &" + std::to_string(wfm)));
    const std::string h = std::to_string(wfm);
    EXPECT_THAT(r[1].arguments, HasSubstr(", 2, [2: " + h + ", " + h + "], [2: 3, 1], &"));
    EXPECT_THAT(r[2].arguments, HasSubstr(", 2, [2: 0, 0.1], &?")) << "nothing came back";
    std::vector<ViReal64> volts(8);
    ASSERT_EQ(QZIvi_RenderOutput(s.vi(), "Channel1", 0, 1e-6, 8, volts.data()), VI_SUCCESS);
    EXPECT_THAT(recorder.Records().back().arguments, HasSubstr(", 8, &[8: 0, 0, 0 ... 0, 0, 0]"));
}

TEST(Trace, WritesOneLineACallToTheFileNamedByTheEnvironment) {
    StoreScope scope;
    const std::string path = (scope.Dir() / "io.log").string();
    ::setenv("QZIVI_TRACE", path.c_str(), 1);
    {
        Session s;
        IviFgen_ConfigureOutputMode(s.vi(), IVIFGEN_VAL_OUTPUT_FUNC);
    }
    qzivi::ivi::SetTraceFile("");
    const auto lines = Lines(path);
    ASSERT_EQ(lines.size(), 3u);
    EXPECT_THAT(lines[0], StartsWith("IviFgen_InitWithOptions(\"SampleFGen\""));
    EXPECT_THAT(lines[1], StartsWith("IviFgen_ConfigureOutputMode("));
    EXPECT_THAT(lines[2], StartsWith("IviFgen_close("));
}

TEST(Trace, TheStoreCanSwitchTheFileOn) {
    StoreScope scope;
    const std::string path = (scope.Dir() / "store-trace.log").string();
    scope.UseStore("trace = " + path + "\n[Bench]\nmodule = builtin\n");
    { Session s("", "Bench"); }
    qzivi::ivi::SetTraceFile("");
    EXPECT_THAT(Lines(path), ElementsAre(StartsWith("IviFgen_InitWithOptions(\"Bench\""),
                                         StartsWith("IviFgen_close(")));
}

TEST(Trace, FailedOpensAreTracedToo) {
    StoreScope scope;
    TraceRecorder recorder;
    ViSession vi = 0;
    IviFgen_InitWithOptions("Nowhere", VI_FALSE, VI_FALSE, "", &vi);
    ASSERT_EQ(recorder.Records().size(), 1u);
    EXPECT_EQ(recorder.Records()[0].status, IVI_ERROR_LOGICAL_NAME_NOT_FOUND);
    EXPECT_THAT(recorder.Records()[0].Line(),
                StartsWith("IviFgen_InitWithOptions(\"Nowhere\", 0, 0, \"\", &?) = 0xBFFA1101"));
}

} // namespace
