// The error path: statuses mapped to codes, descriptions, the check of a driver status, the fixed
// failures, and the boundary that fires events and decides what reaches the caller.
#include "../platform/test_support.h"
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/support/failure.h"

#include <gmock/gmock.h>

namespace qzivi {
namespace {

using ::testing::HasSubstr;

struct Fired {
    std::string event;
    std::int32_t code;
    std::string source;
    std::string description;
};

class ErrorPathTest : public ::testing::Test {
protected:
    ErrorPathTest() {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        err_ = std::make_shared<CIviErrorReport>();
        for (auto* event : {&err_->AllError, &err_->Error, &err_->Warning}) {
            const std::string name = event == &err_->AllError ? "AllError"
                                     : event == &err_->Error  ? "Error"
                                                              : "Warning";
            connections_.push_back(
                event->Connect([this, name](std::int32_t code, const std::string& source,
                                            const std::string& text) {
                    fired_.push_back({name, code, source, text});
                }));
        }
    }

    // Runs `body` inside a guarded frame ending in HandleError, as a public member does.
    std::optional<Failure> Boundary(const std::string& source, std::int32_t mode,
                                    const std::function<void()>& body) {
        try {
            try {
                body();
            } catch (...) {
                HandleError(source, mode, err_.get());
            }
        } catch (const Failure& f) {
            return f;
        }
        return std::nullopt;
    }

    qzivi::test::StoreScope store_;
    std::shared_ptr<CIviErrorReport> err_;
    std::vector<Connection> connections_;
    std::vector<Fired> fired_;
};

TEST(MapIviError, TurnsStatusesIntoCodesByRange) {
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0xBFFA0011u)), -30717);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0xBFFA1FFFu)), -30700 - 0xFFF);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0xBFFA2004u)), -31004);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0xBFFA4001u)), -31501);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0xBFFC0102u)), -30900 - 0x102);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0xBFFF0015u)), -30521);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0x3FFA0065u)), 30801);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0x3FFA2001u)), 31001);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0x3FFA4001u)), 31501);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0x3FFC0001u)), 30901);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0x3FFF0085u)), 30633);
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0x3FFF0080u)), 31629);
    EXPECT_EQ(CIviErrorReport::MapIviError(-1), -1) << "outside every range it maps to itself";
    EXPECT_EQ(CIviErrorReport::MapIviError(IVI_STATUS_CODE(0xBFFA7000u)),
              IVI_STATUS_CODE(0xBFFA7000u));
}

TEST_F(ErrorPathTest, AnErrorStatusRaisesWithTheDriversTextAndItsHexCode) {
    qzivi::test::Session s;
    err_->hSession(s.vi());
    IviFgen_ConfigureOutputImpedance(s.vi(), "Channel1", -5); // leaves an elaboration behind
    try {
        err_->IviCheckError(IVI_ERROR_INVALID_VALUE,
                            "Fgen1.Channels.Item(\"Channel1\").OutputImpedance", 0, "Channel1");
        FAIL();
    } catch (const Failure& f) {
        EXPECT_EQ(f.Number(), -30716);
        EXPECT_EQ(f.Source(), "Fgen1.Channels.Item(\"Channel1\").OutputImpedance");
        EXPECT_THAT(f.Description(),
                    ::testing::StartsWith("(Channel1) Invalid value for parameter or property. "));
        EXPECT_THAT(f.Description(), HasSubstr("IVIFGEN_ATTR_OUTPUT_IMPEDANCE"));
        EXPECT_THAT(f.Description(), ::testing::EndsWith(" [IVI Error Code:  BFFA0010]"));
        EXPECT_EQ(f.HelpFile(), "");
    }
    EXPECT_EQ(err_->GetLastIviError(), -30716);
    EXPECT_TRUE(fired_.empty()) << "raising is the boundary's business, not the check's";
    err_->hSession(0);
}

TEST_F(ErrorPathTest, AWarningFiresAndWorkGoesOn) {
    EXPECT_EQ(err_->IviCheckError(IVI_WARN_VALUE_COERCED, "Configure", 0, ""),
              IVI_WARN_VALUE_COERCED);
    ASSERT_EQ(fired_.size(), 1u);
    EXPECT_EQ(fired_[0].event, "Warning");
    EXPECT_EQ(fired_[0].code, 31501);
    EXPECT_THAT(fired_[0].description, ::testing::EndsWith(" [IVI Warning Code:  3FFA4001]"));
    EXPECT_EQ(err_->GetLastIviError(), 31501);
}

