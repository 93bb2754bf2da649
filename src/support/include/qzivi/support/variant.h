// The tagged value: what the system takes where it accepts "any value" (indexes, optional
// arguments, table cells). Empty, missing, a number, a text, an object or an array.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <typeinfo>
#include <vector>

namespace qzivi {

class Variant {
public:
    enum class Kind { Empty, Missing, Number, Text, Object, Array };

    Variant() = default;
    Variant(double number) : kind_(Kind::Number), number_(number) {}
    Variant(int number) : kind_(Kind::Number), number_(number) {}
    Variant(std::int64_t number) : kind_(Kind::Number), number_(static_cast<double>(number)) {}
    Variant(bool value)
        : kind_(Kind::Number), number_(value ? -1 : 0) {} // true is -1, as persisted
    Variant(std::string text) : kind_(Kind::Text), text_(std::move(text)) {}
    Variant(const char* text) : kind_(Kind::Text), text_(text) {}

    static Variant Missing() {
        Variant v;
        v.kind_ = Kind::Missing;
        return v;
    }
    template <typename T>
    static Variant Object(std::shared_ptr<T> object) {
        Variant v;
        v.kind_ = Kind::Object;
        v.type_ = &typeid(T);
        v.object_ = std::move(object);
        return v;
    }
    // A one-dimensional array; `rows` > 0 makes it a table of rows x (size / rows), row-major.
    static Variant Array(std::vector<Variant> items, std::size_t rows = 0) {
        Variant v;
        v.kind_ = Kind::Array;
        v.array_ = std::make_shared<std::vector<Variant>>(std::move(items));
        v.rows_ = rows;
        return v;
    }

    Kind GetKind() const { return kind_; }
    bool IsEmpty() const { return kind_ == Kind::Empty; }
    bool IsMissing() const { return kind_ == Kind::Missing; }
    bool IsNumber() const { return kind_ == Kind::Number; }
    bool IsText() const { return kind_ == Kind::Text; }
    bool IsObject() const { return kind_ == Kind::Object; }
    bool IsArray() const { return kind_ == Kind::Array; }

    // A number, or a text that reads wholly as one: "numeric" in the system's sense.
    bool IsNumeric() const;

    // Conversions fail as the system's own running does: a wrong type raises number 13, a value
    // beyond the target raises number 6.
    double AsDouble() const;
    std::int32_t AsInt32() const;
    std::int16_t AsInt16() const;
    bool AsBool() const;
    std::string AsText() const;

    // The object if it is one of type T, else null.
    template <typename T>
    std::shared_ptr<T> AsObject() const {
        if (kind_ != Kind::Object || *type_ != typeid(T)) return nullptr;
        return std::static_pointer_cast<T>(object_);
    }

    const std::vector<Variant>& Items() const;
    std::size_t Rows() const { return rows_; }
    std::size_t Columns() const { return rows_ == 0 ? Items().size() : Items().size() / rows_; }
    const Variant& At(std::size_t row, std::size_t column) const {
        return Items().at(row * Columns() + column);
    }

    // Same kind and value; objects by identity, arrays item by item.
    bool operator==(const Variant& other) const;

private:
    Kind kind_ = Kind::Empty;
    double number_ = 0;
    std::string text_;
    const std::type_info* type_ = nullptr;
    std::shared_ptr<void> object_;
    std::shared_ptr<std::vector<Variant>> array_;
    std::size_t rows_ = 0;
};

} // namespace qzivi
