// What every class of the object model shares: error-source paths, unique ids, default names and
// the key prefixes of the property bag.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace qzivi {

// Change kinds of CollectionChanged.
enum CollectionChanges : std::int32_t {
    ChangeAdded = 1,
    ChangeRemoved = 2,
    ChangeRenamed = 4,
    ChangeActive = 8,
};

// `parent` with a "." unless it ends in one, then `own` without one leading "." and with a "."
// unless it ends in one.
std::string JoinPath(std::string_view parent, std::string_view own);

// 64 characters of codes 48 to 122, drawn afresh each time.
std::string NewUniqueId();

// `prefix` with "_" unless it is empty or ends in one, then `word` and "_".
std::string BagPrefix(std::string_view prefix, std::string_view word);

// `base` followed by the lowest N from 1 up whose lower-case text no name in `names` has.
template <typename Names>
std::string MakeUniqueName(const Names& names, std::string_view base);

std::string LowerText(std::string_view text);

template <typename Names>
std::string MakeUniqueName(const Names& names, std::string_view base) {
    const std::string lowerBase = LowerText(base);
    for (std::int64_t n = 1; n <= 2147483647; ++n) {
        const std::string candidate = lowerBase + std::to_string(n);
        bool taken = false;
        for (const auto& name : names)
            if (LowerText(name) == candidate) {
                taken = true;
                break;
            }
        if (!taken) return std::string(base) + std::to_string(n);
    }
    return std::string(base);
}

} // namespace qzivi
