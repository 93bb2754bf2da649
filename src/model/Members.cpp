#include "qzivi/model/Members.h"

#include "qzivi/model/Conventions.h"
#include "qzivi/model/PropertyBag.h"

namespace qzivi {

void MemberCollection::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                              const std::shared_ptr<CIviFgenPropImp>& propSet) {
    m_oErr = std::move(errorReport);
    m_oPropSet = propSet;
}

void MemberCollection::SetPath(const std::string& parentPath) {
    m_sPath = JoinPath(parentPath, part_);
}

void MemberCollection::ReadProperties(const PropertyBag& bag, const std::string& prefix) {
    bag.ReadInt32(BagPrefix(prefix, word_) + "ItemCount", 0);
}

void MemberCollection::WriteProperties(PropertyBag& bag, const std::string& prefix) const {
    bag.WriteInt32(BagPrefix(prefix, word_) + "ItemCount", Count(), 0);
}

void QZIviConfigurations::Attach(std::shared_ptr<CIviErrorReport> errorReport,
                                 CIviFgenPropImp* propSet, const std::string&) {
    m_oErr = std::move(errorReport);
    m_oPropSet = propSet;
}

void QZIviConfigurations::ReadProperties(const PropertyBag& bag) {
    bag.ReadInt32("Configurations_ItemCount", 0);
}

void QZIviConfigurations::WriteProperties(PropertyBag& bag) const {
    bag.WriteInt32("Configurations_ItemCount", Count(), 0);
}

} // namespace qzivi
