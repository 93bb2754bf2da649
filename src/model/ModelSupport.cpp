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

std::int64_t DefaultNumberOf(std::string_view name, std::string_view base) {
    if (name.size() <= base.size() || name.size() > base.size() + 10 ||
        !text::EqualsNoCase(name.substr(0, base.size()), base) || name[base.size()] == '0')
        return 0;
    std::int64_t n = 0;
    for (const char c : name.substr(base.size())) {
        if (c < '0' || c > '9') return 0;
        n = n * 10 + (c - '0');
    }
    return n <= 2147483647 ? n : 0;
}

std::size_t NoCaseHash::operator()(std::string_view text) const {
    std::size_t hash = 14695981039346656037ull; // FNV-1a over the folded bytes
    for (const char c : text)
        hash = (hash ^ static_cast<unsigned char>(c >= 'A' && c <= 'Z' ? c + 32 : c)) *
               1099511628211ull;
    return hash;
}

} // namespace qzivi
