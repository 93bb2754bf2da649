// The call trace of the class driver: every IviFgen_* and Ivi_* call with its arguments, status
// and duration, to a file (an I/O spy for users) and to an in-process sink (for tests).
#pragma once

#include "IviFgen.h"

#include <atomic>
#include <chrono>
#include <functional>
#include <string>
#include <vector>

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

// ---- How a trace line shows a call's arguments ----
// A channel name as the application gave it.
struct TraceChannel {
    ViConstString name;
};
// A text the driver writes into the caller's buffer: shown as it came back.
struct TraceOutText {
    ViChar* buffer;
    ViInt32 size;
};
// An array the call reads, or (Out) fills: shown by its length and its first and last values.
template <typename T>
struct TraceArray {
    const T* data;
    ViInt32 count;
};
struct TraceOutArray {
    const ViReal64* data;
    ViInt32 count;
};

void AppendArgument(std::string& out, ViInt32 v, ViStatus status);
void AppendArgument(std::string& out, ViUInt32 v, ViStatus status);
void AppendArgument(std::string& out, ViBoolean v, ViStatus status);
void AppendArgument(std::string& out, ViReal64 v, ViStatus status);
void AppendArgument(std::string& out, ViConstString v, ViStatus status);
void AppendArgument(std::string& out, TraceChannel v, ViStatus status);
void AppendArgument(std::string& out, TraceOutText v, ViStatus status);
void AppendArgument(std::string& out, TraceArray<ViReal64> v, ViStatus status);
void AppendArgument(std::string& out, TraceArray<ViInt32> v, ViStatus status);
void AppendArgument(std::string& out, TraceOutArray v, ViStatus status);
// An output parameter: what the driver gave back, '?' where it gave nothing.
template <typename T>
void AppendArgument(std::string& out, T* v, ViStatus status) {
    if (v == nullptr || status < 0) {
        out += v == nullptr ? "NULL" : "&?";
        return;
    }
    out += "&";
    AppendArgument(out, *v, status);
}

// The arguments of one call as a trace line writes them, separated by ", ".
template <typename... Args>
std::string FormatArguments(ViStatus status, const Args&... args) {
    std::string out;
    ((out += out.empty() ? "" : ", ", AppendArgument(out, args, status)), ...);
    return out;
}

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
