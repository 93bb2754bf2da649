// The numbers of the system's own failures: each is the negative of the string id of its text, so
// that LoadResString(-number) gives the description.
#pragma once

#include <cstdint>

namespace qzivi::errid {

inline constexpr std::int32_t kUnexpected = -30000;
inline constexpr std::int32_t kInvalidArgument = -30002;
inline constexpr std::int32_t kInvalidType = -30003;
inline constexpr std::int32_t kDivisionByZero = -30004;
inline constexpr std::int32_t kOverflow = -30006;
inline constexpr std::int32_t kOutOfMemory = -30007;
// Raised positive, with the missing extensions as its source; the boundary words it.
inline constexpr std::int32_t kExtensionNotSupported = 30717;

inline constexpr std::int32_t kNotInitialized = -31600;
inline constexpr std::int32_t kNotConfigured = -31601;
inline constexpr std::int32_t kOperationInProgress = -31602;
inline constexpr std::int32_t kInvalidSession = -31603;
inline constexpr std::int32_t kUnknownAttribute = -31604;
inline constexpr std::int32_t kCannotLoadLibrary = -31605;
inline constexpr std::int32_t kFileNotFound = -31606;
inline constexpr std::int32_t kFileAccess = -31607;
inline constexpr std::int32_t kDesignModeOnly = -31608;
inline constexpr std::int32_t kInvalidConfigurationFile = -31609;
inline constexpr std::int32_t kClassSpecVersion = -31610;
inline constexpr std::int32_t kInvalidIndex = -31611;
inline constexpr std::int32_t kAlreadyInitialized = -31612;
inline constexpr std::int32_t kInvalidWaveform = -31613;
inline constexpr std::int32_t kUnknownLogicalName = -31614;
inline constexpr std::int32_t kTooFewPoints = -31615;
inline constexpr std::int32_t kInvalidSequence = -31616;
inline constexpr std::int32_t kInvalidChannelName = -31617;
inline constexpr std::int32_t kForeignObject = -31618;
inline constexpr std::int32_t kSessionManager = -31619;
inline constexpr std::int32_t kNoChannels = -31620;
inline constexpr std::int32_t kNoOutputModeExtension = -31621;
inline constexpr std::int32_t kNoWaveform = -31622;
inline constexpr std::int32_t kNoSuchConfiguration = -31623;
inline constexpr std::int32_t kNoSuchChannel = -31624;
inline constexpr std::int32_t kNoSuchWaveform = -31625;
inline constexpr std::int32_t kNoSuchSequenceItem = -31626;
inline constexpr std::int32_t kNoSuchSequence = -31627;
inline constexpr std::int32_t kOutputModeExtensionOff = -31628;

} // namespace qzivi::errid
