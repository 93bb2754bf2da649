#include "qzivi/model/ModelSupport.h"

#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/PropertyBag.h"

namespace qzivi {

std::string PathOf(const CIviFgenPropImp* propSet) {
    return propSet ? propSet->Path() : std::string();
}

void CheckItemCounts(const PropertyBag& bag) {
    // An item with every value at its default stores nothing, so the counts may claim more items
    // than the bag holds values, but only by a margin: an item worth keeping stores its name or
    // its waveform, and a load stays a matter of moments and kilobytes.
    constexpr std::int64_t kImpliedItems = 4096;
    std::int64_t claimed = 0;
    std::string largest;
    std::int32_t largestCount = 0;
    for (const auto& name : bag.Names()) {
        // Keys are found whatever their case, so they are counted whatever their case.
        const auto endsWith = [&](std::string_view tail) {
            return name.size() >= tail.size() &&
                   text::EqualsNoCase(std::string_view(name).substr(name.size() - tail.size()),
                                      tail);
        };
        if (!endsWith("ItemCount") && !endsWith("Config_Count")) continue;
        std::int32_t count = 0;
        try {
            count = bag.ReadInt32(name, 0);
        } catch (const Failure&) {
            continue; // no number: refused with its type where the tree reads it
        }
        if (count <= 0) continue;
        claimed += count;
        if (count > largestCount) largestCount = count, largest = name;
    }
    const auto entries = static_cast<std::int64_t>(bag.Size());
    if (claimed > entries + kImpliedItems)
        RaiseRuntime(runtime::kImproperFile, "The property bag claims " + std::to_string(claimed) +
                                                 " items (" + std::to_string(largestCount) +
                                                 " under \"" + largest + "\") but holds only " +
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
