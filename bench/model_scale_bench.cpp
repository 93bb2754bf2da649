// The object model at scale: adding waveforms by default name, finding one by name, a long
// sequence built and written and read, removing every other waveform from under a sequence that
// uses them all, and a snapshot of the tree; each at n = 1k, 10k and 100k.
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/PropertyBag.h"

#include <benchmark/benchmark.h>

#include <cstdlib>

namespace {

using qzivi::CIviFgenPropImp;

std::shared_ptr<CIviFgenPropImp> NewTree() {
    ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
    static const auto err = std::make_shared<qzivi::CIviErrorReport>();
    auto tree = CIviFgenPropImp::Create();
    tree->Attach(err);
    tree->InitProperties();
    tree->ExceptionOnError(true);
    return tree;
}

// n held waveforms of eight points each, with default names.
void AddWaveforms(CIviFgenPropImp& tree, std::int64_t n) {
    for (std::int64_t i = 0; i < n; ++i)
        tree.Waveforms()->Add()->Data({0, 0.5, 1, 0.5, 0, -0.5, -1, -0.5});
}

void BM_AddWithDefaultNames(benchmark::State& state) {
    for (auto _ : state) {
        state.PauseTiming();
        auto tree = NewTree();
        state.ResumeTiming();
        for (std::int64_t i = 0; i < state.range(0); ++i)
            benchmark::DoNotOptimize(tree->Waveforms()->Add());
        state.PauseTiming();
        tree.reset();
        state.ResumeTiming();
    }
    state.SetComplexityN(state.range(0));
}

void BM_ItemByName(benchmark::State& state) {
    auto tree = NewTree();
    AddWaveforms(*tree, state.range(0));
    const std::string last = "waveform" + std::to_string(state.range(0));
    for (auto _ : state)
        benchmark::DoNotOptimize(tree->Waveforms()->Item(last));
    state.SetComplexityN(state.range(0));
}

void BM_SequenceBuildWriteRead(benchmark::State& state) {
    for (auto _ : state) {
        auto tree = NewTree();
        AddWaveforms(*tree, 4);
        const auto sequence = tree->Sequences()->Add();
        for (std::int64_t i = 0; i < state.range(0); ++i)
            sequence->Add(tree->Waveforms()->At(static_cast<std::int32_t>(i % 4 + 1)), 1);
        qzivi::PropertyBag bag;
        tree->WriteProperties(bag, "", false);
        auto copy = NewTree();
        copy->ReadProperties(bag, "", false);
        benchmark::DoNotOptimize(copy->Sequences()->At(1)->Count());
    }
    state.SetComplexityN(state.range(0));
}

void BM_RemoveEveryOtherUnderASequence(benchmark::State& state) {
    for (auto _ : state) {
        state.PauseTiming();
        auto tree = NewTree();
        AddWaveforms(*tree, state.range(0));
        const auto sequence = tree->Sequences()->Add();
        for (const auto& waveform : *tree->Waveforms())
            sequence->Add(waveform, 1);
        state.ResumeTiming();
        const auto& waveforms = *tree->Waveforms();
        for (std::int32_t position = 2; position <= waveforms.Count(); ++position)
            tree->Waveforms()->Remove(position);
        benchmark::DoNotOptimize(sequence->Count());
        state.PauseTiming();
        tree.reset();
        state.ResumeTiming();
    }
    state.SetComplexityN(state.range(0));
}

void BM_SnapshotAddAndLoad(benchmark::State& state) {
    auto tree = NewTree();
    AddWaveforms(*tree, state.range(0));
    const auto sequence = tree->Sequences()->Add();
    for (const auto& waveform : *tree->Waveforms())
        sequence->Add(waveform, 1);
    for (auto _ : state) {
        const auto snapshot = tree->Configurations()->Add("Snapshot");
        snapshot->Load();
        tree->Configurations()->Remove(1);
    }
    state.SetComplexityN(state.range(0));
}

#define QZIVI_SCALE(bm)                                                                            \
    BENCHMARK(bm)->Arg(1000)->Arg(10000)->Arg(100000)->Unit(benchmark::kMillisecond)
QZIVI_SCALE(BM_AddWithDefaultNames);
BENCHMARK(BM_ItemByName)->Arg(1000)->Arg(10000)->Arg(100000);
QZIVI_SCALE(BM_SequenceBuildWriteRead);
QZIVI_SCALE(BM_RemoveEveryOtherUnderASequence);
QZIVI_SCALE(BM_SnapshotAddAndLoad);

} // namespace
