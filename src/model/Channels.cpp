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
    NameChanged(old);
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
}

void QZIviFgenChannel::UniqueId(const std::string& value) {
    const std::string old = m_sUniqueId;
    m_sUniqueId = value;
    UniqueIdChanged(old);
}

void QZIviFgenChannel::SetPath(const std::string& parentPath) {
    m_sPath = JoinPath(parentPath, "Item(\"" + m_sName + "\")");
}

std::span<const PropertyRow<QZIviFgenChannel>> QZIviFgenChannel::Properties() {
    using C = QZIviFgenChannel;
    static const PropertyRow<C> rows[] = {
        Accessor<C>(
            "Name", std::string(), [](const C& c) -> PropertyValue { return c.m_sName; },
            [](C& c, const PropertyValue& v) { c.Name(std::get<std::string>(v)); }),
        Field<&C::m_bAMEnabled>("AMEnabled", false, IVIFGEN_ATTR_AM_ENABLED),
        Field<&C::m_lAMSource>("AMSource", qzivifgenAMInternal, IVIFGEN_ATTR_AM_SOURCE),
        Field<&C::m_dArbFrequency>("ArbFrequency", 1000, IVIFGEN_ATTR_ARB_FREQUENCY),
        Field<&C::m_dArbGain>("ArbGain", 1, IVIFGEN_ATTR_ARB_GAIN),
        Field<&C::m_dArbOffset>("ArbOffset", 0, IVIFGEN_ATTR_ARB_OFFSET),
        Field<&C::m_lBurstCount>("BurstCount", 2, IVIFGEN_ATTR_BURST_COUNT),
        Field<&C::m_bFMEnabled>("FMEnabled", false, IVIFGEN_ATTR_FM_ENABLED),
        Field<&C::m_lFMSource>("FMSource", qzivifgenFMInternal, IVIFGEN_ATTR_FM_SOURCE),
        Field<&C::m_dFuncAmplitude>("FuncAmplitude", 2, IVIFGEN_ATTR_FUNC_AMPLITUDE),
        Field<&C::m_dFuncDCOffset>("FuncDCOffset", 0, IVIFGEN_ATTR_FUNC_DC_OFFSET),
        Field<&C::m_dFuncDutyCycleHigh>("FuncDutyCycleHigh", 50, IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH),
        Field<&C::m_dFuncFrequency>("FuncFrequency", 1000, IVIFGEN_ATTR_FUNC_FREQUENCY),
        Field<&C::m_dFuncStartPhase>("FuncStartPhase", 0, IVIFGEN_ATTR_FUNC_START_PHASE),
        Field<&C::m_lFuncWaveform>("FuncWaveform", qzivifgenWaveformSine,
                                   IVIFGEN_ATTR_FUNC_WAVEFORM),
        Field<&C::m_lOperationMode>("OperationMode", qzivifgenOperateContinuous,
                                    IVIFGEN_ATTR_OPERATION_MODE),
        Field<&C::m_bOutputEnabled>("OutputEnabled", true, IVIFGEN_ATTR_OUTPUT_ENABLED),
        Field<&C::m_dOutputImpedance>("OutputImpedance", 50, IVIFGEN_ATTR_OUTPUT_IMPEDANCE),
        Field<&C::m_lTriggerSource>("TriggerSource", qzivifgenExternalTrigger,
                                    IVIFGEN_ATTR_TRIGGER_SOURCE),
        Reference<C>("ArbWaveform", IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE),
        Reference<C>("Sequence", IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE),
    };
    return rows;
}

QZIviFgenChannel::QZIviFgenChannel() {
    PutDefaults(Properties(), *this);
}

void QZIviFgenChannel::InitProperties() {
    PutDefaults(Properties(), *this);
    ArbWaveform(nullptr);
    Sequence(nullptr);
    UniqueId(NewUniqueId());
}

void QZIviFgenChannel::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    const std::string p = BagPrefix(prefix, "Channel");
    ReadRows(Properties(), *this, bag, p);
    UniqueId(NewUniqueId());
    const auto propSet = PropSet();
    if (!propSet) return;
    if (const std::int32_t index = bag.ReadInt32(p + "ArbWaveform", 0); index > 0)
        ArbWaveform(propSet->Waveforms()->Item(index));
    if (const std::int32_t index = bag.ReadInt32(p + "Sequence", 0); index > 0)
        Sequence(propSet->Sequences()->Item(index));
}

void QZIviFgenChannel::WriteProperties(PropertyBag& bag, const std::string& prefix) const {
    const std::string p = BagPrefix(prefix, "Channel");
    WriteRows(Properties(), *this, bag, p);
    const auto propSet = PropSet();
    const auto waveformIndex =
        m_oArbWaveform && propSet ? propSet->Waveforms()->IndexOfName(m_oArbWaveform->Name()) : 0;
    bag.WriteInt32(p + "ArbWaveform", waveformIndex, 0);
    const auto sequenceIndex =
        m_oSequence && propSet ? propSet->Sequences()->IndexOfName(m_oSequence->Name()) : 0;
    bag.WriteInt32(p + "Sequence", sequenceIndex, 0);
}

void QZIviFgenChannel::Clone(QZIviFgenChannel& target) const {
    CopyRows(Properties(), *this, target);
    target.ArbWaveform(m_oArbWaveform);
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
        m_oItems.Append(channel);
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
        const std::int32_t position = m_oItems.RemovalPosition(Index);
        if (position == 0) StdError(m_oErr, errid::kInvalidIndex, m_sPath + "Remove");
        const auto active = ActiveChannel();
        if (active && (IndexOfObject(active.get()) == position ||
                       std::to_string(position) == active->Name())) {
            if (Count() == 1)
                ActiveChannel(nullptr);
            else if (position - 1 > 0)
                ActiveChannel(m_oItems.At(position - 1));
            else
                ActiveChannel(m_oItems.At(position + 1));
        }
        m_oItems.RemoveAt(position);
        if (const auto propSet = PropSet())
            propSet->RaiseCollectionChanged(kChannels, Variant::Object(shared_from_this()),
                                            ChangeRemoved, position, "");
    });
}

// Any rename or removal of a waveform or sequence drops the reference, whichever one it was.
void QZIviFgenChannels::ForgetWaveforms() {
    for (const auto& channel : m_oItems)
        channel->m_oArbWaveform = nullptr;
}

void QZIviFgenChannels::ForgetSequences() {
    for (const auto& channel : m_oItems)
        channel->m_oSequence = nullptr;
}

std::shared_ptr<QZIviFgenChannel> QZIviFgenChannels::ActiveChannel() {
    if (!m_oActiveChannel && Count() > 0) m_oActiveChannel = m_oItems.At(1);
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
