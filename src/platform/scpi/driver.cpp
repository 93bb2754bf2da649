// The C entry points of the SCPI generator driver: sessions, options, the IVI error record, and
// the class's attributes and functions handed to the Generator.
#include "QZScpiFgen.h"

#include "generator.h"
#include "qzivi/c_boundary.h"
#include "qzivi/ivi_common.h"

#include <initializer_list>
#include <mutex>
#include <utility>

namespace {

using qzivi::ivi::CEntry;
using qzivi::ivi::CopyText;
using qzivi::ivi::ErrorRecord;
using qzivi::ivi::Out;
using qzivi::ivi::SessionTable;
using qzivi::ivi::StatusError;
using qzivi::scpi::Generator;

constexpr const char* kCapabilities =
    "IviFgenBase,IviFgenStdFunc,IviFgenArbWfm,IviFgenArbSeq,IviFgenTrigger,"
    "IviFgenInternalTrigger,IviFgenSoftwareTrigger,IviFgenBurst,IviFgenModulateAM,"
    "IviFgenModulateFM";

struct Session {
    std::mutex mutex;
    std::unique_ptr<Generator> generator;
    std::string driverSetup;
    ErrorRecord record;
};

SessionTable<Session> g_sessions(0x7100);
thread_local ErrorRecord t_record;

template <typename Body>
ViStatus Run(ViSession vi, const char* function, Body&& body) noexcept {
    Session* s = g_sessions.Find(vi);
    if (s == nullptr) return qzivi::ivi::InvalidSession(t_record, vi, function);
    return CEntry(function, s->record, [&]() -> ViStatus {
        std::lock_guard lock(s->mutex);
        try {
            body(*s->generator);
        } catch (const StatusError& e) {
            throw StatusError(e.Status(), std::string(function) + ": " + e.what());
        }
        return VI_SUCCESS;
    });
}

std::string Channel(ViConstString channel) {
    return channel != nullptr ? channel : "";
}

// A class function that sets attributes: every setting is checked before any is sent.
ViStatus Configure(ViSession vi, const char* function, ViConstString channel,
                   std::initializer_list<std::pair<ViAttr, double>> settings) {
    return Run(vi, function, [&](Generator& g) {
        for (const auto& [attr, value] : settings)
            g.Set(attr, Channel(channel), value, true);
        for (const auto& [attr, value] : settings)
            g.Set(attr, Channel(channel), value, false);
    });
}

// The field of an *IDN? answer: 0 the maker, 1 the model.
std::string IdentityField(const std::string& identity, int field) {
    std::size_t start = 0;
    for (int i = 0; i < field; ++i)
        start = identity.find(',', start) + 1;
    return std::string(qzivi::ivi::Trim(identity.substr(start, identity.find(',', start) - start)));
}

} // namespace

