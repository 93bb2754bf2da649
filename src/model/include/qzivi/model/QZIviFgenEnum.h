// The display-name tables that the property pages fill their lists from: row 0 the names, row 1
// the values. A column whose extension is off keeps an empty name, and the list leaves it out.
#pragma once

#include "qzivi/support/variant.h"

#include <cstdint>

namespace qzivi {

class QZIviFgenEnum {
public:
    Variant UIStyleNames() const;
    Variant AutoNormalizeNames() const;
    Variant OutputModeNames(std::int32_t extensions) const;
    Variant OperationModeNames(std::int32_t extensions) const;
    Variant RefClockNames() const;
    Variant FuncWaveformNames(std::int32_t extensions) const;
    Variant TriggerSourceNames(std::int32_t extensions) const;
    Variant AMSourceNames(std::int32_t extensions) const;
    Variant AMInternalWaveformNames(std::int32_t extensions) const;
    Variant FMSourceNames(std::int32_t extensions) const;
    Variant FMInternalWaveformNames(std::int32_t extensions) const;
    Variant WaveformSourceNames(std::int32_t extensions) const;
};

} // namespace qzivi
