#include "qzivi/c_boundary.h"
#include "qzivi/ivi_common.h"

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstring>

namespace qzivi::ivi {

namespace {

struct StatusEntry {
    ViStatus status;
    const char* text;
};

constexpr StatusEntry kStatusTexts[] = {
    {IVI_ERROR_CANNOT_RECOVER, "Unrecoverable failure."},
    {IVI_ERROR_INSTRUMENT_STATUS, "Instrument error detected."},
    {VI_ERROR_RSRC_NFOUND, "Insufficient location information or the requested device or resource "
                           "is not present in the system."},
    {VI_ERROR_TMO, "Timeout expired before operation completed."},
    {VI_ERROR_IO, "Could not perform operation because of I/O error."},
    {VI_ERROR_CONN_LOST, "The connection for the given session has been lost."},
    {IVI_ERROR_CANNOT_OPEN_FILE, "Cannot open file."},
    {IVI_ERROR_READING_FILE, "Error reading file."},
    {IVI_ERROR_INVALID_ATTRIBUTE, "Attribute ID not recognized."},
    {IVI_ERROR_ATTR_NOT_WRITABLE, "Attribute is read-only."},
    {IVI_ERROR_ATTR_NOT_READABLE, "Attribute is write-only."},
    {IVI_ERROR_INVALID_VALUE, "Invalid value for parameter or property."},
    {IVI_ERROR_FUNCTION_NOT_SUPPORTED, "Function or method not supported."},
    {IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED, "Attribute or property not supported."},
    {IVI_ERROR_VALUE_NOT_SUPPORTED, "The enumeration value for the parameter is not supported."},
    {IVI_ERROR_TYPES_DO_NOT_MATCH, "The attribute and the function do not have the same type."},
    {IVI_ERROR_NOT_INITIALIZED, "The session is not initialized."},
    {IVI_ERROR_UNKNOWN_CHANNEL_NAME, "Unknown channel name."},
    {IVI_ERROR_CHANNEL_NAME_REQUIRED, "A channel name is required."},
    {IVI_ERROR_BAD_OPTION_NAME, "Invalid option name in the option string."},
    {IVI_ERROR_BAD_OPTION_VALUE, "Invalid option value in the option string."},
    {IVI_ERROR_OUT_OF_MEMORY, "The necessary memory could not be allocated."},
    {IVI_ERROR_NULL_POINTER, "Null pointer passed for a parameter that must not be null."},
    {IVI_ERROR_BUFFER_TOO_SMALL, "The buffer is too small for the data."},
    {IVI_ERROR_LOGICAL_NAME_NOT_FOUND, "The logical name is not in the configuration store."},
    {IVI_ERROR_CONFIG_STORE_INVALID, "The configuration store is not valid."},
    {IVI_ERROR_CANNOT_LOAD_MODULE, "The driver module could not be loaded."},
    {IVI_ERROR_MODULE_FUNCTION_MISSING, "The driver module lacks a required function."},
    {IVI_ERROR_FILE_NOT_SECURE, "The file can be written by other users and is not trusted."},
    {IVI_ERROR_TOO_MANY_SESSIONS, "Too many sessions are open."},
    {IVI_ERROR_INVALID_SESSION_HANDLE, "The session handle is not valid."},
    {IVIFGEN_ERROR_TRIGGER_NOT_SOFTWARE, "The trigger source is not set to software trigger."},
    {IVIFGEN_ERROR_NO_WFMS_AVAILABLE, "The waveform memory has no room for the waveform."},
    {IVIFGEN_ERROR_WFM_IN_USE, "The waveform is in use."},
    {IVIFGEN_ERROR_NO_SEQS_AVAILABLE, "The sequence memory has no room for the sequence."},
    {IVIFGEN_ERROR_SEQ_IN_USE, "The sequence is in use."},
    {IVIFGEN_ERROR_NOT_GENERATING, "The function generator is not generating a signal."},
    {IVI_WARN_NSUP_ID_QUERY, "Identification query not supported."},
    {IVI_WARN_NSUP_RESET, "Reset not supported."},
    {IVI_WARN_VALUE_COERCED, "The value was coerced to one the instrument can produce."},
};

} // namespace

const char* KnownStatusText(ViStatus status) {
    for (const auto& entry : kStatusTexts)
        if (entry.status == status) return entry.text;
    return status == VI_SUCCESS ? "Success." : nullptr;
}

std::string StatusHex(ViStatus status) {
    char text[16];
    std::snprintf(text, sizeof text, "%08X", static_cast<unsigned>(status));
    return text;
}

void StatusMessage(ViStatus status, ViChar message[256]) {
    if (message == nullptr) return;
    const char* known = KnownStatusText(status);
    std::string text = known != nullptr ? known
                       : status < 0     ? "Unknown error, status 0x" + StatusHex(status) + "."
                                        : "Unknown warning, status 0x" + StatusHex(status) + ".";
    CopyText(text, 256, message);
}

ViInt32 CopyText(std::string_view text, ViInt32 bufferSize, ViChar* buffer) {
    if (bufferSize < 0)
        throw StatusError(IVI_ERROR_INVALID_VALUE,
                          "the buffer size " + std::to_string(bufferSize) + " is negative");
    if (bufferSize > 0 && buffer == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER, "the text buffer is a null pointer");
    const auto needed = static_cast<ViInt32>(std::min<size_t>(text.size() + 1, 0x7FFFFFFF));
    if (bufferSize <= 0 || buffer == nullptr) return bufferSize == 0 ? needed : 0;
    const auto n = static_cast<size_t>(std::min(needed - 1, bufferSize - 1));
    std::memcpy(buffer, text.data(), n);
    buffer[n] = '\0';
    return needed > bufferSize ? needed : 0;
}

bool EqualsNoCase(std::string_view a, std::string_view b) {
    return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) {
               return std::tolower(static_cast<unsigned char>(x)) ==
                      std::tolower(static_cast<unsigned char>(y));
           });
}

