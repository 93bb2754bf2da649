#include "qzivi/model/Sequences.h"
#include "qzivi/driver/ErrorIds.h"

#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/PropertyBag.h"

#include <cmath>

namespace qzivi {

namespace {

constexpr const char* kSequence = "QZIviFgenSequence";
constexpr const char* kSequences = "QZIviFgenSequences";

// A step whose failure is dropped and the work goes on, as the sample of a sequence is gathered.
template <typename F>
void Ignoring(F&& step) {
    try {
        step();
    } catch (...) {
    }
}

} // namespace

// ---- QZIviFgenSequenceItem ------------------------------------------------------------------

void QZIviFgenSequenceItem::Waveform(const std::shared_ptr<QZIviFgenArbWaveform>& value) {
    Guard(m_oErr, "Waveform", [&] {
        const auto propSet = PropSet();
        if (value) {
            if (!propSet)
                RaiseRuntime(91,
                             "Object variable not set: the sequence item belongs to no control.");
            if (!propSet->Waveforms()->ContainsObject(*value))
                StdError(m_oErr, errid::kForeignObject, m_sPath + "Waveform");
        }
        m_oWaveform = value;
        if (propSet) propSet->Sequences()->Refer(*this);
    });
}

void QZIviFgenSequenceItem::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                                   const std::shared_ptr<CIviFgenPropImp>& propSet) {
    m_oErr = std::move(errorReport);
    m_oPropSet = propSet;
}

void QZIviFgenSequenceItem::InitProperties() {
    Waveform(nullptr);
    Iterations(0);
}

void QZIviFgenSequenceItem::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    const std::string p = BagPrefix(prefix, "SequenceItem");
    Iterations(bag.ReadInt32(p + "Iterations", 0));
    const std::int32_t index = bag.ReadInt32(p + "Waveform", 0);
    const auto propSet = PropSet();
    Waveform(index > 0 && propSet ? propSet->Waveforms()->Item(index) : nullptr);
}

void QZIviFgenSequenceItem::WriteProperties(PropertyBag& bag, const std::string& prefix) const {
    const std::string p = BagPrefix(prefix, "SequenceItem");
    bag.WriteInt32(p + "Iterations", m_lIterations, 0);
    const auto propSet = PropSet();
    const std::int32_t index =
        m_oWaveform && propSet ? propSet->Waveforms()->IndexOfName(m_oWaveform->Name()) : 0;
    bag.WriteInt32(p + "Waveform", index, 0);
}

void QZIviFgenSequenceItem::Clone(QZIviFgenSequenceItem& target) const {
    target.Waveform(m_oWaveform);
    target.Iterations(m_lIterations);
}

// ---- QZIviFgenSequence ----------------------------------------------------------------------

std::int32_t QZIviFgenSequence::IndexOfObject(const QZIviFgenSequenceItem* item) const {
    return m_oItems.IndexOfObject(item);
}

std::shared_ptr<QZIviFgenSequenceItem> QZIviFgenSequence::SequenceItem(const Variant& Index) {
    return Guard(m_oErr, "SequenceItem", [&] {
        std::shared_ptr<QZIviFgenSequenceItem> found;
        if (Index.IsNumber()) {
            const std::int32_t position = Index.AsInt32();
            if (position >= 1 && position <= Count()) found = At(position);
        }
        if (!found) StdError(m_oErr, errid::kNoSuchSequenceItem, m_sPath + "Item");
        return found;
    });
}

std::shared_ptr<QZIviFgenSequenceItem>
QZIviFgenSequence::Add(const std::shared_ptr<QZIviFgenArbWaveform>& Waveform,
                       std::int32_t Iterations) {
    return Guard(m_oErr, "Add", [&] {
        auto item = std::make_shared<QZIviFgenSequenceItem>();
        item->Attach(m_oErr, PropSet());
        item->Sequence(this);
        item->InitProperties();
        // The setter's own frame reports a foreign waveform; it ends this Add only if it raises.
        item->Waveform(Waveform);
        item->Iterations(Iterations);
        m_oItems.Append(item);
        if (const auto propSet = PropSet())
            propSet->RaiseCollectionChanged(kSequence, Variant::Object(shared_from_this()),
                                            ChangeAdded, Count(), "");
        return item;
    });
}

