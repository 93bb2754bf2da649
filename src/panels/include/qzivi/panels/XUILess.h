// XUILess: the panel of UIStyle 0, an icon of the control shown only at design time. It keeps its
// fixed size of 435 by 435 twips whatever it is asked, and gives back the UiState it was given.
#pragma once

#include "qzivi/control/Panel.h"

#include <QWidget>

namespace qzivi {

class XUILess : public QWidget, public IQZIviFgenPanel {
    Q_OBJECT

public:
    static constexpr int kSizeTwips = 435;

    explicit XUILess(QWidget* parent = nullptr);

    void Size(float width, float height) override;
    float Width() const override { return static_cast<float>(width()); }
    float Height() const override { return static_cast<float>(height()); }
    std::int32_t UiState() const override { return m_lUiState; }
    void UiState(std::int32_t state) override { m_lUiState = state; }
    void SetNewIcon(std::int32_t id);
    void Visible(bool visible) override { setVisible(visible); }
    void Move(float left, float top) override {
        move(static_cast<int>(left), static_cast<int>(top));
    }

protected:
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;

private:
    std::int32_t m_lUiState = 0;
    int m_lIcon = 110;
};

} // namespace qzivi
