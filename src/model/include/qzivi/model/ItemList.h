// The ordered, 1-based list that every collection of the object model keeps. It is built for
// trees of many thousand members:
// - access by position is O(1); the free room of the list (a gap) follows the edits, so adding
//   at the end and removing in order cost O(1) each, any edit at most the distance the gap moves;
// - a member knows the list that holds it and its slot there, so membership and position are O(1);
// - names are indexed case-folded, so Item(name), IndexOfName and the lowest free default name
//   cost O(1) on average (O(log n) for the name), kept right through add, remove and rename.
#pragma once

#include "qzivi/support/text.h"
#include "qzivi/support/variant.h"

#include <concepts>
#include <cstdint>
#include <memory>
#include <set>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace qzivi {

template <typename T>
class ItemList;

// What a member knows of its place. A member is in one list at most.
template <typename T>
class ListMember {
public:
    // The list that holds this member, or null.
    const ItemList<T>* List() const { return m_pList; }

protected:
    ListMember() = default;
    // A copy is a new object: it is in no list.
    ListMember(const ListMember&) {}
    ListMember& operator=(const ListMember&) { return *this; }
    ~ListMember() = default;

    // The hooks a named member calls when its name or unique id changes.
    void NameChanged(const std::string& before) {
        if (m_pList) m_pList->Rename(static_cast<T&>(*this), before);
    }
    void UniqueIdChanged(const std::string& before) {
        if (m_pList) m_pList->ChangeUniqueId(static_cast<T&>(*this), before);
    }

private:
    friend class ItemList<T>;
    ItemList<T>* m_pList = nullptr;
    std::size_t m_nSlot = 0;
};

template <typename T>
concept NamedMember = requires(const T& t) {
    { t.Name() } -> std::convertible_to<std::string>;
    { t.UniqueId() } -> std::convertible_to<std::string>;
};

// The lowest free number N of default names "<base>N": numbers in use are counted; below `top`
// the free ones are kept in order, and `top` only ever moves up, so each query is O(log n)
// amortized.
class DefaultNumbers {
public:
    void Use(std::int64_t n) {
        if (m_oCount[n]++ == 0 && n < m_nTop) m_oFree.erase(n);
    }
    void Release(std::int64_t n) {
        const auto found = m_oCount.find(n);
        if (found == m_oCount.end()) return;
        if (--found->second == 0) {
            m_oCount.erase(found);
            if (n < m_nTop) m_oFree.insert(n);
        }
    }
    std::int64_t LowestFree() {
        if (!m_oFree.empty()) return *m_oFree.begin();
        while (m_oCount.contains(m_nTop))
            ++m_nTop;
        return m_nTop;
    }
    void Clear() {
        m_oCount.clear();
        m_oFree.clear();
        m_nTop = 1;
    }

private:
    std::unordered_map<std::int64_t, std::int32_t> m_oCount;
    std::set<std::int64_t> m_oFree;
    std::int64_t m_nTop = 1;
};

// N if `name` is `base` (both ignoring case) followed by N from 1 to 2147483647 in plain digits,
// as default names are made; 0 otherwise.
std::int64_t DefaultNumberOf(std::string_view name, std::string_view base);

// Texts hashed and compared ignoring case, looked up without a copy.
struct NoCaseHash {
    using is_transparent = void;
    std::size_t operator()(std::string_view text) const;
};
struct NoCaseEqual {
    using is_transparent = void;
    bool operator()(std::string_view a, std::string_view b) const {
        return text::EqualsNoCase(a, b);
    }
};

template <typename T>
class ItemList {
public:
    using Ptr = std::shared_ptr<T>;

    // `base` is the word of default names ("Waveform"); empty for a list without names.
    explicit ItemList(std::string_view base = {}) : m_sBase(base) {}
    ~ItemList() { Clear(); }
    ItemList(const ItemList&) = delete;
    ItemList& operator=(const ItemList&) = delete;

    class const_iterator {
    public:
        using value_type = Ptr;
        using difference_type = std::ptrdiff_t;
        const_iterator() = default;
        const_iterator(const ItemList* list, std::size_t i) : m_pList(list), m_nIndex(i) {}
        const Ptr& operator*() const { return m_pList->Slot(m_nIndex); }
        const Ptr* operator->() const { return &**this; }
        const_iterator& operator++() {
            ++m_nIndex;
            return *this;
        }
        const_iterator operator++(int) {
            auto old = *this;
            ++m_nIndex;
            return old;
        }
        bool operator==(const const_iterator& other) const { return m_nIndex == other.m_nIndex; }