void QZIviFgenSequence::Remove(const Variant& Index) {
    Guard(m_oErr, "Remove", [&] {
        const std::int32_t position = Index.IsNumeric() ? Index.AsInt32() : 0;
        if (position < 1 || position > Count())
            StdError(m_oErr, errid::kInvalidIndex, m_sPath + "Remove");
        m_oItems.RemoveAt(position);
        if (const auto propSet = PropSet())
            propSet->RaiseCollectionChanged(kSequence, Variant::Object(shared_from_this()),
                                            ChangeRemoved, position, "");
    });
}

void QZIviFgenSequence::Name(const std::string& value) {
    const std::string old = m_sName;
    m_sName = value;
    NameChanged(old);
    if (const auto propSet = PropSet())
        propSet->RaiseCollectionChanged(kSequences, Variant::Object(propSet->Sequences()),
                                        ChangeRenamed, value, old);
}

std::int32_t QZIviFgenSequence::DataSize() {
    return Guard(
        m_oErr, "DataSize",
        [&] {
            std::int64_t total = 0;
            for (const auto& item : m_oItems) {
                if (!item->Waveform() || item->Iterations() < 1)
                    StdError(m_oErr, errid::kInvalidSequence, m_sPath + "DataSize");
                total +=
                    static_cast<std::int64_t>(item->Waveform()->DataSize()) * item->Iterations();
            }
            if (total > 0x7FFFFFFF) RaiseRuntime(runtime::kOverflow, "Overflow.");
            return static_cast<std::int32_t>(total);
        },
        true);
}

std::int32_t QZIviFgenSequence::PreviewDataSize() {
    std::int64_t total = 0;
    for (const auto& item : m_oItems)
        if (item->Waveform()) total += item->Waveform()->DataSize();
    return static_cast<std::int32_t>(std::min<std::int64_t>(total, 0x7FFFFFFF));
}

SampleBlocks QZIviFgenSequence::GetDataSample(std::int32_t StartIndex, std::int32_t Interval,
                                              std::int32_t Count) {
    return Guard(
        m_oErr, "GetDataSample",
        [&] {
            const std::int32_t n = this->Count();
            std::vector<std::int64_t> size(static_cast<std::size_t>(n) + 1),
                iters(static_cast<std::size_t>(n) + 1);
            std::int64_t cum = 0, firstIter = 0, offset = 0, blocks = 0;
            std::int32_t startItem = 0;
            bool found = false;
            for (std::int32_t i = 1; i <= n; ++i) {
                const auto& item = At(i);
                if (!item->Waveform())
                    StdError(m_oErr, errid::kInvalidSequence, m_sPath + "GetDataSample");
                Ignoring([&] { size[i] = item->Waveform()->DataSize(); });
                iters[i] = m_bCollapseIterations ? 1 : item->Iterations();
                const std::int64_t total = size[i] * iters[i];
                if (cum + total < StartIndex) {
                    cum += total;
                } else if (!found) {
                    startItem = i;
                    if (size[i] != 0)
                        firstIter = static_cast<std::int64_t>(
                            std::trunc(double(StartIndex - cum) / double(size[i])));
                    offset = StartIndex - cum - firstIter * size[i];
                    found = true;
                    blocks = -firstIter;
                }
                if (found) blocks += iters[i];
            }
            m_bCollapseIterations = false;
            SampleBlocks table;
            const std::size_t room = blocks > 0 ? static_cast<std::size_t>(blocks) : 0;
            table.reserve(room);

            std::int64_t collected = 0;
            bool collecting = true;
            for (std::int32_t i = 1; i <= n && collecting; ++i) {
                if (i < startItem) continue;
                const auto waveform = At(i)->Waveform();
                const std::int64_t repetitions = i == startItem ? iters[i] - firstIter : iters[i];
                for (std::int64_t r = 1; r <= repetitions && collecting; ++r) {
                    const std::int64_t remain = Count == -1 ? -1 : Count - collected;
                    const std::int64_t from = i == startItem && r == 1 ? offset : 0;
                    const bool whole =
                        Count == -1 || double(size[i] - from) / Interval <= double(remain);
                    Points block;
                    Ignoring([&] {
                        if (waveform->Source() > 0)
                            block = waveform->GetDataSample(
                                static_cast<std::int32_t>(from), Interval,
                                whole ? -1 : static_cast<std::int32_t>(remain));
                        else
                            block = waveform->Data();
                    });
                    if (block) {
                        collected += static_cast<std::int64_t>(block->size());
                        if (table.size() < room) table.push_back(block);
                    }
                    collecting = whole;
                }
            }
            if (Count != -1 && collected < Count) {
                // Reported, but the blocks collected are the result all the same.
                try {
                    StdError(m_oErr, errid::kTooFewPoints, m_sPath + "GetDataSample");
                } catch (...) {
                    HandleError("GetDataSample", 0, m_oErr.get());
                }
            }
            return table;
        },
        true);
}