TEST_F(ErrorPathTest, UnknownStatusesLookOnlyAndEmptySourcesRemember) {
    EXPECT_EQ(err_->IviCheckError(-1, "Init", 0, ""), -1);
    EXPECT_EQ(err_->GetLastIviError(), -1);
    EXPECT_EQ(err_->IviCheckError(IVI_ERROR_INVALID_VALUE, "Configure", 8, ""),
              IVI_ERROR_INVALID_VALUE)
        << "flags 8 only look";
    EXPECT_EQ(err_->GetLastIviError(), -30716);
    EXPECT_TRUE(fired_.empty());
    EXPECT_EQ(err_->IviCheckError(IVI_WARN_NSUP_RESET, "", 0, ""), IVI_WARN_NSUP_RESET);
    ASSERT_EQ(fired_.size(), 1u);
    EXPECT_EQ(fired_[0].source, "Configure") << "the last source given";
    EXPECT_EQ(err_->IviCheckError(0, "Init", 0, ""), 0);
    EXPECT_EQ(err_->GetLastIviError(), 0);
}

TEST_F(ErrorPathTest, DoStdErrorAlwaysRaisesTheTableText) {
    try {
        err_->DoStdError(-31612, "Fgen1.Init");
    } catch (const Failure& f) {
        EXPECT_EQ(f.Number(), -31612);
        EXPECT_EQ(f.Description(), "The instrument session is already initialized. (Fgen1.Init)");
    }
    try {
        err_->DoStdError(-31617, "Configure", IVI_ERROR_UNKNOWN_CHANNEL_NAME, "Channel9");
    } catch (const Failure& f) {
        EXPECT_THAT(f.Description(),
                    ::testing::StartsWith("Channel name specified is not valid for the instrument. "
                                          "(Configure)  (Channel9) Unknown channel name."));
    }
    EXPECT_EQ(err_->GetLastIviError(), 0) << "DoStdError leaves the last IVI error alone";
}

TEST_F(ErrorPathTest, TheBoundaryFiresThenRaisesOnlyInModeMinusOne) {
    for (std::int32_t mode : {-1, 0}) {
        fired_.clear();
        const auto raised =
            Boundary("Initiate", mode, [&] { err_->DoStdError(-31601, "Fgen1.Initiate"); });
        ASSERT_EQ(fired_.size(), 2u);
        EXPECT_EQ(fired_[0].event, "AllError");
        EXPECT_EQ(fired_[1].event, "Error");
        EXPECT_EQ(fired_[1].code, -31601);
        EXPECT_EQ(fired_[1].source, "Initiate");
        EXPECT_EQ(err_->LastErrorNumber(), -31601);
        EXPECT_EQ(err_->LastErrorSource(), "Initiate");
        EXPECT_EQ(raised.has_value(), mode == -1);
        if (raised) {
            EXPECT_EQ(raised->Number(), -31601);
            EXPECT_EQ(raised->HelpFile(), "qzivi.chm");
            EXPECT_EQ(raised->HelpContext(), 200);
            EXPECT_EQ(raised->Description(), fired_[1].description);
        }
    }
}

TEST_F(ErrorPathTest, RuntimeFailuresMapToTheirIdsAndKeepTheirText) {
    struct Case {
        std::int32_t number;
        std::int32_t id;
    };
    for (auto [number, id] :
         {Case{13, 30003},    Case{6, 30006},     Case{7, 30007},      Case{14, 30007},
          Case{28, 30007},    Case{9, 31611},     Case{11, 30004},     Case{48, 31605},
          Case{453, 31605},   Case{53, 31606},    Case{52, 31607},     Case{76, 31607},
          Case{382, 31608},   Case{393, 31608},   Case{60040, 31609},  Case{60041, 31607},
          Case{60042, 31615}, Case{17304, 31614}, Case{-31612, 31612}, Case{12345, 30000},
          Case{77, 30000}}) {
        PendingFailure failure{number, "src", "its own text", {}, 0};
        EXPECT_EQ(MapRuntimeError(failure), id) << number;
        EXPECT_EQ(failure.description, "its own text");
    }
    const auto raised = Boundary("", -1, [] { RaiseRuntime(12345, "Something of its own."); });
    ASSERT_TRUE(raised);
    EXPECT_EQ(raised->Number(), -30000);
    EXPECT_EQ(raised->Source(), "QZIviFgen") << "an empty source becomes the control's name";
    EXPECT_EQ(raised->Description(), "Something of its own.");
    const auto vector = Boundary("Item", -1, [] { (void)std::vector<int>().at(3); });
    EXPECT_EQ(vector->Number(), -31611);
}

