#include "qzivi/model/PropertyBag.h"

#include "qzivi/support/failure.h"
#include "qzivi/support/text.h"

#include <algorithm>
#include <bit>
#include <cstring>

namespace qzivi {

namespace {

static_assert(std::endian::native == std::endian::little,
              "the block layout is written for little-endian hosts");

constexpr std::uint8_t kMagic[4] = {'Q', 'Z', 'P', 'B'};
constexpr std::uint8_t kVersion = 1;
enum Type : std::uint8_t { kInt32 = 1, kDouble = 2, kBool = 3, kText = 4, kBytes = 5 };

[[noreturn]] void WrongType(std::string_view name) {
    RaiseRuntime(runtime::kWrongType, "The property bag value \"" + std::string(name) +
                                          "\" is not of the type it is read as.");
}

Variant AsVariant(const PropertyBag::Value& value, std::string_view name) {
    switch (value.index()) {
    case 0:
        return Variant(std::get<std::int32_t>(value));
    case 1:
        return Variant(std::get<double>(value));
    case 2:
        return Variant(std::get<bool>(value));
    case 3:
        return Variant(std::get<std::string>(value));
    default:
        WrongType(name);
    }
}

class Writer {
public:
    explicit Writer(const std::function<void(const void*, std::size_t)>& sink) : sink_(sink) {}
    void Raw(const void* data, std::size_t size) { sink_(data, size); }
    template <typename T>
    void Put(T value) {
        Raw(&value, sizeof value);
    }

private:
    const std::function<void(const void*, std::size_t)>& sink_;
};

// Reads the block; every length is held against what remains before anything is allocated.
class Reader {
public:
    explicit Reader(std::span<const std::uint8_t> block) : block_(block) {}
    std::size_t At() const { return at_; }
    std::size_t Remaining() const { return block_.size() - at_; }
    template <typename T>
    T Get(const char* what) {
        Need(sizeof(T), what);
        T value;
        std::memcpy(&value, block_.data() + at_, sizeof value);
        at_ += sizeof value;
        return value;
    }
    std::span<const std::uint8_t> Take(std::size_t size, const char* what) {
        Need(size, what);
        auto part = block_.subspan(at_, size);
        at_ += size;
        return part;
    }
    [[noreturn]] void Corrupt(const std::string& why) const {
        RaiseRuntime(runtime::kImproperFile, "The property bag data is corrupt at byte " +
                                                 std::to_string(at_) + ": " + why + ".");
    }

private:
    void Need(std::size_t size, const char* what) const {
        if (size > Remaining())
            Corrupt(std::string(what) + " needs " + std::to_string(size) + " bytes, but only " +
                    std::to_string(Remaining()) + " remain");
    }
    std::span<const std::uint8_t> block_;
    std::size_t at_ = 0;
};

} // namespace

SharedBytes::SharedBytes(Bytes bytes) {
    auto owner = std::make_shared<const Bytes>(std::move(bytes));
    size_ = owner->size();
    data_ = std::shared_ptr<const std::uint8_t>(owner, owner->data());
}

SharedBytes::SharedBytes(std::shared_ptr<const Bytes> owner, std::size_t offset, std::size_t size)
    : data_(owner, owner->data() + offset), size_(size) {}

bool operator==(const SharedBytes& a, const SharedBytes& b) {
    return a.size_ == b.size_ && (a.size_ == 0 || std::memcmp(a.data(), b.data(), a.size_) == 0);
}

namespace {
// Names are hashed and compared on every read and write of the tree, so eight bytes at a time:
// a word's ASCII capitals are folded to small letters at once, other bytes kept as they are.
constexpr std::uint64_t kEachByte = 0x0101010101010101ull;
std::uint64_t FoldWord(std::uint64_t word) {
    const std::uint64_t low7 = word & (kEachByte * 0x7f);
    const std::uint64_t fromA = low7 + kEachByte * (0x80 - 'A'); // top bit: at least 'A'
    const std::uint64_t pastZ = low7 + kEachByte * (0x7f - 'Z'); // top bit: beyond 'Z'
    const std::uint64_t capital = ~word & (fromA ^ pastZ) & (kEachByte * 0x80);
    return word | (capital >> 2);
}
// The word at `at`; a last part of under eight bytes is padded with zeros.
std::uint64_t WordAt(std::string_view name, std::size_t at) {
    std::uint64_t word = 0;
    if (name.size() - at >= sizeof word)
        std::memcpy(&word, name.data() + at, sizeof word); // one load, not a call
    else
        std::memcpy(&word, name.data() + at, name.size() - at);
    return FoldWord(word);
}
bool SameName(std::string_view a, std::string_view b) {
    if (a.size() != b.size()) return false;
    for (std::size_t at = 0; at < a.size(); at += 8)
        if (WordAt(a, at) != WordAt(b, at)) return false;
    return true;
}
} // namespace

std::uint64_t PropertyBag::Hash(std::string_view name) {
    std::uint64_t hash = name.size();
    for (std::size_t at = 0; at < name.size(); at += 8)
        hash = (hash ^ WordAt(name, at)) * 0x9e3779b97f4a7c15ull;
    // A word's high bytes reach only the high bits above; spread them to the low ones the index
    // uses (the finalizer of splitmix64).
    hash = (hash ^ (hash >> 30)) * 0xbf58476d1ce4e5b9ull;
    hash = (hash ^ (hash >> 27)) * 0x94d049bb133111ebull;
    return hash ^ (hash >> 31);
}

std::size_t PropertyBag::Probe(std::string_view name, std::uint64_t hash) const {
    const std::size_t mask = index_.size() - 1;
    for (std::size_t i = hash & mask;; i = (i + 1) & mask) {
        const Slot& slot = index_[i];
        if (slot.entry == 0) return i;
        if (slot.hash == hash && SameName(entries_[slot.entry - 1].name, name)) return i;
    }
}

void PropertyBag::Reindex(std::size_t capacity) {
    index_.assign(capacity, Slot{});
    for (std::size_t i = 0; i < entries_.size(); ++i) {
        if (entries_[i].name.empty()) continue;
        const std::uint64_t hash = Hash(entries_[i].name);
        index_[Probe(entries_[i].name, hash)] = {hash, static_cast<std::uint32_t>(i + 1)};
    }
}

const PropertyBag::Value* PropertyBag::Find(std::string_view name) const {
    if (index_.empty()) return nullptr;
    const Slot& slot = index_[Probe(name, Hash(name))];
    return slot.entry == 0 ? nullptr : &entries_[slot.entry - 1].value;
}

void PropertyBag::Store(std::string_view name, Value value) {
    if (2 * (entries_.size() + 1) > index_.size())
        Reindex(std::max<std::size_t>(16, 2 * index_.size()));
    const std::uint64_t hash = Hash(name);
    Slot& slot = index_[Probe(name, hash)];
    if (slot.entry != 0) {
        entries_[slot.entry - 1].value = std::move(value);
        return;
    }
    entries_.push_back({std::string(name), std::move(value)});
    slot = {hash, static_cast<std::uint32_t>(entries_.size())};
}

void PropertyBag::Remove(std::string_view name) {
    if (index_.empty()) return;
    const std::size_t mask = index_.size() - 1;
    std::size_t hole = Probe(name, Hash(name));
    if (index_[hole].entry == 0) return;
    Entry& entry = entries_[index_[hole].entry - 1];
    entry.name.clear();
    entry.value = Value();
    // Close the hole: later slots of the same run that belong at or before it move up.
    for (std::size_t i = (hole + 1) & mask; index_[i].entry != 0; i = (i + 1) & mask) {
        const std::size_t home = index_[i].hash & mask;
        if (((i - home) & mask) >= ((i - hole) & mask)) {
            index_[hole] = index_[i];
            hole = i;
        }
    }
    index_[hole] = Slot{};
    if (2 * ++removed_ <= entries_.size()) return;
    std::erase_if(entries_, [](const Entry& e) { return e.name.empty(); });
    removed_ = 0;
    Reindex(index_.size());
}

std::vector<std::string> PropertyBag::Names() const {
    std::vector<std::string> names;
    names.reserve(Size());
    ForEachEntry([&](const std::string& name, const Value&) { names.push_back(name); });
    return names;
}

bool PropertyBag::Contains(std::string_view name) const {
    return Find(name) != nullptr;
}

void PropertyBag::Clear() {
    entries_.clear();
    index_.clear();
    removed_ = 0;
}

std::int32_t PropertyBag::ReadInt32(std::string_view name, std::int32_t defaultValue) const {
    const Value* value = Find(name);
    return value == nullptr ? defaultValue : AsVariant(*value, name).AsInt32();
}

double PropertyBag::ReadDouble(std::string_view name, double defaultValue) const {
    const Value* value = Find(name);
    return value == nullptr ? defaultValue : AsVariant(*value, name).AsDouble();
}

bool PropertyBag::ReadBool(std::string_view name, bool defaultValue) const {
    const Value* value = Find(name);
    return value == nullptr ? defaultValue : AsVariant(*value, name).AsBool();
}

std::string PropertyBag::ReadText(std::string_view name, std::string_view defaultValue) const {
    const Value* value = Find(name);
    return value == nullptr ? std::string(defaultValue) : AsVariant(*value, name).AsText();
}

Bytes PropertyBag::ReadBytes(std::string_view name) const {
    return ReadSharedBytes(name).ToBytes();
}

SharedBytes PropertyBag::ReadSharedBytes(std::string_view name) const {
    const Value* value = Find(name);
    if (value == nullptr) return {};
    if (const auto* bytes = std::get_if<SharedBytes>(value)) return *bytes;
    WrongType(name);
}

void PropertyBag::WriteInt32(std::string_view name, std::int32_t value, std::int32_t defaultValue) {
    value == defaultValue ? Remove(name) : Store(name, value);
}

void PropertyBag::WriteDouble(std::string_view name, double value, double defaultValue) {
    value == defaultValue ? Remove(name) : Store(name, value);
}

void PropertyBag::WriteBool(std::string_view name, bool value, bool defaultValue) {
    value == defaultValue ? Remove(name) : Store(name, value);
}

void PropertyBag::WriteText(std::string_view name, std::string_view value,
                            std::string_view defaultValue) {
    value == defaultValue ? Remove(name) : Store(name, std::string(value));
}

void PropertyBag::WriteText(std::string_view name, std::string_view value) {
    Store(name, std::string(value));
}

void PropertyBag::WriteBytes(std::string_view name, Bytes value) {
    Store(name, SharedBytes(std::move(value)));
}

void PropertyBag::WriteBytes(std::string_view name, SharedBytes value) {
    Store(name, std::move(value));
}

Bytes PropertyBag::Contents() const {
    // Sized once, so that a bag of large byte values is copied once and never regrown.
    std::size_t size = 0;
    WriteContents([&](const void*, std::size_t n) { size += n; });
    Bytes out;
    out.reserve(size);
    WriteContents([&](const void* data, std::size_t n) {
        const auto* bytes = static_cast<const std::uint8_t*>(data);
        out.insert(out.end(), bytes, bytes + n);
    });
    return out;
}

void PropertyBag::WriteContents(const std::function<void(const void*, std::size_t)>& sink) const {
    Writer w(sink);
    w.Raw(kMagic, sizeof kMagic);
    w.Put(kVersion);
    w.Put(static_cast<std::uint32_t>(Size()));
    ForEachEntry([&](const std::string& name, const Value& value) {
        w.Put(static_cast<std::uint16_t>(name.size()));
        w.Raw(name.data(), name.size());
        switch (value.index()) {
        case 0:
            w.Put(kInt32);
            w.Put(std::get<std::int32_t>(value));
            break;
        case 1:
            w.Put(kDouble);
            w.Put(std::get<double>(value));
            break;
        case 2:
            w.Put(kBool);
            w.Put(static_cast<std::uint8_t>(std::get<bool>(value) ? 1 : 0));
            break;
        case 3: {
            const auto& text = std::get<std::string>(value);
            w.Put(kText);
            w.Put(static_cast<std::uint32_t>(text.size()));
            w.Raw(text.data(), text.size());
            break;
        }
        default: {
            const auto& bytes = std::get<SharedBytes>(value);
            w.Put(kBytes);
            w.Put(static_cast<std::uint32_t>(bytes.size()));
            w.Raw(bytes.data(), bytes.size());
            break;
        }
        }
    });
}

void PropertyBag::SetContents(std::span<const std::uint8_t> block) {
    SetContents(SharedBytes(Bytes(block.begin(), block.end())));
}

void PropertyBag::SetContents(const SharedBytes& shared) {
    Reader r(shared.span());
    const auto magic = r.Take(sizeof kMagic, "the identifier");
    if (std::memcmp(magic.data(), kMagic, sizeof kMagic) != 0)
        r.Corrupt("it does not start with \"QZPB\"");
    const auto version = r.Get<std::uint8_t>("the version");
    if (version != kVersion)
        r.Corrupt("version " + std::to_string(version) + " is not one this program reads");
    const auto count = r.Get<std::uint32_t>("the entry count");
    // The smallest entry takes 4 bytes: an empty name can't be, so 2 + 1 + 1 + 1 at least.
    if (count > r.Remaining() / 4)
        r.Corrupt(std::to_string(count) + " entries cannot fit in what remains");
    PropertyBag bag;
    bag.entries_.reserve(count);
    bag.Reindex(std::bit_ceil(2 * std::size_t{count} + 16));
    for (std::uint32_t i = 0; i < count; ++i) {
        const auto nameLength = r.Get<std::uint16_t>("a name length");
        if (nameLength == 0) r.Corrupt("an entry has an empty name");
        const auto nameBytes = r.Take(nameLength, "a name");
        std::string name(nameBytes.begin(), nameBytes.end());
        if (bag.Contains(name)) r.Corrupt("the name \"" + name + "\" comes twice");
        const auto type = r.Get<std::uint8_t>("a type");
        switch (type) {
        case kInt32:
            bag.Store(name, r.Get<std::int32_t>("an int32 value"));
            break;
        case kDouble:
            bag.Store(name, r.Get<double>("a double value"));
            break;
        case kBool:
            bag.Store(name, r.Get<std::uint8_t>("a bool value") != 0);
            break;
        case kText: {
            const auto size = r.Get<std::uint32_t>("a text length");
            const auto chars = r.Take(size, "a text");
            bag.Store(name, std::string(chars.begin(), chars.end()));
            break;
        }
        case kBytes: {
            const auto size = r.Get<std::uint32_t>("a byte array length");
            r.Take(size, "a byte array");
            bag.Store(name, shared.Slice(r.At() - size, size));
            break;
        }
        default:
            r.Corrupt("type " + std::to_string(type) + " of \"" + name + "\" is unknown");
        }
    }
    if (r.Remaining() != 0)
        r.Corrupt(std::to_string(r.Remaining()) + " bytes follow the last entry");
    *this = std::move(bag);
}

bool operator==(const PropertyBag& a, const PropertyBag& b) {
    if (a.Size() != b.Size()) return false;
    bool equal = true;
    a.ForEachEntry([&](const std::string& name, const PropertyBag::Value& value) {
        const PropertyBag::Value* other = b.Find(name);
        equal = equal && other != nullptr && *other == value;
    });
    return equal;
}

} // namespace qzivi
