#include "Scpi.h"

#include <cctype>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>

namespace qzivi::scpi {

namespace {

std::string Upper(std::string_view text) {
    std::string out(text);
    for (char& c : out)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return out;
}

std::string_view Trim(std::string_view text) {
    while (!text.empty() && std::isspace(static_cast<unsigned char>(text.front())))
        text.remove_prefix(1);
    while (!text.empty() && std::isspace(static_cast<unsigned char>(text.back())))
        text.remove_suffix(1);
    return text;
}

bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}

// The end of the definite-length block that starts at `at` ('#'), or 0 when the bytes there are
// no such block's header; `complete` tells whether the header itself is all there.
std::size_t BlockEnd(std::string_view text, std::size_t at, bool& complete) {
    complete = false;
    if (at + 1 >= text.size()) return 0;
    const char d = text[at + 1];
    if (d < '1' || d > '9') {
        complete = true;
        return 0;
    }
    const auto digits = static_cast<std::size_t>(d - '0');
    if (at + 2 + digits > text.size()) return 0;
    complete = true;
    std::size_t length = 0;
    for (std::size_t i = at + 2; i < at + 2 + digits; ++i) {
        if (!IsDigit(text[i])) return 0;
        length = length * 10 + static_cast<std::size_t>(text[i] - '0');
    }
    return at + 2 + digits + length;
}

// Splits `text` at `separator` outside strings and blocks.
std::vector<std::string_view> SplitOutside(std::string_view text, char separator) {
    std::vector<std::string_view> parts;
    std::size_t start = 0;
    char quote = 0;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        if (quote != 0) {
            if (c == quote) quote = 0;
        } else if (c == '"' || c == '\'') {
            quote = c;
        } else if (c == '#') {
            bool complete = false;
            if (const std::size_t end = BlockEnd(text, i, complete); end > 0)
                i = std::min(end, text.size()) - 1;
        } else if (c == separator) {
            parts.push_back(text.substr(start, i - start));
            start = i + 1;
        }
    }
    parts.push_back(text.substr(start));
    return parts;
}

Parameter ReadParameter(std::string_view text) {
    text = Trim(text);
    if (text.empty()) throw Error{-109, "Missing parameter"};
    Parameter p;
    if (text.front() == '"' || text.front() == '\'') {
        const char quote = text.front();
        p.kind = ParamKind::String;
        std::size_t i = 1;
        for (; i < text.size(); ++i) {
            if (text[i] != quote) {
                p.value.push_back(text[i]);
            } else if (i + 1 < text.size() && text[i + 1] == quote) {
                p.value.push_back(quote); // a doubled quote stands for itself
                ++i;
            } else {
                break;
            }
        }
        if (i + 1 != text.size()) throw Error{-151, "Invalid string data"};
        return p;
    }
    if (text.front() == '#') {
        p.kind = ParamKind::Block;
        if (text.size() >= 2 && text[1] == '0') { // indefinite: to the end of the message
            p.value = std::string(text.substr(2));
            return p;
        }
        bool complete = false;
        const std::size_t end = BlockEnd(text, 0, complete);
        if (end == 0 || end > text.size()) throw Error{-161, "Invalid block data"};
        if (!Trim(text.substr(end)).empty()) throw Error{-161, "Invalid block data"};
        const std::size_t digits = static_cast<std::size_t>(text[1] - '0');
        p.value = std::string(text.substr(2 + digits, end - 2 - digits));
        return p;
    }
    p.value = std::string(text);
    return p;
}

// One node of a header: letters, then an optional number.
std::string ReadNode(std::string_view node) {
    if (node.empty()) throw Error{-102, "Syntax error"};
    std::size_t i = 0;
    while (i < node.size() && (std::isalpha(static_cast<unsigned char>(node[i])) || node[i] == '_'))
        ++i;
    if (i == 0) throw Error{-102, "Syntax error"};
    if (i > 12) throw Error{-112, "Program mnemonic too long"};
    for (std::size_t j = i; j < node.size(); ++j)
        if (!IsDigit(node[j])) throw Error{-102, "Syntax error"};
    return Upper(node);
}

using PatternNode = Pattern::Node;

std::vector<PatternNode> ReadPattern(std::string_view pattern) {
    std::vector<PatternNode> nodes;
    bool optional = false;
    std::string word;
    auto flush = [&] {
        if (word.empty()) return;
        PatternNode n;
        n.optional = optional;
        if (word.back() == '#') {
            n.suffix = true;
            word.pop_back();
        }
        for (char c : word)
            if (std::isupper(static_cast<unsigned char>(c)) || IsDigit(c)) n.shortForm += c;
        n.longForm = Upper(word);
        nodes.push_back(std::move(n));
        word.clear();
    };
    for (char c : pattern) {
        if (c == '[' || c == ']' || c == ':') {
            flush();
            if (c == '[') optional = true;
            if (c == ']') optional = false;
        } else {
            word += c;
        }
    }
    flush();
    return nodes;
}