extern "C" {

ViStatus QZScpiFgen_InitWithOptions(ViRsrc resource, ViBoolean idQuery, ViBoolean reset,
                                    ViConstString options, ViSession* vi) {
    (void)idQuery; // the model is always asked: the driver refuses one it does not know
    return CEntry("InitWithOptions", t_record, [&]() -> ViStatus {
        if (vi == nullptr) throw StatusError(IVI_ERROR_NULL_POINTER, "vi is a null pointer");
        *vi = 0;
        auto session = std::make_unique<Session>();
        std::chrono::milliseconds timeout(5000);
        for (const auto& option : qzivi::ivi::ParseOptions(options != nullptr ? options : "")) {
            auto is = [&](const char* name) { return qzivi::ivi::EqualsNoCase(option.name, name); };
            if (is("DriverSetup")) {
                session->driverSetup = option.value;
                for (const auto& setup : qzivi::ivi::ParseOptions(option.value)) {
                    char* end = nullptr;
                    const long ms = std::strtol(setup.value.c_str(), &end, 10);
                    if (!qzivi::ivi::EqualsNoCase(setup.name, "Timeout"))
                        throw StatusError(IVI_ERROR_BAD_OPTION_NAME,
                                          "DriverSetup item \"" + setup.name +
                                              "\" is unknown; this driver takes Timeout=ms");
                    if (setup.value.empty() || *end != '\0' || ms < 1 || ms > 3600000)
                        throw StatusError(IVI_ERROR_BAD_OPTION_VALUE,
                                          "the time-out \"" + setup.value +
                                              "\" is no number of milliseconds from 1 to 3600000");
                    timeout = std::chrono::milliseconds(ms);
                }
            } else if (is("Simulate")) {
                if (qzivi::ivi::ParseBoolOption(option))
                    throw StatusError(IVI_ERROR_BAD_OPTION_VALUE,
                                      "this driver talks to instruments and does not simulate; "
                                      "name the simulator's module instead");
            } else if (is("RangeCheck") || is("QueryInstrStatus") || is("Cache") ||
                       is("RecordCoercions") || is("InterchangeCheck")) {
                qzivi::ivi::ParseBoolOption(option);
            } else {
                throw StatusError(IVI_ERROR_BAD_OPTION_NAME,
                                  "option \"" + option.name + "\" is unknown");
            }
        }
        session->generator = std::make_unique<Generator>(resource != nullptr ? resource : "",
                                                         timeout, reset != VI_FALSE);
        *vi = g_sessions.Insert(std::move(session));
        return VI_SUCCESS;
    });
}

ViStatus QZScpiFgen_close(ViSession vi) {
    return CEntry("close", t_record, [&]() -> ViStatus {
        const std::unique_ptr<Session> session = g_sessions.Remove(vi);
        if (!session) return qzivi::ivi::InvalidSession(t_record, vi, "close");
        return VI_SUCCESS; // the connection closes with the session, whatever the instrument does
    });
}

ViStatus QZScpiFgen_error_message(ViSession vi, ViStatus status, ViChar message[]) {
    (void)vi;
    return qzivi::ivi::ErrorMessage(t_record, status, message);
}

ViStatus QZScpiFgen_GetError(ViSession vi, ViStatus* code, ViInt32 bufferSize,
                             ViChar description[]) {
    return g_sessions.Report(vi, t_record, code, bufferSize, description);
}

ViStatus QZScpiFgen_GetAttributeViInt32(ViSession vi, ViConstString channel, ViAttr attr,
                                        ViInt32* value) {
    Session* s = g_sessions.Find(vi);
    return Run(vi, "GetAttributeViInt32", [&](Generator& g) {
        switch (attr) {
        case IVI_ATTR_PRIMARY_ERROR:
            return Out(value, s->record.status);
        case IVI_ATTR_CHANNEL_COUNT:
            return Out(value, ViInt32{g.ModelInfo().channels});
        case IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION:
            return Out(value, ViInt32{1});
        case IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION:
            return Out(value, ViInt32{0});
        case IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION:
            return Out(value, ViInt32{3});
        case IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MINOR_VERSION:
            return Out(value, ViInt32{0});
        default:
            Generator::RequireType(attr, Generator::Type::Int32);
            return Out(value, static_cast<ViInt32>(g.Get(attr, Channel(channel))));
        }
    });
}

ViStatus QZScpiFgen_GetAttributeViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                         ViReal64* value) {
    return Run(vi, "GetAttributeViReal64", [&](Generator& g) {
        Generator::RequireType(attr, Generator::Type::Real64);
        Out(value, g.Get(attr, Channel(channel)));
    });
}

ViStatus QZScpiFgen_GetAttributeViBoolean(ViSession vi, ViConstString channel, ViAttr attr,
                                          ViBoolean* value) {
    return Run(vi, "GetAttributeViBoolean", [&](Generator& g) {
        if (attr != IVI_ATTR_SIMULATE) Generator::RequireType(attr, Generator::Type::Boolean);
        Out(value, attr == IVI_ATTR_SIMULATE
                       ? ViBoolean{VI_FALSE}
                       : ViBoolean(g.Get(attr, Channel(channel)) != 0 ? VI_TRUE : VI_FALSE));
    });
}

