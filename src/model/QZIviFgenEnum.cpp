#include "qzivi/model/QZIviFgenEnum.h"

#include <initializer_list>
#include <string>
#include <utility>
#include <vector>

namespace qzivi {

namespace {

struct Column {
    const char* name;
    std::int32_t value;
    bool shown = true;
};

Variant Table(std::initializer_list<Column> columns) {
    std::vector<Variant> cells;
    for (const auto& c : columns)
        cells.emplace_back(c.shown ? c.name : "");
    for (const auto& c : columns)
        cells.emplace_back(c.value);
    return Variant::Array(std::move(cells), 2);
}

bool On(std::int32_t extensions, std::int32_t bit) {
    return (extensions & bit) != 0;
}

Variant Waveforms(bool shown) {
    return Table({{"Sine", 1, shown},
                  {"Square", 2, shown},
                  {"Triangle", 3, shown},
                  {"Ramp Up", 4, shown},
                  {"Ramp Down", 5, shown},
                  {"DC", 6, shown}});
}

} // namespace

Variant QZIviFgenEnum::UIStyleNames() const {
    return Table({{"Invisible at Runtime", 0}, {"Allow Control", 1}, {"Display Only", 2}});
}

Variant QZIviFgenEnum::AutoNormalizeNames() const {
    return Table({{"No Auto Normalize", 0}, {"Normalize", 1}, {"Normalize and Remove Offset", 2}});
}

Variant QZIviFgenEnum::OutputModeNames(std::int32_t e) const {
    return Table({{"Standard Function", 0, On(e, 1)},
                  {"Arb Waveform", 1, On(e, 2)},
                  {"Arb Sequence", 2, On(e, 8)}});
}

Variant QZIviFgenEnum::OperationModeNames(std::int32_t e) const {
    return Table({{"Continuous", 0}, {"Burst", 1, On(e, 128)}});
}

Variant QZIviFgenEnum::RefClockNames() const {
    return Table({{"Internal", 0}, {"External", 1}, {"RTSI Clock", 101}});
}

Variant QZIviFgenEnum::FuncWaveformNames(std::int32_t e) const {
    return Waveforms(On(e, 1));
}

Variant QZIviFgenEnum::TriggerSourceNames(std::int32_t e) const {
    const bool t = On(e, 16);
    return Table({{"External", 1, t},
                  {"Software", 2, t && On(e, 64)},
                  {"Internal", 3, t && On(e, 32)},
                  {"TTL0", 111, t},
                  {"TTL1", 112, t},
                  {"TTL2", 113, t},
                  {"TTL3", 114, t},
                  {"TTL4", 115, t},
                  {"TTL5", 116, t},
                  {"TTL6", 117, t},
                  {"TTL7", 118, t},
                  {"ECL0", 119, t},
                  {"ECL1", 120, t},
                  {"PXI Star", 131, t},
                  {"RTSI0", 141, t},
                  {"RTSI1", 142, t},
                  {"RTSI2", 143, t},
                  {"RTSI3", 144, t},
                  {"RTSI4", 145, t},
                  {"RTSI5", 146, t},
                  {"RTSI6", 147, t}});
}

Variant QZIviFgenEnum::AMSourceNames(std::int32_t e) const {
    return Table({{"Internal", 0, On(e, 256)}, {"External", 1, On(e, 256)}});
}

Variant QZIviFgenEnum::AMInternalWaveformNames(std::int32_t e) const {
    return Waveforms(On(e, 256));
}

Variant QZIviFgenEnum::FMSourceNames(std::int32_t e) const {
    return Table({{"Internal", 0, On(e, 512)}, {"External", 1, On(e, 512)}});
}

Variant QZIviFgenEnum::FMInternalWaveformNames(std::int32_t e) const {
    return Waveforms(On(e, 512));
}

Variant QZIviFgenEnum::WaveformSourceNames(std::int32_t e) const {
    const bool w = On(e, 2);
    return Table(
        {{"Persisted", 0, w}, {"ASCIIFile", 1, w}, {"2ByteInteger", 2, w}, {"4ByteInteger", 3, w}});
}

} // namespace qzivi
