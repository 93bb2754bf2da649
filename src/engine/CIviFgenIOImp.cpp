#include "qzivi/engine/CIviFgenIOImp.h"
#include "qzivi/driver/ErrorIds.h"

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/support/failure.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace qzivi {

namespace {

// A step whose errors are dropped altogether.
template <typename F>
void Ignoring(F&& step) {
    try {
        step();
    } catch (...) {
    }
}

bool Has(std::int32_t extensions, std::int32_t flag) {
    return (extensions & flag) != 0;
}

// The type the driver is asked about for a value of this kind.
AttrType TypeOf(PropertyKind kind) {
    switch (kind) {
    case PropertyKind::Double:
        return AttrType::Real64;
    case PropertyKind::Bool:
        return AttrType::Boolean;
    case PropertyKind::Text:
        return AttrType::String;
    default:
        return AttrType::Int32;
    }
}

// What Configure stores as a boolean: -1 for true, as it is persisted.
ViBoolean Stored(bool value) {
    return value ? static_cast<ViBoolean>(-1) : ViBoolean{0};
}

// Ends a run after a warning of a checked call; caught by the run itself.
struct RunEnded {};

} // namespace

CIviFgenIOImp::~CIviFgenIOImp() {
    try {
        if (m_oErr && m_oErr->IsInitialized()) CloseSession();
    } catch (...) {
    }
}

void CIviFgenIOImp::Construct(std::shared_ptr<CIviFgenPropImp> propSet,
                              std::shared_ptr<CIviErrorReport> errorReport) {
    m_oProp = std::move(propSet);
    m_oErr = std::move(errorReport);
    auto forward = [this](std::int32_t code, const std::string& source, const std::string& text) {
        Error(code, source, text);
    };
    m_cError = m_oErr->Error.Connect(forward);
    m_cAllError = m_oErr->AllError.Connect(forward);
    m_cSessionClosed = m_oErr->SessionClosed.Connect([this] {
        ResetHandles();
        m_bSeqPrepassDone = false;
    });
}

void CIviFgenIOImp::SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet) {
    m_oProp = std::move(propSet);
}

void CIviFgenIOImp::Init(bool doIDQuery, bool doReset, const std::string& optionString,
                         std::int32_t reInitBehavior) {
    if (!m_oProp->Enabled()) return;
    std::string name = m_oProp->LogicalName();
    m_oErr->Init(name, doIDQuery, doReset, optionString, reInitBehavior);
}

void CIviFgenIOImp::CloseSession() {
    m_oErr->CloseSession(true);
}

ViSession CIviFgenIOImp::Vi() const {
    return m_oErr->hSession();
}

const std::string& CIviFgenIOImp::Path() const {
    return m_oProp->Path();
}

// ---- Configure ----------------------------------------------------------------------------------

void CIviFgenIOImp::Configure(bool internalCall) {
    bool runOwnsState = true;
    try {
        auto& prop = *m_oProp;
        const bool enabled = prop.Enabled();
        const std::int32_t ext = prop.Extensions();
        const std::int32_t channels = prop.Channels()->Count();
        if (channels == 0 ||
            !Has(ext, qzivifgenArbSeqExt | qzivifgenStdFuncExt | qzivifgenArbWfmExt) || !enabled) {
            if (!enabled) return;
            m_oErr->DoStdError(channels > 0 ? errid::kNoOutputModeExtension : errid::kNoChannels,
                               Path() + "Configure");
        }
        if (prop.OutputMode() == qzivifgenOutputSeq && !m_bSeqPrepassDone &&
            prop.Waveforms()->Count() > 0) {
            m_bSeqPrepassDone = true;
            prop.OutputMode(qzivifgenOutputArb);
            try {
                Configure(true);
            } catch (...) {
                prop.OutputMode(
                    qzivifgenOutputSeq); // a failed pre-pass leaves the user's mode as it was
                throw;
            }
            prop.OutputMode(qzivifgenOutputSeq);
        }
        Init(false, false, "", qziviNoOp);
        if (m_oErr->state() == IviStateBusy)
            runOwnsState = false; // refused below; the state is another's
        m_oErr->CheckForValidState(IviStateClosed | IviStateBusy, Path(), "Configure", true);
        Run(internalCall);
    } catch (const RunEnded&) {
        // A warning ended the run: it has fired already, and nothing is raised.
        if (m_oErr->state() > IviStateClosed) m_oErr->state(IviStateInitialized);
    } catch (...) {
        if (runOwnsState && m_oErr->state() > IviStateClosed) m_oErr->state(IviStateInitialized);
        ReRaise();
    }
}