ViStatus QZScpiFgen_GetAttributeViString(ViSession vi, ViConstString channel, ViAttr attr,
                                         ViInt32 bufferSize, ViChar value[]) {
    (void)channel;
    ViStatus fits = 0;
    Session* s = g_sessions.Find(vi);
    const ViStatus status = Run(vi, "GetAttributeViString", [&](Generator& g) {
        std::string text;
        switch (attr) {
        case IVI_ATTR_ERROR_ELABORATION:
            text = s->record.elaboration;
            break;
        case IVI_ATTR_DRIVER_SETUP:
            text = s->driverSetup;
            break;
        case IVI_ATTR_SPECIFIC_DRIVER_PREFIX:
            text = QZSCPIFGEN_PREFIX;
            break;
        case IVI_ATTR_IO_RESOURCE_DESCRIPTOR:
            text = g.Resource();
            break;
        case IVI_ATTR_GROUP_CAPABILITIES:
            text = kCapabilities;
            break;
        case IVI_ATTR_INSTRUMENT_MANUFACTURER:
            text = IdentityField(g.Identity(), 0);
            break;
        case IVI_ATTR_INSTRUMENT_MODEL:
            text = IdentityField(g.Identity(), 1);
            break;
        case IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION:
            text = "SCPI driver of the 33500 and 33600 series bench generators";
            break;
        default:
            throw StatusError(IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED,
                              "attribute " + std::to_string(attr) + " is no text of this driver");
        }
        fits = CopyText(text, bufferSize, value);
    });
    return status != VI_SUCCESS ? status : fits;
}

#define QZSCPI_SET_AND_CHECK(CType, Kind)                                                          \
    ViStatus QZScpiFgen_SetAttribute##CType(ViSession vi, ViConstString channel, ViAttr attr,      \
                                            CType value) {                                         \
        return Run(vi, "SetAttribute" #CType, [&](Generator& g) {                                  \
            Generator::RequireType(attr, Generator::Type::Kind);                                   \
            g.Set(attr, Channel(channel), static_cast<double>(value), false);                      \
        });                                                                                        \
    }                                                                                              \
    ViStatus QZScpiFgen_CheckAttribute##CType(ViSession vi, ViConstString channel, ViAttr attr,    \
                                              CType value) {                                       \
        return Run(vi, "CheckAttribute" #CType, [&](Generator& g) {                                \
            Generator::RequireType(attr, Generator::Type::Kind);                                   \
            g.Set(attr, Channel(channel), static_cast<double>(value), true);                       \
        });                                                                                        \
    }
QZSCPI_SET_AND_CHECK(ViInt32, Int32)
QZSCPI_SET_AND_CHECK(ViReal64, Real64)
QZSCPI_SET_AND_CHECK(ViBoolean, Boolean)
#undef QZSCPI_SET_AND_CHECK

ViStatus QZScpiFgen_ConfigureOutputMode(ViSession vi, ViInt32 outputMode) {
    return Configure(vi, "ConfigureOutputMode", nullptr,
                     {{IVIFGEN_ATTR_OUTPUT_MODE, double(outputMode)}});
}

ViStatus QZScpiFgen_ConfigureRefClockSource(ViSession vi, ViInt32 source) {
    return Configure(vi, "ConfigureRefClockSource", nullptr,
                     {{IVIFGEN_ATTR_REF_CLOCK_SOURCE, double(source)}});
}

ViStatus QZScpiFgen_ConfigureOutputImpedance(ViSession vi, ViConstString channel,
                                             ViReal64 impedance) {
    return Configure(vi, "ConfigureOutputImpedance", channel,
                     {{IVIFGEN_ATTR_OUTPUT_IMPEDANCE, impedance}});
}

ViStatus QZScpiFgen_ConfigureOperationMode(ViSession vi, ViConstString channel,
                                           ViInt32 operationMode) {
    return Configure(vi, "ConfigureOperationMode", channel,
                     {{IVIFGEN_ATTR_OPERATION_MODE, double(operationMode)}});
}

ViStatus QZScpiFgen_ConfigureOutputEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return Configure(vi, "ConfigureOutputEnabled", channel,
                     {{IVIFGEN_ATTR_OUTPUT_ENABLED, double(enabled != VI_FALSE)}});
}

