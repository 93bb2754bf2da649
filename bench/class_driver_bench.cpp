// Calls per second through the IviFgen class driver, set beside the same calls made straight into
// the simulated driver on the very session the class driver opened. Tracing stays off.
#include "IviFgen.h"
#include "QZSimFgen.h"

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>
#include <memory>
#include <vector>

namespace {

struct Sessions {
    ViSession classVi = 0;
    ViSession specificVi = 0;
    Sessions() {
        ::setenv("QZIVI_CONFIG_STORE", "", 1);
        ::unsetenv("QZIVI_TRACE");
        if (IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_TRUE, "", &classVi) != VI_SUCCESS ||
            IviFgen_GetSpecificDriverCHandle(classVi, &specificVi) != VI_SUCCESS)
            std::abort();
    }
    ~Sessions() { IviFgen_close(classVi); }
};

Sessions& Open() {
    static Sessions sessions;
    return sessions;
}

void ConfigureStandardWaveform_ClassDriver(benchmark::State& state) {
    const ViSession vi = Open().classVi;
    double f = 1000;
    for (auto _ : state) {
        f = f < 2e6 ? f + 1 : 1000;
        benchmark::DoNotOptimize(IviFgen_ConfigureStandardWaveform(
            vi, "Channel1", IVIFGEN_VAL_WFM_SINE, 2.0, 0.0, f, 0.0));
    }
}

void ConfigureStandardWaveform_Direct(benchmark::State& state) {
    const ViSession vi = Open().specificVi;
    double f = 1000;
    for (auto _ : state) {
        f = f < 2e6 ? f + 1 : 1000;
        benchmark::DoNotOptimize(
            QZSimFgen_ConfigureStandardWaveform(vi, "1", IVIFGEN_VAL_WFM_SINE, 2.0, 0.0, f, 0.0));
    }
}

void GetAttributeViReal64_ClassDriver(benchmark::State& state) {
    const ViSession vi = Open().classVi;
    ViReal64 value = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(
            IviFgen_GetAttributeViReal64(vi, "Channel2", IVIFGEN_ATTR_FUNC_FREQUENCY, &value));
    }
}

void GetAttributeViReal64_Direct(benchmark::State& state) {
    const ViSession vi = Open().specificVi;
    ViReal64 value = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(
            QZSimFgen_GetAttributeViReal64(vi, "2", IVIFGEN_ATTR_FUNC_FREQUENCY, &value));
    }
}

void ConfigureOutputMode_ClassDriver(benchmark::State& state) {
    const ViSession vi = Open().classVi;
    for (auto _ : state)
        benchmark::DoNotOptimize(IviFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_FUNC));
}

void ConfigureOutputMode_Direct(benchmark::State& state) {
    const ViSession vi = Open().specificVi;
    for (auto _ : state)
        benchmark::DoNotOptimize(QZSimFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_FUNC));
}

// A 10-million-point download: the simulator checks the range of each point as it copies it,
// set beside a plain copy of the same points into new memory.
std::vector<ViReal64>& BigWaveform() {
    static std::vector<ViReal64> points = [] {
        std::vector<ViReal64> p(10'000'000);
        for (std::size_t i = 0; i < p.size(); ++i)
            p[i] = static_cast<double>(i % 2000) / 1000.0 - 1.0;
        return p;
    }();
    return points;
}

void CreateArbWaveform10M_Simulator(benchmark::State& state) {
    ViSession vi = 0;
    if (QZSimFgen_InitWithOptions("", VI_FALSE, VI_TRUE,
                                  "DriverSetup=MaxWaveformSize=10000000;Memory=10000000",
                                  &vi) != VI_SUCCESS)
        std::abort();
    const auto& points = BigWaveform();
    for (auto _ : state) {
        ViInt32 handle = 0;
        QZSimFgen_CreateArbWaveform(vi, static_cast<ViInt32>(points.size()), points.data(),
                                    &handle);
        state.PauseTiming();
        QZSimFgen_ClearArbWaveform(vi, handle);
        state.ResumeTiming();
    }
    QZSimFgen_close(vi);
}

void CreateArbWaveform10M_PlainCopy(benchmark::State& state) {
    const auto& points = BigWaveform();
    for (auto _ : state) {
        auto copy = std::make_unique_for_overwrite<double[]>(points.size());
        std::memcpy(copy.get(), points.data(), points.size() * sizeof(double));
        benchmark::DoNotOptimize(copy.get());
        state.PauseTiming();
        copy.reset();
        state.ResumeTiming();
    }
}

// What the scope view asks for at each refresh: 2000 samples of a channel playing a sequence of
// `range(0)` steps of 64-point waveforms (as many different ones as the instrument holds).
void RenderOutput_Sequence(benchmark::State& state) {
    const auto steps = static_cast<ViInt32>(state.range(0));
    ViSession vi = 0;
    if (QZSimFgen_InitWithOptions("", VI_FALSE, VI_TRUE, "", &vi) != VI_SUCCESS) std::abort();
    std::vector<ViInt32> handles(static_cast<std::size_t>(steps));
    std::vector<ViReal64> points(64);
    for (std::size_t k = 0; k < handles.size(); ++k) {
        if (k >= 256) {
            handles[k] = handles[k % 256];
            continue;
        }
        for (std::size_t i = 0; i < points.size(); ++i)
            points[i] = static_cast<double>((i + k) % 64) / 32.0 - 1.0;
        if (QZSimFgen_CreateArbWaveform(vi, 64, points.data(), &handles[k]) != VI_SUCCESS)
            std::abort();
    }
    const std::vector<ViInt32> loops(handles.size(), 2);
    ViInt32 sequence = 0;
    if (QZSimFgen_CreateArbSequence(vi, steps, handles.data(), loops.data(), &sequence) !=
            VI_SUCCESS ||
        QZSimFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_SEQ) != VI_SUCCESS ||
        QZSimFgen_ConfigureArbSequence(vi, "1", sequence, 1.0, 0.0) != VI_SUCCESS ||
        QZSimFgen_ConfigureOutputEnabled(vi, "1", VI_TRUE) != VI_SUCCESS ||
        QZSimFgen_InitiateGeneration(vi) != VI_SUCCESS)
        std::abort();
    // The view spans the whole sequence, so every step is played.
    std::vector<ViReal64> volts(2000);
    const double step = 2.0 * 64 * steps / 1e6 / static_cast<double>(volts.size());
    for (auto _ : state) {
        QZSimFgen_RenderOutput(vi, "1", 0, step, static_cast<ViInt32>(volts.size()), volts.data());
        benchmark::DoNotOptimize(volts.data());
    }
    QZSimFgen_close(vi);
}

} // namespace

BENCHMARK(RenderOutput_Sequence)->Arg(1)->Arg(64)->Arg(1024)->Unit(benchmark::kMicrosecond);
BENCHMARK(CreateArbWaveform10M_Simulator)->Unit(benchmark::kMillisecond);
BENCHMARK(CreateArbWaveform10M_PlainCopy)->Unit(benchmark::kMillisecond);
BENCHMARK(ConfigureStandardWaveform_Direct);
BENCHMARK(ConfigureStandardWaveform_ClassDriver);
BENCHMARK(GetAttributeViReal64_Direct);
BENCHMARK(GetAttributeViReal64_ClassDriver);
BENCHMARK(ConfigureOutputMode_Direct);
BENCHMARK(ConfigureOutputMode_ClassDriver);
