// The IviFgen class driver: opens a logical name's driver session and dispatches every call to
// the specific driver, translating virtual channel names and tracing when asked.
#include "class_session.h"
#include "qzivi/config_store.h"
#include "qzivi/ivi_common.h"

#include <cstdint>
#include <cstdlib>
#include <cstring>

namespace qzivi::ivi {

namespace {
constexpr ViSession kFirstSession = 0x1000;
}

SessionTable<ClassSession>& ClassSessions() {
    static SessionTable<ClassSession> sessions(kFirstSession);
    return sessions;
}

ErrorRecord& ThreadRecord() {
    thread_local ErrorRecord record;
    return record;
}

namespace {
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
} // namespace

const char* Physical(const ClassSession& s, ViConstString name) {
    if (name == nullptr || s.virtualNames.empty()) return name;
    const size_t length = std::strlen(name);
    for (const auto& [virtualName, physical] : s.virtualNames)
        if (virtualName.size() == length && SameText(virtualName.data(), name, length))
            return physical.c_str();
    return name;
}

} // namespace qzivi::ivi

namespace {

using namespace qzivi::ivi;

[[noreturn]] void NoSession(ViSession vi) {
    throw StatusError(IVI_ERROR_INVALID_SESSION_HANDLE,
                      std::to_string(vi) + " is not an open IviFgen session");
}

// One call through to the specific driver of `vi`.
template <typename Fn, typename... Args>
ViStatus Forward(const char* function, ViSession vi, Fn DriverTable::*slot, Args... args) {
    ClassSession* s = ClassSessions().Find(vi);
    return TracedEntry(
        function, s,
        [&]() -> ViStatus {
            if (s == nullptr) NoSession(vi);
            const Fn fn = s->table.*slot;
            if (fn == nullptr)
                throw StatusError(IVI_ERROR_FUNCTION_NOT_SUPPORTED,
                                  "driver module \"" + s->module->Location() +
                                      "\" has no function " + s->module->Prefix() + "_" +
                                      (std::strchr(function, '_') + 1));
            s->own.pending = false;
            return fn(s->specific, Unwrap(*s, args)...);
        },
        vi, args...);
}

// The logical name's store entry, or StatusError naming the store and the names it knows.
const DriverSession& FindEntry(const ConfigStore& store, const std::string& name) {
    if (const DriverSession* entry = store.Find(name)) return *entry;
    std::string known;
    for (const auto& session : store.sessions)
        known += (known.empty() ? "" : ", ") + session.logicalName;
    // A name of any length is told by its start: an error text is for a person to read.
    constexpr std::size_t kShown = 80;
    const std::string shown = name.size() <= kShown ? name : name.substr(0, kShown) + "...";
    throw StatusError(IVI_ERROR_LOGICAL_NAME_NOT_FOUND,
                      "logical name \"" + shown + "\" is not in the configuration store " +
                          (store.path.empty() ? std::string("(embedded default only)")
                                              : "\"" + store.path + "\"") +
                          "; known names: " + known);
}

// Why a specific driver refused to open: its own error text, else its status text.
std::string OpenFailure(const DriverTable& table, ViStatus status) {
    ViChar text[512] = {};
    if (table.GetError != nullptr) {
        ViStatus code = 0;
        table.GetError(VI_NULL, &code, sizeof text, text);
    }
    if (text[0] == '\0') table.error_message(VI_NULL, status, text);
    return text;
}

} // namespace

#define QZIVI_FORWARD(name, vi, ...) Forward("IviFgen_" #name, vi, &DriverTable::name, __VA_ARGS__)