    private:
        const ItemList* m_pList = nullptr;
        std::size_t m_nIndex = 0;
    };
    const_iterator begin() const { return {this, 0}; }
    const_iterator end() const { return {this, Size()}; }

    std::int32_t Count() const { return static_cast<std::int32_t>(Size()); }
    const Ptr& At(std::int32_t position) const {
        return Slot(static_cast<std::size_t>(position - 1));
    }
    bool Has(std::int32_t position) const { return position >= 1 && position <= Count(); }
    // Whether `item` is a member of this very list.
    bool Holds(const T& item) const { return item.m_pList == this; }
    // The position of a member of this list, -1 for anything else.
    std::int32_t IndexOfObject(const T* item) const {
        if (item == nullptr || !Holds(*item)) return -1;
        const std::size_t slot = item->m_nSlot;
        return static_cast<std::int32_t>(slot < m_nGapBegin ? slot : slot - Gap()) + 1;
    }

    void Append(Ptr item) { Insert(Size(), std::move(item)); }
    // Puts `item` at `position` (1 to Count + 1).
    void Insert(std::int32_t position, Ptr item) {
        Insert(static_cast<std::size_t>(position - 1), std::move(item));
    }
    void RemoveAt(std::int32_t position) {
        MoveGap(static_cast<std::size_t>(position - 1));
        Ptr& slot = m_oSlots[m_nGapEnd];
        Forget(*slot);
        slot.reset();
        ++m_nGapEnd;
    }
    void Clear() {
        for (auto& slot : m_oSlots)
            if (slot) slot->m_pList = nullptr;
        m_oSlots = std::vector<Ptr>();
        m_nGapBegin = m_nGapEnd = 0;
        m_oByName.clear();
        m_oUniqueIds.clear();
        m_bUniqueIds = false;
        m_oNumbers.Clear();
    }

    // ---- Names (for members that have them) ----
    // The first member whose name equals `name`, ignoring case; null if none.
    Ptr FindName(const std::string& name) const requires NamedMember<T> {
        const auto bucket = m_oByName.find(std::string_view(name));
        if (bucket == m_oByName.end()) return nullptr;
        const T* first = nullptr;
        for (const T* item : bucket->second)
            if (!first || IndexOfObject(item) < IndexOfObject(first)) first = item;
        return first ? At(IndexOfObject(first)) : nullptr;
    }
    // The position of the first member whose name equals `name` exactly; -1 if none.
    std::int32_t IndexOfName(const std::string& name) const requires NamedMember<T> {
        const auto bucket = m_oByName.find(std::string_view(name));
        std::int32_t position = -1;
        if (bucket != m_oByName.end())
            for (const T* item : bucket->second)
                if (item->Name() == name) {
                    const std::int32_t at = IndexOfObject(item);
                    if (position == -1 || at < position) position = at;
                }
        return position;
    }
    // The members whose names equal `name`, ignoring case, in no order.
    const std::vector<T*>& Named(const std::string& name) const requires NamedMember<T> {
        static const std::vector<T*> none;
        const auto bucket = m_oByName.find(std::string_view(name));
        return bucket == m_oByName.end() ? none : bucket->second;
    }
    // Asked only of objects of another copy of the tree, so the index is made at the first
    // question and kept from then on.
    bool ContainsUniqueId(const std::string& uniqueId) const requires NamedMember<T> {
        if (!m_bUniqueIds) {
            for (const auto& item : *this)
                ++m_oUniqueIds[item->UniqueId()];
            m_bUniqueIds = true;
        }
        return m_oUniqueIds.find(std::string_view(uniqueId)) != m_oUniqueIds.end();
    }
    // The base followed by the lowest number from 1 up that no member's name, ignoring case, has.
    std::string DefaultName(std::string_view base) const requires NamedMember<T> {
        return std::string(base) + std::to_string(m_oNumbers.LowestFree());
    }

    // Position by a tagged index for Item: a number (not a text) is a position, anything else a
    // name; null when neither finds one.
    Ptr Lookup(const Variant& index) const requires NamedMember<T> {
        if (index.IsNumber()) {
            const std::int32_t position = index.AsInt32();
            return Has(position) ? At(position) : nullptr;
        }
        return FindName(index.AsText());
    }
    // Position by a tagged index for Remove: a numeric value (a numeric text too) is a position,
    // anything else the first name that equals it; 0 when nothing fits.
    std::int32_t RemovalPosition(const Variant& index) const requires NamedMember<T> {
        std::int32_t position = 0;
        if (index.IsNumeric())
            position = index.AsInt32();
        else if (!index.IsEmpty() && !index.IsMissing())
            if (const auto found = FindName(index.AsText())) position = IndexOfObject(found.get());
        return Has(position) ? position : 0;
    }

private:
    friend class ListMember<T>;