std::vector<std::int32_t> QZIviFgenSequence::WaveformHandles() const {
    std::vector<std::int32_t> handles;
    for (const auto& item : m_oItems)
        handles.push_back(item->Waveform() ? item->Waveform()->WaveformHandle() : 0);
    return handles;
}

std::vector<std::int32_t> QZIviFgenSequence::IterationCounts() const {
    std::vector<std::int32_t> counts;
    for (const auto& item : m_oItems)
        counts.push_back(item->Iterations());
    return counts;
}

void QZIviFgenSequence::UniqueId(const std::string& value) {
    const std::string old = m_sUniqueId;
    m_sUniqueId = value;
    UniqueIdChanged(old);
}

void QZIviFgenSequence::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                               const std::shared_ptr<CIviFgenPropImp>& propSet) {
    m_oErr = std::move(errorReport);
    m_oPropSet = propSet;
    for (const auto& item : m_oItems)
        item->Attach(m_oErr, propSet);
}

void QZIviFgenSequence::SetPath(const std::string& parentPath) {
    m_sPath = JoinPath(parentPath, "Sequence");
    for (const auto& item : m_oItems)
        item->SetPath(m_sPath);
}

void QZIviFgenSequence::InitProperties() {
    m_oItems.Clear();
    Name("");
    m_lSequenceHandle = 0;
    UniqueId(NewUniqueId());
    m_lCurrentItem = 1;
}

void QZIviFgenSequence::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    const std::string p = BagPrefix(prefix, "Sequence");
    Name(bag.ReadText(p + "Name", ""));
    UniqueId(NewUniqueId());
    m_lCurrentItem = 1;
    const std::int32_t count = bag.ReadInt32(p + "ItemCount", 0);
    if (count <= 0) return;
    m_oItems.Clear();
    for (std::int32_t i = 1; i <= count; ++i) {
        auto item = std::make_shared<QZIviFgenSequenceItem>();
        item->Attach(m_oErr, PropSet());
        item->Sequence(this);
        item->ReadProperties(bag, p + "Item" + std::to_string(i) + "_");
        m_oItems.Append(std::move(item));
    }
}

void QZIviFgenSequence::WriteProperties(PropertyBag& bag, const std::string& prefix) const {
    const std::string p = BagPrefix(prefix, "Sequence");
    bag.WriteText(p + "Name", m_sName, "");
    bag.WriteInt32(p + "ItemCount", Count(), 0);
    std::int32_t i = 0;
    for (const auto& item : m_oItems)
        item->WriteProperties(bag, p + "Item" + std::to_string(++i) + "_");
}

void QZIviFgenSequence::Clone(QZIviFgenSequence& target) const {
    target.Name(m_sName);
    target.SetSequenceHandle(m_lSequenceHandle);
    target.UniqueId(m_sUniqueId);
    target.CurrentItem(m_lCurrentItem);
    for (std::int32_t i = 1; i <= Count(); ++i) {
        target.Add(nullptr, 0);
        if (i <= target.Count()) At(i)->Clone(*target.At(i));
    }
}

