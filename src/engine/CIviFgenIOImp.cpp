#include "qzivi/engine/CIviFgenIOImp.h"

#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/model/CIviFgenPropImp.h"

namespace qzivi {

CIviFgenIOImp::~CIviFgenIOImp() {
    try {
        if (m_oErr && m_oErr->IsInitialized()) CloseSession();
    } catch (...) {
    }
}

void CIviFgenIOImp::Construct(std::shared_ptr<CIviFgenPropImp> propSet,
                              std::shared_ptr<CIviErrorReport> errorReport) {
    m_oProp = std::move(propSet);
    m_oErr = std::move(errorReport);
}

void CIviFgenIOImp::SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet) {
    m_oProp = std::move(propSet);
}

void CIviFgenIOImp::Init(bool doIDQuery, bool doReset, const std::string& optionString,
                         std::int32_t reInitBehavior) {
    if (!m_oProp->Enabled()) return;
    std::string name = m_oProp->LogicalName();
    m_oErr->Init(name, doIDQuery, doReset, optionString, reInitBehavior);
}

void CIviFgenIOImp::CloseSession() {
    m_oErr->CloseSession(true);
}

} // namespace qzivi
