#include "qzivi/control/PageLink.h"

#include "qzivi/support/failure.h"

namespace qzivi {

CPPObjWrapper::~CPPObjWrapper() {
    try {
        Linked().ReleaseCopy(false);
    } catch (...) {
    }
}

IQZCtlUtil& CPPObjWrapper::Linked() const {
    if (!m_oLink) RaiseRuntime(91, "Object variable not set.");
    return *m_oLink;
}

void CPPObjWrapper::SelectionChanged(IQZCtlUtil& control) {
    m_oLink = &control;
    m_oLink->RegisterSelectionChanged();
}

void CPPObjWrapper::ApplyChanges(bool alert) {
    Linked().RegisterApplyChanges();
    if (alert) AlertChanges();
}

void CPPObjWrapper::AlertChanges() {
    Linked().IncrementLastChangeIndex();
    // Wrapped as the counter is, so that a page level with it stays level at the wrap.
    m_lLocalChangeIndex = NextChangeIndex(m_lLocalChangeIndex);
}

std::shared_ptr<CIviFgenPropImp> CPPObjWrapper::Props() {
    return Linked().PropCopy();
}

bool CPPObjWrapper::CheckForChanges() {
    const std::int32_t counter = Linked().LastChangeIndex();
    if (counter == m_lLocalChangeIndex) return false;
    m_lLocalChangeIndex = counter;
    return true;
}

} // namespace qzivi