TEST_F(ErrorPathTest, AMissingExtensionNamesItsWords) {
    const auto raised =
        Boundary("Configure", -1, [] { throw Failure(-30717, "Burst, ModulateAM", "whatever"); });
    ASSERT_TRUE(raised);
    EXPECT_EQ(raised->Number(), -30717);
    EXPECT_EQ(raised->Description(),
              "Extension capability not supported by instrument driver.  (Burst, ModulateAM)");
}

TEST_F(ErrorPathTest, AFailingHandlerSendsTheBoundaryToItsFallback) {
    auto broken = err_->Error.Connect([](std::int32_t, const std::string&, const std::string&) {
        throw std::runtime_error("the handler broke");
    });
    for (std::int32_t mode : {-1, 0}) {
        const auto raised = Boundary("Init", mode, [&] { err_->DoStdError(-31600, "Init"); });
        ASSERT_TRUE(raised) << "the fallback raises in every mode";
        EXPECT_EQ(static_cast<std::uint32_t>(raised->Number()), 0x80047530u);
        EXPECT_EQ(raised->HelpFile(), "qzivi.chm");
        EXPECT_EQ(raised->HelpContext(), 200);
        EXPECT_THAT(raised->Description(), HasSubstr("you must first initialize"));
    }
}

TEST_F(ErrorPathTest, ModeOneShowsOneMessageBoxAndRaisesNothing) {
    std::vector<MessageBoxRequest> boxes;
    std::optional<Failure> raised;
    {
        const MessageBoxScope scope([&](const MessageBoxRequest& r) { boxes.push_back(r); });
        raised = Boundary("PChannels", 1, [&] { err_->DoStdError(-31624, "Item"); });
    }
    EXPECT_FALSE(raised);
    ASSERT_EQ(boxes.size(), 1u);
    EXPECT_EQ(boxes[0].title, "PChannels");
    EXPECT_EQ(boxes[0].text,
              "An error has occurred.\n\nError 31624:  The specified channel does not exist in the "
              "current collection. (Item)");
    EXPECT_EQ(boxes[0].helpFile, "qzivi.chm");
    EXPECT_EQ(boxes[0].helpContext, 31624);
}

TEST(FirstLine, CutsAtTheFirstLineBreakUnlessItLeads) {
    EXPECT_EQ(FirstLine("one\r\ntwo"), "one");
    EXPECT_EQ(FirstLine("one\ntwo"), "one");
    EXPECT_EQ(FirstLine("\none"), "\none");
    EXPECT_EQ(FirstLine("single"), "single");
}

TEST(CheckForValidState, RefusesByThePresentState) {
    ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
    CIviErrorReport err;
    std::vector<std::pair<std::int32_t, std::int32_t>> changes;
    auto c = err.StateChanged.Connect(
        [&](std::int32_t now, std::int32_t before) { changes.emplace_back(now, before); });
    std::int32_t result = 0;
    auto refusal = [&](std::int32_t mask) -> std::int32_t {
        try {
            result = err.CheckForValidState(mask, "Fgen1.Initiate", true);
        } catch (const Failure& f) {
            return f.Number();
        }
        return 0;
    };
    EXPECT_EQ(refusal(-5), -31600);
    err.state(IviStateInitialized);
    EXPECT_EQ(refusal(-5), -31601);
    err.state(IviStateConfigured);
    EXPECT_EQ(refusal(-5), 0);
    EXPECT_EQ(result, IviStateConfigured);
    EXPECT_EQ(err.state(), IviStateBusy);
    EXPECT_EQ(refusal(9), -31602);
    EXPECT_EQ(changes.back(),
              (std::pair<std::int32_t, std::int32_t>{IviStateBusy, IviStateConfigured}));
}

TEST(BuildOptionString, PutsResetAndIDQueryFirst) {
    EXPECT_EQ(CIviErrorReport::BuildOptionString(true, false, ""), "Reset=1,IDQuery=0");
    EXPECT_EQ(CIviErrorReport::BuildOptionString(false, true, "Simulate=1"),
              "Reset=0,IDQuery=1,Simulate=1");
}

} // namespace
} // namespace qzivi
