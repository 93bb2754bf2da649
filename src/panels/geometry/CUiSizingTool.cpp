#include "qzivi/panels/CUiSizingTool.h"

#include "qzivi/support/failure.h"

#include <algorithm>
#include <charconv>
#include <cmath>

namespace qzivi {

namespace {

// The product before the division, as a signed 32-bit value would hold it.
std::int32_t Scaled(std::int32_t value, std::int32_t size, std::int32_t design) {
    if (design == 0) RaiseRuntime(runtime::kDivisionByZero, "Division by zero.");
    const std::int64_t product = static_cast<std::int64_t>(value) * size;
    if (product > 2147483647 || product < -2147483648LL)
        RaiseRuntime(runtime::kOverflow, "Overflow.");
    return static_cast<std::int32_t>(std::nearbyint(static_cast<double>(product) / design));
}

std::int32_t AtLeastZero(std::int32_t value) {
    return std::max(value, 0);
}

// Proportional size given the new start: cut at the window's edge, never negative.
std::int32_t Proportional(std::int32_t size, std::int32_t start, std::int32_t window,
                          std::int32_t design) {
    std::int32_t s = Scaled(size, window, design);
    if (start + s > window) s = window - start;
    return AtLeastZero(s);
}

// One direction of a control's place: proportional, or anchored to the far edge with the width
// (or height) it will have, or as it is.
std::int32_t Place(bool scale, bool keepFar, bool scaleSize, std::int32_t designStart,
                   std::int32_t designSize, std::int32_t start, std::int32_t size,
                   std::int32_t window, std::int32_t designWindow) {
    if (scale) return Scaled(designStart, window, designWindow);
    if (!keepFar) return start;
    const std::int32_t newSize =
        scaleSize ? Proportional(designSize, start, window, designWindow) : size;
    return AtLeastZero(designStart + window - designWindow - newSize + designSize);
}

} // namespace

std::int32_t CUiSizingTool::FlagsOf(const std::string& tag) {
    std::int32_t flags = 0;
    const auto [end, error] = std::from_chars(tag.data(), tag.data() + tag.size(), flags);
    return error == std::errc() && end == tag.data() + tag.size() ? flags : 0;
}

std::int32_t CUiSizingTool::Find(const std::string& name, std::int32_t index) const {
    for (std::size_t i = 0; i < m_oRecords.size(); ++i)
        if (m_oRecords[i].Name == name && m_oRecords[i].Index == index)
            return static_cast<std::int32_t>(i + 1);
    return -1;
}

void CUiSizingTool::Store(const std::vector<ISizedControl*>& controls, std::int32_t height,
                          std::int32_t width) {
    m_lDesignHeight = height;
    m_lDesignWidth = width;
    for (const ISizedControl* control : controls)
        Add(*control, false);
}

void CUiSizingTool::Add(const ISizedControl& control, bool tagOnly) {
    const std::string name = control.Name();
    const std::int32_t index = control.Index();
    std::int32_t at = Find(name, index);
    if (at == -1) {
        if (m_oRecords.size() == m_nCapacity) m_nCapacity += 10;
        m_oRecords.push_back({name, index});
        at = static_cast<std::int32_t>(m_oRecords.size());
    }
    Record& r = m_oRecords[static_cast<std::size_t>(at - 1)];
    r.Flags = FlagsOf(control.Tag());
    if (tagOnly) return;
    r.Height = control.Height();
    r.Width = control.Width();
    r.Top = control.Top();
    r.Left = control.Left();
    r.FontSize = control.FontSize();
}

void CUiSizingTool::Resize(const std::vector<ISizedControl*>& controls, std::int32_t height,
                           std::int32_t width) {
    m_lLastHeight = height;
    m_lLastWidth = width;
    const std::int32_t W = width, H = height, DW = m_lDesignWidth, DH = m_lDesignHeight;
    for (ISizedControl* control : controls) {
        const std::int32_t at = Find(control->Name(), control->Index());
        if (at == -1) continue;
        const Record& r = m_oRecords[static_cast<std::size_t>(at - 1)];
        const std::int32_t f = r.Flags;
        if (f == 0) continue;
        std::int32_t left = control->Left(), top = control->Top();
        std::int32_t w = control->Width(), h = control->Height();

        if (f & kScaleFont) try {
                if (DH == 0 || DW == 0) RaiseRuntime(runtime::kDivisionByZero, "Division by zero.");
                control->SetFontSize(std::min(H * r.FontSize / DH, W * r.FontSize / DW));
            } catch (...) { // a control without a font
            }
        auto place = [&] {
            left = Place(f & kScaleLeft, f & kKeepRight, f & kScaleWidth, r.Left, r.Width, left, w,
                         W, DW);
            top = Place(f & kScaleTop, f & kKeepBottom, f & kScaleHeight, r.Top, r.Height, top, h,
                        H, DH);
        };
        place();
        if (f & kKeepShape) {
            if (DW == 0 || DH == 0) RaiseRuntime(runtime::kDivisionByZero, "Division by zero.");
            const double s = std::min(static_cast<double>(W) / DW, static_cast<double>(H) / DH);
            const auto W2 = static_cast<std::int32_t>(std::nearbyint(DW * s));
            const auto H2 = static_cast<std::int32_t>(std::nearbyint(DH * s));
            w = Proportional(r.Width, 0, W2, DW);
            h = Proportional(r.Height, 0, H2, DH);
        } else {
            if (f & kScaleWidth)
                w = Proportional(r.Width, left, W, DW);
            else if (f & kKeepWidthMargin)
                w = AtLeastZero(W - (DW - r.Width));
            if (f & kScaleHeight)
                h = Proportional(r.Height, top, H, DH);
            else if (f & kKeepHeightMargin)
                h = AtLeastZero(H - (DH - r.Height));
        }
        place(); // the anchored positions see the final size only now
        control->Move(left, top, w, control->KeepsItsHeight() ? control->Height() : h);
    }
}

double CUiSizingTool::ScaleX(double value, double width) const {
    if (width == 0) width = m_lLastWidth;
    return value * width / m_lDesignWidth;
}

double CUiSizingTool::ScaleY(double value, double height) const {
    if (height == 0) height = m_lLastHeight;
    return value * height / m_lDesignHeight;
}

} // namespace qzivi
