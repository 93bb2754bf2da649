// The instrument's internal modulation sources and internal trigger, one for the control.
#pragma once

#include "qzivi/model/PropertyTable.h"
#include "qzivi/model/QZIviFgenTypes.h"
#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

class CIviErrorReport;
class CIviFgenPropImp;
class PropertyBag;

class QZIviFgenInternalConfig {
public:
    QZIviFgenInternalConfig();

    double AMInternalDepth() const { return m_dAMInternalDepth; }
    void AMInternalDepth(double value) { m_dAMInternalDepth = value; }
    double AMInternalFrequency() const { return m_dAMInternalFrequency; }
    void AMInternalFrequency(double value) { m_dAMInternalFrequency = value; }
    std::int32_t AMInternalWaveform() const { return m_lAMInternalWaveform; }
    void AMInternalWaveform(std::int32_t value) { m_lAMInternalWaveform = value; }
    double FMInternalDeviation() const { return m_dFMInternalDeviation; }
    void FMInternalDeviation(double value) { m_dFMInternalDeviation = value; }
    double FMInternalFrequency() const { return m_dFMInternalFrequency; }
    void FMInternalFrequency(double value) { m_dFMInternalFrequency = value; }
    std::int32_t FMInternalWaveform() const { return m_lFMInternalWaveform; }
    void FMInternalWaveform(std::int32_t value) { m_lFMInternalWaveform = value; }
    double InternalTriggerRate() const { return m_dInternalTriggerRate; }
    void InternalTriggerRate(double value) { m_dInternalTriggerRate = value; }

    void Attach(std::shared_ptr<CIviErrorReport> errorReport,
                const std::shared_ptr<CIviFgenPropImp>& propSet);
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath);
    std::shared_ptr<CIviFgenPropImp> PropSet() const { return m_oPropSet.lock(); }
    void InitProperties();
    void ReadProperties(const PropertyBag& bag, const std::string& prefix);
    void WriteProperties(PropertyBag& bag, const std::string& prefix) const;
    void Clone(QZIviFgenInternalConfig& target) const;

    // The properties in the order of their bag keys.
    static std::span<const PropertyRow<QZIviFgenInternalConfig>> Properties();

private:
    // Their defaults are the table's.
    double m_dAMInternalDepth{};
    double m_dAMInternalFrequency{};
    std::int32_t m_lAMInternalWaveform{};
    double m_dFMInternalDeviation{};
    double m_dFMInternalFrequency{};
    std::int32_t m_lFMInternalWaveform{};
    double m_dInternalTriggerRate{};
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::weak_ptr<CIviFgenPropImp> m_oPropSet;
    std::string m_sPath;
};

} // namespace qzivi
