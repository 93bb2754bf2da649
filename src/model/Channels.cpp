#include "qzivi/model/Channels.h"
#include "qzivi/driver/ErrorIds.h"

#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/model/Waveforms.h"

namespace qzivi {

namespace {
constexpr const char* kChannels = "QZIviFgenChannels";
}

// ---- QZIviFgenChannel -----------------------------------------------------------------------

void QZIviFgenChannel::Name(const std::string& value) {
    const std::string old = m_sName;
    m_sName = value;
    if (const auto propSet = PropSet())
        propSet->RaiseCollectionChanged(kChannels, Variant::Object(propSet->Channels()),
                                        ChangeRenamed, value, old);
}

void QZIviFgenChannel::ArbWaveform(const std::shared_ptr<QZIviFgenArbWaveform>& value) {
    Guard(m_oErr, "ArbWaveform", [&] {
        if (value) {
            const auto propSet = PropSet();
            if (!propSet)
                RaiseRuntime(91, "Object variable not set: the channel belongs to no control.");
            if (!propSet->Waveforms()->ContainsObject(*value))
                StdError(m_oErr, errid::kForeignObject, m_sPath + "ArbWaveform");
        }
        m_oArbWaveform = value;
    });
}

void QZIviFgenChannel::Sequence(const std::shared_ptr<QZIviFgenSequence>& value) {
    Guard(m_oErr, "Sequence", [&] {
        m_oSequence = value;
        if (value) {
            const auto propSet = PropSet();
            if (!propSet)
                RaiseRuntime(91, "Object variable not set: the channel belongs to no control.");
            if (!propSet->Sequences()->ContainsObject(*value))
                StdError(m_oErr, errid::kForeignObject, m_sPath + "Sequence");
        }
    });
}

void QZIviFgenChannel::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                              const std::shared_ptr<CIviFgenPropImp>& propSet) {
    m_oErr = std::move(errorReport);
    m_oPropSet = propSet;
    m_cCollectionChanged.Disconnect();
    if (propSet)
        m_cCollectionChanged = propSet->CollectionChanged.Connect(
            [this](const std::string& name, const Variant&, std::int32_t kind, const Variant&,
                   const Variant&) { OnCollectionChanged(name, kind); });
}

// Any rename or removal of a waveform or sequence drops the reference, whichever one it was.
void QZIviFgenChannel::OnCollectionChanged(const std::string& name, std::int32_t kind) {
    if (kind != ChangeRemoved && kind != ChangeRenamed) return;
    if (name == "QZIviFgenArbWaveforms") m_oArbWaveform = nullptr;
    if (name == "QZIviFgenSequences") m_oSequence = nullptr;
}

void QZIviFgenChannel::SetPath(const std::string& parentPath) {
    m_sPath = JoinPath(parentPath, "Item(\"" + m_sName + "\")");
}

void QZIviFgenChannel::InitProperties() {
    Name("");
    AMEnabled(false);
    AMSource(0);
    ArbFrequency(1000);
    ArbGain(1);
    ArbOffset(0);
    ArbWaveform(nullptr);
    BurstCount(2);
    FMEnabled(false);
    FMSource(0);
    FuncAmplitude(2);
    FuncDCOffset(0);
    FuncDutyCycleHigh(50);
    FuncFrequency(1000);
    FuncStartPhase(0);
    FuncWaveform(qzivifgenWaveformSine);
    OperationMode(qzivifgenOperateContinuous);
    OutputEnabled(true);
    OutputImpedance(50);
    Sequence(nullptr);
    TriggerSource(qzivifgenExternalTrigger);
    m_sUniqueId = NewUniqueId();
}