ViStatus QZScpiFgen_ConfigureStandardWaveform(ViSession vi, ViConstString channel, ViInt32 waveform,
                                              ViReal64 amplitude, ViReal64 dcOffset,
                                              ViReal64 frequency, ViReal64 startPhase) {
    return Run(vi, "ConfigureStandardWaveform", [&](Generator& g) {
        g.ConfigureStandardWaveform(Channel(channel), waveform, amplitude, dcOffset, frequency,
                                    startPhase);
    });
}

ViStatus QZScpiFgen_QueryArbWfmCapabilities(ViSession vi, ViInt32* maxNumWaveforms,
                                            ViInt32* waveformQuantum, ViInt32* minWaveformSize,
                                            ViInt32* maxWaveformSize) {
    return Run(vi, "QueryArbWfmCapabilities", [&](Generator& g) {
        Out(maxNumWaveforms, Generator::kMaxWaveforms);
        Out(waveformQuantum, ViInt32{1});
        Out(minWaveformSize, ViInt32{8});
        Out(maxWaveformSize, g.ModelInfo().maxPoints);
    });
}

ViStatus QZScpiFgen_CreateArbWaveform(ViSession vi, ViInt32 size, const ViReal64 data[],
                                      ViInt32* handle) {
    return Run(vi, "CreateArbWaveform", [&](Generator& g) {
        if (handle == nullptr)
            throw StatusError(IVI_ERROR_NULL_POINTER, "handle is a null pointer");
        *handle = g.CreateArbWaveform(size, data);
    });
}

ViStatus QZScpiFgen_ClearArbWaveform(ViSession vi, ViInt32 handle) {
    return Run(vi, "ClearArbWaveform", [&](Generator& g) { g.ClearArbWaveform(handle); });
}

ViStatus QZScpiFgen_ConfigureArbWaveform(ViSession vi, ViConstString channel, ViInt32 handle,
                                         ViReal64 gain, ViReal64 offset) {
    return Run(vi, "ConfigureArbWaveform", [&](Generator& g) {
        g.ConfigureArb(Channel(channel), handle, gain, offset, false);
    });
}

ViStatus QZScpiFgen_ConfigureSampleRate(ViSession vi, ViReal64 sampleRate) {
    return Configure(vi, "ConfigureSampleRate", nullptr,
                     {{IVIFGEN_ATTR_ARB_SAMPLE_RATE, sampleRate}});
}

ViStatus QZScpiFgen_QueryArbSeqCapabilities(ViSession vi, ViInt32* maxNumSequences,
                                            ViInt32* minSequenceLength, ViInt32* maxSequenceLength,
                                            ViInt32* maxLoopCount) {
    return Run(vi, "QueryArbSeqCapabilities", [&](Generator&) {
        Out(maxNumSequences, Generator::kMaxSequences);
        Out(minSequenceLength, ViInt32{1});
        Out(maxSequenceLength, Generator::kMaxSequenceLength);
        Out(maxLoopCount, Generator::kMaxLoopCount);
    });
}

ViStatus QZScpiFgen_CreateArbSequence(ViSession vi, ViInt32 length, const ViInt32 waveformHandles[],
                                      const ViInt32 loopCounts[], ViInt32* handle) {
    return Run(vi, "CreateArbSequence", [&](Generator& g) {
        if (handle == nullptr)
            throw StatusError(IVI_ERROR_NULL_POINTER, "handle is a null pointer");
        *handle = g.CreateArbSequence(length, waveformHandles, loopCounts);
    });
}

ViStatus QZScpiFgen_ClearArbSequence(ViSession vi, ViInt32 handle) {
    return Run(vi, "ClearArbSequence", [&](Generator& g) { g.ClearArbSequence(handle); });
}

ViStatus QZScpiFgen_ConfigureArbSequence(ViSession vi, ViConstString channel, ViInt32 handle,
                                         ViReal64 gain, ViReal64 offset) {
    return Run(vi, "ConfigureArbSequence",
               [&](Generator& g) { g.ConfigureArb(Channel(channel), handle, gain, offset, true); });
}

