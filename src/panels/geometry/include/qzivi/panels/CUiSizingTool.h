// CUiSizingTool: a panel's controls scale with its window. Each control's rectangle and font are
// recomputed from a snapshot taken at design size, never from the present rectangle, so that
// repeated resizing gathers no rounding error. The word of flags a control carries in its Tag
// decides how it scales. Standard library only: the widgets reach it through ISizedControl.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace qzivi {

// What the tool needs of a control.
class ISizedControl {
public:
    virtual ~ISizedControl() = default;
    virtual std::string Name() const = 0;
    // The position in a control array; -1 for a control that stands alone.
    virtual std::int32_t Index() const = 0;
    // The Tag, as the form designer gave it: a decimal number of flags, or anything else.
    virtual std::string Tag() const = 0;
    virtual std::int32_t Left() const = 0;
    virtual std::int32_t Top() const = 0;
    virtual std::int32_t Width() const = 0;
    virtual std::int32_t Height() const = 0;
    // 0 for a control without a font.
    virtual double FontSize() const = 0;
    virtual void SetFontSize(double size) = 0;
    virtual void Move(std::int32_t left, std::int32_t top, std::int32_t width,
                      std::int32_t height) = 0;
    // A combo box whose height follows its font: Move changes only left, top and width.
    virtual bool KeepsItsHeight() const { return false; }
};

class CUiSizingTool {
public:
    enum Flags : std::int32_t {
        kScaleLeft = 1,
        kScaleTop = 2,
        kScaleWidth = 4,
        kScaleHeight = 8,
        kScaleFont = 16,
        kKeepRight = 32,         // without kScaleLeft
        kKeepBottom = 64,        // without kScaleTop
        kKeepShape = 128,        // one factor for width and height
        kKeepWidthMargin = 256,  // without kScaleWidth
        kKeepHeightMargin = 512, // without kScaleHeight
    };

    struct Record {
        std::string Name;
        std::int32_t Index = -1;
        std::int32_t Height = 0, Width = 0, Top = 0, Left = 0;
        std::int32_t Flags = 0;
        double FontSize = 0;
    };

    // Keeps the design size and a snapshot of each control.
    void Store(const std::vector<ISizedControl*>& controls, std::int32_t height,
               std::int32_t width);
    // With `tagOnly`, only the flags of a known control are read again.
    void Add(const ISizedControl& control, bool tagOnly);
    // Moves each known control with flags to its place for the window size.
    void Resize(const std::vector<ISizedControl*>& controls, std::int32_t height,
                std::int32_t width);
    // A design value scaled to `width` (0: the last width given to Resize).
    double ScaleX(double value, double width = 0) const;
    double ScaleY(double value, double height = 0) const;

    // The record of a control, -1 if none (1-based, as the table is).
    std::int32_t Find(const std::string& name, std::int32_t index) const;
    const std::vector<Record>& Records() const { return m_oRecords; }
    std::size_t Capacity() const { return m_nCapacity; }

    // The flags of a Tag: a decimal number, 0 for none or a text.
    static std::int32_t FlagsOf(const std::string& tag);

private:
    std::vector<Record> m_oRecords;
    std::size_t m_nCapacity = 25; // room in the table: 25, then 10 more whenever it is full
    std::int32_t m_lDesignHeight = 0, m_lDesignWidth = 0;
    std::int32_t m_lLastHeight = 0, m_lLastWidth = 0;
};

// Geometry given in twips becomes device-independent pixels at 15 twips a pixel.
inline constexpr double kTwipsPerPixel = 15.0;
inline constexpr double TwipsToPixels(double twips) {
    return twips / kTwipsPerPixel;
}

} // namespace qzivi
