// The C entry points of the simulated generator: sessions, faults, and the IVI error record.
#include "QZSimFgen.h"

#include "faults.h"
#include "instrument.h"
#include "qzivi/c_boundary.h"
#include "qzivi/ivi_common.h"

#include <array>
#include <atomic>
#include <memory>
#include <mutex>
#include <new>

namespace {

using qzivi::ivi::CEntry;
using qzivi::ivi::CopyText;
using qzivi::ivi::ErrorRecord;
using qzivi::ivi::Out;
using qzivi::ivi::SessionTable;
using qzivi::ivi::StatusError;
using qzivi::sim::AttrValue;
using qzivi::sim::Faults;
using qzivi::sim::Group;
using qzivi::sim::Instrument;

struct Session {
    Session(Faults faults, std::string resource, std::string driverSetup)
        : instrument(std::move(faults), std::move(resource), std::move(driverSetup)) {}
    std::mutex mutex;
    Instrument instrument;
    ErrorRecord record;
};

// Session numbers of this driver start here, so that a class driver's number passed by mistake
// is refused rather than taken for another session. The loadable build counts from elsewhere:
// the engine knows a specific session by its number, so two drivers in one process keep apart.
#ifndef QZSIM_FIRST_SESSION
#define QZSIM_FIRST_SESSION 0x5100
#endif
SessionTable<Session> g_sessions(QZSIM_FIRST_SESSION);

// The error record of calls that have no session: a failed open, a wrong session number.
thread_local ErrorRecord t_record;

// What the Throw fault throws: a type no handler of this project knows.
struct InjectedThrow {};

// Runs one call on a session: injected faults first, then the body; whatever it throws becomes
// the call's status and the session's elaboration.
template <typename Body>
ViStatus Run(ViSession vi, const char* function, Body&& body) noexcept {
    Session* s = g_sessions.Find(vi);
    if (s == nullptr) return qzivi::ivi::InvalidSession(t_record, vi, function);
    return CEntry(function, s->record, [&]() -> ViStatus {
        std::lock_guard lock(s->mutex);
        Faults& faults = s->instrument.ActiveFaults();
        if (!faults.Empty()) {
            if (faults.Throws(function)) throw InjectedThrow{};
            if (const ViStatus injected = faults.Failure(function))
                throw StatusError(injected, "failure injected by DriverSetup");
        }
        body(s->instrument);
        if (!faults.Empty())
            if (const ViStatus warning = faults.Warning(function)) {
                s->record.elaboration = std::string(function) + ": warning injected by DriverSetup";
                return warning;
            }
        return VI_SUCCESS;
    });
}

Faults ParseInitOptions(ViConstString optionString, std::string& driverSetup) {
    Faults faults;
    for (const auto& option :
         qzivi::ivi::ParseOptions(optionString != nullptr ? optionString : "")) {
        auto is = [&](const char* name) { return qzivi::ivi::EqualsNoCase(option.name, name); };
        if (is("DriverSetup")) {
            driverSetup = option.value;
            faults = qzivi::sim::ParseDriverSetup(option.value);
        } else if (is("Simulate") || is("RangeCheck") || is("QueryInstrStatus") || is("Cache") ||
                   is("RecordCoercions") || is("InterchangeCheck")) {
            qzivi::ivi::ParseBoolOption(option); // refuses a value that is no boolean
        } else {
            throw StatusError(IVI_ERROR_BAD_OPTION_NAME,
                              "option \"" + option.name + "\" is unknown");
        }
    }
    return faults;
}

ViStatus GetString(ViSession vi, const char* function, ViConstString channel, ViAttr attr,
                   ViInt32 bufferSize, ViChar value[]) {
    ViStatus fits = 0;
    Session* s = g_sessions.Find(vi);
    const ViStatus status = Run(vi, function, [&](Instrument& inst) {
        std::string text = attr == IVI_ATTR_ERROR_ELABORATION
                               ? s->record.elaboration
                               : inst.GetAttribute<std::string>(attr, channel);
        if (bufferSize > 0 && value == nullptr)
            throw StatusError(IVI_ERROR_NULL_POINTER, "the value buffer is a null pointer");
        fits = CopyText(text, bufferSize, value);
    });
    return status != VI_SUCCESS ? status : fits;
}

} // namespace

