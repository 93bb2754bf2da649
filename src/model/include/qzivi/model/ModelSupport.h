// What the classes of the object model share: the guarded frame of their public members and the
// 1-based list of items that the collections keep.
#pragma once

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/driver/StringTable.h"
#include "qzivi/model/Conventions.h"
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

// An ordered list that keeps insertion order and does not enforce unique names. Positions count
// from 1 at the interface.
template <typename T>
class ItemList {
public:
    using Items = std::vector<std::shared_ptr<T>>;

    std::int32_t Count() const { return static_cast<std::int32_t>(items_.size()); }
    const std::shared_ptr<T>& At(std::int32_t position) const {
        return items_[static_cast<std::size_t>(position - 1)];
    }
    bool Has(std::int32_t position) const { return position >= 1 && position <= Count(); }
    void Append(std::shared_ptr<T> item) { items_.push_back(std::move(item)); }
    void RemoveAt(std::int32_t position) { items_.erase(items_.begin() + (position - 1)); }
    void Clear() { items_ = Items(); }
    typename Items::const_iterator begin() const { return items_.begin(); }
    typename Items::const_iterator end() const { return items_.end(); }

    // The first item whose name equals `name`, ignoring case; null if none.
    std::shared_ptr<T> FindName(const std::string& name) const {
        for (const auto& item : items_)
            if (text::EqualsNoCase(item->Name(), name)) return item;
        return nullptr;
    }
    // Position by a tagged index for Item: a number (not a text) is a position, anything else a
    // name; null when neither finds one.
    std::shared_ptr<T> Lookup(const Variant& index) const {
        if (index.IsNumber()) {
            const std::int32_t position = index.AsInt32();
            return Has(position) ? At(position) : nullptr;
        }
        return FindName(index.AsText());
    }
    // Position by a tagged index for Remove: a numeric value (a numeric text too) is a position,
    // anything else the first name that equals it; 0 when nothing fits.
    std::int32_t RemovalPosition(const Variant& index) const {
        std::int32_t position = 0;
        if (index.IsNumeric()) {
            position = index.AsInt32();
        } else if (!index.IsEmpty() && !index.IsMissing()) {
            const std::string name = index.AsText();
            for (std::int32_t i = 1; i <= Count() && position == 0; ++i)
                if (text::EqualsNoCase(At(i)->Name(), name)) position = i;
        }
        return Has(position) ? position : 0;
    }
    bool ContainsUniqueId(const std::string& uniqueId) const {
        for (const auto& item : items_)
            if (text::EqualsNoCase(item->UniqueId(), uniqueId)) return true;
        return false;
    }
    std::int32_t IndexOfObject(const T* object) const {
        for (std::int32_t i = 1; i <= Count(); ++i)
            if (At(i).get() == object) return i;
        return -1;
    }
    std::int32_t IndexOfName(const std::string& name) const {
        for (std::int32_t i = 1; i <= Count(); ++i)
            if (At(i)->Name() == name) return i;
        return -1;
    }
    std::string DefaultName(std::string_view base) const {
        std::vector<std::string> names;
        for (const auto& item : items_)
            names.push_back(item->Name());
        return MakeUniqueName(names, base);
    }

private:
    Items items_;
};

} // namespace qzivi
