#include "qzivi/model/ModelSupport.h"

#include "qzivi/model/CIviFgenPropImp.h"

namespace qzivi {

std::string PathOf(const CIviFgenPropImp* propSet) {
    return propSet ? propSet->Path() : std::string();
}

void CheckItemCount(std::int32_t count, std::size_t entries, const std::string& key) {
    // An item with every value at its default stores nothing, so a count may exceed the values,
    // but not by this much.
    constexpr std::size_t kSlack = 1000000;
    if (count > 0 && static_cast<std::size_t>(count) > entries + kSlack)
        RaiseRuntime(runtime::kImproperFile, "The property bag claims " + std::to_string(count) +
                                                 " items under \"" + key + "\" but holds only " +
                                                 std::to_string(entries) + " values.");
}

std::int32_t ReadInstrumentLimit(CIviErrorReport& err, const std::string& source,
                                 ViAttr attribute) {
    const std::int32_t saved = err.state();
    std::int32_t value = 0;
    try {
        err.CheckForValidState(IviStateClosed | IviStateBusy, source, true);
        if (saved > 0) {
            const ViStatus status =
                IviFgen_GetAttributeViInt32(err.hSession(), "", attribute, &value);
            err.IviCheckError(status, source, 0, "");
        }
    } catch (...) {
        err.state(saved);
        ReRaise();
    }
    err.state(saved);
    return value;
}

} // namespace qzivi

namespace qzivi {

std::int64_t DefaultNumberOf(std::string_view folded, std::string_view foldedBase) {
    if (folded.size() <= foldedBase.size() || folded.size() > foldedBase.size() + 10 ||
        folded.substr(0, foldedBase.size()) != foldedBase || folded[foldedBase.size()] == '0')
        return 0;
    std::int64_t n = 0;
    for (const char c : folded.substr(foldedBase.size())) {
        if (c < '0' || c > '9') return 0;
        n = n * 10 + (c - '0');
    }
    return n <= 2147483647 ? n : 0;
}

} // namespace qzivi
