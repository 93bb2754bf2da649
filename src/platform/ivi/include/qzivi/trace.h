// The call trace of the class driver: every IviFgen_* and Ivi_* call with its arguments, status
// and duration, to a file (an I/O spy for users) and to an in-process sink (for tests).
#pragma once

#include "IviFgen.h"

#include <atomic>
#include <chrono>
#include <functional>
#include <string>

namespace qzivi::ivi {

struct TraceRecord {
    std::string function;  // "IviFgen_ConfigureStandardWaveform"
    std::string arguments; // as written in the trace line, without the brackets
    ViStatus status = 0;
    std::chrono::nanoseconds duration{0};

    // One line: name(arguments) = status [duration]
    std::string Line() const;
};

using TraceSink = std::function<void(const TraceRecord&)>;

// Sets the in-process sink (an empty one switches it off) and returns the one it replaces.
TraceSink SetTraceSink(TraceSink sink);

// Appends trace lines to `path` from now on; "" stops. Throws StatusError if it cannot be opened.
void SetTraceFile(const std::string& path);
std::string TraceFile();

namespace detail {
extern std::atomic<bool> g_traceOn;
}
inline bool TraceEnabled() {
    return detail::g_traceOn.load(std::memory_order_relaxed);
}

void Trace(const TraceRecord& record);

// Collects the records of its lifetime, for tests and tools.
class TraceRecorder {
public:
    TraceRecorder();
    ~TraceRecorder();
    TraceRecorder(const TraceRecorder&) = delete;
    TraceRecorder& operator=(const TraceRecorder&) = delete;

    const std::vector<TraceRecord>& Records() const { return records_; }
    std::vector<std::string> Functions() const;
    void Clear() { records_.clear(); }

private:
    std::vector<TraceRecord> records_;
    TraceSink previous_;
};

} // namespace qzivi::ivi
