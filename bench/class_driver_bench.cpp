// Calls per second through the IviFgen class driver, set beside the same calls made straight into
// the simulated driver on the very session the class driver opened. Tracing stays off.
#include "IviFgen.h"
#include "QZSimFgen.h"

#include <benchmark/benchmark.h>

#include <cstdlib>

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

} // namespace

BENCHMARK(ConfigureStandardWaveform_Direct);
BENCHMARK(ConfigureStandardWaveform_ClassDriver);
BENCHMARK(GetAttributeViReal64_Direct);
BENCHMARK(GetAttributeViReal64_ClassDriver);
BENCHMARK(ConfigureOutputMode_Direct);
BENCHMARK(ConfigureOutputMode_ClassDriver);
