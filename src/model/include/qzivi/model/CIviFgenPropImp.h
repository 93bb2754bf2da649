// CIviFgenPropImp: the root of the property tree, the whole state a user sets. It keeps its ten
// values, owns its five members, and fixes the order of reset, read, write and clone.
#pragma once

#include "qzivi/model/Channels.h"
#include "qzivi/model/PropertyTable.h"
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
    // A clone refers to the waveforms and sequences of the tree it came from. This makes each
    // such reference one to the twin of the same unique id in this tree, so that the tree stands
    // alone: the instrument's handles that Configure sets are on the objects its channels use.
    void OwnReferences();

    double ArbSampleRate() const { return m_dArbSampleRate; }
    void ArbSampleRate(double value) { Put(kArbSampleRate, value); }
    bool AutoStopStart() const { return m_bAutoStopStart; }
    void AutoStopStart(bool value) { Put(kAutoStopStart, value); }
    std::int32_t Extensions() const { return m_lExtensions; }
    void Extensions(std::int32_t value) { Put(kExtensions, value); }
    std::int32_t OutputMode() const { return m_lOutputMode; }
    void OutputMode(std::int32_t value) { Put(kOutputMode, value); }
    std::int32_t RefClockSource() const { return m_lRefClockSource; }
    void RefClockSource(std::int32_t value) { Put(kRefClockSource, value); }
    const std::shared_ptr<QZIviFgenInternalConfig>& Internal() const { return m_oInternal; }
    const std::shared_ptr<QZIviFgenChannels>& Channels() const { return m_oChannels; }
    const std::shared_ptr<QZIviFgenArbWaveforms>& Waveforms() const { return m_oWaveforms; }
    const std::shared_ptr<QZIviFgenSequences>& Sequences() const { return m_oSequences; }
    void LogicalName(const std::string& value) { Put(kLogicalName, value); }
    const std::string& LogicalName() const { return m_sLogicalName; }
    void AutoConfigure(bool value) { Put(kAutoConfigure, value); }
    bool AutoConfigure() const { return m_bAutoConfigure; }
    void Enabled(bool value) { Put(kEnabled, value); }
    bool Enabled() const { return m_bEnabled; }
    // Values outside 0 to 2 are refused with -30002 and change nothing.
    void UIStyle(std::int32_t value) { Put(kUIStyle, value); }
    std::int32_t UIStyle() const { return m_lUIStyle; }
    // Tells the collection that this set owns it before handing it out.
    const std::shared_ptr<QZIviConfigurations>& Configurations();
    // Kept in the error report, where the object model reads it; a set not yet attached to one
    // answers the default.
    void ExceptionOnError(bool value) { Put(kExceptionOnError, value); }
    bool ExceptionOnError() const;
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

    // The ten values in the order of their notices and bag keys.
    static std::span<const PropertyRow<CIviFgenPropImp>> Properties();
    // A value by its row, through its put: checked where the row checks, then noticed.
    void Put(const PropertyRow<CIviFgenPropImp>& row, const PropertyValue& value);

private:
    enum Row : std::size_t {
        kArbSampleRate,
        kAutoStopStart,
        kExtensions,
        kOutputMode,
        kRefClockSource,
        kLogicalName,
        kAutoConfigure,
        kEnabled,
        kUIStyle,
        kExceptionOnError,
    };
    CIviFgenPropImp();
    void Put(Row row, PropertyValue value) { Put(Properties()[row], value); }
    struct WithNotice {
        void operator()(CIviFgenPropImp& set, const PropertyRow<CIviFgenPropImp>& row,
                        const PropertyValue& value) const {
            set.Put(row, value);
        }
    };

    // Their defaults are the table's.
    double m_dArbSampleRate{};
    bool m_bAutoStopStart{};
    std::int32_t m_lExtensions{};
    std::int32_t m_lOutputMode{};
    std::int32_t m_lRefClockSource{};
    std::shared_ptr<QZIviFgenInternalConfig> m_oInternal;
    std::shared_ptr<QZIviFgenChannels> m_oChannels;
    std::shared_ptr<QZIviFgenArbWaveforms> m_oWaveforms;
    std::shared_ptr<QZIviFgenSequences> m_oSequences;
    std::string m_sLogicalName;
    bool m_bAutoConfigure{};
    bool m_bEnabled{};
    std::int32_t m_lUIStyle{};
    std::shared_ptr<QZIviConfigurations> m_oConfigurations;
    bool m_bDraggingKnob = false;
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::string m_sPath;
};

} // namespace qzivi
