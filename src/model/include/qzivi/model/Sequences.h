// Arbitrary sequences: ordered steps of waveforms with their repetitions, and their collection.
#pragma once

#include "qzivi/model/ModelSupport.h"
#include "qzivi/model/Waveforms.h"
#include "qzivi/support/event.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace qzivi {

class CIviFgenPropImp;
class PropertyBag;

class QZIviFgenSequenceItem {
public:
    // ---- Public ----
    const std::shared_ptr<QZIviFgenArbWaveform>& Waveform() const { return m_oWaveform; }
    // A waveform of another control's tree is refused with -31618; none is always taken.
    void Waveform(const std::shared_ptr<QZIviFgenArbWaveform>& value);
    std::int32_t Iterations() const { return m_lIterations; }
    void Iterations(std::int32_t value) { m_lIterations = value; }

    // ---- Internal ----
    // Also follows the waveforms' CollectionChanged of `propSet`.
    void Attach(std::shared_ptr<CIviErrorReport> errorReport,
                const std::shared_ptr<CIviFgenPropImp>& propSet);
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath) { m_sPath = JoinPath(parentPath, "SequenceItem"); }
    std::shared_ptr<CIviFgenPropImp> PropSet() const { return m_oPropSet.lock(); }
    void InitProperties();
    void ReadProperties(const PropertyBag& bag, const std::string& prefix);
    void WriteProperties(PropertyBag& bag, const std::string& prefix) const;
    void Clone(QZIviFgenSequenceItem& target) const;

private:
    void OnCollectionChanged(const std::string& name, const Variant& collection, std::int32_t kind,
                             const Variant& first, const Variant& second);

    std::shared_ptr<QZIviFgenArbWaveform> m_oWaveform;
    std::int32_t m_lIterations = 0;
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::weak_ptr<CIviFgenPropImp> m_oPropSet;
    std::string m_sPath;
    Connection m_cCollectionChanged;
};

// The blocks of a sequence's sample: one array of points for each repetition read.
using SampleBlocks = std::vector<Points>;

class QZIviFgenSequence : public std::enable_shared_from_this<QZIviFgenSequence> {
public:
    // ---- Public ----
    using Items = std::vector<std::shared_ptr<QZIviFgenSequenceItem>>;
    Items::const_iterator begin() const { return m_oItems.begin(); }
    Items::const_iterator end() const { return m_oItems.end(); }
    // Positions only, no names; -31626 for anything else.
    std::shared_ptr<QZIviFgenSequenceItem> SequenceItem(const Variant& Index);
    std::int32_t Count() const { return static_cast<std::int32_t>(m_oItems.size()); }
    std::shared_ptr<QZIviFgenSequenceItem>
    Add(const std::shared_ptr<QZIviFgenArbWaveform>& Waveform = nullptr,
        std::int32_t Iterations = 0);
    void Remove(const Variant& Index);
    std::int32_t SequenceHandle() const { return m_lSequenceHandle; }
    const std::string& Name() const { return m_sName; }
    void Name(const std::string& value);
    // Points from StartIndex of the unrolled sequence, block by block. Always raises on failure;
    // too few points (-31615) still gives the blocks collected.
    SampleBlocks GetDataSample(std::int32_t StartIndex, std::int32_t Interval, std::int32_t Count);
    // Always raises on failure.
    std::int32_t DataSize();

    // ---- Internal ----
    void Attach(std::shared_ptr<CIviErrorReport> errorReport,
                const std::shared_ptr<CIviFgenPropImp>& propSet);
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath);
    std::shared_ptr<CIviFgenPropImp> PropSet() const { return m_oPropSet.lock(); }
    void InitProperties();
    void ReadProperties(const PropertyBag& bag, const std::string& prefix);
    void WriteProperties(PropertyBag& bag, const std::string& prefix) const;
    void Clone(QZIviFgenSequence& target) const;
    const std::string& UniqueId() const { return m_sUniqueId; }
    void UniqueId(const std::string& value) { m_sUniqueId = value; }
    void SetSequenceHandle(std::int32_t handle) { m_lSequenceHandle = handle; }
    std::int32_t CurrentItem() const { return m_lCurrentItem; }
    void CurrentItem(std::int32_t value) { m_lCurrentItem = value; }
    void CollapseIterations(bool value) { m_bCollapseIterations = value; }
    std::int32_t IndexOfObject(const QZIviFgenSequenceItem* item) const;
    const std::shared_ptr<QZIviFgenSequenceItem>& At(std::int32_t position) const {
        return m_oItems[static_cast<std::size_t>(position - 1)];
    }
    std::vector<std::int32_t> WaveformHandles() const;
    std::vector<std::int32_t> IterationCounts() const;
    std::int32_t PreviewDataSize();

private:
    Items m_oItems; // no names here, so not an ItemList
    std::string m_sName;
    std::int32_t m_lSequenceHandle = 0;
    std::int32_t m_lCurrentItem = 1;
    bool m_bCollapseIterations = false;
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::weak_ptr<CIviFgenPropImp> m_oPropSet;
    std::string m_sPath;
    std::string m_sUniqueId;
};

class QZIviFgenSequences : public std::enable_shared_from_this<QZIviFgenSequences>,
                           public ModelCollection<QZIviFgenSequence>,
                           public DeletedHandleQueue {
public:
    QZIviFgenSequences() : ModelCollection("Sequences", "Sequence") {}

    // ---- Public; iterating it walks the sequences in order ----
    std::shared_ptr<QZIviFgenSequence> Item(const Variant& Index);
    std::shared_ptr<QZIviFgenSequence> Add(const std::string& SequenceName = "");
    void Remove(const Variant& Index);
    std::int32_t GetMaxLoopCount();
    std::int32_t GetMaxNumSequences();
    std::int32_t GetMaxSequenceLength();
    std::int32_t GetMinSequenceLength();

    // ---- Internal ----
    void Clone(QZIviFgenSequences& target) const { CloneInto(target); }
};

} // namespace qzivi