bool NodeMatches(const PatternNode& p, std::string_view node, int* suffix) {
    std::size_t letters = 0;
    while (letters < node.size() && !IsDigit(node[letters]))
        ++letters;
    const std::string_view word = node.substr(0, letters);
    if (word != p.shortForm && word != p.longForm) return false;
    if (letters == node.size()) {
        if (p.suffix && suffix != nullptr) *suffix = 1;
        return true;
    }
    if (!p.suffix) return false;
    int value = 0;
    const auto [end, error] =
        std::from_chars(node.data() + letters, node.data() + node.size(), value);
    if (error != std::errc() || end != node.data() + node.size()) return false;
    if (suffix != nullptr) *suffix = value;
    return true;
}

bool MatchFrom(std::span<const PatternNode> pattern, std::span<const std::string> nodes,
               int* suffix) {
    if (pattern.empty()) return nodes.empty();
    const PatternNode& first = pattern.front();
    if (first.optional && MatchFrom(pattern.subspan(1), nodes, suffix)) return true;
    int value = 0;
    if (!nodes.empty() && NodeMatches(first, nodes.front(), &value) &&
        MatchFrom(pattern.subspan(1), nodes.subspan(1), suffix)) {
        if (first.suffix && suffix != nullptr) *suffix = value;
        return true;
    }
    return false;
}

bool WordIs(std::string_view upper, std::string_view notation) {
    std::string shortForm;
    for (char c : notation)
        if (std::isupper(static_cast<unsigned char>(c)) || IsDigit(c)) shortForm += c;
    return upper == shortForm || upper == Upper(notation);
}

} // namespace

MessageReader::Got MessageReader::Next(std::string& message) {
    std::size_t i = scanned_;
    while (i < buffer_.size()) {
        if (blockEnd_ > 0) {
            if (blockEnd_ > buffer_.size()) {
                i = buffer_.size();
                break;
            }
            i = blockEnd_;
            blockEnd_ = 0;
            continue;
        }
        const char c = buffer_[i];
        if (quote_ != 0) {
            if (c == quote_) quote_ = 0;
        } else if (c == '"' || c == '\'') {
            quote_ = c;
        } else if (c == '#') {
            bool complete = false;
            const std::size_t end = BlockEnd(buffer_, i, complete);
            if (!complete) break; // the block's header is still on its way
            if (end > 0) {
                blockEnd_ = end;
                continue;
            }
        } else if (c == '\n') {
            std::size_t length = i;
            if (length > 0 && buffer_[length - 1] == '\r') --length;
            // The bound holds however the bytes came: in one read or a byte at a time.
            const bool dropped = dropping_ || i > most_;
            if (!dropped) message.assign(buffer_, 0, length);
            buffer_.erase(0, i + 1);
            Reset();
            dropping_ = false;
            return dropped ? Got::TooLong : Got::Message;
        }
        ++i;
    }
    scanned_ = i;
    if (buffer_.size() > most_) {
        // Only the scanner's state is kept of a message past the bound.
        dropping_ = true;
        if (blockEnd_ > 0) blockEnd_ -= scanned_;
        buffer_.erase(0, scanned_);
        scanned_ = 0;
    }
    return Got::Nothing;
}

Parsed ParseMessage(std::string_view message) {
    Parsed parsed;
    std::vector<std::string> path; // the nodes a relative header starts from
    try {
        for (std::string_view text : SplitOutside(message, ';')) {
            text = Trim(text);
            if (text.empty()) continue;
            std::size_t headerEnd = 0;
            while (headerEnd < text.size() &&
                   !std::isspace(static_cast<unsigned char>(text[headerEnd])))
                ++headerEnd;
            std::string_view header = text.substr(0, headerEnd);
            const std::string_view rest = text.substr(headerEnd);
            Command command;
            if (!header.empty() && header.back() == '?') {
                command.query = true;
                header.remove_suffix(1);
            }
            if (!header.empty() && header.front() == '*') {
                command.common = true;
                command.nodes.push_back(ReadNode(header.substr(1)));
            } else {
                const bool absolute = !header.empty() && header.front() == ':';
                if (absolute) header.remove_prefix(1);
                if (!absolute) {
                    command.nodes = path;
                    command.carried = path.size();
                }
                for (std::string_view node : SplitOutside(header, ':'))
                    command.nodes.push_back(ReadNode(node));
                path.assign(command.nodes.begin(), command.nodes.end() - 1);
            }
            if (!Trim(rest).empty())
                for (std::string_view param : SplitOutside(rest, ','))
                    command.params.push_back(ReadParameter(param));
            parsed.commands.push_back(std::move(command));
        }
    } catch (const Error& error) {
        parsed.error = error;
    }
    return parsed;
}