extern "C" {

ViStatus QZSimFgen_InitWithOptions(ViRsrc resource, ViBoolean idQuery, ViBoolean reset,
                                   ViConstString options, ViSession* vi) {
    (void)idQuery;
    (void)reset; // every session starts from the reset state
    return CEntry("InitWithOptions", t_record, [&]() -> ViStatus {
        if (vi == nullptr) throw StatusError(IVI_ERROR_NULL_POINTER, "vi is a null pointer");
        *vi = 0;
        std::string driverSetup;
        Faults faults = ParseInitOptions(options, driverSetup);
        if (faults.Throws("InitWithOptions")) throw InjectedThrow{};
        if (const ViStatus injected = faults.Failure("InitWithOptions"))
            throw StatusError(injected, "failure injected by DriverSetup");
        const ViStatus warning = faults.Warning("InitWithOptions");
        auto session = std::make_unique<Session>(
            std::move(faults), resource != nullptr ? resource : "", std::move(driverSetup));
        session->instrument.Reset();
        *vi = g_sessions.Insert(std::move(session));
        return warning;
    });
}

ViStatus QZSimFgen_close(ViSession vi) {
    return CEntry("close", t_record, [&]() -> ViStatus {
        const std::unique_ptr<Session> session = g_sessions.Remove(vi);
        if (!session) return qzivi::ivi::InvalidSession(t_record, vi, "close");
        // The session is gone whatever the instrument answers; an injected failure still reports.
        if (const ViStatus injected = session->instrument.ActiveFaults().Failure("close"))
            throw StatusError(injected, "failure injected by DriverSetup");
        return VI_SUCCESS;
    });
}

ViStatus QZSimFgen_error_message(ViSession vi, ViStatus status, ViChar message[]) {
    (void)vi;
    return qzivi::ivi::ErrorMessage(t_record, status, message);
}

ViStatus QZSimFgen_GetError(ViSession vi, ViStatus* code, ViInt32 bufferSize,
                            ViChar description[]) {
    return g_sessions.Report(vi, t_record, code, bufferSize, description);
}

ViStatus QZSimFgen_GetAttributeViInt32(ViSession vi, ViConstString channel, ViAttr attr,
                                       ViInt32* value) {
    Session* s = g_sessions.Find(vi);
    return Run(vi, "GetAttributeViInt32", [&](Instrument& inst) {
        Out(value, attr == IVI_ATTR_PRIMARY_ERROR ? s->record.status
                                                  : inst.GetAttribute<ViInt32>(attr, channel));
    });
}

ViStatus QZSimFgen_GetAttributeViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                        ViReal64* value) {
    return Run(vi, "GetAttributeViReal64",
               [&](Instrument& inst) { Out(value, inst.GetAttribute<ViReal64>(attr, channel)); });
}

ViStatus QZSimFgen_GetAttributeViBoolean(ViSession vi, ViConstString channel, ViAttr attr,
                                         ViBoolean* value) {
    return Run(vi, "GetAttributeViBoolean",
               [&](Instrument& inst) { Out(value, inst.GetAttribute<ViBoolean>(attr, channel)); });
}

ViStatus QZSimFgen_GetAttributeViSession(ViSession vi, ViConstString channel, ViAttr attr,
                                         ViSession* value) {
    return Run(vi, "GetAttributeViSession",
               [&](Instrument& inst) { Out(value, inst.GetAttribute<ViSession>(attr, channel)); });
}

ViStatus QZSimFgen_GetAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                        ViInt32 bufferSize, ViChar value[]) {
    return GetString(vi, "GetAttributeViString", channel, attr, bufferSize, value);
}

