// What the classes of the object model share: the guarded frame of their public members and the
// 1-based list of items that the collections keep.
#pragma once

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/driver/StringTable.h"
#include "qzivi/model/Conventions.h"
#include "qzivi/model/ItemList.h"
#include "qzivi/support/failure.h"
#include "qzivi/support/text.h"
#include "qzivi/support/variant.h"

#include <cstdint>
#include <memory>
#include <string>
#include <type_traits>
#include <vector>

namespace qzivi {

// Runs a public member: a failure fires the error events of `err` and reaches the caller when its
// ExceptionOnError says so, or always with `alwaysRaise`.
template <typename F>
auto Guard(const std::shared_ptr<CIviErrorReport>& err, const char* source, F&& body,
           bool alwaysRaise = false) -> decltype(body()) {
    try {
        return body();
    } catch (...) {
        HandleError(source, alwaysRaise || !err || err->ExceptionOnError() ? -1 : 0, err.get());
        if constexpr (!std::is_void_v<decltype(body())>) return {};
    }
}

// The system's own failure of `code`, through the error report when there is one.
[[noreturn]] inline void StdError(const std::shared_ptr<CIviErrorReport>& err, std::int32_t code,
                                  const std::string& source) {
    if (err) err->DoStdError(code, source);
    throw Failure(code, source, LoadResString(-code) + " (" + source + ")");
}

class CIviFgenPropImp;
class PropertyBag;

// The item counts a whole bag claims, refused when no bag this program wrote could hold them.
void CheckItemCounts(const PropertyBag& bag);

// Reads a limit of the instrument under the state rules of the session: the mask 9, busy for the
// call, the state given back on every way out. 0 when no session is open.
std::int32_t ReadInstrumentLimit(CIviErrorReport& err, const std::string& source, ViAttr attribute);

// The root's Path, "" for none; kept out of line, as the root is only declared here.
std::string PathOf(const CIviFgenPropImp* propSet);

// What the three collections of the tree share: their items, attach, path, bag keys and clone.
// `Item` is the class of their members.
template <typename Item>
class ModelCollection {
public:
    // `word` names the collection in bag keys and paths ("Channels"), `itemWord` its members'
    // default names ("Channel").
    ModelCollection(const char* word, const char* itemWord)
        : m_oItems(itemWord), word_(word), itemWord_(itemWord) {}

    typename ItemList<Item>::const_iterator begin() const { return m_oItems.begin(); }
    typename ItemList<Item>::const_iterator end() const { return m_oItems.end(); }
    std::int32_t Count() const { return m_oItems.Count(); }
    const std::shared_ptr<Item>& At(std::int32_t position) const { return m_oItems.At(position); }

    void Attach(std::shared_ptr<CIviErrorReport> errorReport,
                const std::shared_ptr<CIviFgenPropImp>& propSet) {
        m_oErr = std::move(errorReport);
        m_oPropSet = propSet;
        for (const auto& item : m_oItems)
            item->Attach(m_oErr, propSet);
    }
    const std::string& Path() const { return m_sPath; }
    void SetPath(const std::string& parentPath) {
        m_sPath = JoinPath(parentPath, word_);
        for (const auto& item : m_oItems)
            item->SetPath(m_sPath);
    }
    std::shared_ptr<CIviFgenPropImp> PropSet() const { return m_oPropSet.lock(); }
    void InitProperties() { m_oItems.Clear(); }

    // A count above 0 replaces the items by that many, read in order, without events.
    template <typename Bag>
    void ReadProperties(const Bag& bag, const std::string& prefix) {
        const std::string p = BagPrefix(prefix, word_);
        const std::int32_t count = bag.ReadInt32(p + "ItemCount", 0);
        if (count <= 0) return;
        m_oItems.Clear();
        for (std::int32_t i = 1; i <= count; ++i) {
            auto item = std::make_shared<Item>();
            item->Attach(m_oErr, PropSet());
            item->ReadProperties(bag, p + "Item" + std::to_string(i) + "_");
            m_oItems.Append(std::move(item));
        }
    }
    template <typename Bag>
    void WriteProperties(Bag& bag, const std::string& prefix) const {
        const std::string p = BagPrefix(prefix, word_);
        bag.WriteInt32(p + "ItemCount", Count(), 0);
        std::int32_t i = 0;
        for (const auto& item : m_oItems)
            item->WriteProperties(bag, p + "Item" + std::to_string(++i) + "_");
    }

    bool ContainsObject(const Item& object) const {
        return m_oItems.Holds(object) || m_oItems.ContainsUniqueId(object.UniqueId());
    }
    std::int32_t IndexOfObject(const Item* object) const { return m_oItems.IndexOfObject(object); }
    std::int32_t IndexOfName(const std::string& name) const { return m_oItems.IndexOfName(name); }
    std::string DefaultName() const { return m_oItems.DefaultName(itemWord_); }
    // The members named `name`, ignoring case.
    const std::vector<Item*>& Named(const std::string& name) const { return m_oItems.Named(name); }
    bool Holds(const Item& object) const { return m_oItems.Holds(object); }

protected:
    // Item of the collections: a miss is the failure `code` under Path + "Item".
    std::shared_ptr<Item> ItemOrRefuse(const Variant& index, std::int32_t code) {
        return Guard(m_oErr, "Item", [&] {
            auto found = m_oItems.Lookup(index);
            if (!found) StdError(m_oErr, code, m_sPath + "Item");
            return found;
        });
    }
    // A new member, attached, with its defaults and named: `name`, or the next free default.
    std::shared_ptr<Item> NewItem(const std::string& name) {
        auto item = std::make_shared<Item>();
        item->Attach(m_oErr, PropSet());
        item->InitProperties();
        item->Name(name.empty() ? DefaultName() : name);
        return item;
    }

    // A limit of the instrument for the public member `operation`, under that member's guard.
    std::int32_t Limit(const char* operation, ViAttr attribute) {
        return Guard(m_oErr, operation, [&] {
            const auto propSet = PropSet();
            return ReadInstrumentLimit(*m_oErr, PathOf(propSet.get()) + operation, attribute);
        });
    }

    // For each item: Add by its name in `target`, then Clone into the first of that name there.
    template <typename Collection>
    void CloneInto(Collection& target) const {
        for (const auto& item : m_oItems) {
            target.Add(item->Name());
            if (const auto copy = target.Item(item->Name())) item->Clone(*copy);
        }
    }

    ItemList<Item> m_oItems;
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::weak_ptr<CIviFgenPropImp> m_oPropSet;
    std::string m_sPath;

private:
    const char* word_;
    const char* itemWord_;
};

} // namespace qzivi