extern "C" {

ViStatus IviFgen_InitWithOptions(ViRsrc logicalName, ViBoolean idQuery, ViBoolean reset,
                                 ViConstString optionString, ViSession* vi) {
    ViSession opened = 0;
    return TracedEntry<true>(
        "IviFgen_InitWithOptions", nullptr,
        [&]() -> ViStatus {
            const std::string name = logicalName != nullptr ? logicalName : "";
            if (vi == nullptr) throw StatusError(IVI_ERROR_NULL_POINTER, "vi is a null pointer");
            *vi = 0;
            const ConfigStore store = LoadConfigStore();
            const char* traceFile = std::getenv("QZIVI_TRACE");
            if (traceFile != nullptr && *traceFile != '\0')
                SetTraceFile(traceFile);
            else if (!store.traceFile.empty())
                SetTraceFile(store.traceFile);
            const DriverSession& entry = FindEntry(store, name);
            auto session = std::make_unique<ClassSession>();
            session->module = LoadDriverModule(entry, store.path);
            session->table = session->module->Table();
            session->logicalName = entry.logicalName;
            session->virtualNames = entry.virtualNames;
            const std::string options = JoinOptions(
                MergeOptions(ParseOptions(entry.options),
                             ParseOptions(optionString != nullptr ? optionString : "")));
            const DriverTable& table = session->table;
            const ViStatus status = table.InitWithOptions(entry.resource.c_str(), idQuery, reset,
                                                          options.c_str(), &session->specific);
            if (status < 0)
                throw StatusError(status, "logical name \"" + name + "\": driver " +
                                              session->module->Prefix() +
                                              " did not open resource \"" + entry.resource +
                                              "\": " + OpenFailure(table, status));
            const ViSession specific = session->specific;
            try {
                opened = ClassSessions().Insert(std::move(session));
            } catch (...) {
                table.close(specific);
                throw;
            }
            *vi = opened;
            return status;
        },
        logicalName, idQuery, reset, optionString,
        vi != nullptr ? &opened : static_cast<ViSession*>(nullptr));
}

ViStatus IviFgen_close(ViSession vi) {
    return TracedEntry(
        "IviFgen_close", nullptr,
        [&]() -> ViStatus {
            const std::unique_ptr<ClassSession> session = ClassSessions().Remove(vi);
            if (!session) NoSession(vi);
            const ViStatus status = session->table.close(session->specific);
            if (status < 0) {
                ViChar text[256] = {};
                session->table.error_message(VI_NULL, status, text);
                throw StatusError(status, text);
            }
            return status;
        },
        vi);
}

ViStatus IviFgen_GetSpecificDriverCHandle(ViSession vi, ViSession* specificVi) {
    ClassSession* s = ClassSessions().Find(vi);
    return TracedEntry(
        "IviFgen_GetSpecificDriverCHandle", s,
        [&]() -> ViStatus {
            if (s == nullptr) NoSession(vi);
            if (specificVi == nullptr)
                throw StatusError(IVI_ERROR_NULL_POINTER, "specificVi is a null pointer");
            *specificVi = s->specific;
            return VI_SUCCESS;
        },
        vi, specificVi);
}

ViStatus IviFgen_error_message(ViSession vi, ViStatus status, ViChar message[]) {
    ClassSession* s = ClassSessions().Find(vi);
    return TracedEntry(
        "IviFgen_error_message", s,
        [&]() -> ViStatus {
            if (message == nullptr)
                throw StatusError(IVI_ERROR_NULL_POINTER, "message is a null pointer");
            if (s == nullptr || KnownStatusText(status) != nullptr ||
                s->table.error_message(s->specific, status, message) < 0)
                StatusMessage(status, message);
            return VI_SUCCESS;
        },
        vi, status, TraceOutText{message, 256});
}

ViStatus IviFgen_GetError(ViSession vi, ViStatus* code, ViInt32 bufferSize, ViChar description[]) {
    ClassSession* s = ClassSessions().Find(vi);
    return TracedEntry(
        "IviFgen_GetError", s,
        [&]() -> ViStatus {
            if (s != nullptr && !s->own.pending && s->table.GetError != nullptr)
                return s->table.GetError(s->specific, code, bufferSize, description);
            return RecordOf(s).Report(code, bufferSize, description);
        },
        vi, code, bufferSize, TraceOutText{description, bufferSize});
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
    ClassSession* s = ClassSessions().Find(vi);
    // What the class driver itself knows: its own last failure, the logical name, the module.
    const std::string* own = nullptr;
    if (s != nullptr && attr == IVI_ATTR_ERROR_ELABORATION && s->own.pending)
        own = &s->own.elaboration;
    else if (s == nullptr && vi == VI_NULL && attr == IVI_ATTR_ERROR_ELABORATION)
        own = &ThreadRecord().elaboration;
    else if (s != nullptr && attr == IVI_ATTR_LOGICAL_NAME)
        own = &s->logicalName;
    else if (s != nullptr && attr == QZIVI_ATTR_DRIVER_MODULE)
        own = &s->module->Location();
    if (own == nullptr)
        return QZIVI_FORWARD(GetAttributeViString, vi, Channel{channel}, attr, bufferSize,
                             TraceOutText{value, bufferSize});
    return TracedEntry(
        "IviFgen_GetAttributeViString", s,
        [&]() -> ViStatus {
            if (bufferSize > 0 && value == nullptr)
                throw StatusError(IVI_ERROR_NULL_POINTER, "value is a null pointer");
            return CopyText(*own, bufferSize, value);
        },
        vi, Channel{channel}, attr, bufferSize, TraceOutText{value, bufferSize});
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
    return QZIVI_FORWARD(CreateArbWaveform, vi, size, TraceArray<ViReal64>{data, size}, handle);
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
    return QZIVI_FORWARD(CreateArbSequence, vi, length,
                         TraceArray<ViInt32>{waveformHandles, length},
                         TraceArray<ViInt32>{loopCounts, length}, handle);
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
                   startTime, timeStep, count, TraceOutArray{volts, count});
}

} // extern "C"
