// Panel hosting without any user interface library: which panel each mode and style makes, how
// the control sizes and shows itself, the swap of styles, and the start-up configure on the
// std-only tick loop.
#include "../platform/test_support.h"
#include "fake_host.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/support/failure.h"
#include "qzivi/support/timers.h"

#include <gmock/gmock.h>

namespace qzivi {
namespace {

class HostingTest : public ::testing::Test {
protected:
    HostingTest() { ::setenv("QZIVI_SESSION_MANAGER", "none", 1); }

    // A control loaded from the bag of a control with one channel and the values given.
    std::unique_ptr<QZIviFgen> Load(std::int32_t style, bool autoConfigure = false,
                                    const std::string& logicalName = "SampleFGen") {
        PropertyBag bag;
        {
            QZIviFgen source;
            source.InitProperties();
            source.Channels()->Add("Channel1");
            source.UIStyle(style);
            source.AutoConfigure(autoConfigure);
            source.LogicalName(logicalName);
            source.WriteProperties(bag);
        }
        auto control = std::make_unique<QZIviFgen>(&host_);
        host_.control = control.get();
        control->ReadProperties(bag);
        return control;
    }
    ~HostingTest() override { host_.control = nullptr; }

    test::StoreScope store_;
    TimerLoop loop_;
    TickSourceScope ticks_{&loop_};
    PanelHost host_;
};

TEST_F(HostingTest, EachModeAndStyleMakesItsPanel) {
    struct Case {
        bool userMode;
        std::int32_t style;
        const char* panel; // null for none
    };
    const Case cases[] = {{false, 0, "QZIviFgenLib.XUILess"},  {false, 1, "QZIviFgenLib.XUIFgen1"},
                          {false, 2, "QZIviFgenLib.XUIFgen2"}, {true, 0, nullptr},
                          {true, 1, "QZIviFgenLib.XUIFgen1"},  {true, 2, "QZIviFgenLib.XUIFgen2"}};
    for (const auto& c : cases) {
        host_ = PanelHost();
        host_.userMode = c.userMode;
        const auto control = Load(c.style);
        const std::string what = std::to_string(c.userMode) + "/" + std::to_string(c.style);
        if (!c.panel) {
            EXPECT_EQ(host_.panel, nullptr) << what;
            EXPECT_EQ(host_.width, 0) << what;
            EXPECT_EQ(host_.height, 0) << what;
            EXPECT_FALSE(host_.formVisible) << what;
            continue;
        }
        ASSERT_NE(host_.panel, nullptr) << what;
        EXPECT_EQ(host_.panel->className, c.panel) << what;
        EXPECT_TRUE(host_.panel->constructed && host_.panel->visible) << what;
        EXPECT_TRUE(host_.panel->enabled) << what;
        EXPECT_EQ(host_.panel->state & 1, c.userMode ? 0 : 1) << "bit 0 is design mode: " << what;
        EXPECT_EQ(host_.width, 300) << "the panel has the last word on the size: " << what;
        EXPECT_TRUE(host_.formVisible) << what;
    }
}

TEST_F(HostingTest, StyleZeroAndBackRestoresTheSizeAndVisibilityOfBefore) {
    const auto control = Load(1);
    host_.panel->state = 6; // the panel's own bits
    host_.SetSize(300, 200);
    control->UIStyle(0);
    EXPECT_EQ(host_.panel, nullptr);
    EXPECT_EQ(host_.width, 0);
    EXPECT_FALSE(host_.formVisible);
    control->UIStyle(1);
    ASSERT_NE(host_.panel, nullptr);
    EXPECT_EQ(host_.width, 300);
    EXPECT_EQ(host_.height, 200);
    EXPECT_TRUE(host_.formVisible) << "shown again, as it was";
    EXPECT_EQ(host_.panel->state, 6) << "the panel's own bits pass to the new panel";

    // Hidden at the time the style went to 0: it stays hidden when it comes back.
    control->UIStyle(0);
    control->UIStyle(1);
    host_.formVisible = false;
    control->UIStyle(0);
    control->UIStyle(1);
    EXPECT_FALSE(host_.formVisible);
}

TEST_F(HostingTest, AStyleSetToItsPresentValueDoesNothing) {
    const auto control = Load(2);
    const auto panel = host_.panel;
    const int resizes = host_.resizes, sized = panel->sized;
    control->UIStyle(2);
    EXPECT_EQ(host_.panel, panel) << "the same panel";
    EXPECT_EQ(host_.resizes, resizes) << "not even a resize";
    EXPECT_EQ(panel->sized, sized);
}

TEST_F(HostingTest, FocusWithoutAPanelMovesOnAndEnabledReachesThePanel) {
    auto control = Load(0);
    control->GotFocus();
    EXPECT_EQ(host_.tabs, 1);
    control = Load(1);
    control->GotFocus();
    EXPECT_EQ(host_.tabs, 1) << "a panel takes the focus itself";
    control->Enabled(false);
    EXPECT_FALSE(host_.panel->enabled);
    host_.panel->enabled = true;
    control->RefreshPanel();
    EXPECT_FALSE(host_.panel->enabled) << "refreshed from the control";
}

TEST_F(HostingTest, AutoConfigureRunsAfterTheHostsLoadCode) {
    const auto control = Load(1, true);
    int configured = 0;
    bool initializedBefore = false;
    auto c = control->Configured.Connect([&] {
        ++configured;
        initializedBefore = control->SessionHandle() != 0;
    });
    // The host's own load code: an Init, with the start-up configure still pending.
    control->Init();
    EXPECT_EQ(configured, 0) << "not during the load code";
    loop_.Advance(1);
    EXPECT_EQ(configured, 1);
    EXPECT_TRUE(initializedBefore);
    loop_.Advance(100);
    EXPECT_EQ(configured, 1) << "once";

    host_.userMode = false;
    const auto designed = Load(1, true);
    loop_.Advance(10);
    EXPECT_EQ(configured, 1) << "not at design time";
}

TEST_F(HostingTest, AFailingAutoConfigureReportsAndRaisesNothing) {
    store_.UseStore("[Broken]\nmodule = builtin\nresource = SIM\n"
                    "options = DriverSetup=Fail=ConfigureOutputMode:0xBFFA0001\n");
    const auto control = Load(1, true, "Broken");
    control->ExceptionOnError(true);
    std::vector<std::int32_t> errors;
    auto c = control->IviError.Connect(
        [&](std::int32_t code, const std::string&, const std::string&) { errors.push_back(code); });
    EXPECT_NO_THROW(loop_.Advance(1));
    ASSERT_EQ(errors.size(), 1u);
    EXPECT_EQ(errors[0], -30701) << "the driver's error, mapped";
}

} // namespace
} // namespace qzivi