void QZIviFgenChannel::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    const std::string p = BagPrefix(prefix, "Channel");
    Name(bag.ReadText(p + "Name", ""));
    AMEnabled(bag.ReadBool(p + "AMEnabled", false));
    AMSource(bag.ReadInt32(p + "AMSource", 0));
    ArbFrequency(bag.ReadDouble(p + "ArbFrequency", 1000));
    ArbGain(bag.ReadDouble(p + "ArbGain", 1));
    ArbOffset(bag.ReadDouble(p + "ArbOffset", 0));
    BurstCount(bag.ReadInt32(p + "BurstCount", 2));
    FMEnabled(bag.ReadBool(p + "FMEnabled", false));
    FMSource(bag.ReadInt32(p + "FMSource", 0));
    FuncAmplitude(bag.ReadDouble(p + "FuncAmplitude", 2));
    FuncDCOffset(bag.ReadDouble(p + "FuncDCOffset", 0));
    FuncDutyCycleHigh(bag.ReadDouble(p + "FuncDutyCycleHigh", 50));
    FuncFrequency(bag.ReadDouble(p + "FuncFrequency", 1000));
    FuncStartPhase(bag.ReadDouble(p + "FuncStartPhase", 0));
    FuncWaveform(bag.ReadInt32(p + "FuncWaveform", qzivifgenWaveformSine));
    OperationMode(bag.ReadInt32(p + "OperationMode", qzivifgenOperateContinuous));
    OutputEnabled(bag.ReadBool(p + "OutputEnabled", true));
    OutputImpedance(bag.ReadDouble(p + "OutputImpedance", 50));
    TriggerSource(bag.ReadInt32(p + "TriggerSource", qzivifgenExternalTrigger));
    m_sUniqueId = NewUniqueId();
    const auto propSet = PropSet();
    if (!propSet) return;
    if (const std::int32_t index = bag.ReadInt32(p + "ArbWaveform", 0); index > 0)
        ArbWaveform(propSet->Waveforms()->Item(index));
    if (const std::int32_t index = bag.ReadInt32(p + "Sequence", 0); index > 0)
        Sequence(propSet->Sequences()->Item(index));
}

void QZIviFgenChannel::WriteProperties(PropertyBag& bag, const std::string& prefix) const {
    const std::string p = BagPrefix(prefix, "Channel");
    bag.WriteText(p + "Name", m_sName, "");
    bag.WriteBool(p + "AMEnabled", m_bAMEnabled, false);
    bag.WriteInt32(p + "AMSource", m_lAMSource, 0);
    bag.WriteDouble(p + "ArbFrequency", m_dArbFrequency, 1000);
    bag.WriteDouble(p + "ArbGain", m_dArbGain, 1);
    bag.WriteDouble(p + "ArbOffset", m_dArbOffset, 0);
    bag.WriteInt32(p + "BurstCount", m_lBurstCount, 2);
    bag.WriteBool(p + "FMEnabled", m_bFMEnabled, false);
    bag.WriteInt32(p + "FMSource", m_lFMSource, 0);
    bag.WriteDouble(p + "FuncAmplitude", m_dFuncAmplitude, 2);
    bag.WriteDouble(p + "FuncDCOffset", m_dFuncDCOffset, 0);
    bag.WriteDouble(p + "FuncDutyCycleHigh", m_dFuncDutyCycleHigh, 50);
    bag.WriteDouble(p + "FuncFrequency", m_dFuncFrequency, 1000);
    bag.WriteDouble(p + "FuncStartPhase", m_dFuncStartPhase, 0);
    bag.WriteInt32(p + "FuncWaveform", m_lFuncWaveform, qzivifgenWaveformSine);
    bag.WriteInt32(p + "OperationMode", m_lOperationMode, qzivifgenOperateContinuous);
    bag.WriteBool(p + "OutputEnabled", m_bOutputEnabled, true);
    bag.WriteDouble(p + "OutputImpedance", m_dOutputImpedance, 50);
    bag.WriteInt32(p + "TriggerSource", m_lTriggerSource, qzivifgenExternalTrigger);
    const auto propSet = PropSet();
    const auto waveformIndex =
        m_oArbWaveform && propSet ? propSet->Waveforms()->IndexOfName(m_oArbWaveform->Name()) : 0;
    bag.WriteInt32(p + "ArbWaveform", waveformIndex, 0);
    const auto sequenceIndex =
        m_oSequence && propSet ? propSet->Sequences()->IndexOfName(m_oSequence->Name()) : 0;
    bag.WriteInt32(p + "Sequence", sequenceIndex, 0);
}