    std::size_t Size() const { return m_oSlots.size() - Gap(); }
    std::size_t Gap() const { return m_nGapEnd - m_nGapBegin; }
    const Ptr& Slot(std::size_t index) const {
        return m_oSlots[index < m_nGapBegin ? index : index + Gap()];
    }

    void Insert(std::size_t index, Ptr item) {
        if (Gap() == 0) Grow();
        MoveGap(index);
        item->m_pList = this;
        item->m_nSlot = m_nGapBegin;
        Learn(*item);
        m_oSlots[m_nGapBegin++] = std::move(item);
    }

    // Moves the gap so that it starts at `index`, telling each member moved its new slot.
    void MoveGap(std::size_t index) {
        while (m_nGapBegin > index) {
            --m_nGapBegin;
            --m_nGapEnd;
            m_oSlots[m_nGapEnd] = std::move(m_oSlots[m_nGapBegin]);
            m_oSlots[m_nGapEnd]->m_nSlot = m_nGapEnd;
        }
        while (m_nGapBegin < index) {
            m_oSlots[m_nGapBegin] = std::move(m_oSlots[m_nGapEnd]);
            m_oSlots[m_nGapBegin]->m_nSlot = m_nGapBegin;
            ++m_nGapBegin;
            ++m_nGapEnd;
        }
    }

    // Doubles the room, keeping the gap where it is.
    void Grow() {
        const std::size_t size = Size();
        std::vector<Ptr> room(std::max<std::size_t>(16, 2 * size));
        const std::size_t tail = size - m_nGapBegin;
        for (std::size_t i = 0; i < m_nGapBegin; ++i)
            room[i] = std::move(m_oSlots[i]);
        for (std::size_t i = 0; i < tail; ++i) {
            auto& moved = room[room.size() - tail + i] = std::move(m_oSlots[m_nGapEnd + i]);
            moved->m_nSlot = room.size() - tail + i;
        }
        m_nGapEnd = room.size() - tail;
        m_oSlots = std::move(room);
    }

    void Learn(T& item) {
        if constexpr (NamedMember<T>) {
            AddName(item, item.Name());
            if (m_bUniqueIds) ++m_oUniqueIds[item.UniqueId()];
        }
    }
    void Forget(T& item) {
        item.m_pList = nullptr;
        if constexpr (NamedMember<T>) {
            DropName(item, item.Name());
            DropUniqueId(item.UniqueId());
        }
    }
    void AddName(T& item, const std::string& name) {
        if (const auto n = DefaultNumberOf(name, m_sBase)) m_oNumbers.Use(n);
        auto bucket = m_oByName.find(std::string_view(name));
        if (bucket == m_oByName.end()) bucket = m_oByName.emplace(name, std::vector<T*>()).first;
        bucket->second.push_back(&item);
    }
    void DropName(T& item, const std::string& name) {
        if (const auto n = DefaultNumberOf(name, m_sBase)) m_oNumbers.Release(n);
        const auto bucket = m_oByName.find(std::string_view(name));
        if (bucket == m_oByName.end()) return;
        auto& items = bucket->second;
        for (auto& entry : items)
            if (entry == &item) {
                entry = items.back();
                items.pop_back();
                break;
            }
        if (items.empty()) m_oByName.erase(bucket);
    }
    void DropUniqueId(const std::string& uniqueId) {
        if (!m_bUniqueIds) return;
        const auto found = m_oUniqueIds.find(std::string_view(uniqueId));
        if (found != m_oUniqueIds.end() && --found->second == 0) m_oUniqueIds.erase(found);
    }
    void Rename(T& item, const std::string& before) {
        DropName(item, before);
        AddName(item, item.Name());
    }
    void ChangeUniqueId(T& item, const std::string& before) {
        if (!m_bUniqueIds) return;
        DropUniqueId(before);
        ++m_oUniqueIds[item.UniqueId()];
    }

    std::vector<Ptr> m_oSlots;
    std::size_t m_nGapBegin = 0, m_nGapEnd = 0;
    std::string m_sBase;
    // A name, ignoring case -> the members of that name.
    std::unordered_map<std::string, std::vector<T*>, NoCaseHash, NoCaseEqual> m_oByName;
    // A unique id, ignoring case -> how many members have it; made at the first question.
    mutable std::unordered_map<std::string, std::int32_t, NoCaseHash, NoCaseEqual> m_oUniqueIds;
    mutable bool m_bUniqueIds = false;
    mutable DefaultNumbers m_oNumbers;
};

} // namespace qzivi
