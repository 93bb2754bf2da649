// The saved configurations under the root property set. They keep the member conventions
// (attach, bag, clone); the snapshots themselves come with the saved configurations.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

class CIviErrorReport;
class CIviFgenPropImp;
class PropertyBag;

// The saved configurations. The owning property set is a bare reference (set again on each get
// of the root's Configurations); a configuration holds no configurations.
class QZIviConfigurations {
public:
    void Attach(std::shared_ptr<CIviErrorReport> errorReport, CIviFgenPropImp* propSet,
                const std::string& name);
    void SetOwner(CIviFgenPropImp* propSet) { m_oPropSet = propSet; }
    CIviFgenPropImp* PropSet() const { return m_oPropSet; }
    std::int32_t Count() const { return 0; }
    void ReadProperties(const PropertyBag& bag);
    void WriteProperties(PropertyBag& bag) const;
    void Clone(QZIviConfigurations&) const {}

private:
    std::shared_ptr<CIviErrorReport> m_oErr;
    CIviFgenPropImp* m_oPropSet = nullptr;
};

} // namespace qzivi
