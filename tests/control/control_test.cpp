// The control end to end: opening and closing the session through both roads (the session
// manager and the direct class driver), every refusal, the events and what reaches the caller.
#include "../platform/test_support.h"
#include "qzivi/control/Host.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/support/failure.h"
#include "qzivi/trace.h"

#include <gmock/gmock.h>

namespace qzivi {
namespace {

using ::testing::HasSubstr;
using ::testing::StartsWith;

class FakeHost : public IQZIviFgenHost {
public:
    bool UserMode() const override { return true; }
    std::string DisplayName() const override { return displayName; }
    float Width() const override { return 0; }
    float Height() const override { return 0; }
    void SetSize(float, float) override {}
    std::shared_ptr<IQZIviFgenPanel> AddChild(const std::string&, const std::string&) override {
        return nullptr;
    }
    void RemoveChild(const std::string&) override {}
    bool FormEntryVisible() const override { return true; }
    void SetFormEntryVisible(bool) override {}
    void PropertyChanged(const std::string& name) override { changed.push_back(name); }
    void SendTab() override {}
    void ShowAboutBox() override { ++aboutBoxes; }

    std::string displayName = "Fgen1";
    std::vector<std::string> changed;
    int aboutBoxes = 0;
};

struct Reported {
    std::int32_t code;
    std::string source;
    std::string description;
    bool operator==(const Reported&) const = default;
};

enum class Road { Direct, Managed };

// A control on a fake host, with what it reports recorded.
class Harness {
public:
    Harness() : control(std::make_unique<QZIviFgen>(&host)) {
        control->InitProperties();
        c1 = control->IviError.Connect(
            [this](std::int32_t code, const std::string& s, const std::string& d) {
                errors.push_back({code, s, d});
            });
        c2 = control->IviWarning.Connect(
            [this](std::int32_t code, const std::string& s, const std::string& d) {
                warnings.push_back({code, s, d});
            });
        c3 = control->Initialized.Connect([this] { ++initialized; });
    }

    // Runs a member and gives the failure that reached the caller, checking its help fields.
    std::optional<Failure> Raised(const std::function<void()>& member) {
        try {
            member();
        } catch (const Failure& f) {
            EXPECT_EQ(f.HelpFile(), "qzivi.chm");
            EXPECT_EQ(f.HelpContext(), 200);
            return f;
        }
        return std::nullopt;
    }

    FakeHost host;
    std::unique_ptr<QZIviFgen> control;
    std::vector<Reported> errors, warnings;
    int initialized = 0;
    Connection c1, c2, c3;
};

class ControlTest : public ::testing::TestWithParam<Road> {
protected:
    ControlTest() {
        ::setenv("QZIVI_SESSION_MANAGER",
                 GetParam() == Road::Managed ? QZIVI_TEST_SESSION_MANAGER : "none", 1);
    }
    bool Managed() const { return GetParam() == Road::Managed; }
    static bool Open(ViSession vi) {
        ViInt32 channels = 0;
        return IviFgen_GetAttributeViInt32(vi, "", IVI_ATTR_CHANNEL_COUNT, &channels) == VI_SUCCESS;
    }

