// Arbitrary sequences: ordered steps of waveforms with their repetitions, and their collection.
#pragma once

#include "qzivi/model/ModelSupport.h"
#include "qzivi/model/Waveforms.h"
#include "qzivi/support/event.h"

#include <cstdint>
#include <memory>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace qzivi {

class CIviFgenPropImp;
class PropertyBag;
class QZIviFgenSequence;

class QZIviFgenSequenceItem : public std::enable_shared_from_this<QZIviFgenSequenceItem>,
                              public ListMember<QZIviFgenSequenceItem> {
public:
    // ---- Public ----
    const std::shared_ptr<QZIviFgenArbWaveform>& Waveform() const { return m_oWaveform; }
    // A waveform of another control's tree is refused with -31618; none is always taken.
    void Waveform(const std::shared_ptr<QZIviFgenArbWaveform>& value);
    std::int32_t Iterations() const { return m_lIterations; }
    void Iterations(std::int32_t value) { m_lIterations = value; }

    // ---- Internal ----
    void Attach(std::shared_ptr<CIviErrorReport> errorReport,
                const std::shared_ptr<CIviFgenPropImp>& propSet);
    // The sequence that holds this item, while it does.
    QZIviFgenSequence* Sequence() const { return List() ? m_pSequence : nullptr; }
    void Sequence(QZIviFgenSequence* sequence) { m_pSequence = sequence; }
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath) { m_sPath = JoinPath(parentPath, "SequenceItem"); }
    std::shared_ptr<CIviFgenPropImp> PropSet() const { return m_oPropSet.lock(); }
    void InitProperties();
    void ReadProperties(const PropertyBag& bag, const std::string& prefix);
    void WriteProperties(PropertyBag& bag, const std::string& prefix) const;
    void Clone(QZIviFgenSequenceItem& target) const;

private:
    friend class QZIviFgenSequences;

    std::shared_ptr<QZIviFgenArbWaveform> m_oWaveform;
    std::int32_t m_lIterations = 0;
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::weak_ptr<CIviFgenPropImp> m_oPropSet;
    std::string m_sPath;
    QZIviFgenSequence* m_pSequence = nullptr;
};

// The blocks of a sequence's sample: one array of points for each repetition read.
using SampleBlocks = std::vector<Points>;

class QZIviFgenSequence : public std::enable_shared_from_this<QZIviFgenSequence>,
                          public ListMember<QZIviFgenSequence> {
public:
    // ---- Public ----
    ItemList<QZIviFgenSequenceItem>::const_iterator begin() const { return m_oItems.begin(); }
    ItemList<QZIviFgenSequenceItem>::const_iterator end() const { return m_oItems.end(); }
    // Positions only, no names; -31626 for anything else.
    std::shared_ptr<QZIviFgenSequenceItem> SequenceItem(const Variant& Index);
    std::int32_t Count() const { return m_oItems.Count(); }
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
    void UniqueId(const std::string& value);
    void SetSequenceHandle(std::int32_t handle) { m_lSequenceHandle = handle; }
    std::int32_t CurrentItem() const { return m_lCurrentItem; }
    void CurrentItem(std::int32_t value) { m_lCurrentItem = value; }
    void CollapseIterations(bool value) { m_bCollapseIterations = value; }
    std::int32_t IndexOfObject(const QZIviFgenSequenceItem* item) const;
    const std::shared_ptr<QZIviFgenSequenceItem>& At(std::int32_t position) const {
        return m_oItems.At(position);
    }
    std::vector<std::int32_t> WaveformHandles() const;
    std::vector<std::int32_t> IterationCounts() const;
    std::int32_t PreviewDataSize();

private:
    ItemList<QZIviFgenSequenceItem> m_oItems;
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
    void InitProperties();

    // The items of the tree follow the waveforms they use through one index here, not through
    // a listener each: an item tells which waveform it now refers to (null for none) ...
    void Refer(QZIviFgenSequenceItem& item);
    // ... the items of every waveform named as `waveform` (ignoring case) leave their sequences,
    // last first, before it is removed; an item without a waveform stops that (error 91) ...
    void RemoveItemsOf(const QZIviFgenArbWaveform& waveform);
    // ... and after a waveform notice of the tree, a waveform of another copy of the tree follows
    // the rename of its twin here, and one whose name is gone from here is let go.
    void WaveformRenamed(const std::string& now, const std::string& before);
    void WaveformRemoved();

private:
    using Users = std::vector<std::weak_ptr<QZIviFgenSequenceItem>>;
    // Whether the item is in a sequence of this collection.
    bool InTree(const QZIviFgenSequenceItem& item) const;
    // The items of this tree that use `waveform` now; stale entries are dropped on the way.
    std::vector<std::shared_ptr<QZIviFgenSequenceItem>>
    UsersOf(const QZIviFgenArbWaveform* waveform);
    // The waveforms of other copies that items here use, named `name` (exactly, or ignoring
    // case); those no item uses any more are dropped.
    std::vector<const QZIviFgenArbWaveform*> ForeignNamed(const std::string& name, bool ignoreCase);
    void PruneWithoutWaveform();

    std::unordered_map<const QZIviFgenArbWaveform*, Users> m_oUsers;
    std::unordered_set<const QZIviFgenArbWaveform*> m_oForeign;
    Users m_oWithoutWaveform;
    std::size_t m_nPruneAt = 64;
};

} // namespace qzivi
