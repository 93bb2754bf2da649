// A class of the object model names each of its properties once, in one table: name (also its bag
// key), kind, default and, where the engine sends it, the IVI attribute. The life-cycle members
// (defaults, read, write, clone) are loops over the rows; the engine names a refused value by the
// row of its attribute; the pages and the Qt host read the same rows.
#pragma once

#include "IviFgen.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <variant>

namespace qzivi {

class PropertyBag;

enum class PropertyKind { Double, Int32, Bool, Text, Reference };
using PropertyValue = std::variant<double, std::int32_t, bool, std::string>;

// What everyone may read of a row.
struct PropertyInfo {
    std::string_view name;
    PropertyKind kind = PropertyKind::Int32;
    PropertyValue initial;
    ViAttr attribute = 0;      // 0 where the engine does not send the value by itself
    bool alwaysStored = false; // written with no default, so that the bag always holds it
};

// A row with its access. A reference (an object kept in the bag by its position) has no access
// here: its class resolves it after the other rows.
template <typename Owner>
struct PropertyRow : PropertyInfo {
    PropertyValue (*get)(const Owner&) = nullptr;
    void (*put)(Owner&, const PropertyValue&) = nullptr;
};

namespace detail {
template <typename M>
struct MemberOf;
template <typename O, typename T>
struct MemberOf<T O::*> {
    using Owner = O;
    using Type = T;
};
template <typename T>
constexpr PropertyKind KindOf() {
    if constexpr (std::is_same_v<T, double>) return PropertyKind::Double;
    if constexpr (std::is_same_v<T, std::int32_t>) return PropertyKind::Int32;
    if constexpr (std::is_same_v<T, bool>) return PropertyKind::Bool;
    if constexpr (std::is_same_v<T, std::string>) return PropertyKind::Text;
}
} // namespace detail

// A row over a data member, stored as it is given.
template <auto Member>
auto Field(std::string_view name, typename detail::MemberOf<decltype(Member)>::Type initial,
           ViAttr attribute = 0) {
    using Owner = typename detail::MemberOf<decltype(Member)>::Owner;
    using T = typename detail::MemberOf<decltype(Member)>::Type;
    PropertyRow<Owner> row;
    row.name = name;
    row.kind = detail::KindOf<T>();
    row.initial = std::move(initial);
    row.attribute = attribute;
    row.get = [](const Owner& o) -> PropertyValue { return o.*Member; };
    row.put = [](Owner& o, const PropertyValue& v) { o.*Member = std::get<T>(v); };
    return row;
}

// A row whose value is read and stored by the class's own code.
template <typename Owner, typename T>
PropertyRow<Owner> Accessor(std::string_view name, T initial, PropertyValue (*get)(const Owner&),
                            void (*put)(Owner&, const PropertyValue&), ViAttr attribute = 0) {
    PropertyRow<Owner> row;
    row.name = name;
    row.kind = detail::KindOf<T>();
    row.initial = PropertyValue(std::move(initial));
    row.attribute = attribute;
    row.get = get;
    row.put = put;
    return row;
}

// An object kept in the bag by its 1-based position in its collection; 0 for none.
template <typename Owner>
PropertyRow<Owner> Reference(std::string_view name, ViAttr attribute = 0) {
    PropertyRow<Owner> row;
    row.name = name;
    row.kind = PropertyKind::Reference;
    row.initial = std::int32_t{0};
    row.attribute = attribute;
    return row;
}

// The bag side of one value: read with its default beside it, written with the default unless
// the row is always stored.
PropertyValue ReadProperty(const PropertyBag& bag, const std::string& key,
                           const PropertyInfo& info);
void WriteProperty(PropertyBag& bag, const std::string& key, const PropertyValue& value,
                   const PropertyInfo& info);

// The row of an attribute, or null.
template <typename Owner>
const PropertyInfo* FindByAttribute(std::span<const PropertyRow<Owner>> rows, ViAttr attribute) {
    for (const auto& row : rows)
        if (row.attribute == attribute) return &row;
    return nullptr;
}

// Stores a row's value as it is given.
struct PutAsGiven {
    template <typename Owner>
    void operator()(Owner& owner, const PropertyRow<Owner>& row, const PropertyValue& value) const {
        row.put(owner, value);
    }
};

// The life-cycle loops. `put(owner, row, value)` stores through the class, so that a class with
// notices fires them in row order; references are left to the class.
template <typename Owner, typename Put = PutAsGiven>
void PutDefaults(std::span<const PropertyRow<Owner>> rows, Owner& owner, Put put = {}) {
    for (const auto& row : rows)
        if (row.put) put(owner, row, row.initial);
}
// One key buffer for a whole table: a tree of many items builds a key for every row of each.
template <typename Owner, typename Put = PutAsGiven>
void ReadRows(std::span<const PropertyRow<Owner>> rows, Owner& owner, const PropertyBag& bag,
              const std::string& prefix, Put put = {}) {
    std::string key = prefix;
    for (const auto& row : rows) {
        if (!row.put) continue;
        key.replace(prefix.size(), std::string::npos, row.name);
        put(owner, row, ReadProperty(bag, key, row));
    }
}
template <typename Owner>
void WriteRows(std::span<const PropertyRow<Owner>> rows, const Owner& owner, PropertyBag& bag,
               const std::string& prefix) {
    std::string key = prefix;
    for (const auto& row : rows) {
        if (!row.get) continue;
        key.replace(prefix.size(), std::string::npos, row.name);
        WriteProperty(bag, key, row.get(owner), row);
    }
}
template <typename Owner, typename Put = PutAsGiven>
void CopyRows(std::span<const PropertyRow<Owner>> rows, const Owner& from, Owner& to,
              Put put = {}) {
    for (const auto& row : rows)
        if (row.get && row.put) put(to, row, row.get(from));
}

} // namespace qzivi