std::string_view Trim(std::string_view text) {
    const auto first = text.find_first_not_of(" \t\r\n");
    if (first == std::string_view::npos) return {};
    const auto last = text.find_last_not_of(" \t\r\n");
    return text.substr(first, last - first + 1);
}

std::vector<Option> ParseOptions(std::string_view text) {
    std::vector<Option> options;
    while (!Trim(text).empty()) {
        const auto comma = text.find(',');
        std::string_view item = text.substr(0, comma);
        const auto equals = item.find('=');
        if (equals == std::string_view::npos || Trim(item.substr(0, equals)).empty())
            throw StatusError(IVI_ERROR_BAD_OPTION_NAME, "option string item \"" +
                                                             std::string(Trim(item)) +
                                                             "\" is not of the form Name=Value");
        Option option{std::string(Trim(item.substr(0, equals))), {}};
        if (EqualsNoCase(option.name, "DriverSetup")) {
            option.value = std::string(Trim(text.substr(text.find('=') + 1)));
            options.push_back(std::move(option));
            break;
        }
        option.value = std::string(Trim(item.substr(equals + 1)));
        options.push_back(std::move(option));
        if (comma == std::string_view::npos) break;
        text.remove_prefix(comma + 1);
    }
    return options;
}

std::vector<Option> MergeOptions(std::vector<Option> base, const std::vector<Option>& overrides) {
    for (const auto& option : overrides) {
        auto same = std::find_if(base.begin(), base.end(), [&](const Option& o) {
            return EqualsNoCase(o.name, option.name);
        });
        if (same != base.end())
            same->value = option.value;
        else
            base.push_back(option);
    }
    return base;
}

std::string JoinOptions(const std::vector<Option>& options) {
    std::string text;
    const Option* driverSetup = nullptr;
    for (const auto& option : options) {
        if (EqualsNoCase(option.name, "DriverSetup")) {
            driverSetup = &option;
            continue;
        }
        text += (text.empty() ? "" : ", ") + option.name + "=" + option.value;
    }
    if (driverSetup != nullptr)
        text += (text.empty() ? "" : ", ") + ("DriverSetup=" + driverSetup->value);
    return text;
}

bool ParseBoolOption(const Option& option) {
    for (const char* yes : {"1", "true", "VI_TRUE"})
        if (EqualsNoCase(option.value, yes)) return true;
    for (const char* no : {"0", "false", "VI_FALSE"})
        if (EqualsNoCase(option.value, no)) return false;
    throw StatusError(IVI_ERROR_BAD_OPTION_VALUE,
                      "option " + option.name + " takes a boolean, not \"" + option.value + "\"");
}

} // namespace qzivi::ivi

namespace qzivi::ivi {

ViStatus ErrorRecord::Set(ViStatus failure, const char* function, const char* what) noexcept {
    status = failure;
    pending = true;
    try {
        elaboration = std::string(function) + ": " + what;
    } catch (...) {
        elaboration.clear();
    }
    return failure;
}

ViStatus ErrorRecord::Report(ViStatus* code, ViInt32 bufferSize, ViChar description[]) noexcept {
    // A buffer that cannot take the text is refused, and the error stays to be read.
    if (bufferSize < 0) return IVI_ERROR_INVALID_VALUE;
    if (bufferSize > 0 && description == nullptr) return IVI_ERROR_NULL_POINTER;
    ViStatus result = 0;
    try {
        ViChar text[256];
        StatusMessage(status, text);
        result = CopyText(status == 0 ? std::string() : std::string(text) + " " + elaboration,
                          bufferSize, description);
    } catch (...) { // no room for the text: the status alone
        if (bufferSize > 0) description[0] = '\0';
    }
    if (code != nullptr) *code = status;
    if (bufferSize != 0) {
        status = 0;
        elaboration.clear();
        pending = false;
    }
    return result;
}

} // namespace qzivi::ivi