void CIviFgenIOImp::Run(bool internalCall) {
    auto& prop = *m_oProp;
    const std::int32_t ext = prop.Extensions();
    const ViSession vi = Vi();
    const auto& channels = *prop.Channels();

    ViChar capabilities[1000];
    capabilities[0] = '\0';
    const ViStatus read = IviFgen_GetAttributeViString(vi, "", IVI_ATTR_GROUP_CAPABILITIES,
                                                       sizeof capabilities, capabilities);
    m_oErr->IviCheckError(read, read == 0 ? std::string() : Path() + "GetAttribute", 0, "");
    CheckExtensions(ext,
                    std::string_view(capabilities, ::strnlen(capabilities, sizeof capabilities)));
    if (prop.AutoStopStart()) {
        Ignoring([&] { Abort(true); });
        for (const auto& channel : channels)
            IviFgen_ConfigureOutputEnabled(vi, channel->Name().c_str(), VI_FALSE);
    }
    for (const auto& channel : channels) {
        IviFgen_ConfigureAMEnabled(vi, channel->Name().c_str(), VI_FALSE);
        IviFgen_ConfigureFMEnabled(vi, channel->Name().c_str(), VI_FALSE);
    }
    const std::int32_t mode = prop.OutputMode();
    Checked(IviFgen_ConfigureOutputMode(vi, mode), "Base", "", prop,
            {{IVIFGEN_ATTR_OUTPUT_MODE, mode}});
    if (mode != qzivifgenOutputFunc && !m_bArbMemoryCleared) {
        IviFgen_ClearArbWaveform(vi, IVIFGEN_VAL_ALL_WAVEFORMS);
        m_bArbMemoryCleared = true;
    }
    ClearDeletedHandles();
    CreateMissingHandles();
    Checked(IviFgen_ConfigureRefClockSource(vi, prop.RefClockSource()), "Base", "", prop,
            {{IVIFGEN_ATTR_REF_CLOCK_SOURCE, prop.RefClockSource()}});
    if (Has(ext, qzivifgenArbWfmExt) && !Has(ext, qzivifgenArbFrequencyExt) &&
        mode != qzivifgenOutputFunc)
        Checked(IviFgen_ConfigureSampleRate(vi, prop.ArbSampleRate()), "Base", "", prop,
                {{IVIFGEN_ATTR_ARB_SAMPLE_RATE, prop.ArbSampleRate()}});

    bool anyTrigger = false, anyAM = false, anyFM = false;
    for (const auto& channel : channels)
        ConfigureChannel(*channel, anyTrigger, anyAM, anyFM);

    const auto& in = *prop.Internal();
    if (Has(ext, qzivifgenModulateAMExt) && anyAM)
        Checked(IviFgen_ConfigureAMInternal(vi, in.AMInternalDepth(), in.AMInternalWaveform(),
                                            in.AMInternalFrequency()),
                "ModulateAM", "", in,
                {{IVIFGEN_ATTR_AM_INTERNAL_DEPTH, in.AMInternalDepth()},
                 {IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM, in.AMInternalWaveform()},
                 {IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY, in.AMInternalFrequency()}});
    if (Has(ext, qzivifgenModulateFMExt) && anyFM)
        Checked(IviFgen_ConfigureFMInternal(vi, in.FMInternalDeviation(), in.FMInternalWaveform(),
                                            in.FMInternalFrequency()),
                "ModulateFM", "", in,
                {{IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, in.FMInternalDeviation()},
                 {IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM, in.FMInternalWaveform()},
                 {IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY, in.FMInternalFrequency()}});
    if (Has(ext, qzivifgenInternalTriggerExt) && anyTrigger)
        Checked(IviFgen_ConfigureInternalTriggerRate(vi, in.InternalTriggerRate()),
                "InternalTrigger", "", in,
                {{IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, in.InternalTriggerRate()}});

    for (const auto& channel : channels) {
        const ViBoolean enabled = Stored(channel->OutputEnabled());
        Checked(IviFgen_ConfigureOutputEnabled(vi, channel->Name().c_str(), enabled), "Base",
                channel->Name(), *channel,
                {{IVIFGEN_ATTR_OUTPUT_ENABLED,
                  static_cast<std::int32_t>(static_cast<std::int16_t>(enabled))}});
    }
    if (prop.AutoStopStart()) Initiate(true);
    ClearDeletedHandles();
    m_oErr->state(IviStateConfigured);
    if (!internalCall) Configured();
}

