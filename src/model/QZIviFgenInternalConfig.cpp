#include "qzivi/model/QZIviFgenInternalConfig.h"

#include "qzivi/model/Conventions.h"
#include "qzivi/model/PropertyBag.h"

namespace qzivi {

void QZIviFgenInternalConfig::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                                     const std::shared_ptr<CIviFgenPropImp>& propSet) {
    m_oErr = std::move(errorReport);
    m_oPropSet = propSet;
}

void QZIviFgenInternalConfig::SetPath(const std::string& parentPath) {
    m_sPath = JoinPath(parentPath, "Internal");
}

void QZIviFgenInternalConfig::InitProperties() {
    AMInternalDepth(50);
    AMInternalFrequency(1000);
    AMInternalWaveform(1);
    FMInternalDeviation(100);
    FMInternalFrequency(1000);
    FMInternalWaveform(1);
    InternalTriggerRate(1000);
}

void QZIviFgenInternalConfig::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    const std::string p = BagPrefix(prefix, "Internal");
    AMInternalDepth(bag.ReadDouble(p + "AMInternalDepth", 50));
    AMInternalFrequency(bag.ReadDouble(p + "AMInternalFrequency", 1000));
    AMInternalWaveform(bag.ReadInt32(p + "AMInternalWaveform", 1));
    FMInternalDeviation(bag.ReadDouble(p + "FMInternalDeviation", 100));
    FMInternalFrequency(bag.ReadDouble(p + "FMInternalFrequency", 1000));
    FMInternalWaveform(bag.ReadInt32(p + "FMInternalWaveform", 1));
    InternalTriggerRate(bag.ReadDouble(p + "InternalTriggerRate", 1000));
}

void QZIviFgenInternalConfig::WriteProperties(PropertyBag& bag, const std::string& prefix) const {
    const std::string p = BagPrefix(prefix, "Internal");
    bag.WriteDouble(p + "AMInternalDepth", AMInternalDepth(), 50);
    bag.WriteDouble(p + "AMInternalFrequency", AMInternalFrequency(), 1000);
    bag.WriteInt32(p + "AMInternalWaveform", AMInternalWaveform(), 1);
    bag.WriteDouble(p + "FMInternalDeviation", FMInternalDeviation(), 100);
    bag.WriteDouble(p + "FMInternalFrequency", FMInternalFrequency(), 1000);
    bag.WriteInt32(p + "FMInternalWaveform", FMInternalWaveform(), 1);
    bag.WriteDouble(p + "InternalTriggerRate", InternalTriggerRate(), 1000);
}

void QZIviFgenInternalConfig::Clone(QZIviFgenInternalConfig& target) const {
    target.AMInternalDepth(AMInternalDepth());
    target.AMInternalFrequency(AMInternalFrequency());
    target.AMInternalWaveform(AMInternalWaveform());
    target.FMInternalDeviation(FMInternalDeviation());
    target.FMInternalFrequency(FMInternalFrequency());
    target.FMInternalWaveform(FMInternalWaveform());
    target.InternalTriggerRate(InternalTriggerRate());
}

} // namespace qzivi
