// The class driver's sessions: the table that maps a class session to its module and specific
// session, the error records, channel-name translation, and the traced call of an entry.
#pragma once

#include "driver_module.h"
#include "qzivi/c_boundary.h"
#include "qzivi/trace.h"

#include <chrono>
#include <string>
#include <utility>
#include <vector>

namespace qzivi::ivi {

struct ClassSession {
    std::shared_ptr<DriverModule> module;
    DriverTable table; // the module's, copied here to keep one load off every call
    ViSession specific = 0;
    std::string logicalName;
    std::vector<std::pair<std::string, std::string>> virtualNames;
    // The class driver's own last failure on this session: answered while pending, that is
    // until the next call reaches the specific driver.
    ErrorRecord own;
};

SessionTable<ClassSession>& ClassSessions();
// The record of calls that have no session: a failed open, a wrong session number.
ErrorRecord& ThreadRecord();
// The record a failure of the class driver itself goes to.
inline ErrorRecord& RecordOf(ClassSession* s) {
    return s != nullptr ? s->own : ThreadRecord();
}

// The driver's name of a channel: its virtual name translated, any other name as it is.
const char* Physical(const ClassSession& s, ViConstString name);

// A channel name as the application gives it; reaches the driver translated.
using Channel = TraceChannel;

template <typename T>
T Unwrap(const ClassSession&, T value) {
    return value;
}
inline ViConstString Unwrap(const ClassSession& s, Channel channel) {
    return Physical(s, channel.name);
}
inline ViChar* Unwrap(const ClassSession&, TraceOutText text) {
    return text.buffer;
}
template <typename T>
const T* Unwrap(const ClassSession&, TraceArray<T> array) {
    return array.data;
}
inline ViReal64* Unwrap(const ClassSession&, TraceOutArray array) {
    return const_cast<ViReal64*>(array.data);
}

// One exported entry of the class driver: its body under the C boundary's wrapper, the record of
// `s` (or of the thread) for what it throws, then its trace line. `AlwaysTimed` is for an entry
// that may switch the trace on itself.
template <bool AlwaysTimed = false, typename Body, typename... Args>
ViStatus TracedEntry(const char* function, ClassSession* s, Body&& body, const Args&... args) {
    using Clock = std::chrono::steady_clock;
    const bool timed = AlwaysTimed || TraceEnabled();
    const auto start = timed ? Clock::now() : Clock::time_point{};
    const ViStatus status = CEntry(function, RecordOf(s), body);
    if (TraceEnabled()) try {
            Trace({function, FormatArguments(status, args...), status,
                   timed ? Clock::now() - start : Clock::duration{}});
        } catch (...) { // a trace that cannot be written loses its line, not the call
        }
    return status;
}

} // namespace qzivi::ivi
