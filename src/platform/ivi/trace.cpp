#include "qzivi/trace.h"

#include "qzivi/ivi_common.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <mutex>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qzivi::ivi {

namespace detail {
std::atomic<bool> g_traceOn{false};
}

namespace {
std::mutex g_mutex;
TraceSink g_sink;
std::FILE* g_file = nullptr;
std::string g_filePath;

void UpdateSwitch() {
    detail::g_traceOn.store(g_sink != nullptr || g_file != nullptr);
}

// Opened for appending without waiting: a FIFO with no reader is refused at once, not waited
// for; one with a reader (a terminal, a pipe as /dev/stdout) is written to as any file.
std::FILE* OpenForAppending(const std::string& path) {
    const int fd =
        ::open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_NONBLOCK | O_CLOEXEC, 0644);
    if (fd < 0)
        throw StatusError(IVI_ERROR_CANNOT_OPEN_FILE,
                          "the trace file \"" + path + "\" cannot be opened for writing: " +
                              (errno == ENXIO ? "a pipe that nobody reads" : std::strerror(errno)));
    struct stat info {};
    if (::fstat(fd, &info) != 0 || S_ISDIR(info.st_mode)) {
        ::close(fd);
        throw StatusError(IVI_ERROR_CANNOT_OPEN_FILE,
                          "the trace file \"" + path + "\" is a folder");
    }
    ::fcntl(fd, F_SETFL, ::fcntl(fd, F_GETFL) & ~O_NONBLOCK); // writes wait as usual
    std::FILE* file = ::fdopen(fd, "a");
    if (!file) ::close(fd);
    return file;
}
} // namespace

// ---- Arguments ---------------------------------------------------------------------------------

void AppendArgument(std::string& out, ViInt32 v, ViStatus) {
    out += std::to_string(v);
}
void AppendArgument(std::string& out, ViUInt32 v, ViStatus) {
    out += std::to_string(v);
}
void AppendArgument(std::string& out, ViBoolean v, ViStatus) {
    out += std::to_string(v);
}
void AppendArgument(std::string& out, ViReal64 v, ViStatus) {
    // Fifteen digits where they give the value back, all seventeen where they would not.
    char text[32];
    std::snprintf(text, sizeof text, "%.15g", v);
    if (std::strtod(text, nullptr) != v) std::snprintf(text, sizeof text, "%.17g", v);
    out += text;
}
void AppendArgument(std::string& out, ViConstString v, ViStatus) {
    out += v != nullptr ? "\"" + std::string(v) + "\"" : "NULL";
}
void AppendArgument(std::string& out, TraceChannel v, ViStatus status) {
    AppendArgument(out, v.name, status);
}
void AppendArgument(std::string& out, TraceOutText v, ViStatus status) {
    if (v.buffer == nullptr || v.size <= 0 || status < 0) {
        out += "&?";
        return;
    }
    out += "&\"" + std::string(v.buffer, ::strnlen(v.buffer, static_cast<size_t>(v.size))) + "\"";
}

namespace {
// "[count: first, second, third, ..., third last, second last, last]"; all of a short array.
template <typename T>
void AppendValues(std::string& out, const T* data, ViInt32 count) {
    constexpr ViInt32 kEnds = 3;
    if (data == nullptr) {
        out += "NULL";
        return;
    }
    out += "[" + std::to_string(count) + ":";
    for (ViInt32 i = 0; i < count; ++i) {
        const bool gap = count > 2 * kEnds && i == kEnds;
        if (gap) i = count - kEnds;
        out += i == 0 ? " " : gap ? " ... " : ", ";
        AppendArgument(out, data[i], VI_SUCCESS);
    }
    out += "]";
}
} // namespace

void AppendArgument(std::string& out, TraceArray<ViReal64> v, ViStatus) {
    AppendValues(out, v.data, v.count);
}
void AppendArgument(std::string& out, TraceArray<ViInt32> v, ViStatus) {
    AppendValues(out, v.data, v.count);
}
void AppendArgument(std::string& out, TraceOutArray v, ViStatus status) {
    if (v.data != nullptr && status < 0) {
        out += "&?";
        return;
    }
    if (v.data != nullptr) out += "&";
    AppendValues(out, v.data, v.count);
}

// ---- Records -----------------------------------------------------------------------------------

std::string TraceRecord::Line() const {
    char tail[64];
    std::snprintf(tail, sizeof tail, " [%.3f us]", static_cast<double>(duration.count()) / 1000.0);
    const std::string result = status == 0 ? "0" : "0x" + StatusHex(status);
    return function + "(" + arguments + ") = " + result + tail;
}

TraceSink SetTraceSink(TraceSink sink) {
    std::lock_guard lock(g_mutex);
    std::swap(g_sink, sink);
    UpdateSwitch();
    return sink;
}

void SetTraceFile(const std::string& path) {
    std::lock_guard lock(g_mutex);
    if (path == g_filePath) return;
    if (g_file) std::fclose(g_file);
    g_file = nullptr;
    g_filePath.clear();
    if (!path.empty()) {
        try {
            g_file = OpenForAppending(path);
        } catch (...) {
            UpdateSwitch();
            throw;
        }
        if (!g_file) {
            UpdateSwitch();
            throw StatusError(IVI_ERROR_CANNOT_OPEN_FILE,
                              "the trace file \"" + path + "\" cannot be opened for writing");
        }
        g_filePath = path;
    }
    UpdateSwitch();
}

std::string TraceFile() {
    std::lock_guard lock(g_mutex);
    return g_filePath;
}

void Trace(const TraceRecord& record) {
    std::lock_guard lock(g_mutex);
    if (g_file) {
        const std::string line = record.Line() + '\n';
        std::fwrite(line.data(), 1, line.size(), g_file);
        std::fflush(g_file);
    }
    if (g_sink) g_sink(record);
}

TraceRecorder::TraceRecorder() {
    previous_ = SetTraceSink([this](const TraceRecord& record) { records_.push_back(record); });
}

TraceRecorder::~TraceRecorder() {
    SetTraceSink(std::move(previous_));
}

std::vector<std::string> TraceRecorder::Functions() const {
    std::vector<std::string> names;
    for (const auto& record : records_)
        names.push_back(record.function);
    return names;
}

} // namespace qzivi::ivi