#define QZSIM_SET_AND_CHECK(Type, Suffix)                                                          \
    ViStatus QZSimFgen_SetAttribute##Suffix(ViSession vi, ViConstString channel, ViAttr attr,      \
                                            Type value) {                                          \
        return Run(vi, "SetAttribute" #Suffix, [&](Instrument& inst) {                             \
            inst.SetAttribute(attr, channel, AttrValue(value), false);                             \
        });                                                                                        \
    }                                                                                              \
    ViStatus QZSimFgen_CheckAttribute##Suffix(ViSession vi, ViConstString channel, ViAttr attr,    \
                                              Type value) {                                        \
        return Run(vi, "CheckAttribute" #Suffix, [&](Instrument& inst) {                           \
            inst.SetAttribute(attr, channel, AttrValue(value), true);                              \
        });                                                                                        \
    }
QZSIM_SET_AND_CHECK(ViInt32, ViInt32)
QZSIM_SET_AND_CHECK(ViReal64, ViReal64)
QZSIM_SET_AND_CHECK(ViBoolean, ViBoolean)
QZSIM_SET_AND_CHECK(ViSession, ViSession)
#undef QZSIM_SET_AND_CHECK

ViStatus QZSimFgen_SetAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                        ViConstString value) {
    return Run(vi, "SetAttributeViString", [&](Instrument& inst) {
        inst.SetAttribute(attr, channel, AttrValue(std::string(value != nullptr ? value : "")),
                          false);
    });
}

ViStatus QZSimFgen_CheckAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                          ViConstString value) {
    return Run(vi, "CheckAttributeViString", [&](Instrument& inst) {
        inst.SetAttribute(attr, channel, AttrValue(std::string(value != nullptr ? value : "")),
                          true);
    });
}

ViStatus QZSimFgen_ConfigureOutputMode(ViSession vi, ViInt32 outputMode) {
    return Run(vi, "ConfigureOutputMode",
               [&](Instrument& inst) { inst.ConfigureOutputMode(outputMode); });
}

ViStatus QZSimFgen_ConfigureRefClockSource(ViSession vi, ViInt32 source) {
    return Run(vi, "ConfigureRefClockSource",
               [&](Instrument& inst) { inst.ConfigureRefClockSource(source); });
}

ViStatus QZSimFgen_ConfigureOutputImpedance(ViSession vi, ViConstString channel,
                                            ViReal64 impedance) {
    return Run(vi, "ConfigureOutputImpedance",
               [&](Instrument& inst) { inst.ConfigureOutputImpedance(channel, impedance); });
}

ViStatus QZSimFgen_ConfigureOperationMode(ViSession vi, ViConstString channel,
                                          ViInt32 operationMode) {
    return Run(vi, "ConfigureOperationMode",
               [&](Instrument& inst) { inst.ConfigureOperationMode(channel, operationMode); });
}

ViStatus QZSimFgen_ConfigureOutputEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return Run(vi, "ConfigureOutputEnabled", [&](Instrument& inst) {
        inst.ConfigureOutputEnabled(channel, enabled != VI_FALSE);
    });
}

ViStatus QZSimFgen_ConfigureStandardWaveform(ViSession vi, ViConstString channel, ViInt32 waveform,
                                             ViReal64 amplitude, ViReal64 dcOffset,
                                             ViReal64 frequency, ViReal64 startPhase) {
    return Run(vi, "ConfigureStandardWaveform", [&](Instrument& inst) {
        inst.RequireGroup(Group::StdFunc, "ConfigureStandardWaveform");
        inst.ConfigureStandardWaveform(channel,
                                       {waveform, amplitude, dcOffset, frequency, startPhase, 0});
    });
}

ViStatus QZSimFgen_QueryArbWfmCapabilities(ViSession vi, ViInt32* maxNumWaveforms,
                                           ViInt32* waveformQuantum, ViInt32* minWaveformSize,
                                           ViInt32* maxWaveformSize) {
    return Run(vi, "QueryArbWfmCapabilities", [&](Instrument& inst) {
        inst.RequireGroup(Group::ArbWfm, "QueryArbWfmCapabilities");
        inst.QueryArbWfmCapabilities(maxNumWaveforms, waveformQuantum, minWaveformSize,
                                     maxWaveformSize);
    });
}

