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

} // namespace

BENCHMARK(CreateArbWaveform10M_Simulator)->Unit(benchmark::kMillisecond);
BENCHMARK(CreateArbWaveform10M_PlainCopy)->Unit(benchmark::kMillisecond);
BENCHMARK(ConfigureStandardWaveform_Direct);
BENCHMARK(ConfigureStandardWaveform_ClassDriver);
BENCHMARK(GetAttributeViReal64_Direct);
BENCHMARK(GetAttributeViReal64_ClassDriver);
BENCHMARK(ConfigureOutputMode_Direct);
BENCHMARK(ConfigureOutputMode_ClassDriver);
