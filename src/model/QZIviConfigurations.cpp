#include "qzivi/model/QZIviConfigurations.h"

#include "qzivi/model/Conventions.h"
#include "qzivi/model/PropertyBag.h"

namespace qzivi {

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
