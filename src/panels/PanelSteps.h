// What the panels' event handlers share: design twips to pixels and the failure of an object that
// is not set.
#pragma once

#include "qzivi/panels/CUiSizingTool.h"
#include "qzivi/support/failure.h"

#include <cmath>
#include <memory>

namespace qzivi::panel {

inline int Px(int twips) {
    return static_cast<int>(std::lround(TwipsToPixels(twips)));
}

// An object the panel goes through: none is the failure of an unset object (91), which the
// handler's step then ignores, as it ignores every other.
template <typename T>
T& Set(const std::shared_ptr<T>& object) {
    if (!object) RaiseRuntime(91, "Object variable not set.");
    return *object;
}

} // namespace qzivi::panel