void QZIviFgenChannel::Clone(QZIviFgenChannel& target) const {
    target.Name(m_sName);
    target.AMEnabled(m_bAMEnabled);
    target.AMSource(m_lAMSource);
    target.ArbFrequency(m_dArbFrequency);
    target.ArbGain(m_dArbGain);
    target.ArbOffset(m_dArbOffset);
    target.ArbWaveform(m_oArbWaveform);
    target.BurstCount(m_lBurstCount);
    target.FMEnabled(m_bFMEnabled);
    target.FMSource(m_lFMSource);
    target.FuncAmplitude(m_dFuncAmplitude);
    target.FuncDCOffset(m_dFuncDCOffset);
    target.FuncDutyCycleHigh(m_dFuncDutyCycleHigh);
    target.FuncFrequency(m_dFuncFrequency);
    target.FuncStartPhase(m_dFuncStartPhase);
    target.FuncWaveform(m_lFuncWaveform);
    target.OperationMode(m_lOperationMode);
    target.OutputEnabled(m_bOutputEnabled);
    target.OutputImpedance(m_dOutputImpedance);
    target.TriggerSource(m_lTriggerSource);
    target.Sequence(m_oSequence);
    target.UniqueId(m_sUniqueId);
}

// ---- QZIviFgenChannels ----------------------------------------------------------------------

std::shared_ptr<QZIviFgenChannel> QZIviFgenChannels::Item(const Variant& Index) {
    return ItemOrRefuse(Index, errid::kNoSuchChannel);
}

std::shared_ptr<QZIviFgenChannel> QZIviFgenChannels::Add(const std::string& ChannelName) {
    return Guard(m_oErr, "Add", [&] {
        auto channel = NewItem(ChannelName);
        items_.Append(channel);
        if (const auto propSet = PropSet()) {
            ActiveChannel(channel);
            propSet->RaiseCollectionChanged(kChannels, Variant::Object(shared_from_this()),
                                            ChangeAdded, Count(), "");
        }
        return channel;
    });
}

void QZIviFgenChannels::Remove(const Variant& Index) {
    Guard(m_oErr, "Remove", [&] {
        const std::int32_t position = items_.RemovalPosition(Index);
        if (position == 0) StdError(m_oErr, errid::kInvalidIndex, m_sPath + "Remove");
        const auto active = ActiveChannel();
        if (active && (IndexOfObject(active.get()) == position ||
                       std::to_string(position) == active->Name())) {
            if (Count() == 1)
                ActiveChannel(nullptr);
            else if (position - 1 > 0)
                ActiveChannel(items_.At(position - 1));
            else
                ActiveChannel(items_.At(position + 1));
        }
        items_.RemoveAt(position);
        if (const auto propSet = PropSet())
            propSet->RaiseCollectionChanged(kChannels, Variant::Object(shared_from_this()),
                                            ChangeRemoved, position, "");
    });
}

std::shared_ptr<QZIviFgenChannel> QZIviFgenChannels::ActiveChannel() {
    if (!m_oActiveChannel && Count() > 0) m_oActiveChannel = items_.At(1);
    return m_oActiveChannel;
}

void QZIviFgenChannels::ActiveChannel(const std::shared_ptr<QZIviFgenChannel>& value) {
    Guard(m_oErr, "ActiveChannel", [&] {
        const auto propSet = PropSet();
        if (value) {
            if (!propSet)
                RaiseRuntime(91, "Object variable not set: the channels belong to no control.");
            if (!propSet->Channels()->ContainsObject(*value))
                StdError(m_oErr, errid::kForeignObject, m_sPath + "ActiveChannel");
        }
        m_oActiveChannel = value;
        if (propSet)
            propSet->RaiseCollectionChanged(kChannels, Variant::Object(shared_from_this()),
                                            ChangeActive, IndexOfObject(value.get()), "");
    });
}

} // namespace qzivi
