// The panel contract: what the control asks of its child panel. Every member has a default that
// does nothing, so a panel that lacks one never breaks the control.
#pragma once

#include <cstdint>
#include <memory>

namespace qzivi {

class CIviErrorReport;
class CIviFgenIOImp;
class CIviFgenPropImp;

class IQZIviFgenPanel {
public:
    virtual ~IQZIviFgenPanel() = default;

    virtual void Construct(CIviFgenIOImp* io, std::shared_ptr<CIviFgenPropImp> propSet,
                           std::shared_ptr<CIviErrorReport> errorReport) {
        (void)io, (void)propSet, (void)errorReport;
    }
    virtual void SetNewPropSet(std::shared_ptr<CIviFgenPropImp> propSet) { (void)propSet; }
    virtual void Enabled(bool enabled) { (void)enabled; }
    // Asks for a size; the panel may take another, which Width and Height then give.
    virtual void Size(float width, float height) { (void)width, (void)height; }
    virtual float Width() const { return 0; }
    virtual float Height() const { return 0; }
    // Bit 0 is "design mode"; the other bits are the panel's own.
    virtual std::int32_t UiState() const { return 0; }
    virtual void UiState(std::int32_t state) { (void)state; }
    virtual void SetNewIcon() {}
    virtual void Visible(bool visible) { (void)visible; }
    virtual void Move(float left, float top) { (void)left, (void)top; }
};

} // namespace qzivi
