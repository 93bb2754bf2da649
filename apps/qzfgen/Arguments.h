// The arguments of one subcommand: positional words and "--name value" options (or "--name=value",
// or "--flag" alone), each checked against what the subcommand takes. A misuse throws Misuse with
// the one line the user sees.
#pragma once

#include <map>
#include <optional>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

namespace qzfgen {

struct Misuse : std::runtime_error {
    using std::runtime_error::runtime_error;
};

class Arguments {
public:
    // `valued` options take a value, `flags` none; anything else is refused.
    Arguments(const std::vector<std::string>& words, const std::set<std::string>& valued,
              const std::set<std::string>& flags);

    const std::vector<std::string>& Positional() const { return m_vPositional; }
    // The one positional word the command needs, named `what` in the message when it is missing.
    std::string Only(const char* what, bool required = true) const;
    // For a command that takes no positional word.
    void NoneMore() const;
    std::optional<std::string> Text(const std::string& option) const;
    std::string Text(const std::string& option, const std::string& fallback) const;
    bool Flag(const std::string& option) const { return m_oFlags.contains(option); }
    // A number, with an optional SI prefix ("2.5k", "10M", "1e-3"); anything else is a misuse.
    std::optional<double> Number(const std::string& option) const;
    double Number(const std::string& option, double fallback) const;
    // A whole number from `low` to `high`.
    long long Whole(const std::string& option, long long fallback, long long low,
                    long long high) const;

private:
    std::vector<std::string> m_vPositional;
    std::map<std::string, std::string> m_oValues;
    std::set<std::string> m_oFlags;
};

// Reads "2.5k" as 2500: the whole text must be a finite number with at most one SI prefix.
std::optional<double> ParseNumber(const std::string& text);

} // namespace qzfgen