ViStatus QZSimFgen_CreateArbWaveform(ViSession vi, ViInt32 size, const ViReal64 data[],
                                     ViInt32* handle) {
    return Run(vi, "CreateArbWaveform", [&](Instrument& inst) {
        inst.RequireGroup(Group::ArbWfm, "CreateArbWaveform");
        if (handle == nullptr)
            throw StatusError(IVI_ERROR_NULL_POINTER, "handle is a null pointer");
        *handle = inst.CreateArbWaveform(size, data);
    });
}

ViStatus QZSimFgen_ClearArbWaveform(ViSession vi, ViInt32 handle) {
    return Run(vi, "ClearArbWaveform", [&](Instrument& inst) {
        inst.RequireGroup(Group::ArbWfm, "ClearArbWaveform");
        inst.ClearArbWaveform(handle);
    });
}

ViStatus QZSimFgen_ConfigureArbWaveform(ViSession vi, ViConstString channel, ViInt32 handle,
                                        ViReal64 gain, ViReal64 offset) {
    return Run(vi, "ConfigureArbWaveform", [&](Instrument& inst) {
        inst.RequireGroup(Group::ArbWfm, "ConfigureArbWaveform");
        inst.ConfigureArbWaveform(channel, handle, gain, offset);
    });
}

ViStatus QZSimFgen_ConfigureSampleRate(ViSession vi, ViReal64 sampleRate) {
    return Run(vi, "ConfigureSampleRate",
               [&](Instrument& inst) { inst.ConfigureSampleRate(sampleRate); });
}

ViStatus QZSimFgen_ConfigureArbFrequency(ViSession vi, ViConstString channel, ViReal64 frequency) {
    return Run(vi, "ConfigureArbFrequency",
               [&](Instrument& inst) { inst.ConfigureArbFrequency(channel, frequency); });
}

ViStatus QZSimFgen_QueryArbSeqCapabilities(ViSession vi, ViInt32* maxNumSequences,
                                           ViInt32* minSequenceLength, ViInt32* maxSequenceLength,
                                           ViInt32* maxLoopCount) {
    return Run(vi, "QueryArbSeqCapabilities", [&](Instrument& inst) {
        inst.RequireGroup(Group::ArbSeq, "QueryArbSeqCapabilities");
        inst.QueryArbSeqCapabilities(maxNumSequences, minSequenceLength, maxSequenceLength,
                                     maxLoopCount);
    });
}

ViStatus QZSimFgen_CreateArbSequence(ViSession vi, ViInt32 length, const ViInt32 waveformHandles[],
                                     const ViInt32 loopCounts[], ViInt32* handle) {
    return Run(vi, "CreateArbSequence", [&](Instrument& inst) {
        inst.RequireGroup(Group::ArbSeq, "CreateArbSequence");
        if (handle == nullptr)
            throw StatusError(IVI_ERROR_NULL_POINTER, "handle is a null pointer");
        *handle = inst.CreateArbSequence(length, waveformHandles, loopCounts);
    });
}

ViStatus QZSimFgen_ClearArbSequence(ViSession vi, ViInt32 handle) {
    return Run(vi, "ClearArbSequence", [&](Instrument& inst) {
        inst.RequireGroup(Group::ArbSeq, "ClearArbSequence");
        inst.ClearArbSequence(handle);
    });
}

ViStatus QZSimFgen_ConfigureArbSequence(ViSession vi, ViConstString channel, ViInt32 handle,
                                        ViReal64 gain, ViReal64 offset) {
    return Run(vi, "ConfigureArbSequence", [&](Instrument& inst) {
        inst.RequireGroup(Group::ArbSeq, "ConfigureArbSequence");
        inst.ConfigureArbSequence(channel, handle, gain, offset);
    });
}

