// Export and Import of a configuration that holds a 10-million-point persisted waveform, set beside
// writing and reading the same bytes with plain file calls in the same run.
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/model/CIviFgenPropImp.h"

#include <benchmark/benchmark.h>

#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;

struct Fixture {
    std::shared_ptr<qzivi::CIviErrorReport> err;
    std::shared_ptr<qzivi::CIviFgenPropImp> tree;
    std::shared_ptr<qzivi::QZIviConfiguration> config;
    fs::path dir;
    std::string qzc, plain;

    Fixture() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        err = std::make_shared<qzivi::CIviErrorReport>();
        tree = qzivi::CIviFgenPropImp::Create();
        tree->Attach(err);
        tree->InitProperties();
        std::vector<double> points(10'000'000);
        for (std::size_t i = 0; i < points.size(); ++i)
            points[i] = std::sin(double(i) * 0.001);
        tree->Waveforms()->Add("Big")->Data(std::move(points));
        config = tree->Configurations()->Add("Snapshot");
        dir = fs::temp_directory_path() / ("qzivi-config-bench-" + std::to_string(::getpid()));
        fs::create_directories(dir);
        qzc = (dir / "big.qzc").string();
        plain = (dir / "plain.bin").string();
        config->Export(qzc);
    }
    ~Fixture() { fs::remove_all(dir); }
};

Fixture& The() {
    static Fixture fixture;
    return fixture;
}

void BM_Export(benchmark::State& state) {
    auto& f = The();
    for (auto _ : state)
        f.config->Export(f.qzc);
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(fs::file_size(f.qzc)));
}

void PlainWrite(benchmark::State& state, bool sync) {
    auto& f = The();
    const auto& bytes = f.config->Bag();
    for (auto _ : state) {
        std::FILE* file = std::fopen(f.plain.c_str(), "wb");
        std::fwrite(bytes.data(), 1, bytes.size(), file);
        std::fflush(file);
        if (sync) ::fsync(fileno(file));
        std::fclose(file);
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(bytes.size()));
}
void BM_PlainWrite(benchmark::State& state) {
    PlainWrite(state, false);
}
void BM_PlainWriteAndSync(benchmark::State& state) {
    PlainWrite(state, true);
}

void BM_Import(benchmark::State& state) {
    auto& f = The();
    for (auto _ : state)
        f.config->Import(f.qzc);
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(fs::file_size(f.qzc)));
}

void BM_PlainRead(benchmark::State& state) {
    auto& f = The();
    const auto size = fs::file_size(f.qzc);
    for (auto _ : state) {
        std::vector<char> bytes(size);
        std::FILE* file = std::fopen(f.qzc.c_str(), "rb");
        benchmark::DoNotOptimize(std::fread(bytes.data(), 1, bytes.size(), file));
        std::fclose(file);
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(size));
}

} // namespace

BENCHMARK(BM_PlainWrite)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_PlainWriteAndSync)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_Export)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_PlainRead)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_Import)->Unit(benchmark::kMillisecond)->Iterations(5);
