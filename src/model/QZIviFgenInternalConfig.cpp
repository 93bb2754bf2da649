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

std::span<const PropertyRow<QZIviFgenInternalConfig>> QZIviFgenInternalConfig::Properties() {
    using C = QZIviFgenInternalConfig;
    static const PropertyRow<C> rows[] = {
        Field<&C::m_dAMInternalDepth>("AMInternalDepth", 50, IVIFGEN_ATTR_AM_INTERNAL_DEPTH),
        Field<&C::m_dAMInternalFrequency>("AMInternalFrequency", 1000,
                                          IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY),
        Field<&C::m_lAMInternalWaveform>("AMInternalWaveform", qzivifgenAMInternalSine,
                                         IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM),
        Field<&C::m_dFMInternalDeviation>("FMInternalDeviation", 100,
                                          IVIFGEN_ATTR_FM_INTERNAL_DEVIATION),
        Field<&C::m_dFMInternalFrequency>("FMInternalFrequency", 1000,
                                          IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY),
        Field<&C::m_lFMInternalWaveform>("FMInternalWaveform", qzivifgenFMInternalSine,
                                         IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM),
        Field<&C::m_dInternalTriggerRate>("InternalTriggerRate", 1000,
                                          IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE),
    };
    return rows;
}

QZIviFgenInternalConfig::QZIviFgenInternalConfig() {
    PutDefaults(Properties(), *this);
}

void QZIviFgenInternalConfig::InitProperties() {
    PutDefaults(Properties(), *this);
}

void QZIviFgenInternalConfig::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    ReadRows(Properties(), *this, bag, BagPrefix(prefix, "Internal"));
}

void QZIviFgenInternalConfig::WriteProperties(PropertyBag& bag, const std::string& prefix) const {
    WriteRows(Properties(), *this, bag, BagPrefix(prefix, "Internal"));
}

void QZIviFgenInternalConfig::Clone(QZIviFgenInternalConfig& target) const {
    CopyRows(Properties(), *this, target);
}

} // namespace qzivi
