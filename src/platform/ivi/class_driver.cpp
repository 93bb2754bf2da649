// The IviFgen class driver: opens a logical name's driver session and dispatches every call to
// the specific driver, translating virtual channel names and tracing when asked.
#include "driver_module.h"
#include "qzivi/config_store.h"
#include "qzivi/ivi_common.h"
#include "qzivi/trace.h"

#include <array>
#include <atomic>
#include <cinttypes>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <mutex>

namespace {

using namespace qzivi::ivi;

struct ClassSession {
    std::shared_ptr<DriverModule> module;
    DriverTable table; // the module's, copied here to keep one load off every call
    ViSession specific = 0;
    std::string logicalName;
    std::vector<std::pair<std::string, std::string>> virtualNames;
    // The class driver's own last failure on this session, answered until the next call reaches
    // the specific driver.
    bool ownErrorPending = false;
    ViStatus ownStatus = 0;
    std::string ownElaboration;
};

constexpr ViSession kFirstSession = 0x1000;
constexpr size_t kSlots = 256;
std::array<std::atomic<ClassSession*>, kSlots> g_sessions{};
std::mutex g_openClose;

thread_local ViStatus t_status = 0;
thread_local std::string t_elaboration;

ClassSession* FindSession(ViSession vi) {
    if (vi < kFirstSession || vi >= kFirstSession + kSlots) return nullptr;
    return g_sessions[vi - kFirstSession].load(std::memory_order_acquire);
}

// Records a failure of the class driver itself and returns its status.
ViStatus OwnError(ClassSession* s, ViStatus status, std::string what) {
    if (s != nullptr) {
        s->ownErrorPending = true;
        s->ownStatus = status;
        s->ownElaboration = std::move(what);
    } else {
        t_status = status;
        t_elaboration = std::move(what);
    }
    return status;
}

ViStatus NoSession(ViSession vi, const char* function) {
    return OwnError(nullptr, IVI_ERROR_INVALID_SESSION_HANDLE,
                    std::string(function) + ": " + std::to_string(vi) +
                        " is not an open IviFgen session");
}

// ---- Arguments -----------------------------------------------------------------------------

// A channel name as the application gives it; reaches the driver translated.
struct Channel {
    ViConstString name;
};
// A text the driver writes into the caller's buffer.
struct OutText {
    ViChar* buffer;
    ViInt32 size;
};
// Samples the driver writes.
struct OutSamples {
    ViReal64* buffer;
};

// Equal texts of length n, compared eight bytes at a time: this runs on every call with a channel.
bool SameText(const char* a, const char* b, size_t n) {
    for (; n >= 8; a += 8, b += 8, n -= 8) {
        std::uint64_t x, y;
        std::memcpy(&x, a, 8);
        std::memcpy(&y, b, 8);
        if (x != y) return false;
    }
    for (; n > 0; --n)
        if (*a++ != *b++) return false;
    return true;
}

const char* Physical(const ClassSession& s, ViConstString name) {
    if (name == nullptr || s.virtualNames.empty()) return name;
    const size_t length = std::strlen(name);
    for (const auto& [virtualName, physical] : s.virtualNames)
        if (virtualName.size() == length && SameText(virtualName.data(), name, length))
            return physical.c_str();
    return name;
}

template <typename T>
T Unwrap(const ClassSession&, T value) {
    return value;
}
inline ViConstString Unwrap(const ClassSession& s, Channel channel) {
    return Physical(s, channel.name);
}
inline ViChar* Unwrap(const ClassSession&, OutText text) {
    return text.buffer;
}
inline ViReal64* Unwrap(const ClassSession&, OutSamples samples) {
    return samples.buffer;
}

void Put(std::string& out, ViInt32 v, ViStatus) {
    out += std::to_string(v);
}
void Put(std::string& out, ViUInt32 v, ViStatus) {
    out += std::to_string(v);
}
void Put(std::string& out, ViBoolean v, ViStatus) {
    out += std::to_string(v);
}
void Put(std::string& out, ViReal64 v, ViStatus) {
    char text[32];
    std::snprintf(text, sizeof text, "%.15g", v);
    out += text;
}
void Put(std::string& out, ViConstString v, ViStatus) {
    out += v != nullptr ? "\"" + std::string(v) + "\"" : "NULL";
}
void Put(std::string& out, Channel v, ViStatus status) {
    Put(out, v.name, status);
}
void Put(std::string& out, const ViReal64* v, ViStatus) {
    out += v != nullptr ? "[...]" : "NULL";
}
void Put(std::string& out, const ViInt32* v, ViStatus) {
    out += v != nullptr ? "[...]" : "NULL";
}
void Put(std::string& out, OutSamples v, ViStatus) {
    out += v.buffer != nullptr ? "&[...]" : "NULL";
}
// Outputs show what the driver gave back, '?' where it gave nothing.
template <typename T>
void Put(std::string& out, T* v, ViStatus status) {
    if (v == nullptr || status < 0) {
        out += v == nullptr ? "NULL" : "&?";
        return;
    }
    out += "&";
    Put(out, *v, status);
}
void Put(std::string& out, OutText v, ViStatus status) {
    if (v.buffer == nullptr || v.size <= 0 || status < 0) {
        out += "&?";
        return;
    }
    out += "&\"" + std::string(v.buffer, ::strnlen(v.buffer, static_cast<size_t>(v.size))) + "\"";
}

template <typename... Args>
std::string Arguments(ViStatus status, const Args&... args) {
    std::string out;
    ((out += out.empty() ? "" : ", ", Put(out, args, status)), ...);
    return out;
}

template <typename... Args>
void Record(const char* function, std::chrono::steady_clock::time_point start, ViStatus status,
            const Args&... args) {
    Trace({function, Arguments(status, args...), status, std::chrono::steady_clock::now() - start});
}

// One call through to the specific driver of `vi`.
template <typename Fn, typename... Args>
ViStatus Forward(const char* function, ViSession vi, Fn DriverTable::*slot, Args... args) {
    const bool tracing = TraceEnabled();
    const auto start =
        tracing ? std::chrono::steady_clock::now() : std::chrono::steady_clock::time_point{};
    ClassSession* s = FindSession(vi);
    ViStatus status;
    if (s == nullptr) {
        status = NoSession(vi, function);
    } else if (const Fn fn = s->table.*slot; fn == nullptr) {
        status = OwnError(s, IVI_ERROR_FUNCTION_NOT_SUPPORTED,
                          std::string(function) + ": driver module \"" + s->module->Location() +
                              "\" has no function " + s->module->Prefix() + "_" +
                              (std::strchr(function, '_') + 1));
    } else {
        s->ownErrorPending = false;
        status = fn(s->specific, Unwrap(*s, args)...);
    }
    if (tracing) Record(function, start, status, vi, args...);
    return status;
}

using Clock = std::chrono::steady_clock;

} // namespace