Pattern::Pattern(std::string_view notation)
    : nodes_(ReadPattern(notation.substr(notation.starts_with('*') ? 1 : 0))),
      common_(notation.starts_with('*')) {}

bool Pattern::Matches(std::span<const std::string> nodes, int* suffix) const {
    int value = 1;
    if (!MatchFrom(nodes_, nodes, &value)) return false;
    if (suffix != nullptr) *suffix = value;
    return true;
}

double ParseNumber(const Parameter& p, double minimum, double maximum, double fallback,
                   std::string_view unit) {
    if (p.kind != ParamKind::Text) throw Error{-104, "Data type error"};
    const std::string text = Upper(p.value);
    if (WordIs(text, "MINimum")) return minimum;
    if (WordIs(text, "MAXimum")) return maximum;
    if (WordIs(text, "DEFault")) return fallback;
    const char* begin = text.data();
    const char* end = begin + text.size();
    if (begin < end && *begin == '+') ++begin; // from_chars takes no plus sign
    double value = 0;
    const auto [stop, error] = std::from_chars(begin, end, value);
    if (error != std::errc() || !std::isfinite(value)) throw Error{-104, "Data type error"};
    const std::string suffix(Trim(std::string_view(stop, static_cast<std::size_t>(end - stop))));
    if (suffix.empty()) return value;
    const std::string u = Upper(unit);
    if (u.empty() || suffix.size() < u.size() ||
        suffix.compare(suffix.size() - u.size(), u.size(), u) != 0)
        throw Error{-131, "Invalid suffix"};
    const std::string prefix = suffix.substr(0, suffix.size() - u.size());
    // SCPI's M is milli but for hertz and ohms, where it is mega; MA is always mega.
    const bool megaM = u == "HZ" || u == "OHM";
    static const struct {
        const char* prefix;
        double factor;
    } kPrefixes[] = {{"", 1},     {"K", 1e3},  {"MA", 1e6}, {"G", 1e9},
                     {"U", 1e-6}, {"N", 1e-9}, {"P", 1e-12}};
    if (prefix == "M") return value * (megaM ? 1e6 : 1e-3);
    for (const auto& k : kPrefixes)
        if (prefix == k.prefix) return value * k.factor;
    throw Error{-131, "Invalid suffix"};
}

bool ParseBoolean(const Parameter& p) {
    if (p.kind != ParamKind::Text) throw Error{-104, "Data type error"};
    const std::string text = Upper(p.value);
    if (text == "ON") return true;
    if (text == "OFF") return false;
    try {
        return std::lround(ParseNumber(p, 0, 1, 0)) != 0;
    } catch (const Error&) {
        throw Error{-104, "Data type error"};
    }
}

std::size_t ParseChoice(const Parameter& p, const std::vector<std::string_view>& choices) {
    if (p.kind != ParamKind::Text) throw Error{-104, "Data type error"};
    const std::string text = Upper(p.value);
    for (std::size_t i = 0; i < choices.size(); ++i)
        if (WordIs(text, choices[i])) return i;
    throw Error{-224, "Illegal parameter value"};
}

std::string Block(std::string_view bytes) {
    const std::string length = std::to_string(bytes.size());
    return "#" + std::to_string(length.size()) + length + std::string(bytes);
}

std::string FormatNumber(double value) {
    // The shortest digits that read back as the value, laid out as the instruments answer:
    // 9.9e37 is "+9.900000000000000E+37", not the float's nearest "+9.899999999999999E+37".
    char shortest[32];
    const auto [end, error] =
        std::to_chars(shortest, shortest + sizeof shortest, value, std::chars_format::scientific);
    const std::string_view digits(shortest, error == std::errc() ? end - shortest : 0);
    const auto e = digits.find('e');
    const std::string_view mantissa = digits.substr(0, e);
    char text[48];
    if (e == std::string_view::npos || mantissa.size() > 18 || !std::isfinite(value)) {
        std::snprintf(text, sizeof text, "%+.15E", value);
        return text;
    }
    const bool negative = mantissa.front() == '-';
    std::string fraction(mantissa.substr(negative ? 1 : 0));
    const char lead = fraction[0];
    fraction = fraction.size() > 2 ? fraction.substr(2) : "";
    fraction.resize(15, '0');
    const int exponent = std::atoi(std::string(digits.substr(e + 1)).c_str());
    std::snprintf(text, sizeof text, "%c%c.%sE%+03d", negative ? '-' : '+', lead, fraction.c_str(),
                  exponent);
    return text;
}

} // namespace qzivi::scpi