void CIviFgenIOImp::ConfigureChannel(QZIviFgenChannel& ch, bool& anyTrigger, bool& anyAM,
                                     bool& anyFM) {
    auto& prop = *m_oProp;
    const std::int32_t ext = prop.Extensions();
    const ViSession vi = Vi();
    const std::string& name = ch.Name();
    const std::string& path = ch.Path();

    const ViStatus impedance =
        IviFgen_ConfigureOutputImpedance(vi, name.c_str(), ch.OutputImpedance());
    if (impedance == IVI_ERROR_UNKNOWN_CHANNEL_NAME)
        m_oErr->DoStdError(errid::kInvalidChannelName, name, 0, "");
    Checked(impedance, "Base", name, ch, {{IVIFGEN_ATTR_OUTPUT_IMPEDANCE, ch.OutputImpedance()}});
    Checked(IviFgen_ConfigureOperationMode(vi, name.c_str(), ch.OperationMode()), "Base", name, ch,
            {{IVIFGEN_ATTR_OPERATION_MODE, ch.OperationMode()}});
    if (Has(ext, qzivifgenBurstExt) && ch.OperationMode() == qzivifgenOperateBurst)
        Checked(IviFgen_ConfigureBurstCount(vi, name.c_str(), ch.BurstCount()), "Burst", name, ch,
                {{IVIFGEN_ATTR_BURST_COUNT, ch.BurstCount()}});
    if (Has(ext, qzivifgenTriggerExt)) {
        Checked(IviFgen_ConfigureTriggerSource(vi, name.c_str(), ch.TriggerSource()), "Trigger",
                name, ch, {{IVIFGEN_ATTR_TRIGGER_SOURCE, ch.TriggerSource()}});
        if (ch.TriggerSource() == qzivifgenInternalTrigger) anyTrigger = true;
    }

    switch (prop.OutputMode()) {
    case qzivifgenOutputFunc:
        if (!Has(ext, qzivifgenStdFuncExt))
            m_oErr->DoStdError(errid::kOutputModeExtensionOff, path + "OutputMode", 0, "");
        Checked(IviFgen_ConfigureStandardWaveform(vi, name.c_str(), ch.FuncWaveform(),
                                                  ch.FuncAmplitude(), ch.FuncDCOffset(),
                                                  ch.FuncFrequency(), ch.FuncStartPhase()),
                "StdFunc", name, ch,
                {{IVIFGEN_ATTR_FUNC_WAVEFORM, ch.FuncWaveform()},
                 {IVIFGEN_ATTR_FUNC_AMPLITUDE, ch.FuncAmplitude()},
                 {IVIFGEN_ATTR_FUNC_DC_OFFSET, ch.FuncDCOffset()},
                 {IVIFGEN_ATTR_FUNC_FREQUENCY, ch.FuncFrequency()},
                 {IVIFGEN_ATTR_FUNC_START_PHASE, ch.FuncStartPhase()}});
        break;
    case qzivifgenOutputArb: {
        if (!Has(ext, qzivifgenArbWfmExt))
            m_oErr->DoStdError(errid::kOutputModeExtensionOff, path + "OutputMode", 0, "");
        if (!ch.ArbWaveform()) {
            if (prop.Waveforms()->Count() == 0)
                m_oErr->DoStdError(errid::kNoWaveform, Path() + "Configure", 0, "");
            ch.ArbWaveform(prop.Waveforms()->At(1));
        }
        const std::int32_t handle = ch.ArbWaveform() ? ch.ArbWaveform()->WaveformHandle() : 0;
        Checked(
            IviFgen_ConfigureArbWaveform(vi, name.c_str(), handle, ch.ArbGain(), ch.ArbOffset()),
            "ArbWfm", name, ch,
            {{IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE, handle},
             {IVIFGEN_ATTR_ARB_GAIN, ch.ArbGain()},
             {IVIFGEN_ATTR_ARB_OFFSET, ch.ArbOffset()}});
        if (Has(ext, qzivifgenArbFrequencyExt))
            Checked(IviFgen_ConfigureArbFrequency(vi, name.c_str(), ch.ArbFrequency()),
                    "ArbFrequency", name, ch, {{IVIFGEN_ATTR_ARB_FREQUENCY, ch.ArbFrequency()}});
        break;
    }
    case qzivifgenOutputSeq: {
        if (!Has(ext, qzivifgenArbSeqExt))
            m_oErr->DoStdError(errid::kOutputModeExtensionOff, path + "OutputMode", 0, "");
        if (!ch.Sequence()) {
            if (prop.Sequences()->Count() == 0)
                m_oErr->DoStdError(errid::kInvalidSequence, Path() + "Configure", 0, "");
            ch.Sequence(prop.Sequences()->At(1));
        }
        const std::int32_t handle = ch.Sequence() ? ch.Sequence()->SequenceHandle() : 0;
        Checked(
            IviFgen_ConfigureArbSequence(vi, name.c_str(), handle, ch.ArbGain(), ch.ArbOffset()),
            "ArbSeq", name, ch,
            {{IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE, handle},
             {IVIFGEN_ATTR_ARB_GAIN, ch.ArbGain()},
             {IVIFGEN_ATTR_ARB_OFFSET, ch.ArbOffset()}});
        break;
    }
    default:
        break;
    }

    if (Has(ext, qzivifgenModulateAMExt)) {
        const ViBoolean on = CIviErrorReport::ToViBoolean(ch.AMEnabled());
        Checked(IviFgen_ConfigureAMEnabled(vi, name.c_str(), on), "ModulateAM", name, ch,
                {{IVIFGEN_ATTR_AM_ENABLED, static_cast<std::int32_t>(on)}});
        if (ch.AMEnabled()) {
            Checked(IviFgen_ConfigureAMSource(vi, name.c_str(), ch.AMSource()), "ModulateAM", name,
                    ch, {{IVIFGEN_ATTR_AM_SOURCE, ch.AMSource()}});
            if (ch.AMSource() == qzivifgenAMInternal) anyAM = true;
        }
    }
    if (Has(ext, qzivifgenModulateFMExt)) {
        const ViBoolean on = CIviErrorReport::ToViBoolean(ch.FMEnabled());
        Checked(IviFgen_ConfigureFMEnabled(vi, name.c_str(), on), "ModulateFM", name, ch,
                {{IVIFGEN_ATTR_FM_ENABLED, static_cast<std::int32_t>(on)}});
        if (ch.FMEnabled()) {
            Checked(IviFgen_ConfigureFMSource(vi, name.c_str(), ch.FMSource()), "ModulateFM", name,
                    ch, {{IVIFGEN_ATTR_FM_SOURCE, ch.FMSource()}});
            if (ch.FMSource() == qzivifgenFMInternal) anyFM = true;
        }
    }
}

