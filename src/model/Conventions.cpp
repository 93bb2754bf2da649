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
    // drawn within one clock tick apart.
    static std::uint64_t counter = 0;
    const auto ticks = static_cast<std::uint64_t>(
        std::chrono::high_resolution_clock::now().time_since_epoch().count());
    std::mt19937_64 generator(ticks ^ (++counter * 0x9E3779B97F4A7C15ull));
    std::uniform_real_distribution<double> uniform(0.0, 1.0);
    std::string id(64, '0');
    for (char& c : id)
        c = static_cast<char>(48 + std::lround(uniform(generator) * 74));
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
