// CIviFgenPropImp: the root of the property tree, the whole state a user sets. It keeps its ten
// values, owns its five members, and fixes the order of reset, read, write and clone.
#pragma once

#include "qzivi/model/Channels.h"
#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/model/QZIviFgenInternalConfig.h"
#include "qzivi/model/QZIviFgenTypes.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/model/Waveforms.h"
#include "qzivi/support/event.h"
#include "qzivi/support/variant.h"

#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

class CIviErrorReport;
class PropertyBag;

class CIviFgenPropImp : public std::enable_shared_from_this<CIviFgenPropImp> {
public:
    // An empty set with its five members; Attach, then InitProperties, ReadProperties or Clone.
    static std::shared_ptr<CIviFgenPropImp> Create();
    CIviFgenPropImp(const CIviFgenPropImp&) = delete;
    CIviFgenPropImp& operator=(const CIviFgenPropImp&) = delete;

    void InitProperties();
    void ReadProperties(const PropertyBag& bag, const std::string& prefix, bool withConfigurations);
    void WriteProperties(PropertyBag& bag, const std::string& prefix,
                         bool withConfigurations) const;
    // Fills `target` (a new set if none) and returns it.
    std::shared_ptr<CIviFgenPropImp> Clone(std::shared_ptr<CIviFgenPropImp> target) const;

    double ArbSampleRate() const { return m_dArbSampleRate; }
    void ArbSampleRate(double value);
    bool AutoStopStart() const { return m_bAutoStopStart; }
    void AutoStopStart(bool value);
    std::int32_t Extensions() const { return m_lExtensions; }
    void Extensions(std::int32_t value);
    std::int32_t OutputMode() const { return m_lOutputMode; }
    void OutputMode(std::int32_t value);
    std::int32_t RefClockSource() const { return m_lRefClockSource; }
    void RefClockSource(std::int32_t value);
    const std::shared_ptr<QZIviFgenInternalConfig>& Internal() const { return m_oInternal; }
    const std::shared_ptr<QZIviFgenChannels>& Channels() const { return m_oChannels; }
    const std::shared_ptr<QZIviFgenArbWaveforms>& Waveforms() const { return m_oWaveforms; }
    const std::shared_ptr<QZIviFgenSequences>& Sequences() const { return m_oSequences; }
    void LogicalName(const std::string& value);
    const std::string& LogicalName() const { return m_sLogicalName; }
    void AutoConfigure(bool value);
    bool AutoConfigure() const { return m_bAutoConfigure; }
    void Enabled(bool value);
    bool Enabled() const { return m_bEnabled; }
    // Values outside 0 to 2 are refused with -30002 and change nothing.
    void UIStyle(std::int32_t value);
    std::int32_t UIStyle() const { return m_lUIStyle; }
    // Tells the collection that this set owns it before handing it out.
    const std::shared_ptr<QZIviConfigurations>& Configurations();
    void ExceptionOnError(bool value);
    bool ExceptionOnError() const { return m_bExceptionOnError; }
    void DraggingKnob(bool value) { m_bDraggingKnob = value; }
    bool DraggingKnob() const { return m_bDraggingKnob; }

    void Attach(std::shared_ptr<CIviErrorReport> errorReport);
    void Detach();
    const std::shared_ptr<CIviErrorReport>& ErrorReport() const { return m_oErr; }
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& name);
    void RaiseCollectionChanged(const std::string& collectionName, const Variant& collection,
                                std::int32_t kind, const Variant& first, const Variant& second);

    // collection name, collection, change kind, first value, second value
    Event<const std::string&, const Variant&, std::int32_t, const Variant&, const Variant&>
        CollectionChanged;
    Event<const std::string&> PropertyChange;

private:
    CIviFgenPropImp() = default;

    double m_dArbSampleRate = 1000.0;
    bool m_bAutoStopStart = true;
    std::int32_t m_lExtensions = 3;
    std::int32_t m_lOutputMode = 0;
    std::int32_t m_lRefClockSource = 0;
    std::shared_ptr<QZIviFgenInternalConfig> m_oInternal;
    std::shared_ptr<QZIviFgenChannels> m_oChannels;
    std::shared_ptr<QZIviFgenArbWaveforms> m_oWaveforms;
    std::shared_ptr<QZIviFgenSequences> m_oSequences;
    std::string m_sLogicalName = "SampleFGen";
    bool m_bAutoConfigure = false;
    bool m_bEnabled = true;
    std::int32_t m_lUIStyle = 1;
    bool m_bExceptionOnError = true;
    std::shared_ptr<QZIviConfigurations> m_oConfigurations;
    bool m_bDraggingKnob = false;
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::string m_sPath;
};

} // namespace qzivi