// The pattern of every driver call of a run: a refused call is asked about each of its values in
// turn, and the first value the driver would not take names the property at fault.
template <typename Owner>
void CIviFgenIOImp::Checked(ViStatus status, const char* word, const std::string& channel,
                            const Owner& owner, std::initializer_list<Param> params) {
    m_oErr->IviCheckError(status, word, 8, "");
    if (status == 0) return;
    for (const auto& p : params) {
        const PropertyInfo* row = FindByAttribute(Owner::Properties(), p.id);
        if (!row) throw std::logic_error("no property row sends attribute " + std::to_string(p.id));
        if (!CheckNumber(TypeOf(row->kind), p.id, p.value, channel.c_str()))
            m_oErr->DoStdError(errid::kInvalidArgument, owner.Path() + std::string(row->name),
                               status, channel);
    }
    // Every value would be taken: the driver's own status stands and ends the run. A known error
    // raises here and a known warning fires; a status the mapping does not know is reported as
    // the unexpected failure or a warning of its own, so that the run never ends unexplained.
    m_oErr->IviCheckError(status, "", 0, "");
    if (CIviErrorReport::MapIviError(status) == status) {
        if (status < 0)
            m_oErr->DoStdError(errid::kUnexpected, Path() + "Configure", status, channel);
        m_oErr->Warning(status, Path() + "Configure", m_oErr->BuildIviDescription(status, channel));
    }
    throw RunEnded{};
}

