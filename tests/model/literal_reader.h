// The rules of the waveform data readers taken word for word, slow and independent of the
// readers: the tests and the data file fuzzer compare the readers with them.
#pragma once

#include "qzivi/model/CDblArrayFromFile.h"

#include <cctype>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <optional>
#include <string>
#include <vector>

// The model is no target of a fuzzer's search: its branches are left out of the coverage.
#if defined(__clang__)
#define QZIVI_LITERAL __attribute__((no_sanitize("coverage")))
#else
#define QZIVI_LITERAL
#endif

namespace qzivi::test {

// The text reader: whole blocks of 10000 characters padded with NUL, split into tokens, each
// token converted on its own.
struct Literal {
    std::optional<std::vector<double>> values; // nothing: no data
    bool cutFails = false;
};

QZIVI_LITERAL inline bool Convert(std::string token, double& out) {
    token = token.substr(0, token.find('\0'));
    const auto first = token.find_first_not_of(" \t\n\r\v\f");
    if (first == std::string::npos) return false;
    token = token.substr(first, token.find_last_not_of(" \t\n\r\v\f") - first + 1);
    std::size_t at = token[0] == '+' || token[0] == '-' ? 1 : 0;
    if (at >= token.size() ||
        !(std::isdigit(static_cast<unsigned char>(token[at])) || token[at] == '.'))
        return false;
    if (token.find_first_of("xXpP") != std::string::npos) return false;
    char* end = nullptr;
    out = std::strtod(token.c_str(), &end);
    return end == token.c_str() + token.size() && std::isfinite(out);
}

QZIVI_LITERAL inline std::vector<std::string> Split(const std::string& text, char delimiter) {
    std::vector<std::string> tokens(1);
    for (char c : text) {
        if (c == delimiter)
            tokens.emplace_back();
        else
            tokens.back().push_back(c);
    }
    return tokens;
}

QZIVI_LITERAL inline Literal LiteralRead(const std::string& file, std::int64_t start,
                                         std::int64_t interval, std::int64_t count) {
    const std::size_t B = 10000;
    auto block = [&](std::size_t k) {
        std::string b = k * B < file.size() ? file.substr(k * B, B) : std::string();
        b.resize(B, '\0');
        return b;
    };
    std::string text = block(0);
    const std::string delimiter = CDblArrayFromFile::FindDelimiter(text);
    if (delimiter.empty()) return {};
    const char d = delimiter[0];
    const std::size_t firstDigit = text.find_first_of("0123456789");
    if (interval <= 0 || start < 0) return {}; // the division, or a token before the first, fails
    std::vector<double> out;
    if (file.size() <= B) {
        const auto tokens = Split(text.substr(firstDigit), d);
        const auto t = std::int64_t(tokens.size());
        const std::int64_t available = t > start ? (t - start + interval - 1) / interval : 0;
        const std::int64_t limit = count == -1 ? available : count;
        if (limit <= 0) return {};
        if (count != -1 && limit > available) return {};
        for (std::int64_t i = start;
             i <= std::int64_t(tokens.size()) - 1 && std::int64_t(out.size()) < limit;
             i += interval) {
            double v;
            if (Convert(tokens[std::size_t(i)], v)) out.push_back(v);
        }
        if (out.empty()) return {std::nullopt, true};
        return {out, false};
    }
    const std::int64_t limit = count == -1 ? std::int64_t(file.size()) : count;
    std::size_t skip = firstDigit;
    for (std::size_t k = 0;; ++k) {
        const std::size_t cut = text.rfind(d);
        const std::string body = cut == std::string::npos ? text : text.substr(0, cut + 1);
        const std::string tail = cut == std::string::npos ? std::string() : text.substr(cut + 1);
        const auto tokens = Split(body.substr(skip), d);
        for (std::int64_t i = k == 0 ? start : 0;
             i <= std::int64_t(tokens.size()) - 1 && std::int64_t(out.size()) < limit;
             i += interval) {
            double v;
            if (Convert(tokens[std::size_t(i)], v)) out.push_back(v);
        }
        if ((k + 1) * B >= file.size()) {
            if (count != -1 && limit >= std::int64_t(out.size()) + 1) return {};
            if (out.empty()) return {};
            return {out, false};
        }
        text = tail + block(k + 1);
        skip = 0;
    }
}

// An integer reader: the count from the elements the file holds, by integer division.
template <typename Int>
QZIVI_LITERAL std::optional<std::vector<double>>
LiteralIntegers(const std::string& file, std::int64_t start, std::int64_t interval,
                std::int64_t count, double scale) {
    const std::int64_t n = std::int64_t(file.size() / sizeof(Int));
    if (interval == 0) return std::nullopt;
    const std::int64_t available = n / interval - start / interval;
    const std::int64_t points = count == -1 ? available : count;
    if (points > available || points <= 0 || start < 0 || interval < 0) return std::nullopt;
    std::vector<double> out;
    for (std::int64_t i = 0; i < points; ++i) {
        const std::int64_t at = start + i * interval;
        if (at >= n) return std::nullopt;
        Int value;
        std::memcpy(&value, file.data() + at * std::int64_t(sizeof(Int)), sizeof(Int));
        out.push_back(value / scale);
    }
    return out;
}

} // namespace qzivi::test
