#include "qzivi/support/variant.h"

#include "qzivi/support/failure.h"
#include "qzivi/support/text.h"

#include <cmath>
#include <limits>

namespace qzivi {

namespace {
const std::vector<Variant>& NoItems() {
    static const std::vector<Variant> none;
    return none;
}

std::int64_t Rounded(double value, double min, double max) {
    // Banker's rounding, as the conversions of the system's first language did.
    const double r = std::nearbyint(value);
    if (!std::isfinite(value) || r < min || r > max)
        RaiseRuntime(runtime::kOverflow, "An overflow error has occurred.");
    return static_cast<std::int64_t>(r);
}
} // namespace

bool Variant::IsNumeric() const {
    return kind_ == Kind::Number || (kind_ == Kind::Text && text::ParseNumber(text_).has_value());
}

double Variant::AsDouble() const {
    switch (kind_) {
    case Kind::Number:
        return number_;
    case Kind::Empty:
        return 0;
    case Kind::Text:
        if (auto n = text::ParseNumber(text_)) return *n;
        break;
    default:
        break;
    }
    RaiseRuntime(runtime::kWrongType, "An invalid type has been passed to a property or method.");
}

std::int32_t Variant::AsInt32() const {
    return static_cast<std::int32_t>(Rounded(AsDouble(), std::numeric_limits<std::int32_t>::min(),
                                             std::numeric_limits<std::int32_t>::max()));
}

std::int16_t Variant::AsInt16() const {
    return static_cast<std::int16_t>(Rounded(AsDouble(), std::numeric_limits<std::int16_t>::min(),
                                             std::numeric_limits<std::int16_t>::max()));
}

bool Variant::AsBool() const {
    if (kind_ == Kind::Text) {
        if (text::EqualsNoCase(text::Trim(text_), "true")) return true;
        if (text::EqualsNoCase(text::Trim(text_), "false")) return false;
    }
    return AsDouble() != 0;
}

std::string Variant::AsText() const {
    switch (kind_) {
    case Kind::Text:
        return text_;
    case Kind::Number:
        return text::FormatNumber(number_);
    case Kind::Empty:
        return {};
    default:
        RaiseRuntime(runtime::kWrongType,
                     "An invalid type has been passed to a property or method.");
    }
}

const std::vector<Variant>& Variant::Items() const {
    return array_ ? *array_ : NoItems();
}

bool Variant::operator==(const Variant& other) const {
    if (kind_ != other.kind_) return false;
    switch (kind_) {
    case Kind::Number:
        return number_ == other.number_;
    case Kind::Text:
        return text_ == other.text_;
    case Kind::Object:
        return object_ == other.object_;
    case Kind::Array:
        return rows_ == other.rows_ && Items() == other.Items();
    default:
        return true;
    }
}

} // namespace qzivi
