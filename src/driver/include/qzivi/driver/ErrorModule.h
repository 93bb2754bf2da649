// The boundary of every public member: how a failure is numbered, reported and passed on.
#pragma once

#include "qzivi/support/scoped_hook.h"

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace qzivi {

class CIviErrorReport;

// True for the length of each call into a session object of the session manager; not cleared
// when the call fails, so that the boundary can recognise such a failure. One for the process.
extern bool InSessionMgrCall;

// The number every failure takes whose handling itself failed.
inline constexpr std::int32_t kFallbackErrorNumber = static_cast<std::int32_t>(0x80047530u);
inline constexpr const char* kHelpFile = "qzivi.chm";
inline constexpr std::int32_t kHelpContext = 200;

// What the failure being handled carries; C++ exceptions that are not the system's Failure get
// the number of the matching failure of the system's own running.
struct PendingFailure {
    std::int32_t number = 0;
    std::string source;
    std::string description;
    std::string helpFile;
    std::int32_t helpContext = 0;
};
// Call only inside a catch handler.
PendingFailure CurrentFailure();

// The string id of a pending failure's number. For the id 30717 the description becomes the
// text of an extension that the driver lacks, with the failure's source in brackets.
std::int32_t MapRuntimeError(PendingFailure& failure);

// Call only inside a catch handler. Fires the reporter's events, then: mode -1 raises, 0 does
// nothing more, 1 shows a message box.
void HandleError(std::string source, std::int32_t mode, CIviErrorReport* reporter);

// Raises the failure being handled again, unchanged. Call only inside a catch handler.
[[noreturn]] void ReRaise();

std::string FirstLine(std::string_view text);

enum class BoxIcon { None, Critical, Exclamation, Information };

// The message box of mode 1. Without a handler the text goes to standard error; the Qt layer
// puts a real box here.
struct MessageBoxRequest {
    std::string text;
    std::string title;
    std::string helpFile;
    std::int32_t helpContext = 0;
    BoxIcon icon = BoxIcon::Critical; // the error boxes' icon
};
using MessageBoxHandler = std::function<void(const MessageBoxRequest&)>;
// Returns the handler it replaces; MessageBoxScope puts it back at the end of a scope.
MessageBoxHandler SetMessageBoxHandler(MessageBoxHandler handler);
using MessageBoxScope = ScopedHook<MessageBoxHandler, &SetMessageBoxHandler>;
// Shows a box through the handler.
void ShowMessageBox(const MessageBoxRequest& request);

} // namespace qzivi
