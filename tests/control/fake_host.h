// A host and a panel without any user interface library, for the control's tests.
#pragma once

#include "qzivi/control/Host.h"
#include "qzivi/control/Panel.h"
#include "qzivi/control/QZIviFgen.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

namespace qzivi {

// A panel that keeps a fixed size of its own, as the real panels keep their design size.
class FakePanel : public IQZIviFgenPanel {
public:
    explicit FakePanel(std::string className) : className(std::move(className)) {}
    void Construct(CIviFgenIOImp* io, std::shared_ptr<CIviFgenPropImp> set,
                   std::shared_ptr<CIviErrorReport>) override {
        constructed = io != nullptr;
        propSet = std::move(set);
    }
    void SetNewPropSet(std::shared_ptr<CIviFgenPropImp> set) override { propSet = std::move(set); }
    void Enabled(bool value) override { enabled = value; }
    void Size(float, float) override { ++sized; }
    float Width() const override { return 300; }
    float Height() const override { return 200; }
    std::int32_t UiState() const override { return state; }
    void UiState(std::int32_t value) override { state = value; }
    void Visible(bool value) override { visible = value; }

    std::string className;
    std::shared_ptr<CIviFgenPropImp> propSet;
    bool constructed = false, enabled = false, visible = false;
    std::int32_t state = 0;
    int sized = 0;
};

class PanelHost : public IQZIviFgenHost {
public:
    bool UserMode() const override { return userMode; }
    std::string DisplayName() const override { return "Fgen1"; }
    float Width() const override { return width; }
    float Height() const override { return height; }
    void SetSize(float w, float h) override {
        width = w;
        height = h;
        ++resizes;
        if (control) control->Resized(); // a host tells the control of every size change
    }
    std::shared_ptr<IQZIviFgenPanel> AddChild(const std::string& className,
                                              const std::string& key) override {
        EXPECT_EQ(key, "UI");
        panel = std::make_shared<FakePanel>(className);
        return panel;
    }
    void RemoveChild(const std::string& key) override {
        EXPECT_EQ(key, "UI");
        panel.reset();
    }
    bool FormEntryVisible() const override { return formVisible; }
    void SetFormEntryVisible(bool value) override { formVisible = value; }
    void PropertyChanged(const std::string& name) override { changed.push_back(name); }
    void SendTab() override { ++tabs; }
    void ShowAboutBox() override {}

    bool userMode = true;
    float width = 800, height = 600;
    bool formVisible = true;
    int resizes = 0, tabs = 0;
    std::vector<std::string> changed;
    std::shared_ptr<FakePanel> panel;
    QZIviFgen* control = nullptr;
};

} // namespace qzivi
