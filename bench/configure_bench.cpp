// Configure in standard function mode, one and two channels, set beside the same driver calls
// made straight through the class driver in the same run; and the first Configure with a
// one-million-point waveform, as download throughput.
#include "IviFgen.h"
#include "qzivi/control/QZIviFgen.h"

#include <benchmark/benchmark.h>

#include <cmath>
#include <cstdlib>
#include <fstream>
#include <string>

namespace {

void Quiet() {
    ::setenv("QZIVI_CONFIG_STORE", "", 1);
    ::unsetenv("QZIVI_TRACE");
    ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
}

std::unique_ptr<qzivi::QZIviFgen> Control(int channels) {
    Quiet();
    auto fgen = std::make_unique<qzivi::QZIviFgen>();
    fgen->InitProperties();
    fgen->Extensions(qzivi::qzivifgenStdFuncExt);
    for (int i = 0; i < channels; ++i)
        fgen->Channels()->Add();
    fgen->Init();
    return fgen;
}

void BM_Configure(benchmark::State& state) {
    const auto fgen = Control(static_cast<int>(state.range(0)));
    for (auto _ : state)
        fgen->Configure();
    if (fgen->GetLastIviError() != 0) state.SkipWithError("Configure failed");
}

// The calls a Configure of this tree makes, in its order, with nothing around them.
void BM_SameDriverCalls(benchmark::State& state) {
    const auto fgen = Control(static_cast<int>(state.range(0)));
    const auto vi = static_cast<ViSession>(fgen->SessionHandle());
    std::vector<std::string> names;
    for (const auto& channel : *fgen->Channels())
        names.push_back(channel->Name());
    for (auto _ : state) {
        ViChar capabilities[1000];
        IviFgen_GetAttributeViString(vi, "", IVI_ATTR_GROUP_CAPABILITIES, sizeof capabilities,
                                     capabilities);
        IviFgen_AbortGeneration(vi);
        for (const auto& n : names)
            IviFgen_ConfigureOutputEnabled(vi, n.c_str(), VI_FALSE);
        for (const auto& n : names) {
            IviFgen_ConfigureAMEnabled(vi, n.c_str(), VI_FALSE);
            IviFgen_ConfigureFMEnabled(vi, n.c_str(), VI_FALSE);
        }
        IviFgen_ConfigureOutputMode(vi, 0);
        IviFgen_ConfigureRefClockSource(vi, 0);
        for (const auto& n : names) {
            IviFgen_ConfigureOutputImpedance(vi, n.c_str(), 50);
            IviFgen_ConfigureOperationMode(vi, n.c_str(), 0);
            IviFgen_ConfigureStandardWaveform(vi, n.c_str(), 1, 2, 0, 1000, 0);
        }
        for (const auto& n : names)
            IviFgen_ConfigureOutputEnabled(vi, n.c_str(), static_cast<ViBoolean>(-1));
        benchmark::DoNotOptimize(IviFgen_InitiateGeneration(vi));
    }
}

void BM_FirstConfigureOfAMillionPoints(benchmark::State& state) {
    Quiet();
    qzivi::QZIviFgen fgen;
    fgen.InitProperties();
    fgen.OutputMode(qzivi::qzivifgenOutputArb);
    fgen.ArbSampleRate(100e6);
    fgen.Channels()->Add();
    std::vector<double> points(1'000'000);
    for (std::size_t i = 0; i < points.size(); ++i)
        points[i] = std::sin(2 * 3.141592653589793 * double(i) / 1000.0);
    fgen.Waveforms()->Add("Million")->Data(points);
    for (auto _ : state) {
        state.PauseTiming();
        fgen.Init(false, false, "",
                  qzivi::qziviCloseAndInit); // a fresh session: the waveform goes down again
        state.ResumeTiming();
        fgen.Configure();
    }
    if (fgen.Waveforms()->Item(1)->WaveformHandle() == 0) state.SkipWithError("no download");
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(points.size()));
}

// A field of /proc/self/status in bytes ("VmRSS", "VmHWM").
std::int64_t StatusBytes(const std::string& field) {
    std::ifstream status("/proc/self/status");
    for (std::string line; std::getline(status, line);)
        if (line.rfind(field + ":", 0) == 0)
            return std::stoll(line.substr(field.size() + 1)) * 1024;
    return -1;
}

// The memory that the first Configure of a 10-million-point held waveform takes beyond what
// the process held before it: the peak resident size, reset just before, less the resident size
// then. Counted against the waveform's own bytes; the simulated instrument keeps a copy of the
// points too, as a real one keeps them in its memory.
void BM_ConfigureMemoryOfTenMillionPoints(benchmark::State& state) {
    Quiet();
    constexpr std::size_t kPoints = 10'000'000;
    for (auto _ : state) {
        state.PauseTiming();
        qzivi::QZIviFgen fgen;
        fgen.InitProperties();
        fgen.OutputMode(qzivi::qzivifgenOutputArb);
        fgen.ArbSampleRate(100e6);
        fgen.Channels()->Add();
        std::vector<double> points(kPoints);
        for (std::size_t i = 0; i < points.size(); ++i)
            points[i] = std::sin(double(i) / 1000.0);
        fgen.Waveforms()->Add("Ten million")->Data(std::move(points));
        fgen.Init(false, false, "DriverSetup=MaxWaveformSize=10000000;Memory=20000000");
        const std::int64_t before = StatusBytes("VmRSS");
        std::ofstream("/proc/self/clear_refs") << "5"; // the peak starts again from here
        state.ResumeTiming();
        fgen.Configure();
        state.PauseTiming();
        const std::int64_t peak = StatusBytes("VmHWM");
        if (fgen.Waveforms()->Item(1)->WaveformHandle() == 0) state.SkipWithError("no download");
        const double waveformBytes = double(kPoints * sizeof(double));
        state.counters["extra_MB"] = double(peak - before) / 1e6;
        state.counters["extra_per_waveform_byte"] = double(peak - before) / waveformBytes;
        state.ResumeTiming();
    }
}

} // namespace

BENCHMARK(BM_Configure)->Arg(1)->Arg(2);
BENCHMARK(BM_SameDriverCalls)->Arg(1)->Arg(2);
BENCHMARK(BM_FirstConfigureOfAMillionPoints)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ConfigureMemoryOfTenMillionPoints)->Unit(benchmark::kMillisecond)->Iterations(3);
