// CPaintFlickerFree: a paint handler draws into an off-screen pixmap of the widget and copies it
// to the widget in one step: BeginPainting, EraseBackground, the drawing, StopPainting, all in
// one paint event. The pixmap has the screen's pixel ratio, so the copy is sharp.
#pragma once

#include <QPainter>
#include <QPalette>
#include <QPixmap>

#include <cstdint>
#include <optional>

class QWidget;

namespace qzivi {

class CPaintFlickerFree {
public:
    // The painter of the off-screen picture of `widget`, to be copied to `target`.
    QPainter* BeginPainting(QPainter& target, const QWidget& widget);
    // Fills the picture with a colour of the system (ResolveColor).
    void EraseBackground(std::uint32_t colour);
    // The one copy to the target; the painter of the picture is gone afterwards.
    void StopPainting();
    // The painter while painting goes on, null otherwise.
    QPainter* hdc() { return m_oPainter ? &*m_oPainter : nullptr; }

private:
    QPainter* m_oTarget = nullptr;
    QPalette m_oPalette;
    QPixmap m_oPixmap;
    std::optional<QPainter> m_oPainter;
};

} // namespace qzivi
