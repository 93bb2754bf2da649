// The property bag: named values (texts, numbers, booleans, byte arrays), each read with a
// default and written with a default beside it, and the whole as one block of bytes.
//
// The block is our own layout, little-endian throughout:
//   "QZPB", version (1 byte, 1), entry count (u32), then per entry:
//   name length (u16), name (UTF-8), type (1 byte), value
//   types: 1 int32 (4 bytes), 2 double (8), 3 bool (1), 4 text (u32 length + bytes),
//          5 bytes (u32 length + bytes)
// A value equal to its default is not kept, so a read of it gives the default again.
#pragma once

#include "qzivi/support/variant.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <variant>
#include <vector>

namespace qzivi {

using Bytes = std::vector<std::uint8_t>;

class PropertyBag {
public:
    using Value = std::variant<std::int32_t, double, bool, std::string, Bytes>;

    // Names ignore case. A stored value of another kind converts as the system's values do: a
    // text that is no number read as a number raises the wrong-type failure (13).
    std::int32_t ReadInt32(std::string_view name, std::int32_t defaultValue) const;
    double ReadDouble(std::string_view name, double defaultValue) const;
    bool ReadBool(std::string_view name, bool defaultValue) const;
    std::string ReadText(std::string_view name, std::string_view defaultValue) const;
    Bytes ReadBytes(std::string_view name) const; // empty when missing

    void WriteInt32(std::string_view name, std::int32_t value, std::int32_t defaultValue);
    void WriteDouble(std::string_view name, double value, double defaultValue);
    void WriteBool(std::string_view name, bool value, bool defaultValue);
    void WriteText(std::string_view name, std::string_view value, std::string_view defaultValue);
    // Always stored, as a text written with no default is.
    void WriteText(std::string_view name, std::string_view value);
    void WriteBytes(std::string_view name, Bytes value);

    bool Contains(std::string_view name) const;
    std::size_t Size() const { return entries_.size(); }
    void Clear();

    Bytes Contents() const;
    // Replaces everything by what the block holds. A block that is not one gives the improper-file
    // failure (60040) with what is wrong, and leaves the bag as it was.
    void SetContents(std::span<const std::uint8_t> block);

    friend bool operator==(const PropertyBag& a, const PropertyBag& b);

private:
    struct Entry {
        std::string name;
        Value value;
    };
    const Value* Find(std::string_view name) const;
    void Store(std::string_view name, Value value);
    void Remove(std::string_view name);

    std::vector<Entry> entries_;
    std::unordered_map<std::string, std::size_t> index_; // lower-case name -> entry
};

} // namespace qzivi