void CIviFgenIOImp::CheckExtensions(std::int32_t extensions, std::string_view capabilities) {
    // The same question as last time has the same answer.
    if (extensions == m_lCheckedExtensions && capabilities == m_sCheckedCapabilities) return;
    struct Word {
        std::int32_t flag;
        std::string_view group; // "IviFgen" and the word
    };
    static constexpr Word kWords[] = {{qzivifgenArbFrequencyExt, "IviFgenArbFrequency"},
                                      {qzivifgenArbSeqExt, "IviFgenArbSeq"},
                                      {qzivifgenArbWfmExt, "IviFgenArbWfm"},
                                      {qzivifgenBurstExt, "IviFgenBurst"},
                                      {qzivifgenInternalTriggerExt, "IviFgenInternalTrigger"},
                                      {qzivifgenModulateAMExt, "IviFgenModulateAM"},
                                      {qzivifgenModulateFMExt, "IviFgenModulateFM"},
                                      {qzivifgenSoftwareTriggerExt, "IviFgenSoftwareTrigger"},
                                      {qzivifgenStdFuncExt, "IviFgenStdFunc"},
                                      {qzivifgenTriggerExt, "IviFgenTrigger"}};
    std::string missing;
    for (const auto& [flag, group] : kWords)
        if (Has(extensions, flag) && capabilities.find(group) == std::string_view::npos)
            missing.append(missing.empty() ? "" : ", ").append(group.substr(7));
    if (missing.empty()) {
        m_lCheckedExtensions = extensions;
        m_sCheckedCapabilities = capabilities;
        return;
    }
    throw Failure(errid::kExtensionNotSupported, missing,
                  "Extension capability not supported by instrument driver.  (" + missing + ")");
}

void CIviFgenIOImp::ClearDeletedHandles() {
    const ViSession vi = Vi();
    auto clear = [](DeletedHandleQueue& queue, ViStatus (*call)(ViSession, ViInt32),
                    ViSession session) {
        const std::int32_t n = queue.DeletedHandleCount();
        std::int32_t removed = 0;
        for (std::int32_t i = 1; i <= n; ++i)
            if (call(session, queue.DeletedHandleAt(i - removed)) == 0) {
                queue.RemoveDeletedHandleAt(i - removed);
                ++removed;
            }
    };
    clear(*m_oProp->Sequences(), &IviFgen_ClearArbSequence, vi);
    clear(*m_oProp->Waveforms(), &IviFgen_ClearArbWaveform, vi);
}

