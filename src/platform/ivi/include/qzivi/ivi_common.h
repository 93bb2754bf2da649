// Pieces that the class driver and the specific drivers share: status texts, IVI option strings
// and the IVI rules for filling a caller's text buffer.
#pragma once

#include "IviFgen.h"

#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace qzivi::ivi {

// The text of a status that this project knows, or nullptr.
const char* KnownStatusText(ViStatus status);

// Writes the text of `status` into a buffer of 256 characters, with a fallback for unknown ones.
void StatusMessage(ViStatus status, ViChar message[256]);

// Hexadecimal as IVI prints a status: upper case, eight digits.
std::string StatusHex(ViStatus status);

// Copies `text` into a caller buffer as IVI does: with `bufferSize` 0 nothing is written; if the
// text does not fit it is cut, and the size it needs (with the NUL) is returned; 0 otherwise.
// Throws StatusError for a negative size or a null buffer of a positive size.
ViInt32 CopyText(std::string_view text, ViInt32 bufferSize, ViChar* buffer);

bool EqualsNoCase(std::string_view a, std::string_view b);
std::string_view Trim(std::string_view text);

// A failure with the status it stands for; the drivers turn it into their return value.
class StatusError : public std::runtime_error {
public:
    StatusError(ViStatus status, const std::string& what) : runtime_error(what), status_(status) {}
    ViStatus Status() const { return status_; }

private:
    ViStatus status_;
};

// The class's condition for SendSoftwareTrigger, for a driver that keeps each channel's operation
// mode and trigger source: some channel waits in burst mode on the software trigger, and the
// instrument generates. Throws the class's error for whichever is missing.
template <class Channels>
void RequireSoftwareTrigger(const Channels& channels, bool generating) {
    bool waiting = false;
    for (const auto& c : channels)
        waiting = waiting || (c.operationMode == IVIFGEN_VAL_OPERATE_BURST &&
                              c.triggerSource == IVIFGEN_VAL_SOFTWARE_TRIG);
    if (!waiting)
        throw StatusError(IVIFGEN_ERROR_TRIGGER_NOT_SOFTWARE,
                          "no channel is in burst mode with the software trigger as its source");
    if (!generating)
        throw StatusError(IVIFGEN_ERROR_NOT_GENERATING,
                          "a trigger needs generation to be initiated first");
}

struct Option {
    std::string name;
    std::string value;
};

// Parses "Name=Value, Name=Value, DriverSetup=anything": names are trimmed, "DriverSetup" takes
// the rest of the text whatever it holds. Throws StatusError(IVI_ERROR_BAD_OPTION_NAME) for an
// item without '=' or a name.
std::vector<Option> ParseOptions(std::string_view text);

// `base` with every option of `overrides` put over the one of the same name (ignoring case).
std::vector<Option> MergeOptions(std::vector<Option> base, const std::vector<Option>& overrides);

// The option string again, DriverSetup last.
std::string JoinOptions(const std::vector<Option>& options);

// "1", "0", "true", "false", "VI_TRUE", "VI_FALSE", any case. Throws IVI_ERROR_BAD_OPTION_VALUE.
bool ParseBoolOption(const Option& option);

} // namespace qzivi::ivi
