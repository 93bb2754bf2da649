#include "qzivi/model/PropertyTable.h"

#include "qzivi/model/PropertyBag.h"

namespace qzivi {

PropertyValue ReadProperty(const PropertyBag& bag, const std::string& key,
                           const PropertyInfo& info) {
    switch (info.kind) {
    case PropertyKind::Double:
        return bag.ReadDouble(key, std::get<double>(info.initial));
    case PropertyKind::Bool:
        return bag.ReadBool(key, std::get<bool>(info.initial));
    case PropertyKind::Text:
        return bag.ReadText(key, std::get<std::string>(info.initial));
    case PropertyKind::Int32:
    case PropertyKind::Reference:
        break;
    }
    return bag.ReadInt32(key, std::get<std::int32_t>(info.initial));
}

void WriteProperty(PropertyBag& bag, const std::string& key, const PropertyValue& value,
                   const PropertyInfo& info) {
    switch (info.kind) {
    case PropertyKind::Double:
        bag.WriteDouble(key, std::get<double>(value), std::get<double>(info.initial));
        return;
    case PropertyKind::Bool:
        bag.WriteBool(key, std::get<bool>(value), std::get<bool>(info.initial));
        return;
    case PropertyKind::Text:
        if (info.alwaysStored)
            bag.WriteText(key, std::get<std::string>(value));
        else
            bag.WriteText(key, std::get<std::string>(value), std::get<std::string>(info.initial));
        return;
    case PropertyKind::Int32:
    case PropertyKind::Reference:
        bag.WriteInt32(key, std::get<std::int32_t>(value), std::get<std::int32_t>(info.initial));
        return;
    }
}

} // namespace qzivi