ViStatus QZSimFgen_ConfigureTriggerSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return Run(vi, "ConfigureTriggerSource",
               [&](Instrument& inst) { inst.ConfigureTriggerSource(channel, source); });
}

ViStatus QZSimFgen_ConfigureInternalTriggerRate(ViSession vi, ViReal64 rate) {
    return Run(vi, "ConfigureInternalTriggerRate",
               [&](Instrument& inst) { inst.ConfigureInternalTriggerRate(rate); });
}

ViStatus QZSimFgen_SendSoftwareTrigger(ViSession vi) {
    return Run(vi, "SendSoftwareTrigger", [&](Instrument& inst) {
        inst.RequireGroup(Group::SoftwareTrigger, "SendSoftwareTrigger");
        inst.SendSoftwareTrigger();
    });
}

ViStatus QZSimFgen_ConfigureBurstCount(ViSession vi, ViConstString channel, ViInt32 count) {
    return Run(vi, "ConfigureBurstCount",
               [&](Instrument& inst) { inst.ConfigureBurstCount(channel, count); });
}

ViStatus QZSimFgen_ConfigureAMEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return Run(vi, "ConfigureAMEnabled",
               [&](Instrument& inst) { inst.ConfigureAMEnabled(channel, enabled != VI_FALSE); });
}

ViStatus QZSimFgen_ConfigureAMSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return Run(vi, "ConfigureAMSource",
               [&](Instrument& inst) { inst.ConfigureAMSource(channel, source); });
}

ViStatus QZSimFgen_ConfigureAMInternal(ViSession vi, ViReal64 depth, ViInt32 waveform,
                                       ViReal64 frequency) {
    return Run(vi, "ConfigureAMInternal", [&](Instrument& inst) {
        inst.RequireGroup(Group::ModulateAM, "ConfigureAMInternal");
        inst.ConfigureAMInternal(depth, waveform, frequency);
    });
}

ViStatus QZSimFgen_ConfigureFMEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return Run(vi, "ConfigureFMEnabled",
               [&](Instrument& inst) { inst.ConfigureFMEnabled(channel, enabled != VI_FALSE); });
}

ViStatus QZSimFgen_ConfigureFMSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return Run(vi, "ConfigureFMSource",
               [&](Instrument& inst) { inst.ConfigureFMSource(channel, source); });
}

ViStatus QZSimFgen_ConfigureFMInternal(ViSession vi, ViReal64 deviation, ViInt32 waveform,
                                       ViReal64 frequency) {
    return Run(vi, "ConfigureFMInternal", [&](Instrument& inst) {
        inst.RequireGroup(Group::ModulateFM, "ConfigureFMInternal");
        inst.ConfigureFMInternal(deviation, waveform, frequency);
    });
}

ViStatus QZSimFgen_InitiateGeneration(ViSession vi) {
    return Run(vi, "InitiateGeneration", [&](Instrument& inst) { inst.InitiateGeneration(); });
}

ViStatus QZSimFgen_AbortGeneration(ViSession vi) {
    return Run(vi, "AbortGeneration", [&](Instrument& inst) { inst.AbortGeneration(); });
}

ViStatus QZSimFgen_GetAttrMinMaxViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                         ViReal64* min, ViReal64* max, ViBoolean* hasMin,
                                         ViBoolean* hasMax) {
    return Run(vi, "GetAttrMinMaxViReal64", [&](Instrument& inst) {
        const auto range = inst.MinMax(attr, channel);
        Out(min, range.min);
        Out(max, range.max);
        if (hasMin != nullptr) *hasMin = VI_TRUE;
        if (hasMax != nullptr) *hasMax = VI_TRUE;
    });
}

ViStatus QZSimFgen_RenderOutput(ViSession vi, ViConstString channel, ViReal64 startTime,
                                ViReal64 timeStep, ViInt32 count, ViReal64 volts[]) {
    return Run(vi, "RenderOutput",
               [&](Instrument& inst) { inst.Render(channel, startTime, timeStep, count, volts); });
}

} // extern "C"
