// Output channels: what the application wants of each, and the collection that decides which one
// the front panels show.
#pragma once

#include "qzivi/model/ModelSupport.h"
#include "qzivi/model/PropertyTable.h"
#include "qzivi/model/QZIviFgenTypes.h"
#include "qzivi/support/event.h"

#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

class CIviFgenPropImp;
class PropertyBag;
class QZIviFgenArbWaveform;
class QZIviFgenSequence;

enum QZIviFgenFMSources : std::int32_t { qzivifgenFMInternal = 0, qzivifgenFMExternal = 1 };
enum QZIviFgenOperationModes : std::int32_t {
    qzivifgenOperateContinuous = 0,
    qzivifgenOperateBurst = 1
};

// A pure state holder: values are stored as given; the instrument judges them at Configure.
class QZIviFgenChannel : public ListMember<QZIviFgenChannel> {
public:
    QZIviFgenChannel();

    // ---- Public ----
    const std::string& Name() const { return m_sName; }
    void Name(const std::string& value);
    bool AMEnabled() const { return m_bAMEnabled; }
    void AMEnabled(bool value) { m_bAMEnabled = value; }
    std::int32_t AMSource() const { return m_lAMSource; }
    void AMSource(std::int32_t value) { m_lAMSource = value; }
    double ArbFrequency() const { return m_dArbFrequency; }
    void ArbFrequency(double value) { m_dArbFrequency = value; }
    double ArbGain() const { return m_dArbGain; }
    void ArbGain(double value) { m_dArbGain = value; }
    double ArbOffset() const { return m_dArbOffset; }
    void ArbOffset(double value) { m_dArbOffset = value; }
    const std::shared_ptr<QZIviFgenArbWaveform>& ArbWaveform() const { return m_oArbWaveform; }
    // Checked before it is stored: a foreign waveform (-31618) leaves the old one.
    void ArbWaveform(const std::shared_ptr<QZIviFgenArbWaveform>& value);
    std::int32_t BurstCount() const { return m_lBurstCount; }
    void BurstCount(std::int32_t value) { m_lBurstCount = value; }
    bool FMEnabled() const { return m_bFMEnabled; }
    void FMEnabled(bool value) { m_bFMEnabled = value; }
    std::int32_t FMSource() const { return m_lFMSource; }
    void FMSource(std::int32_t value) { m_lFMSource = value; }
    double FuncAmplitude() const { return m_dFuncAmplitude; }
    void FuncAmplitude(double value) { m_dFuncAmplitude = value; }
    double FuncDCOffset() const { return m_dFuncDCOffset; }
    void FuncDCOffset(double value) { m_dFuncDCOffset = value; }
    double FuncDutyCycleHigh() const { return m_dFuncDutyCycleHigh; }
    void FuncDutyCycleHigh(double value) { m_dFuncDutyCycleHigh = value; }
    double FuncFrequency() const { return m_dFuncFrequency; }
    void FuncFrequency(double value) { m_dFuncFrequency = value; }
    double FuncStartPhase() const { return m_dFuncStartPhase; }
    void FuncStartPhase(double value) { m_dFuncStartPhase = value; }
    std::int32_t FuncWaveform() const { return m_lFuncWaveform; }
    void FuncWaveform(std::int32_t value) { m_lFuncWaveform = value; }
    std::int32_t OperationMode() const { return m_lOperationMode; }
    void OperationMode(std::int32_t value) { m_lOperationMode = value; }
    bool OutputEnabled() const { return m_bOutputEnabled; }
    void OutputEnabled(bool value) { m_bOutputEnabled = value; }
    double OutputImpedance() const { return m_dOutputImpedance; }
    void OutputImpedance(double value) { m_dOutputImpedance = value; }
    const std::shared_ptr<QZIviFgenSequence>& Sequence() const { return m_oSequence; }
    // Stored before it is checked: a foreign sequence (-31618) stays stored.
    void Sequence(const std::shared_ptr<QZIviFgenSequence>& value);
    std::int32_t TriggerSource() const { return m_lTriggerSource; }
    void TriggerSource(std::int32_t value) { m_lTriggerSource = value; }

    // ---- Internal ----
    void Attach(std::shared_ptr<CIviErrorReport> errorReport,
                const std::shared_ptr<CIviFgenPropImp>& propSet);
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath);
    std::shared_ptr<CIviFgenPropImp> PropSet() const { return m_oPropSet.lock(); }
    void InitProperties();
    void ReadProperties(const PropertyBag& bag, const std::string& prefix);
    void WriteProperties(PropertyBag& bag, const std::string& prefix) const;
    void Clone(QZIviFgenChannel& target) const;
    const std::string& UniqueId() const { return m_sUniqueId; }
    void UniqueId(const std::string& value);

    // The properties in the order of their notices and bag keys; the references come last.
    static std::span<const PropertyRow<QZIviFgenChannel>> Properties();

private:
    friend class QZIviFgenChannels;

    // Their defaults are the table's.
    std::string m_sName;
    bool m_bAMEnabled{};
    std::int32_t m_lAMSource{};
    double m_dArbFrequency{};
    double m_dArbGain{};
    double m_dArbOffset{};
    std::shared_ptr<QZIviFgenArbWaveform> m_oArbWaveform;
    std::int32_t m_lBurstCount{};
    bool m_bFMEnabled{};
    std::int32_t m_lFMSource{};
    double m_dFuncAmplitude{};
    double m_dFuncDCOffset{};
    double m_dFuncDutyCycleHigh{};
    double m_dFuncFrequency{};
    double m_dFuncStartPhase{};
    std::int32_t m_lFuncWaveform{};
    std::int32_t m_lOperationMode{};
    bool m_bOutputEnabled{};
    double m_dOutputImpedance{};
    std::shared_ptr<QZIviFgenSequence> m_oSequence;
    std::int32_t m_lTriggerSource{};
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::weak_ptr<CIviFgenPropImp> m_oPropSet;
    std::string m_sPath;
    std::string m_sUniqueId;
};

class QZIviFgenChannels : public std::enable_shared_from_this<QZIviFgenChannels>,
                          public ModelCollection<QZIviFgenChannel> {
public:
    QZIviFgenChannels() : ModelCollection("Channels", "Channel") {}

    // ---- Public; iterating it walks the channels in order ----
    std::shared_ptr<QZIviFgenChannel> Item(const Variant& Index);
    std::shared_ptr<QZIviFgenChannel> Add(const std::string& ChannelName = "");
    void Remove(const Variant& Index);
    // With none active and channels present, the first becomes active, without an event.
    std::shared_ptr<QZIviFgenChannel> ActiveChannel();
    void ActiveChannel(const std::shared_ptr<QZIviFgenChannel>& value);

    // ---- Internal ----
    void Clone(QZIviFgenChannels& target) const { CloneInto(target); }
    // The tree's reactions to a rename or removal of a waveform, or of a sequence.
    void ForgetWaveforms();
    void ForgetSequences();

private:
    std::shared_ptr<QZIviFgenChannel> m_oActiveChannel;
};

} // namespace qzivi
