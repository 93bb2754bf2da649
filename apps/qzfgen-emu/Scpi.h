// The SCPI grammar as bench instruments read it: program messages cut from a byte stream (a
// definite-length block may hold any byte, a string any but its quote), commands split at ';'
// with the header path carried over, parameters split at ',', and headers matched against
// patterns in the instruments' notation: "[SOURce#:]FUNCtion:SQUare:DCYCle" takes the short form
// (the capitals) or the long one, in any case, '#' an optional channel number, '[...]' an
// optional node.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qzivi::scpi {

// A refused message part, with its SCPI error number ("-113", "Undefined header").
struct Error {
    int number;
    std::string text;
};

// Cuts program messages out of the bytes a connection brings.
class MessageReader {
public:
    enum class Got { Nothing, Message, TooLong };

    // A message longer than this is refused whole (error -223), its bytes dropped up to its end.
    explicit MessageReader(std::size_t mostBytes = std::size_t{1} << 28) : most_(mostBytes) {}

    void Feed(std::string_view bytes) { buffer_.append(bytes); }
    // The next whole message, without its terminator, in `message`; nothing until more bytes
    // come; or the end of a message that outgrew the bound.
    Got Next(std::string& message);

private:
    void Reset() { quote_ = 0, blockEnd_ = 0, scanned_ = 0; }

    std::string buffer_;
    std::size_t most_;
    bool dropping_ = false;
    // The scanner's state at scanned_, so a message cut across reads is scanned once.
    std::size_t scanned_ = 0;
    char quote_ = 0;
    std::size_t blockEnd_ = 0; // past the block being skipped, 0 outside one
};

enum class ParamKind { Text, String, Block };

struct Parameter {
    ParamKind kind = ParamKind::Text;
    std::string value; // the text trimmed, the string unquoted, or the block's bytes
};

struct Command {
    std::vector<std::string> nodes; // the header's keywords with any suffix, upper case
    std::size_t carried = 0;        // leading nodes that came from the previous command's path
    bool query = false;
    bool common = false; // "*IDN?" and its kind
    std::vector<Parameter> params;
};

// The commands of one message; the path of each compound header carries to the next command that
// does not start with ':' or '*'. A malformed command gives its error in place of the command.
struct Parsed {
    std::vector<Command> commands;
    std::optional<Error> error; // the first malformed command; those after it are dropped
};
Parsed ParseMessage(std::string_view message);

// A header pattern, read once: every command is held against every pattern of the table.
class Pattern {
public:
    explicit Pattern(std::string_view notation);
    // A common command's pattern ("*IDN"); its nodes are those after the '*'.
    bool Common() const { return common_; }
    // Whether `nodes` match; `suffix` gets the number of the node marked '#' (1 when none was
    // given), or stays as it was.
    bool Matches(std::span<const std::string> nodes, int* suffix) const;

    struct Node {
        std::string shortForm, longForm;
        bool suffix = false, optional = false;
    };

private:
    std::vector<Node> nodes_;
    bool common_ = false;
};

// A number, a unit-prefixed number ("1 KHZ", "5mV") or MIN, MAX, DEF: `minimum`, `maximum` and
// `fallback` stand for the words. Throws Error -104 for no number, -131 for a wrong suffix.
double ParseNumber(const Parameter& p, double minimum, double maximum, double fallback,
                   std::string_view unit = {});
// ON, OFF, 1, 0 (a number rounds, non-zero is on). Throws Error -104 otherwise.
bool ParseBoolean(const Parameter& p);
// A character parameter matched against choices in the short/long notation ("SINusoid"); the
// index of the match. Throws Error -224 for none.
std::size_t ParseChoice(const Parameter& p, const std::vector<std::string_view>& choices);

// A definite-length block of `bytes`: "#<digits><length><bytes>".
std::string Block(std::string_view bytes);
// A number as the instruments answer it: "+1.000000000000000E+03".
std::string FormatNumber(double value);

} // namespace qzivi::scpi