void CIviFgenIOImp::CreateMissingHandles() {
    auto& prop = *m_oProp;
    const std::int32_t ext = prop.Extensions();
    const ViSession vi = Vi();
    if (Has(ext, qzivifgenArbWfmExt) && prop.OutputMode() == qzivifgenOutputArb)
        for (const auto& waveform : *prop.Waveforms()) {
            if (waveform->WaveformHandle() != 0) continue;
            const Points data = waveform->Data();
            if (!data) m_oErr->DoStdError(errid::kInvalidWaveform, waveform->Name(), 0, "");
            ViInt32 handle = 0;
            const ViStatus status = IviFgen_CreateArbWaveform(
                vi, static_cast<ViInt32>(data->size()), data->data(), &handle);
            m_oErr->IviCheckError(status, waveform->Name(), 0, waveform->Name());
            waveform->SetWaveformHandle(handle);
        }
    if (Has(ext, qzivifgenArbSeqExt) && prop.OutputMode() == qzivifgenOutputSeq)
        for (const auto& sequence : *prop.Sequences()) {
            if (sequence->SequenceHandle() != 0) continue;
            if (sequence->Count() == 0)
                m_oErr->DoStdError(errid::kInvalidSequence, sequence->Name(), 0, "");
            for (const auto& item : *sequence)
                if (!item->Waveform())
                    m_oErr->DoStdError(errid::kInvalidSequence, sequence->Name(), 0, "");
            const auto handles = sequence->WaveformHandles();
            const auto counts = sequence->IterationCounts();
            ViInt32 handle = 0;
            const ViStatus status = IviFgen_CreateArbSequence(vi, sequence->Count(), handles.data(),
                                                              counts.data(), &handle);
            m_oErr->IviCheckError(status, sequence->Name(), 0, sequence->Name());
            sequence->SetSequenceHandle(handle);
        }
}

void CIviFgenIOImp::ResetHandles() {
    if (!m_oProp) return;
    for (const auto& waveform : *m_oProp->Waveforms())
        waveform->SetWaveformHandle(0);
    for (const auto& sequence : *m_oProp->Sequences())
        sequence->SetSequenceHandle(0);
}

// ---- Generation ---------------------------------------------------------------------------------

void CIviFgenIOImp::Generation(bool internalCall, std::int32_t mask, const char* word,
                               ViStatus (*call)(ViSession)) {
    if (!m_oProp->Enabled()) return;
    const std::int32_t saved = m_oErr->state();
    try {
        if (!internalCall) m_oErr->CheckForValidState(mask, Path(), word, true);
        const ViStatus status = call(Vi());
        m_oErr->IviCheckError(status, status == 0 ? std::string() : Path() + word, 0, "");
        m_oErr->state(saved);
    } catch (...) {
        m_oErr->state(saved);
        ReRaise();
    }
}

void CIviFgenIOImp::Initiate(bool internalCall) {
    Generation(internalCall, ~IviStateConfigured, "Initiate", &IviFgen_InitiateGeneration);
}

void CIviFgenIOImp::Abort(bool internalCall) {
    Generation(internalCall, IviStateClosed | IviStateBusy, "Abort", &IviFgen_AbortGeneration);
}

void CIviFgenIOImp::SendSoftwareTrigger() {
    Generation(false, ~IviStateConfigured, "SendSoftwareTrigger", &IviFgen_SendSoftwareTrigger);
}

std::vector<double> CIviFgenIOImp::RenderOutput(const std::string& channel, double startTime,
                                                double timeStep, std::int32_t count) {
    m_oErr->CheckForValidState(IviStateClosed, Path(), "RenderOutput", false);
    std::vector<double> volts(static_cast<std::size_t>(std::max(count, 0)));
    const ViStatus status =
        QZIvi_RenderOutput(Vi(), channel.c_str(), startTime, timeStep, count, volts.data());
    m_oErr->IviCheckError(status, status == 0 ? std::string() : Path() + "RenderOutput", 0, "");
    return volts;
}

} // namespace qzivi
