// The subcommands of qzfgen. Each takes the words after its name and returns the exit code; a
// misuse throws Misuse, a refusal of the control qzivi::Failure.
#pragma once

#include <span>
#include <string>
#include <vector>

namespace qzfgen {

struct Command {
    const char* name;
    const char* summary;
    const char* usage;
    int (*run)(const std::vector<std::string>& words);
};

std::span<const Command> Commands();

// Writes a plot of `volts`, sampled `rate` times a second, as a PNG picture; false where this
// build has no Qt layer to draw with.
bool WritePlot(const std::string& path, const std::vector<double>& volts, double rate,
               const std::string& title);

} // namespace qzfgen
