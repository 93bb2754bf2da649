// Reading 10 million points from waveform data files, set beside the plain baselines:
//   text:     the whole file read at once and parsed with std::from_chars into a vector sized once;
//   integers: the whole file read at once and converted in one loop.
// Peak memory of a text read is taken in a child process, so that nothing else in this program
// counts towards it.
#include "qzivi/model/CDblArrayFromFile.h"

#include <benchmark/benchmark.h>

#include <charconv>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace {

namespace fs = std::filesystem;
constexpr std::size_t kPoints = 10'000'000;

struct Files {
    fs::path dir;
    std::string lines, commas, shorts, longs;

    Files() {
        dir = fs::temp_directory_path() / ("qzivi-bench-" + std::to_string(::getpid()));
        fs::create_directories(dir);
        std::mt19937 random(1);
        std::uniform_real_distribution<double> uniform(-1, 1);
        std::string lineText, commaText;
        std::vector<std::int16_t> s16(kPoints);
        std::vector<std::int32_t> s32(kPoints);
        char number[32];
        for (std::size_t i = 0; i < kPoints; ++i) {
            const double v = uniform(random);
            const int n = std::snprintf(number, sizeof number, "%.6f", v);
            lineText.append(number, static_cast<std::size_t>(n)).append("\r\n");
            commaText.append(number, static_cast<std::size_t>(n))
                .append(i + 1 < kPoints ? "," : "\n");
            s16[i] = static_cast<std::int16_t>(v * 32767);
            s32[i] = static_cast<std::int32_t>(v * 2147483647.0);
        }
        lines = Write("lines.txt", lineText.data(), lineText.size());
        commas = Write("commas.txt", commaText.data(), commaText.size());
        shorts = Write("shorts.bin", s16.data(), s16.size() * 2);
        longs = Write("longs.bin", s32.data(), s32.size() * 4);
    }
    ~Files() { fs::remove_all(dir); }

    std::string Write(const char* name, const void* data, std::size_t size) {
        const auto path = (dir / name).string();
        std::ofstream(path, std::ios::binary)
            .write(static_cast<const char*>(data), static_cast<std::streamsize>(size));
        return path;
    }
};

const Files& TheFiles() {
    static const Files files;
    return files;
}

std::string WholeFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::string text(fs::file_size(path), '\0');
    in.read(text.data(), static_cast<std::streamsize>(text.size()));
    return text;
}

// ---- Text ---------------------------------------------------------------------------------------

void TextBaseline(benchmark::State& state, const std::string& path, char delimiter) {
    for (auto _ : state) {
        const std::string text = WholeFile(path);
        std::vector<double> values;
        values.reserve(kPoints);
        const char* p = text.data();
        const char* end = p + text.size();
        while (p < end) {
            while (p < end && (*p == '\n' || *p == ' '))
                ++p;
            double v = 0;
            const auto [q, error] = std::from_chars(p, end, v);
            if (error == std::errc()) values.push_back(v);
            const char* next = static_cast<const char*>(
                std::memchr(q, delimiter, static_cast<std::size_t>(end - q)));
            p = next != nullptr ? next + 1 : end;
        }
        benchmark::DoNotOptimize(values.data());
        state.counters["points"] = static_cast<double>(values.size());
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(fs::file_size(path)));
}

void Reader(benchmark::State& state, std::int32_t type, const std::string& path,
            std::int32_t interval) {
    const qzivi::CDblArrayFromFile reader;
    for (auto _ : state) {
        const auto values = reader.RetrieveDblArray(type, path, 0, interval, -1);
        benchmark::DoNotOptimize(values.data());
        state.counters["points"] = static_cast<double>(values.size());
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(fs::file_size(path)));
}

void BM_TextLines_Baseline(benchmark::State& s) {
    TextBaseline(s, TheFiles().lines, '\r');
}
void BM_TextLines_Reader(benchmark::State& s) {
    Reader(s, 1, TheFiles().lines, 1);
}
void BM_TextLines_ReaderStep7(benchmark::State& s) {
    Reader(s, 1, TheFiles().lines, 7);
}
void BM_TextCommas_Baseline(benchmark::State& s) {
    TextBaseline(s, TheFiles().commas, ',');
}
void BM_TextCommas_Reader(benchmark::State& s) {
    Reader(s, 1, TheFiles().commas, 1);
}
void BM_TextCommas_ReaderStep7(benchmark::State& s) {
    Reader(s, 1, TheFiles().commas, 7);
}

// ---- Integers -----------------------------------------------------------------------------------

template <typename Int>
void IntegerBaseline(benchmark::State& state, const std::string& path, double scale) {
    for (auto _ : state) {
        const std::string bytes = WholeFile(path);
        std::vector<double> values(bytes.size() / sizeof(Int));
        const auto* ints = reinterpret_cast<const Int*>(bytes.data());
        for (std::size_t i = 0; i < values.size(); ++i)
            values[i] = ints[i] / scale;
        benchmark::DoNotOptimize(values.data());
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(fs::file_size(path)));
}

void BM_Int16_Baseline(benchmark::State& s) {
    IntegerBaseline<std::int16_t>(s, TheFiles().shorts, 32767.0);
}
void BM_Int16_Reader(benchmark::State& s) {
    Reader(s, 2, TheFiles().shorts, 1);
}
void BM_Int16_ReaderStep7(benchmark::State& s) {
    Reader(s, 2, TheFiles().shorts, 7);
}
void BM_Int32_Baseline(benchmark::State& s) {
    IntegerBaseline<std::int32_t>(s, TheFiles().longs, 2147483647.0);
}
void BM_Int32_Reader(benchmark::State& s) {
    Reader(s, 3, TheFiles().longs, 1);
}
void BM_Int32_ReaderStep7(benchmark::State& s) {
    Reader(s, 3, TheFiles().longs, 7);
}

// ---- Peak memory of a text read ----------------------------------------------------------------

void BM_TextLines_PeakMemory(benchmark::State& state) {
    const std::string path = TheFiles().lines;
    for (auto _ : state) {
        const pid_t child = ::fork();
        if (child == 0) {
            const auto values = qzivi::CDblArrayFromFile().RetrieveDblArray(1, path, 0, 1, -1);
            ::_exit(values.size() == kPoints ? 0 : 1);
        }
        int status = 0;
        struct rusage usage {};
        ::wait4(child, &status, 0, &usage);
        const double peakMB = static_cast<double>(usage.ru_maxrss) / 1024.0;
        const double arrayMB = kPoints * sizeof(double) / (1024.0 * 1024.0);
        state.counters["peak_MB"] = peakMB;
        state.counters["array_MB"] = arrayMB;
        state.counters["peak_over_array"] = peakMB / arrayMB;
        if (status != 0) state.SkipWithError("the child read the wrong number of points");
    }
}

} // namespace

BENCHMARK(BM_TextLines_Baseline)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_TextLines_Reader)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_TextLines_ReaderStep7)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_TextCommas_Baseline)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_TextCommas_Reader)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_TextCommas_ReaderStep7)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_Int16_Baseline)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_Int16_Reader)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_Int16_ReaderStep7)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_Int32_Baseline)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_Int32_Reader)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_Int32_ReaderStep7)->Unit(benchmark::kMillisecond)->Iterations(5);
BENCHMARK(BM_TextLines_PeakMemory)->Unit(benchmark::kMillisecond)->Iterations(1);
