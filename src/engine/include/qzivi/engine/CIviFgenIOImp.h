// CIviFgenIOImp: the engine, the only class that makes output calls on the driver. It turns the
// property tree into driver calls and runs generation.
#pragma once

#include "qzivi/support/event.h"

#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

class CIviErrorReport;
class CIviFgenPropImp;

class CIviFgenIOImp {
public:
    CIviFgenIOImp() = default;
    // Closes an open session, whatever fails.
    ~CIviFgenIOImp();
    CIviFgenIOImp(const CIviFgenIOImp&) = delete;
    CIviFgenIOImp& operator=(const CIviFgenIOImp&) = delete;

    void Construct(std::shared_ptr<CIviFgenPropImp> propSet,
                   std::shared_ptr<CIviErrorReport> errorReport);
    void SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet);
    const std::shared_ptr<CIviFgenPropImp>& PropSet() const { return m_oProp; }

    // Opens the session of the set's LogicalName, unless the set is not Enabled.
    void Init(bool doIDQuery, bool doReset, const std::string& optionString,
              std::int32_t reInitBehavior);
    void CloseSession();

    Event<> Configured;

private:
    std::shared_ptr<CIviFgenPropImp> m_oProp;
    std::shared_ptr<CIviErrorReport> m_oErr;
};

} // namespace qzivi