// ---- QZIviFgenSequences ---------------------------------------------------------------------

std::shared_ptr<QZIviFgenSequence> QZIviFgenSequences::Item(const Variant& Index) {
    return ItemOrRefuse(Index, errid::kNoSuchSequence);
}

std::shared_ptr<QZIviFgenSequence> QZIviFgenSequences::Add(const std::string& SequenceName) {
    return Guard(m_oErr, "Add", [&] {
        auto sequence = NewItem(SequenceName);
        m_oItems.Append(sequence);
        if (const auto propSet = PropSet())
            propSet->RaiseCollectionChanged(kSequences, Variant::Object(shared_from_this()),
                                            ChangeAdded, Count(), "");
        return sequence;
    });
}

void QZIviFgenSequences::Remove(const Variant& Index) {
    Guard(m_oErr, "Remove", [&] {
        const std::int32_t position = m_oItems.RemovalPosition(Index);
        if (position == 0) StdError(m_oErr, errid::kInvalidIndex, m_sPath + "Remove");
        Queue(m_oItems.At(position)->SequenceHandle());
        m_oItems.RemoveAt(position);
        if (const auto propSet = PropSet())
            propSet->RaiseCollectionChanged(kSequences, Variant::Object(shared_from_this()),
                                            ChangeRemoved, position, "");
    });
}

// ---- The items' waveforms -----------------------------------------------------------------------

void QZIviFgenSequences::InitProperties() {
    ModelCollection::InitProperties();
    m_oUsers.clear();
    m_oForeign.clear();
    m_oWithoutWaveform.clear();
    m_nPruneAt = 64;
}

bool QZIviFgenSequences::InTree(const QZIviFgenSequenceItem& item) const {
    const QZIviFgenSequence* sequence = item.Sequence();
    return sequence != nullptr && Holds(*sequence);
}

void QZIviFgenSequences::Refer(QZIviFgenSequenceItem& item) {
    auto self = item.weak_from_this();
    if (self.expired()) return; // an item no tree can hold
    const QZIviFgenArbWaveform* waveform = item.m_oWaveform.get();
    if (!waveform) {
        // Every new item passes through here on its way to a waveform: the list is pruned
        // whenever it has doubled, so it stays near the number of items truly without one.
        m_oWithoutWaveform.push_back(std::move(self));
        if (m_oWithoutWaveform.size() >= m_nPruneAt) {
            PruneWithoutWaveform();
            m_nPruneAt = std::max<std::size_t>(64, 2 * m_oWithoutWaveform.size());
        }
        return;
    }
    m_oUsers[waveform].push_back(std::move(self));
    if (const auto propSet = PropSet(); propSet && !propSet->Waveforms()->Holds(*waveform))
        m_oForeign.insert(waveform);
}

std::vector<std::shared_ptr<QZIviFgenSequenceItem>>
QZIviFgenSequences::UsersOf(const QZIviFgenArbWaveform* waveform) {
    std::vector<std::shared_ptr<QZIviFgenSequenceItem>> users;
    const auto found = m_oUsers.find(waveform);
    if (found == m_oUsers.end()) return users;
    Users& entries = found->second;
    std::erase_if(entries, [&](const std::weak_ptr<QZIviFgenSequenceItem>& entry) {
        const auto item = entry.lock();
        if (!item || item->m_oWaveform.get() != waveform || !InTree(*item)) return true;
        if (std::find(users.begin(), users.end(), item) != users.end()) return true; // twice
        users.push_back(item);
        return false;
    });
    if (entries.empty()) m_oUsers.erase(found);
    return users;
}

std::vector<const QZIviFgenArbWaveform*> QZIviFgenSequences::ForeignNamed(const std::string& name,
                                                                          bool ignoreCase) {
    std::vector<const QZIviFgenArbWaveform*> named;
    for (auto it = m_oForeign.begin(); it != m_oForeign.end();) {
        const auto users = UsersOf(*it);
        if (users.empty()) { // no item holds it: it may be gone
            it = m_oForeign.erase(it);
            continue;
        }
        const std::string& own = users.front()->m_oWaveform->Name();
        if (ignoreCase ? text::EqualsNoCase(own, name) : own == name) named.push_back(*it);
        ++it;
    }
    return named;
}

