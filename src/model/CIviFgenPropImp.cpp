#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/driver/ErrorIds.h"

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/model/Conventions.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/support/failure.h"

namespace qzivi {

std::shared_ptr<CIviFgenPropImp> CIviFgenPropImp::Create() {
    std::shared_ptr<CIviFgenPropImp> set(new CIviFgenPropImp);
    set->m_oConfigurations = std::make_shared<QZIviConfigurations>();
    set->m_oInternal = std::make_shared<QZIviFgenInternalConfig>();
    set->m_oChannels = std::make_shared<QZIviFgenChannels>();
    set->m_oWaveforms = std::make_shared<QZIviFgenArbWaveforms>();
    set->m_oSequences = std::make_shared<QZIviFgenSequences>();
    return set;
}

void CIviFgenPropImp::ArbSampleRate(double value) {
    m_dArbSampleRate = value;
    PropertyChange("ArbSampleRate");
}

void CIviFgenPropImp::AutoStopStart(bool value) {
    m_bAutoStopStart = value;
    PropertyChange("AutoStopStart");
}

void CIviFgenPropImp::Extensions(std::int32_t value) {
    m_lExtensions = value;
    PropertyChange("Extensions");
}

void CIviFgenPropImp::OutputMode(std::int32_t value) {
    m_lOutputMode = value;
    PropertyChange("OutputMode");
}

void CIviFgenPropImp::RefClockSource(std::int32_t value) {
    m_lRefClockSource = value;
    PropertyChange("RefClockSource");
}

void CIviFgenPropImp::LogicalName(const std::string& value) {
    m_sLogicalName = value;
    PropertyChange("LogicalName");
}

void CIviFgenPropImp::AutoConfigure(bool value) {
    m_bAutoConfigure = value;
    PropertyChange("AutoConfigure");
}

void CIviFgenPropImp::Enabled(bool value) {
    m_bEnabled = value;
    PropertyChange("Enabled");
}

void CIviFgenPropImp::UIStyle(std::int32_t value) {
    if (value < 0 || value > 2) {
        if (m_oErr) m_oErr->DoStdError(errid::kInvalidArgument, m_sPath + "UIStyle");
        throw Failure(errid::kInvalidArgument, m_sPath + "UIStyle",
                      "An invalid argument has been passed to a property or method. (" + m_sPath +
                          "UIStyle)");
    }
    m_lUIStyle = value;
    PropertyChange("UIStyle");
}

const std::shared_ptr<QZIviConfigurations>& CIviFgenPropImp::Configurations() {
    m_oConfigurations->PropSet(this);
    return m_oConfigurations;
}

void CIviFgenPropImp::ExceptionOnError(bool value) {
    m_bExceptionOnError = value;
    if (m_oErr) m_oErr->ExceptionOnError(value);
    PropertyChange("ExceptionOnError");
}

void CIviFgenPropImp::InitProperties() {
    ArbSampleRate(1000.0);
    AutoStopStart(true);
    Extensions(3);
    OutputMode(0);
    RefClockSource(0);
    LogicalName("SampleFGen");
    AutoConfigure(false);
    Enabled(true);
    UIStyle(1);
    ExceptionOnError(true);
    m_oInternal->InitProperties();
    m_oChannels->InitProperties();
    m_oWaveforms->InitProperties();
    m_oSequences->InitProperties();
}

void CIviFgenPropImp::ReadProperties(const PropertyBag& bag, const std::string& prefix,
                                     bool withConfigurations) {
    ArbSampleRate(bag.ReadDouble(prefix + "ArbSampleRate", 1000));
    AutoStopStart(bag.ReadBool(prefix + "AutoStopStart", true));
    Extensions(bag.ReadInt32(prefix + "Extensions", 3));
    OutputMode(bag.ReadInt32(prefix + "OutputMode", 0));
    RefClockSource(bag.ReadInt32(prefix + "RefClockSource", 0));
    LogicalName(bag.ReadText(prefix + "LogicalName", "SampleFGen"));
    AutoConfigure(bag.ReadBool(prefix + "AutoConfigure", false));
    Enabled(bag.ReadBool(prefix + "Enabled", true));
    UIStyle(bag.ReadInt32(prefix + "UIStyle", 1));
    ExceptionOnError(bag.ReadBool(prefix + "ExceptionOnError", true));
    m_oInternal->ReadProperties(bag, prefix);
    m_oWaveforms->ReadProperties(bag, prefix);
    m_oSequences->ReadProperties(bag, prefix);
    m_oChannels->ReadProperties(bag, prefix);
    if (withConfigurations) m_oConfigurations->ReadProperties(bag);
}

void CIviFgenPropImp::WriteProperties(PropertyBag& bag, const std::string& prefix,
                                      bool withConfigurations) const {
    bag.WriteDouble(prefix + "ArbSampleRate", m_dArbSampleRate, 1000);
    bag.WriteBool(prefix + "AutoStopStart", m_bAutoStopStart, true);
    bag.WriteInt32(prefix + "Extensions", m_lExtensions, 3);
    bag.WriteInt32(prefix + "OutputMode", m_lOutputMode, 0);
    bag.WriteInt32(prefix + "RefClockSource", m_lRefClockSource, 0);
    bag.WriteText(prefix + "LogicalName", m_sLogicalName); // always stored
    bag.WriteBool(prefix + "AutoConfigure", m_bAutoConfigure, false);
    bag.WriteBool(prefix + "Enabled", m_bEnabled, true);
    bag.WriteInt32(prefix + "UIStyle", m_lUIStyle, 1);
    bag.WriteBool(prefix + "ExceptionOnError", m_bExceptionOnError, true);
    m_oInternal->WriteProperties(bag, prefix);
    m_oChannels->WriteProperties(bag, prefix);
    m_oSequences->WriteProperties(bag, prefix);
    m_oWaveforms->WriteProperties(bag, prefix);
    if (withConfigurations) m_oConfigurations->WriteProperties(bag);
}

std::shared_ptr<CIviFgenPropImp>
CIviFgenPropImp::Clone(std::shared_ptr<CIviFgenPropImp> target) const {
    if (!target) target = Create();
    target->Attach(m_oErr);
    target->ArbSampleRate(ArbSampleRate());
    target->AutoStopStart(AutoStopStart());
    target->Extensions(Extensions());
    target->OutputMode(OutputMode());
    target->RefClockSource(RefClockSource());
    target->LogicalName(LogicalName());
    target->AutoConfigure(AutoConfigure());
    target->Enabled(Enabled());
    target->UIStyle(UIStyle());
    target->ExceptionOnError(ExceptionOnError());
    m_oInternal->Clone(*target->m_oInternal);
    m_oWaveforms->Clone(*target->m_oWaveforms);
    m_oSequences->Clone(*target->m_oSequences);
    m_oChannels->Clone(*target->m_oChannels);
    m_oConfigurations->Clone(*target->m_oConfigurations);
    return target;
}

void CIviFgenPropImp::Attach(std::shared_ptr<CIviErrorReport> errorReport) {
    m_oErr = std::move(errorReport);
    const auto self = shared_from_this();
    m_oConfigurations->Attach(m_oErr, this, "");
    m_oInternal->Attach(m_oErr, self);
    m_oChannels->Attach(m_oErr, self);
    m_oWaveforms->Attach(m_oErr, self);
    m_oSequences->Attach(m_oErr, self);
}

void CIviFgenPropImp::Detach() {
    m_oInternal->Attach(m_oErr, nullptr);
    m_oChannels->Attach(m_oErr, nullptr);
    m_oWaveforms->Attach(m_oErr, nullptr);
    m_oSequences->Attach(m_oErr, nullptr);
    m_oConfigurations->Attach(m_oErr, nullptr, "");
    m_oConfigurations->PropSet(nullptr);
}

void CIviFgenPropImp::SetPath(const std::string& name) {
    m_sPath = JoinPath(name, "");
    m_oInternal->SetPath(m_sPath);
    m_oChannels->SetPath(m_sPath);
    m_oWaveforms->SetPath(m_sPath);
    m_oSequences->SetPath(m_sPath);
}

void CIviFgenPropImp::RaiseCollectionChanged(const std::string& collectionName,
                                             const Variant& collection, std::int32_t kind,
                                             const Variant& first, const Variant& second) {
    CollectionChanged(collectionName, collection, kind, first, second);
}

} // namespace qzivi