#define QZIVI_FORWARD(name, vi, ...) Forward("IviFgen_" #name, vi, &DriverTable::name, __VA_ARGS__)

extern "C" {

ViStatus IviFgen_InitWithOptions(ViRsrc logicalName, ViBoolean idQuery, ViBoolean reset,
                                 ViConstString optionString, ViSession* vi) {
    const auto start = Clock::now();
    const std::string name = logicalName != nullptr ? logicalName : "";
    ViSession opened = 0;
    ViStatus status = VI_SUCCESS;
    try {
        if (vi == nullptr) throw StatusError(IVI_ERROR_NULL_POINTER, "vi is a null pointer");
        *vi = 0;
        const ConfigStore store = LoadConfigStore();
        const char* traceFile = std::getenv("QZIVI_TRACE");
        if (traceFile != nullptr && *traceFile != '\0')
            SetTraceFile(traceFile);
        else if (!store.traceFile.empty())
            SetTraceFile(store.traceFile);
        const DriverSession* entry = store.Find(name);
        if (entry == nullptr) {
            std::string known;
            for (const auto& session : store.sessions)
                known += (known.empty() ? "" : ", ") + session.logicalName;
            throw StatusError(IVI_ERROR_LOGICAL_NAME_NOT_FOUND,
                              "logical name \"" + name + "\" is not in the configuration store " +
                                  (store.path.empty() ? std::string("(embedded default only)")
                                                      : "\"" + store.path + "\"") +
                                  "; known names: " + known);
        }
        auto session = std::make_unique<ClassSession>();
        session->module = LoadDriverModule(*entry, store.path);
        session->table = session->module->Table();
        session->logicalName = entry->logicalName;
        session->virtualNames = entry->virtualNames;
        const std::string options =
            JoinOptions(MergeOptions(ParseOptions(entry->options),
                                     ParseOptions(optionString != nullptr ? optionString : "")));
        const DriverTable& table = session->module->Table();
        status = table.InitWithOptions(entry->resource.c_str(), idQuery, reset, options.c_str(),
                                       &session->specific);
        if (status < 0) {
            std::string why;
            if (table.GetError != nullptr) {
                ViStatus code = 0;
                ViChar text[512] = {};
                table.GetError(VI_NULL, &code, sizeof text, text);
                why = text;
            }
            if (why.empty()) {
                ViChar text[256] = {};
                table.error_message(VI_NULL, status, text);
                why = text;
            }
            throw StatusError(status, "logical name \"" + name + "\": driver " +
                                          session->module->Prefix() + " did not open resource \"" +
                                          entry->resource + "\": " + why);
        }
        std::lock_guard lock(g_openClose);
        size_t slot = 0;
        while (slot < kSlots && g_sessions[slot].load(std::memory_order_relaxed) != nullptr)
            ++slot;
        if (slot == kSlots) {
            table.close(session->specific);
            throw StatusError(IVI_ERROR_TOO_MANY_SESSIONS,
                              "all " + std::to_string(kSlots) + " IviFgen sessions are open");
        }
        g_sessions[slot].store(session.release(), std::memory_order_release);
        opened = kFirstSession + static_cast<ViSession>(slot);
        *vi = opened;
    } catch (const StatusError& e) {
        status = OwnError(nullptr, e.Status(), std::string("IviFgen_InitWithOptions: ") + e.what());
    } catch (const std::bad_alloc&) {
        status =
            OwnError(nullptr, IVI_ERROR_OUT_OF_MEMORY, "IviFgen_InitWithOptions: out of memory");
    }
    if (TraceEnabled())
        Record("IviFgen_InitWithOptions", start, status, logicalName, idQuery, reset, optionString,
               vi != nullptr ? &opened : static_cast<ViSession*>(nullptr));
    return status;
}

ViStatus IviFgen_close(ViSession vi) {
    const auto start = Clock::now();
    std::unique_ptr<ClassSession> session;
    {
        std::lock_guard lock(g_openClose);
        if (FindSession(vi) != nullptr)
            session.reset(g_sessions[vi - kFirstSession].exchange(nullptr));
    }
    const ViStatus status = session ? session->module->Table().close(session->specific)
                                    : NoSession(vi, "IviFgen_close");
    if (session && status < 0) {
        ViChar text[256] = {};
        session->module->Table().error_message(VI_NULL, status, text);
        OwnError(nullptr, status, std::string("IviFgen_close: ") + text);
    }
    if (TraceEnabled()) Record("IviFgen_close", start, status, vi);
    return status;
}

ViStatus IviFgen_GetSpecificDriverCHandle(ViSession vi, ViSession* specificVi) {
    const auto start = Clock::now();
    ClassSession* s = FindSession(vi);
    ViStatus status = VI_SUCCESS;
    if (s == nullptr)
        status = NoSession(vi, "IviFgen_GetSpecificDriverCHandle");
    else if (specificVi == nullptr)
        status = OwnError(s, IVI_ERROR_NULL_POINTER,
                          "IviFgen_GetSpecificDriverCHandle: specificVi is a null pointer");
    else
        *specificVi = s->specific;
    if (TraceEnabled()) Record("IviFgen_GetSpecificDriverCHandle", start, status, vi, specificVi);
    return status;
}

ViStatus IviFgen_error_message(ViSession vi, ViStatus status, ViChar message[]) {
    const auto start = Clock::now();
    ClassSession* s = FindSession(vi);
    ViStatus result = VI_SUCCESS;
    if (message == nullptr)
        result =
            OwnError(s, IVI_ERROR_NULL_POINTER, "IviFgen_error_message: message is a null pointer");
    else if (s == nullptr || KnownStatusText(status) != nullptr)
        StatusMessage(status, message);
    else if (s->module->Table().error_message(s->specific, status, message) < 0)
        StatusMessage(status, message);
    if (TraceEnabled())
        Record("IviFgen_error_message", start, result, vi, status, OutText{message, 256});
    return result;
}

ViStatus IviFgen_GetError(ViSession vi, ViStatus* code, ViInt32 bufferSize, ViChar description[]) {
    const auto start = Clock::now();
    ClassSession* s = FindSession(vi);
    ViStatus result;
    if (s != nullptr && !s->ownErrorPending && s->module->Table().GetError != nullptr) {
        result = s->module->Table().GetError(s->specific, code, bufferSize, description);
    } else {
        ViStatus& status = s != nullptr ? s->ownStatus : t_status;
        std::string& elaboration = s != nullptr ? s->ownElaboration : t_elaboration;
        ViChar text[256];
        StatusMessage(status, text);
        if (code != nullptr) *code = status;
        result = CopyText(status == 0 ? std::string() : std::string(text) + " " + elaboration,
                          bufferSize, description);
        if (bufferSize != 0) {
            status = 0;
            elaboration.clear();
            if (s != nullptr) s->ownErrorPending = false;
        }
    }
    if (TraceEnabled())
        Record("IviFgen_GetError", start, result, vi, code, bufferSize,
               OutText{description, bufferSize});
    return result;
}

ViStatus IviFgen_GetAttributeViInt32(ViSession vi, ViConstString channel, ViAttr attr,
                                     ViInt32* value) {
    return QZIVI_FORWARD(GetAttributeViInt32, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_GetAttributeViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                      ViReal64* value) {
    return QZIVI_FORWARD(GetAttributeViReal64, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_GetAttributeViBoolean(ViSession vi, ViConstString channel, ViAttr attr,
                                       ViBoolean* value) {
    return QZIVI_FORWARD(GetAttributeViBoolean, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_GetAttributeViSession(ViSession vi, ViConstString channel, ViAttr attr,
                                       ViSession* value) {
    return QZIVI_FORWARD(GetAttributeViSession, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_GetAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                      ViInt32 bufferSize, ViChar value[]) {
    ClassSession* s = FindSession(vi);
    // What the class driver itself knows: its own last failure, the logical name, the module.
    std::string own;
    bool answered = false;
    if (s != nullptr && attr == IVI_ATTR_ERROR_ELABORATION && s->ownErrorPending) {
        own = s->ownElaboration;
        answered = true;
    } else if (s == nullptr && vi == VI_NULL && attr == IVI_ATTR_ERROR_ELABORATION) {
        own = t_elaboration;
        answered = true;
    } else if (s != nullptr && attr == IVI_ATTR_LOGICAL_NAME) {
        own = s->logicalName;
        answered = true;
    } else if (s != nullptr && attr == QZIVI_ATTR_DRIVER_MODULE) {
        own = s->module->Location();
        answered = true;
    }
    if (!answered)
        return QZIVI_FORWARD(GetAttributeViString, vi, Channel{channel}, attr, bufferSize,
                             OutText{value, bufferSize});
    const auto start = Clock::now();
    const ViStatus status = bufferSize > 0 && value == nullptr
                                ? OwnError(s, IVI_ERROR_NULL_POINTER,
                                           "IviFgen_GetAttributeViString: value is a null pointer")
                                : CopyText(own, bufferSize, value);
    if (TraceEnabled())
        Record("IviFgen_GetAttributeViString", start, status, vi, Channel{channel}, attr,
               bufferSize, OutText{value, bufferSize});
    return status;
}

ViStatus IviFgen_SetAttributeViInt32(ViSession vi, ViConstString channel, ViAttr attr,
                                     ViInt32 value) {
    return QZIVI_FORWARD(SetAttributeViInt32, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_SetAttributeViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                      ViReal64 value) {
    return QZIVI_FORWARD(SetAttributeViReal64, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_SetAttributeViBoolean(ViSession vi, ViConstString channel, ViAttr attr,
                                       ViBoolean value) {
    return QZIVI_FORWARD(SetAttributeViBoolean, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_SetAttributeViSession(ViSession vi, ViConstString channel, ViAttr attr,
                                       ViSession value) {
    return QZIVI_FORWARD(SetAttributeViSession, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_SetAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                      ViConstString value) {
    return QZIVI_FORWARD(SetAttributeViString, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_CheckAttributeViInt32(ViSession vi, ViConstString channel, ViAttr attr,
                                       ViInt32 value) {
    return QZIVI_FORWARD(CheckAttributeViInt32, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_CheckAttributeViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                        ViReal64 value) {
    return QZIVI_FORWARD(CheckAttributeViReal64, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_CheckAttributeViBoolean(ViSession vi, ViConstString channel, ViAttr attr,
                                         ViBoolean value) {
    return QZIVI_FORWARD(CheckAttributeViBoolean, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_CheckAttributeViSession(ViSession vi, ViConstString channel, ViAttr attr,
                                         ViSession value) {
    return QZIVI_FORWARD(CheckAttributeViSession, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_CheckAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                        ViConstString value) {
    return QZIVI_FORWARD(CheckAttributeViString, vi, Channel{channel}, attr, value);
}

ViStatus IviFgen_ConfigureOutputMode(ViSession vi, ViInt32 outputMode) {
    return QZIVI_FORWARD(ConfigureOutputMode, vi, outputMode);
}

ViStatus IviFgen_ConfigureRefClockSource(ViSession vi, ViInt32 source) {
    return QZIVI_FORWARD(ConfigureRefClockSource, vi, source);
}

ViStatus IviFgen_ConfigureOutputImpedance(ViSession vi, ViConstString channel, ViReal64 impedance) {
    return QZIVI_FORWARD(ConfigureOutputImpedance, vi, Channel{channel}, impedance);
}

ViStatus IviFgen_ConfigureOperationMode(ViSession vi, ViConstString channel,
                                        ViInt32 operationMode) {
    return QZIVI_FORWARD(ConfigureOperationMode, vi, Channel{channel}, operationMode);
}

ViStatus IviFgen_ConfigureOutputEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return QZIVI_FORWARD(ConfigureOutputEnabled, vi, Channel{channel}, enabled);
}

ViStatus IviFgen_ConfigureStandardWaveform(ViSession vi, ViConstString channel, ViInt32 waveform,
                                           ViReal64 amplitude, ViReal64 dcOffset,
                                           ViReal64 frequency, ViReal64 startPhase) {
    return QZIVI_FORWARD(ConfigureStandardWaveform, vi, Channel{channel}, waveform, amplitude,
                         dcOffset, frequency, startPhase);
}

ViStatus IviFgen_QueryArbWfmCapabilities(ViSession vi, ViInt32* maxNumWaveforms,
                                         ViInt32* waveformQuantum, ViInt32* minWaveformSize,
                                         ViInt32* maxWaveformSize) {
    return QZIVI_FORWARD(QueryArbWfmCapabilities, vi, maxNumWaveforms, waveformQuantum,
                         minWaveformSize, maxWaveformSize);
}

ViStatus IviFgen_CreateArbWaveform(ViSession vi, ViInt32 size, const ViReal64 data[],
                                   ViInt32* handle) {
    return QZIVI_FORWARD(CreateArbWaveform, vi, size, data, handle);
}

ViStatus IviFgen_ClearArbWaveform(ViSession vi, ViInt32 handle) {
    return QZIVI_FORWARD(ClearArbWaveform, vi, handle);
}

ViStatus IviFgen_ConfigureArbWaveform(ViSession vi, ViConstString channel, ViInt32 handle,
                                      ViReal64 gain, ViReal64 offset) {
    return QZIVI_FORWARD(ConfigureArbWaveform, vi, Channel{channel}, handle, gain, offset);
}

ViStatus IviFgen_ConfigureSampleRate(ViSession vi, ViReal64 sampleRate) {
    return QZIVI_FORWARD(ConfigureSampleRate, vi, sampleRate);
}

ViStatus IviFgen_ConfigureArbFrequency(ViSession vi, ViConstString channel, ViReal64 frequency) {
    return QZIVI_FORWARD(ConfigureArbFrequency, vi, Channel{channel}, frequency);
}

ViStatus IviFgen_QueryArbSeqCapabilities(ViSession vi, ViInt32* maxNumSequences,
                                         ViInt32* minSequenceLength, ViInt32* maxSequenceLength,
                                         ViInt32* maxLoopCount) {
    return QZIVI_FORWARD(QueryArbSeqCapabilities, vi, maxNumSequences, minSequenceLength,
                         maxSequenceLength, maxLoopCount);
}

ViStatus IviFgen_CreateArbSequence(ViSession vi, ViInt32 length, const ViInt32 waveformHandles[],
                                   const ViInt32 loopCounts[], ViInt32* handle) {
    return QZIVI_FORWARD(CreateArbSequence, vi, length, waveformHandles, loopCounts, handle);
}

ViStatus IviFgen_ClearArbSequence(ViSession vi, ViInt32 handle) {
    return QZIVI_FORWARD(ClearArbSequence, vi, handle);
}

ViStatus IviFgen_ConfigureArbSequence(ViSession vi, ViConstString channel, ViInt32 handle,
                                      ViReal64 gain, ViReal64 offset) {
    return QZIVI_FORWARD(ConfigureArbSequence, vi, Channel{channel}, handle, gain, offset);
}

ViStatus IviFgen_ConfigureTriggerSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return QZIVI_FORWARD(ConfigureTriggerSource, vi, Channel{channel}, source);
}

ViStatus IviFgen_ConfigureInternalTriggerRate(ViSession vi, ViReal64 rate) {
    return QZIVI_FORWARD(ConfigureInternalTriggerRate, vi, rate);
}

ViStatus IviFgen_SendSoftwareTrigger(ViSession vi) {
    return Forward("IviFgen_SendSoftwareTrigger", vi, &DriverTable::SendSoftwareTrigger);
}

ViStatus IviFgen_ConfigureBurstCount(ViSession vi, ViConstString channel, ViInt32 count) {
    return QZIVI_FORWARD(ConfigureBurstCount, vi, Channel{channel}, count);
}

ViStatus IviFgen_ConfigureAMEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return QZIVI_FORWARD(ConfigureAMEnabled, vi, Channel{channel}, enabled);
}

ViStatus IviFgen_ConfigureAMSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return QZIVI_FORWARD(ConfigureAMSource, vi, Channel{channel}, source);
}

ViStatus IviFgen_ConfigureAMInternal(ViSession vi, ViReal64 depth, ViInt32 waveform,
                                     ViReal64 frequency) {
    return QZIVI_FORWARD(ConfigureAMInternal, vi, depth, waveform, frequency);
}

ViStatus IviFgen_ConfigureFMEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return QZIVI_FORWARD(ConfigureFMEnabled, vi, Channel{channel}, enabled);
}

ViStatus IviFgen_ConfigureFMSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return QZIVI_FORWARD(ConfigureFMSource, vi, Channel{channel}, source);
}

ViStatus IviFgen_ConfigureFMInternal(ViSession vi, ViReal64 deviation, ViInt32 waveform,
                                     ViReal64 frequency) {
    return QZIVI_FORWARD(ConfigureFMInternal, vi, deviation, waveform, frequency);
}

ViStatus IviFgen_InitiateGeneration(ViSession vi) {
    return Forward("IviFgen_InitiateGeneration", vi, &DriverTable::InitiateGeneration);
}

ViStatus IviFgen_AbortGeneration(ViSession vi) {
    return Forward("IviFgen_AbortGeneration", vi, &DriverTable::AbortGeneration);
}

ViStatus QZIvi_RenderOutput(ViSession vi, ViConstString channel, ViReal64 startTime,
                            ViReal64 timeStep, ViInt32 count, ViReal64 volts[]) {
    return Forward("QZIvi_RenderOutput", vi, &DriverTable::RenderOutput, Channel{channel},
                   startTime, timeStep, count, OutSamples{volts});
}

// ---- Engine ----------------------------------------------------------------------------------

ViStatus Ivi_GetAttrMinMaxViReal64(ViSession specificVi, ViConstString channel, ViAttr attr,
                                   ViReal64* min, ViReal64* max, ViBoolean* hasMin,
                                   ViBoolean* hasMax) {
    const auto start = Clock::now();
    // The engine knows a specific session by the class session that opened it.
    ClassSession* owner = nullptr;
    for (auto& slot : g_sessions) {
        ClassSession* s = slot.load(std::memory_order_acquire);
        if (s != nullptr && s->specific == specificVi) owner = s;
    }
    ViStatus status;
    if (owner == nullptr)
        status = OwnError(nullptr, IVI_ERROR_INVALID_SESSION_HANDLE,
                          "Ivi_GetAttrMinMaxViReal64: " + std::to_string(specificVi) +
                              " is not a specific driver session opened through IviFgen");
    else if (owner->module->Table().GetAttrMinMaxViReal64 == nullptr)
        status = OwnError(owner, IVI_ERROR_FUNCTION_NOT_SUPPORTED,
                          "Ivi_GetAttrMinMaxViReal64: driver module \"" +
                              owner->module->Location() + "\" gives no range information");
    else
        status = owner->module->Table().GetAttrMinMaxViReal64(specificVi, Physical(*owner, channel),
                                                              attr, min, max, hasMin, hasMax);
    if (TraceEnabled())
        Record("Ivi_GetAttrMinMaxViReal64", start, status, specificVi, Channel{channel}, attr, min,
               max, hasMin, hasMax);
    return status;
}

namespace {
std::mutex g_listsMutex;
std::map<ViInt32, std::vector<std::string>> g_lists;
ViInt32 g_nextList = 1;
} // namespace

ViStatus Ivi_GetLogicalNamesList(ViInt32* listHandle, ViInt32* count) {
    const auto start = Clock::now();
    ViStatus status = VI_SUCCESS;
    try {
        if (listHandle == nullptr || count == nullptr)
            throw StatusError(IVI_ERROR_NULL_POINTER,
                              "listHandle and count must not be null pointers");
        *listHandle = 0;
        *count = 0;
        std::vector<std::string> names;
        for (const auto& session : LoadConfigStore().sessions)
            names.push_back(session.logicalName);
        std::lock_guard lock(g_listsMutex);
        *count = static_cast<ViInt32>(names.size());
        *listHandle = g_nextList++;
        g_lists.emplace(*listHandle, std::move(names));
    } catch (const StatusError& e) {
        status = OwnError(nullptr, e.Status(), std::string("Ivi_GetLogicalNamesList: ") + e.what());
    }
    if (TraceEnabled()) Record("Ivi_GetLogicalNamesList", start, status, listHandle, count);
    return status;
}

ViStatus Ivi_GetNthLogicalName(ViInt32 listHandle, ViInt32 index, ViChar buffer[],
                               ViInt32 bufferSize, ViBoolean* found) {
    const auto start = Clock::now();
    ViStatus status = VI_SUCCESS;
    {
        std::lock_guard lock(g_listsMutex);
        const auto list = g_lists.find(listHandle);
        if (list == g_lists.end()) {
            status = OwnError(nullptr, IVI_ERROR_INVALID_VALUE,
                              "Ivi_GetNthLogicalName: " + std::to_string(listHandle) +
                                  " is not a list of logical names");
        } else {
            const bool inRange = index >= 1 && static_cast<size_t>(index) <= list->second.size();
            if (found != nullptr) *found = inRange ? VI_TRUE : VI_FALSE;
            status =
                CopyText(inRange ? list->second[static_cast<size_t>(index) - 1] : std::string(),
                         bufferSize, buffer);
        }
    }
    if (TraceEnabled())
        Record("Ivi_GetNthLogicalName", start, status, listHandle, index,
               OutText{buffer, bufferSize}, bufferSize, found);
    return status;
}

ViStatus Ivi_DisposeLogicalNamesList(ViInt32 listHandle) {
    const auto start = Clock::now();
    ViStatus status = VI_SUCCESS;
    {
        std::lock_guard lock(g_listsMutex);
        if (g_lists.erase(listHandle) == 0)
            status = OwnError(nullptr, IVI_ERROR_INVALID_VALUE,
                              "Ivi_DisposeLogicalNamesList: " + std::to_string(listHandle) +
                                  " is not a list of logical names");
    }
    if (TraceEnabled()) Record("Ivi_DisposeLogicalNamesList", start, status, listHandle);
    return status;
}

} // extern "C"