void QZIviFgenSequences::PruneWithoutWaveform() {
    std::erase_if(m_oWithoutWaveform, [&](const std::weak_ptr<QZIviFgenSequenceItem>& entry) {
        const auto item = entry.lock();
        return !item || item->m_oWaveform || !InTree(*item);
    });
}

void QZIviFgenSequences::RemoveItemsOf(const QZIviFgenArbWaveform& waveform) {
    PruneWithoutWaveform();
    if (!m_oWithoutWaveform.empty())
        RaiseRuntime(91, "Object variable not set: a sequence item has no waveform.");
    const auto propSet = PropSet();
    std::vector<const QZIviFgenArbWaveform*> named = ForeignNamed(waveform.Name(), true);
    if (propSet)
        for (const QZIviFgenArbWaveform* own : propSet->Waveforms()->Named(waveform.Name()))
            named.push_back(own);
    struct Place {
        std::int32_t sequence, item;
    };
    std::vector<Place> places;
    for (const QZIviFgenArbWaveform* each : named)
        for (const auto& item : UsersOf(each))
            places.push_back(
                {IndexOfObject(item->Sequence()), item->Sequence()->IndexOfObject(item.get())});
    // The last sequence first, and in each the last item first, so positions stay true.
    std::sort(places.begin(), places.end(), [](const Place& a, const Place& b) {
        return a.sequence != b.sequence ? a.sequence > b.sequence : a.item > b.item;
    });
    for (const Place& place : places)
        At(place.sequence)->Remove(place.item);
    m_oUsers.erase(&waveform); // it is leaving the tree
}

void QZIviFgenSequences::WaveformRenamed(const std::string& now, const std::string& before) {
    // A rename to nothing is not followed; nor one to the same name, which would rename the
    // twins to their own name, and so on without end.
    if (now.empty() || now == before) return;
    const auto propSet = PropSet();
    std::vector<const QZIviFgenArbWaveform*> named = ForeignNamed(before, false);
    if (propSet)
        for (const QZIviFgenArbWaveform* own : propSet->Waveforms()->Named(before))
            if (own->Name() == before) named.push_back(own);
    for (const QZIviFgenArbWaveform* each : named) {
        const auto users = UsersOf(each);
        if (!users.empty() && each->Name() == before) users.front()->m_oWaveform->Name(now);
    }
}

void QZIviFgenSequences::WaveformRemoved() {
    const auto propSet = PropSet();
    if (!propSet) return;
    std::vector<std::shared_ptr<QZIviFgenSequenceItem>> lost;
    for (auto it = m_oForeign.begin(); it != m_oForeign.end();) {
        const auto users = UsersOf(*it);
        if (!users.empty() &&
            propSet->Waveforms()->IndexOfName(users.front()->m_oWaveform->Name()) != -1) {
            ++it;
            continue;
        }
        lost.insert(lost.end(), users.begin(), users.end());
        it = m_oForeign.erase(it);
    }
    for (const auto& item : lost) {
        item->m_oWaveform = nullptr;
        Refer(*item);
    }
}

std::int32_t QZIviFgenSequences::GetMaxLoopCount() {
    return Limit("GetMaxLoopCount", IVIFGEN_ATTR_MAX_LOOP_COUNT);
}
std::int32_t QZIviFgenSequences::GetMaxNumSequences() {
    return Limit("GetMaxNumSequences", IVIFGEN_ATTR_MAX_NUM_SEQUENCES);
}
std::int32_t QZIviFgenSequences::GetMaxSequenceLength() {
    return Limit("GetMaxSequenceLength", IVIFGEN_ATTR_MAX_SEQUENCE_LENGTH);
}
std::int32_t QZIviFgenSequences::GetMinSequenceLength() {
    return Limit("GetMinSequenceLength", IVIFGEN_ATTR_MIN_SEQUENCE_LENGTH);
}

} // namespace qzivi