ViStatus QZScpiFgen_ConfigureTriggerSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return Configure(vi, "ConfigureTriggerSource", channel,
                     {{IVIFGEN_ATTR_TRIGGER_SOURCE, double(source)}});
}

ViStatus QZScpiFgen_ConfigureInternalTriggerRate(ViSession vi, ViReal64 rate) {
    return Configure(vi, "ConfigureInternalTriggerRate", nullptr,
                     {{IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, rate}});
}

ViStatus QZScpiFgen_SendSoftwareTrigger(ViSession vi) {
    return Run(vi, "SendSoftwareTrigger", [&](Generator& g) { g.SendSoftwareTrigger(); });
}

ViStatus QZScpiFgen_ConfigureBurstCount(ViSession vi, ViConstString channel, ViInt32 count) {
    return Configure(vi, "ConfigureBurstCount", channel,
                     {{IVIFGEN_ATTR_BURST_COUNT, double(count)}});
}

ViStatus QZScpiFgen_ConfigureAMEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return Configure(vi, "ConfigureAMEnabled", channel,
                     {{IVIFGEN_ATTR_AM_ENABLED, double(enabled != VI_FALSE)}});
}

ViStatus QZScpiFgen_ConfigureAMSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return Configure(vi, "ConfigureAMSource", channel, {{IVIFGEN_ATTR_AM_SOURCE, double(source)}});
}

ViStatus QZScpiFgen_ConfigureAMInternal(ViSession vi, ViReal64 depth, ViInt32 waveform,
                                        ViReal64 frequency) {
    return Configure(vi, "ConfigureAMInternal", nullptr,
                     {{IVIFGEN_ATTR_AM_INTERNAL_DEPTH, depth},
                      {IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM, double(waveform)},
                      {IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY, frequency}});
}

ViStatus QZScpiFgen_ConfigureFMEnabled(ViSession vi, ViConstString channel, ViBoolean enabled) {
    return Configure(vi, "ConfigureFMEnabled", channel,
                     {{IVIFGEN_ATTR_FM_ENABLED, double(enabled != VI_FALSE)}});
}

ViStatus QZScpiFgen_ConfigureFMSource(ViSession vi, ViConstString channel, ViInt32 source) {
    return Configure(vi, "ConfigureFMSource", channel, {{IVIFGEN_ATTR_FM_SOURCE, double(source)}});
}

ViStatus QZScpiFgen_ConfigureFMInternal(ViSession vi, ViReal64 deviation, ViInt32 waveform,
                                        ViReal64 frequency) {
    return Configure(vi, "ConfigureFMInternal", nullptr,
                     {{IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, deviation},
                      {IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM, double(waveform)},
                      {IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY, frequency}});
}

ViStatus QZScpiFgen_InitiateGeneration(ViSession vi) {
    return Run(vi, "InitiateGeneration", [&](Generator& g) { g.InitiateGeneration(); });
}

ViStatus QZScpiFgen_AbortGeneration(ViSession vi) {
    return Run(vi, "AbortGeneration", [&](Generator& g) { g.AbortGeneration(); });
}

ViStatus QZScpiFgen_GetAttrMinMaxViReal64(ViSession vi, ViConstString channel, ViAttr attr,
                                          ViReal64* min, ViReal64* max, ViBoolean* hasMin,
                                          ViBoolean* hasMax) {
    return Run(vi, "GetAttrMinMaxViReal64", [&](Generator& g) {
        const auto range = g.MinMax(attr, Channel(channel));
        Out(min, range.min);
        Out(max, range.max);
        if (hasMin != nullptr) *hasMin = VI_TRUE;
        if (hasMax != nullptr) *hasMax = VI_TRUE;
    });
}

ViStatus QZScpiFgen_RenderOutput(ViSession vi, ViConstString channel, ViReal64 startTime,
                                 ViReal64 timeStep, ViInt32 count, ViReal64 volts[]) {
    return Run(vi, "RenderOutput", [&](Generator& g) {
        g.Render(Channel(channel), startTime, timeStep, count, volts);
    });
}

} // extern "C"
