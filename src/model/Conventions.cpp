#include "qzivi/model/Conventions.h"

#include "qzivi/support/text.h"

#include <chrono>
#include <cmath>
#include <random>

namespace qzivi {

std::string JoinPath(std::string_view parent, std::string_view own) {
    std::string path(parent);
    if (path.empty() || path.back() != '.') path += '.';
    if (!own.empty()) {
        if (own.front() == '.') own.remove_prefix(1);
        path += own;
        if (path.back() != '.') path += '.';
    }
    return path;
}

std::string NewUniqueId() {
    // Seeded from the clock each time, as the ids were first drawn; the counter keeps two ids
    // drawn within one clock tick apart. SplitMix64 steps: a tree of many thousand objects
    // draws as many ids, so each must be cheap.
    static std::uint64_t counter = 0;
    std::uint64_t state =
        static_cast<std::uint64_t>(
            std::chrono::high_resolution_clock::now().time_since_epoch().count()) ^
        (++counter * 0x9E3779B97F4A7C15ull);
    std::string id(64, '0');
    for (char& c : id) {
        std::uint64_t z = (state += 0x9E3779B97F4A7C15ull);
        z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9ull;
        z = (z ^ (z >> 27)) * 0x94D049BB133111EBull;
        z ^= z >> 31;
        const double uniform = static_cast<double>(z >> 11) * 0x1.0p-53;
        c = static_cast<char>(48 + std::lround(uniform * 74));
    }
    return id;
}

std::string BagPrefix(std::string_view prefix, std::string_view word) {
    std::string result(prefix);
    if (!result.empty() && result.back() != '_') result += '_';
    return result + std::string(word) + "_";
}

std::string LowerText(std::string_view text) {
    return text::Lower(text);
}

} // namespace qzivi
