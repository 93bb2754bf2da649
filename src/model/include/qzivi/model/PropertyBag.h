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
#include <functional>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace qzivi {

using Bytes = std::vector<std::uint8_t>;

// A run of bytes inside a shared buffer: large values are passed on and parsed in place, never
// copied on the way.
class SharedBytes {
public:
    SharedBytes() = default;
    explicit SharedBytes(Bytes bytes);
    SharedBytes(std::shared_ptr<const Bytes> owner, std::size_t offset, std::size_t size);
    // Bytes that another shared object holds (the points of a waveform), kept alive by it.
    template <typename Owner>
    static SharedBytes Alias(std::shared_ptr<Owner> owner, const void* data, std::size_t size) {
        SharedBytes bytes;
        bytes.data_ = std::shared_ptr<const std::uint8_t>(std::move(owner),
                                                          static_cast<const std::uint8_t*>(data));
        bytes.size_ = size;
        return bytes;
    }

    const std::uint8_t* data() const { return data_.get(); }
    std::size_t size() const { return size_; }
    bool empty() const { return size_ == 0; }
    std::span<const std::uint8_t> span() const { return {data(), size_}; }
    Bytes ToBytes() const { return Bytes(data(), data() + size_); }
    // The same run, narrowed.
    SharedBytes Slice(std::size_t offset, std::size_t size) const {
        return Alias(data_, data() + offset, size);
    }
    friend bool operator==(const SharedBytes& a, const SharedBytes& b);

private:
    std::shared_ptr<const std::uint8_t> data_; // points into the object that owns the bytes
    std::size_t size_ = 0;
};

class PropertyBag {
public:
    using Value = std::variant<std::int32_t, double, bool, std::string, SharedBytes>;

    // Names ignore case. A stored value of another kind converts as the system's values do: a
    // text that is no number read as a number raises the wrong-type failure (13).
    std::int32_t ReadInt32(std::string_view name, std::int32_t defaultValue) const;
    double ReadDouble(std::string_view name, double defaultValue) const;
    bool ReadBool(std::string_view name, bool defaultValue) const;
    std::string ReadText(std::string_view name, std::string_view defaultValue) const;
    Bytes ReadBytes(std::string_view name) const;             // empty when missing
    SharedBytes ReadSharedBytes(std::string_view name) const; // the same, without a copy

    void WriteInt32(std::string_view name, std::int32_t value, std::int32_t defaultValue);
    void WriteDouble(std::string_view name, double value, double defaultValue);
    void WriteBool(std::string_view name, bool value, bool defaultValue);
    void WriteText(std::string_view name, std::string_view value, std::string_view defaultValue);
    // Always stored, as a text written with no default is.
    void WriteText(std::string_view name, std::string_view value);
    void WriteBytes(std::string_view name, Bytes value);
    void WriteBytes(std::string_view name, SharedBytes value);

    bool Contains(std::string_view name) const;
    // The names in the order they were first stored.
    std::vector<std::string> Names() const;
    std::size_t Size() const { return entries_.size() - removed_; }
    void Clear();

    Bytes Contents() const;
    // The same bytes, handed piece by piece to `sink`, so that a large bag is written out without
    // being gathered first.
    void WriteContents(const std::function<void(const void*, std::size_t)>& sink) const;
    // Replaces everything by what the block holds. A block that is not one gives the improper-file
    // failure (60040) with what is wrong, and leaves the bag as it was.
    void SetContents(std::span<const std::uint8_t> block);
    // The same for a shared block, whose byte values stay in it.
    void SetContents(const SharedBytes& block);

    friend bool operator==(const PropertyBag& a, const PropertyBag& b);

private:
    struct Entry {
        std::string name; // empty once removed
        Value value;
    };
    // The index of names, ignoring case: an open-addressed table of the names' hashes and their
    // entries, so that a lookup touches one slot and, on a hit, one name.
    struct Slot {
        std::uint64_t hash = 0;
        std::uint32_t entry = 0; // entry + 1; 0 for a free slot
    };
    static std::uint64_t Hash(std::string_view name);
    // The slot of `name`, or the free slot where it would go.
    std::size_t Probe(std::string_view name, std::uint64_t hash) const;
    void Reindex(std::size_t capacity);
    const Value* Find(std::string_view name) const;
    void Store(std::string_view name, Value value);
    // Leaves a hole in the order, closed once holes are half the entries: O(1) amortized.
    void Remove(std::string_view name);
    template <typename F>
    void ForEachEntry(F&& f) const {
        for (const auto& entry : entries_)
            if (!entry.name.empty()) f(entry.name, entry.value);
    }

    std::vector<Entry> entries_;
    std::size_t removed_ = 0;
    std::vector<Slot> index_; // a power of two, at most half full
};

} // namespace qzivi