    qzivi::test::StoreScope store_;
};

INSTANTIATE_TEST_SUITE_P(BothRoads, ControlTest, ::testing::Values(Road::Direct, Road::Managed),
                         [](const auto& info) {
                             return info.param == Road::Direct ? "Direct" : "Managed";
                         });

TEST_P(ControlTest, InitOpensTheSessionAndCloseSessionClosesIt) {
    Harness h;
    h.control->Init();
    EXPECT_TRUE(h.errors.empty()) << h.errors[0].description;
    EXPECT_EQ(h.initialized, 1);
    const auto vi = static_cast<ViSession>(h.control->SessionHandle());
    ASSERT_NE(vi, 0u);
    EXPECT_TRUE(Open(vi));
    EXPECT_EQ(h.control->GetLastIviError(), 0);
    h.control->CloseSession();
    EXPECT_EQ(h.control->SessionHandle(), 0);
    EXPECT_FALSE(Open(vi)) << "the driver session is gone";
}

TEST_P(ControlTest, CloseSessionWithoutASessionIsRefused) {
    Harness h;
    const auto raised = h.Raised([&] { h.control->CloseSession(); });
    ASSERT_TRUE(raised);
    EXPECT_EQ(raised->Number(), -31600);
    EXPECT_EQ(raised->Source(), "CloseSession");
    EXPECT_EQ(raised->Description(),
              "To access this property or method, you must first initialize the device by "
              "calling the Init method. (CloseSession)");
    EXPECT_EQ(h.errors, (std::vector<Reported>{{-31600, "CloseSession", raised->Description()}}));
}

TEST_P(ControlTest, ASecondInitOfTheSameNameDoesNothing) {
    Harness h;
    h.control->Init();
    const auto vi = h.control->SessionHandle();
    h.control->Init();
    EXPECT_EQ(h.initialized, 1);
    EXPECT_EQ(h.control->SessionHandle(), vi);
    h.control->Init(false, false, "", qziviCloseAndInit);
    EXPECT_EQ(h.initialized, 2) << "close and init opens again";
}

TEST_P(ControlTest, RaiseErrorOnAnOpenSessionRefusesAndCloses) {
    Harness h;
    h.control->Init();
    const auto vi = static_cast<ViSession>(h.control->SessionHandle());
    const auto raised = h.Raised([&] { h.control->Init(false, false, "", qziviRaiseError); });
    ASSERT_TRUE(raised);
    EXPECT_EQ(raised->Number(), -31612);
    EXPECT_EQ(raised->Description(), "The instrument session is already initialized. (Init)");
    EXPECT_EQ(h.control->SessionHandle(), 0) << "a failed Init leaves the session closed";
    EXPECT_FALSE(Open(vi));
}

TEST_P(ControlTest, ANewLogicalNameReopensWhateverTheBehaviour) {
    store_.UseStore("[Bench]\nmodule = builtin\n");
    Harness h;
    h.control->Init();
    h.control->LogicalName("Bench");
    ivi::TraceRecorder trace;
    h.control->Init(false, false, "", qziviRaiseError);
    EXPECT_TRUE(h.errors.empty());
    EXPECT_EQ(h.initialized, 2);
    const auto calls = trace.Functions();
    const auto closed = std::find(calls.begin(), calls.end(), "IviFgen_close");
    ASSERT_NE(closed, calls.end());
    EXPECT_NE(std::find(closed, calls.end(), "IviFgen_InitWithOptions"), calls.end())
        << "closed, then opened";
    ViChar name[64] = {};
    IviFgen_GetAttributeViString(static_cast<ViSession>(h.control->SessionHandle()), "",
                                 IVI_ATTR_LOGICAL_NAME, sizeof name, name);
    EXPECT_STREQ(name, "Bench");
}

TEST_P(ControlTest, AnEmptyLogicalNameMeansTheLastGoodOne) {
    Harness h;
    h.control->Init();
    h.control->CloseSession();
    h.control->LogicalName("");
    h.control->Init();
    EXPECT_TRUE(h.errors.empty());
    EXPECT_NE(h.control->SessionHandle(), 0) << "the last name survives CloseSession";

    Harness fresh;
    fresh.control->LogicalName("");
    const auto raised = fresh.Raised([&] { fresh.control->Init(); });
    ASSERT_TRUE(raised) << "with no last name the empty text goes to the driver";
    EXPECT_EQ(raised->Number(), Managed() ? -31614 : -30957);
    EXPECT_EQ(fresh.control->SessionHandle(), 0);
}

TEST_P(ControlTest, ADisabledControlOpensNothing) {
    Harness h;
    h.control->Enabled(false);
    h.control->Init();
    EXPECT_EQ(h.initialized, 0);
    EXPECT_TRUE(h.errors.empty());
    EXPECT_EQ(h.control->SessionHandle(), 0);
}

TEST_P(ControlTest, AnOlderClassSpecificationIsRefusedAndClosedAtOnce) {
    struct Case {
        const char* setup;
        bool accepted;
    };
    for (const auto& c :
         {Case{"ClassSpec=1", false}, Case{"ClassSpec=1; Prefix=vxFgen20; Version=1.5", true},
          Case{"ClassSpec=1; Prefix=vxFgen20; Version=2.71", true},
          Case{"ClassSpec=1; Prefix=vxFgen20; Version=1.10", false},
          Case{"ClassSpec=1; Prefix=vxFgen20; Version=0.9", false},
          Case{"ClassSpec=1; Prefix=vxfgen20; Version=1.5", false}, Case{"ClassSpec=2", true}}) {
        SCOPED_TRACE(c.setup);
        Harness h;
        ivi::TraceRecorder trace;
        const auto raised =
            h.Raised([&] { h.control->Init(false, false, std::string("DriverSetup=") + c.setup); });
        EXPECT_EQ(!raised, c.accepted);
        if (raised) {
            EXPECT_EQ(raised->Number(), -31610);
            EXPECT_EQ(raised->Description(),
                      "The IVI specific driver is not written to the proper version of the IVI "
                      "class specification. (Init)");
            EXPECT_EQ(h.control->SessionHandle(), 0);
            EXPECT_EQ(trace.Functions().back(), "IviFgen_close") << "closed again at once";
            EXPECT_EQ(h.initialized, 0);
        }
    }
}

TEST_P(ControlTest, TheOptionsReachTheDriver) {
    Harness h;
    ivi::TraceRecorder trace;
    h.control->Init(true, true, "Cache=1");
    const auto& records = trace.Records();
    const auto init = std::find_if(records.begin(), records.end(), [](const auto& r) {
        return r.function == "IviFgen_InitWithOptions";
    });
    ASSERT_NE(init, records.end());
    // Managed, they travel as "Reset=1,IDQuery=1,Cache=1" and the manager hands them on; direct,
    // as arguments with the option string unchanged. The driver sees the same either way.
    EXPECT_THAT(init->Line(),
                StartsWith("IviFgen_InitWithOptions(\"SampleFGen\", 1, 1, \"Cache=1\""));
}

TEST_P(ControlTest, ADriverThatWillNotOpenReachesTheHostByItsRoad) {
    Harness h;
    const auto raised = h.Raised(
        [&] { h.control->Init(false, false, "DriverSetup=Fail=InitWithOptions:0xBFFA0001"); });
    ASSERT_TRUE(raised);
    if (Managed()) {
        EXPECT_EQ(raised->Number(), -31619);
        EXPECT_EQ(raised->Description(),
                  "Session Manager: The session \"SampleFGen\" could not be opened.");
    } else {
        EXPECT_EQ(raised->Number(), -30701);
        EXPECT_THAT(raised->Description(), StartsWith("Instrument error detected."));
        EXPECT_THAT(raised->Description(), ::testing::EndsWith("[IVI Error Code:  BFFA0001]"));
        EXPECT_EQ(h.control->GetLastIviError(), -30701);
    }
    EXPECT_EQ(raised->Source(), "Init");
    EXPECT_EQ(h.errors.size(), 1u);
    EXPECT_EQ(h.control->SessionHandle(), 0);
    h.control->Init();
    EXPECT_EQ(h.initialized, 1) << "a failed open leaves the control ready for the next";
}

TEST_P(ControlTest, ExceptionOnErrorDecidesOnlyWhetherTheCallerSeesIt) {
    std::vector<Reported> reported[2];
    for (bool raise : {true, false}) {
        Harness h;
        h.control->ExceptionOnError(raise);
        const auto raised =
            h.Raised([&] { h.control->Init(false, false, "DriverSetup=ClassSpec=1"); });
        EXPECT_EQ(raised.has_value(), raise);
        EXPECT_EQ(h.control->SessionHandle(), 0);
        reported[raise] = h.errors;
    }
    EXPECT_EQ(reported[0], reported[1]);
    EXPECT_EQ(reported[0].size(), 1u);
}

TEST_P(ControlTest, ControlsOfOneLogicalNameShareTheSessionUnderTheManager) {
    Harness a, b;
    a.control->Init();
    b.control->Init();
    const auto vi = static_cast<ViSession>(a.control->SessionHandle());
    EXPECT_EQ(vi == static_cast<ViSession>(b.control->SessionHandle()), Managed());
    a.control->CloseSession();
    EXPECT_TRUE(Open(static_cast<ViSession>(b.control->SessionHandle())));
    EXPECT_EQ(Open(vi), Managed()) << "managed, the other control still holds it";
    b.control->CloseSession();
    EXPECT_FALSE(Open(vi));
}

TEST_P(ControlTest, TheEndOfTheControlClosesItsSession) {
    Harness h;
    h.control->Init();
    const auto vi = static_cast<ViSession>(h.control->SessionHandle());
    h.control.reset();
    EXPECT_FALSE(Open(vi));
}

// ---- The direct road only ---------------------------------------------------------------------

class DirectControlTest : public ::testing::Test {
protected:
    DirectControlTest() { ::setenv("QZIVI_SESSION_MANAGER", "none", 1); }
    qzivi::test::StoreScope store_;
};

TEST_F(DirectControlTest, AWarningFiresAndTheInitGoesOn) {
    Harness h;
    h.control->Init(false, false, "DriverSetup=Warn=InitWithOptions:0x3FFA4001");
    EXPECT_TRUE(h.errors.empty());
    ASSERT_EQ(h.warnings.size(), 1u);
    EXPECT_EQ(h.warnings[0].code, 31501);
    EXPECT_EQ(h.warnings[0].source, "Init");
    EXPECT_THAT(h.warnings[0].description, HasSubstr(" [IVI Warning Code:  3FFA4001]"));
    EXPECT_EQ(h.initialized, 1);
    EXPECT_EQ(h.control->GetLastIviError(), 31501);
}

TEST_F(DirectControlTest, ACallFromAnEventHandlerWhileBusyIsRefused) {
    Harness h;
    std::optional<Failure> inner;
    auto c =
        h.control->IviWarning.Connect([&](std::int32_t, const std::string&, const std::string&) {
            inner = h.Raised([&] { h.control->CloseSession(); });
        });
    h.control->Init(false, false, "DriverSetup=Warn=InitWithOptions");
    ASSERT_TRUE(inner);
    EXPECT_EQ(inner->Number(), -31602);
    EXPECT_EQ(inner->Description(),
              "There is currently another operation in progress. (CloseSession)");
    EXPECT_EQ(h.initialized, 1) << "the outer Init finished";
    EXPECT_NE(h.control->SessionHandle(), 0);
}

TEST_F(DirectControlTest, ErrorSourcesCarryTheHostsNameAndPutsReachTheHost) {
    Harness h;
    h.host.changed.clear();
    const auto raised = h.Raised([&] { h.control->UIStyle(3); });
    ASSERT_TRUE(raised);
    EXPECT_EQ(raised->Number(), -30002);
    EXPECT_EQ(raised->Source(), "UIStyle");
    EXPECT_EQ(raised->Description(),
              "An invalid argument has been passed to a property or method. (Fgen1.UIStyle)");
    h.control->OutputMode(1);
    h.control->ArbSampleRate(5e6);
    h.control->ExceptionOnError(true);
    EXPECT_EQ(h.host.changed,
              (std::vector<std::string>{"OutputMode", "ArbSampleRate", "ExceptionOnError"}));
    h.host.displayName = "Fgen2";
    h.control->AmbientChanged("DisplayName");
    EXPECT_EQ(h.control->DisplayName(), "Fgen2");
    EXPECT_EQ(h.control->Channels()->Path(), "Fgen2.Channels.");
    h.control->AboutBox();
    EXPECT_EQ(h.host.aboutBoxes, 1);
}

TEST_F(DirectControlTest, SavesAndLoadsThroughTheHostsBag) {
    Harness a;
    a.control->OutputMode(2);
    a.control->LogicalName("Bench");
    a.control->Internal()->AMInternalFrequency(440);
    PropertyBag bag;
    a.control->WriteProperties(bag);
    PropertyBag carried;
    carried.SetContents(bag.Contents());

    Harness b;
    b.control->ReadProperties(carried);
    EXPECT_EQ(b.control->OutputMode(), 2);
    EXPECT_EQ(b.control->LogicalName(), "Bench");
    EXPECT_EQ(b.control->Internal()->AMInternalFrequency(), 440);
}

TEST_F(DirectControlTest, BadBagsLeaveTheControlAsItWas) {
    Harness h;
    h.control->OutputMode(1);
    // A corrupt block is refused before anything is read: the host never gets to load it.
    PropertyBag bag;
    h.control->WriteProperties(bag);
    Bytes block = bag.Contents();
    block.resize(block.size() - 3);
    try {
        PropertyBag broken;
        broken.SetContents(block);
        h.control->ReadProperties(broken);
        FAIL() << "a cut block was taken";
    } catch (const Failure& f) {
        EXPECT_EQ(f.Number(), runtime::kImproperFile);
    }
    EXPECT_EQ(h.control->OutputMode(), 1);
    // A value of the wrong type stops the read at its key; the load still finishes.
    PropertyBag wrong;
    wrong.WriteText("ArbSampleRate", "fast", "");
    wrong.WriteInt32("OutputMode", 2, 0);
    h.host.displayName = "Loaded";
    h.control->ReadProperties(wrong);
    EXPECT_EQ(h.control->OutputMode(), 1);
    EXPECT_EQ(h.control->ArbSampleRate(), 1000);
    EXPECT_EQ(h.control->DisplayName(), "Loaded");
}

TEST_F(DirectControlTest, WithoutAHostTheControlStillWorks) {
    QZIviFgen control;
    control.InitProperties();
    control.Init();
    EXPECT_NE(control.SessionHandle(), 0);
    EXPECT_EQ(control.Channels()->Path(), "QZIviFgen.Channels.");
}

} // namespace
} // namespace qzivi
