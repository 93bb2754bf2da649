// The link between the property pages and the control they edit. The control lends every open
// page one shared working copy of its property set; an apply clones the copy into the live set. A
// change counter on the control keeps the pages in step: a page whose change others show bumps
// it, and a page that comes to the front reloads when the counter has moved since it last looked.
#pragma once

#include "qzivi/model/CIviFgenPropImp.h"

#include <cstdint>
#include <memory>

namespace qzivi {

// The change counter's next value: 1 to 0x7FFFFFFF and back to 1, never through 0.
constexpr std::int32_t NextChangeIndex(std::int32_t index) {
    return index >= 0x7FFFFFFF ? 1 : index + 1;
}

// What the control offers its pages. A failure in any member raises to the page.
class IQZCtlUtil {
public:
    virtual ~IQZCtlUtil() = default;

    virtual std::shared_ptr<CIviFgenPropImp> PropCopy() = 0;
    virtual std::int32_t LastChangeIndex() = 0;
    // Bumps the counter (NextChangeIndex) and returns its new value.
    virtual std::int32_t IncrementLastChangeIndex() = 0;
    // A page link takes hold of the working copy; the first makes it from the live set.
    virtual void RegisterSelectionChanged() = 0;
    // A clone of the working copy becomes the live set; the copy stays in use.
    virtual void RegisterApplyChanges() = 0;
    // A page link lets go of the working copy (all of them with `force`); the last drops it.
    virtual void ReleaseCopy(bool force) = 0;
};

// One page's link to the control of its selection.
class CPPObjWrapper {
public:
    CPPObjWrapper() = default;
    // Lets go of the working copy; a link without a selection has nothing to let go of.
    ~CPPObjWrapper();
    CPPObjWrapper(const CPPObjWrapper&) = delete;
    CPPObjWrapper& operator=(const CPPObjWrapper&) = delete;

    // The control the page host selected becomes the link, and takes hold of the working copy.
    void SelectionChanged(IQZCtlUtil& control);
    void ApplyChanges(bool alert);
    void AlertChanges();
    std::shared_ptr<CIviFgenPropImp> Props();
    // True once for each move of the control's counter since this page last looked.
    bool CheckForChanges();

    IQZCtlUtil* Link() const { return m_oLink; }

private:
    IQZCtlUtil& Linked() const;

    IQZCtlUtil* m_oLink = nullptr;
    std::int32_t m_lLocalChangeIndex = 0;
};

} // namespace qzivi
