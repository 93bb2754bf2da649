#include "Arguments.h"

#include <charconv>
#include <cmath>

namespace qzfgen {

Arguments::Arguments(const std::vector<std::string>& words, const std::set<std::string>& valued,
                     const std::set<std::string>& flags) {
    for (std::size_t i = 0; i < words.size(); ++i) {
        const std::string& word = words[i];
        if (word.size() < 3 || word.compare(0, 2, "--") != 0) {
            if (word.size() > 1 && word[0] == '-' && !ParseNumber(word))
                throw Misuse("unknown option \"" + word + "\"");
            m_vPositional.push_back(word);
            continue;
        }
        std::string name = word.substr(2), value;
        const auto equals = name.find('=');
        const bool inlineValue = equals != std::string::npos;
        if (inlineValue) {
            value = name.substr(equals + 1);
            name.resize(equals);
        }
        if (valued.contains(name)) {
            if (!inlineValue) {
                if (i + 1 >= words.size()) throw Misuse("--" + name + " needs a value");
                value = words[++i];
            }
            m_oValues[name] = value;
        } else if (flags.contains(name) && !inlineValue) {
            m_oFlags.insert(name);
        } else {
            throw Misuse("unknown option \"--" + name + "\"");
        }
    }
}

std::string Arguments::Only(const char* what, bool required) const {
    if (m_vPositional.size() > 1)
        throw Misuse("one " + std::string(what) + " only, not \"" + m_vPositional[1] + "\"");
    if (m_vPositional.empty()) {
        if (required) throw Misuse(std::string(what) + " is missing");
        return {};
    }
    return m_vPositional[0];
}

void Arguments::NoneMore() const {
    if (!m_vPositional.empty()) throw Misuse("takes no argument, not \"" + m_vPositional[0] + "\"");
}

std::optional<std::string> Arguments::Text(const std::string& option) const {
    const auto found = m_oValues.find(option);
    if (found == m_oValues.end()) return std::nullopt;
    return found->second;
}

std::string Arguments::Text(const std::string& option, const std::string& fallback) const {
    return Text(option).value_or(fallback);
}

std::optional<double> Arguments::Number(const std::string& option) const {
    const auto text = Text(option);
    if (!text) return std::nullopt;
    const auto value = ParseNumber(*text);
    if (!value) throw Misuse("--" + option + ": \"" + *text + "\" is not a number");
    return value;
}

double Arguments::Number(const std::string& option, double fallback) const {
    return Number(option).value_or(fallback);
}

long long Arguments::Whole(const std::string& option, long long fallback, long long low,
                           long long high) const {
    const auto value = Number(option);
    if (!value) return fallback;
    if (*value != std::floor(*value) || *value < static_cast<double>(low) ||
        *value > static_cast<double>(high))
        throw Misuse("--" + option + ": " + *Text(option) + " is not a whole number from " +
                     std::to_string(low) + " to " + std::to_string(high));
    return static_cast<long long>(*value);
}

std::optional<double> ParseNumber(const std::string& text) {
    double value = 0;
    const char* begin = text.data();
    const char* end = begin + text.size();
    const auto [stop, error] = std::from_chars(begin, end, value);
    if (error != std::errc() || stop == begin) return std::nullopt;
    if (stop != end) {
        static const std::pair<char, double> kPrefixes[] = {{'G', 1e9},  {'M', 1e6},  {'k', 1e3},
                                                            {'m', 1e-3}, {'u', 1e-6}, {'n', 1e-9}};
        if (end - stop != 1) return std::nullopt;
        bool known = false;
        for (const auto& [prefix, scale] : kPrefixes)
            if (*stop == prefix) {
                value *= scale;
                known = true;
            }
        if (!known) return std::nullopt;
    }
    if (!std::isfinite(value)) return std::nullopt;
    return value;
}

} // namespace qzfgen
