// The one failure type of the system: number, source, description, help file and help context.
#pragma once

#include <cstdint>
#include <stdexcept>
#include <string>

namespace qzivi {

class Failure : public std::runtime_error {
public:
    Failure(std::int32_t number, std::string source, std::string description,
            std::string helpFile = {}, std::int32_t helpContext = 0)
        : std::runtime_error(description), number_(number), source_(std::move(source)),
          description_(std::move(description)), helpFile_(std::move(helpFile)),
          helpContext_(helpContext) {}

    std::int32_t Number() const { return number_; }
    const std::string& Source() const { return source_; }
    const std::string& Description() const { return description_; }
    const std::string& HelpFile() const { return helpFile_; }
    std::int32_t HelpContext() const { return helpContext_; }

private:
    std::int32_t number_;
    std::string source_;
    std::string description_;
    std::string helpFile_;
    std::int32_t helpContext_;
};

// Numbers of failures of the system's own running, where the language it was first written in
// raised them by itself and C++ does not: callers check and raise them explicitly.
namespace runtime {
inline constexpr std::int32_t kOverflow = 6;
inline constexpr std::int32_t kOutOfMemory = 7;
inline constexpr std::int32_t kIndexOutOfRange = 9;
inline constexpr std::int32_t kDivisionByZero = 11;
inline constexpr std::int32_t kWrongType = 13;
inline constexpr std::int32_t kFileNotFound = 53;
inline constexpr std::int32_t kFileAccess = 75;
inline constexpr std::int32_t kImproperFile = 60040;
inline constexpr std::int32_t kFileNotAccessible = 60041;
inline constexpr std::int32_t kTooFewData = 60042;
} // namespace runtime

[[noreturn]] inline void RaiseRuntime(std::int32_t number, std::string description,
                                      std::string source = {}) {
    throw Failure(number, std::move(source), std::move(description));
}

// Runs a step whose failure is ignored, as the host's notices and the user interface's event
// handlers require: what the step would have shown stays as it was.
template <typename F>
void Quietly(F&& step) noexcept {
    try {
        step();
    } catch (...) {
    }
}

} // namespace qzivi
