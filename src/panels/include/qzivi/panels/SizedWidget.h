// A child widget as the sizing tool sees it: its name, place in a control array, Tag and font.
#pragma once

#include "qzivi/panels/CUiSizingTool.h"

#include <QWidget>

#include <string>

namespace qzivi {

class SizedWidget : public ISizedControl {
public:
    SizedWidget(QWidget* widget, std::string name, std::int32_t index, int tag)
        : m_oWidget(widget), m_sName(std::move(name)), m_lIndex(index),
          m_sTag(std::to_string(tag)) {}
    std::string Name() const override { return m_sName; }
    std::int32_t Index() const override { return m_lIndex; }
    std::string Tag() const override { return m_sTag; }
    std::int32_t Left() const override { return m_oWidget->x(); }
    std::int32_t Top() const override { return m_oWidget->y(); }
    std::int32_t Width() const override { return m_oWidget->width(); }
    std::int32_t Height() const override { return m_oWidget->height(); }
    double FontSize() const override { return m_oWidget->font().pointSizeF(); }
    void SetFontSize(double size) override {
        QFont font = m_oWidget->font();
        font.setPointSizeF(std::max(1.0, size));
        m_oWidget->setFont(font);
    }
    void Move(std::int32_t l, std::int32_t t, std::int32_t w, std::int32_t h) override {
        m_oWidget->setGeometry(l, t, w, h);
    }
    QWidget* Widget() const { return m_oWidget; }

private:
    QWidget* m_oWidget;
    std::string m_sName;
    std::int32_t m_lIndex;
    std::string m_sTag;
};

} // namespace qzivi
