// A scripted run over a tree: adds by default and given names, renames (to names in use, case
// variants, nothing), references from channels and sequence items, and removals by position and
// by name. Every CollectionChanged notice a listener sees becomes one line, and the tree's state
// at the end follows. The expected lines were recorded once from the first implementation of the
// collections, so the test proves the notices unchanged.
#pragma once

#include "qzivi/model/CIviFgenPropImp.h"

#include <cstdint>
#include <string>
#include <vector>

namespace qzivi::test {

inline std::vector<std::string> RunNoticeScript(const std::shared_ptr<CIviFgenPropImp>& tree,
                                                int n) {
    std::vector<std::string> lines;
    auto connection = tree->CollectionChanged.Connect([&](const std::string& name, const Variant&,
                                                          std::int32_t kind, const Variant& first,
                                                          const Variant& second) {
        lines.push_back(name + " " + std::to_string(kind) + " " + first.AsText() + " " +
                        second.AsText());
    });
    std::uint32_t state = 12345;
    auto next = [&](std::uint32_t below) {
        state = state * 1664525u + 1013904223u;
        return static_cast<std::int32_t>((state >> 8) % below);
    };
    auto& waveforms = *tree->Waveforms();
    auto& sequences = *tree->Sequences();
    auto& channels = *tree->Channels();
    auto anyWaveform = [&] { return waveforms.At(next(waveforms.Count()) + 1); };

    for (int i = 0; i < n; ++i)
        waveforms.Add();
    for (int i = 0; i < n / 10; ++i)
        waveforms.Add(i % 3 == 0 ? "WAVEFORM" + std::to_string(next(n) + 1)
                                 : "Shape" + std::to_string(next(n / 10 + 1)));
    for (int i = 0; i < 2; ++i)
        channels.Add()->ArbWaveform(anyWaveform());
    for (int s = 0; s < 3; ++s) {
        const auto sequence = sequences.Add(s == 1 ? "Seq" : "");
        for (int i = 0; i < n / 3; ++i)
            sequence->Add(anyWaveform(), next(5) + 1);
    }
    channels.At(1)->Sequence(sequences.At(2));
    for (int i = 0; i < n / 5; ++i) {
        const auto waveform = anyWaveform();
        switch (next(5)) {
        case 0:
            waveform->Name("Waveform" + std::to_string(next(n) + 1)); // a name in use
            break;
        case 1:
            waveform->Name("shape" + std::to_string(next(n / 10 + 1))); // a case variant
            break;
        case 2:
            waveform->Name("");
            break;
        default:
            waveform->Name("Renamed" + std::to_string(i));
        }
    }
    for (int i = 0; i < n / 4; ++i) {
        if (next(3) == 0)
            waveforms.Remove(anyWaveform()->Name());
        else
            waveforms.Remove(next(waveforms.Count()) + 1);
    }
    for (int i = 0; i < n / 10; ++i)
        waveforms.Add();
    sequences.At(1)->Name("Seq");
    sequences.Remove("Seq");
    sequences.At(1)->Remove(1);
    channels.Remove(1);

    for (const auto& waveform : waveforms)
        lines.push_back("waveform " + waveform->Name());
    for (const auto& sequence : sequences) {
        std::string line = "sequence " + sequence->Name();
        for (const auto& item : *sequence)
            line += " " + (item->Waveform() ? item->Waveform()->Name() : std::string("-")) + "x" +
                    std::to_string(item->Iterations());
        lines.push_back(line);
    }
    for (const auto& channel : channels)
        lines.push_back("channel " + channel->Name() + " " +
                        (channel->ArbWaveform() ? channel->ArbWaveform()->Name() : "-") + " " +
                        (channel->Sequence() ? channel->Sequence()->Name() : "-"));
    return lines;
}

} // namespace qzivi::test
