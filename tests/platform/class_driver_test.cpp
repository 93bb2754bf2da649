// The class driver: logical names, driver modules built in and loaded, virtual channel names,
// sessions, and the errors that say what went wrong and where.
#include "test_support.h"

#include <gmock/gmock.h>

#include <filesystem>

using qzivi::test::LastError;
using qzivi::test::Session;
using qzivi::test::StoreScope;
using ::testing::HasSubstr;

namespace {

class ClassDriverTest : public ::testing::Test {
protected:
    StoreScope store_;
};

TEST_F(ClassDriverTest, SampleFGenOpensTheSimulatorWithNoStoreAnywhere) {
    ASSERT_FALSE(std::filesystem::exists(QZIVI_SYSCONFDIR_FOR_TESTS "/qzivi.conf"))
        << "this machine has a system store; the test needs none";
    Session s;
    ASSERT_EQ(s.OpenStatus(), VI_SUCCESS) << LastError(VI_NULL);
    EXPECT_EQ(s.Text(QZIVI_ATTR_DRIVER_MODULE), "builtin");
    Session lowerCase("", "samplefgen");
    EXPECT_EQ(lowerCase.OpenStatus(), VI_SUCCESS) << "logical names ignore case";
    EXPECT_NE(lowerCase.vi(), s.vi());
}

TEST_F(ClassDriverTest, VirtualChannelNamesReachTheDriverTranslated) {
    Session s;
    ASSERT_EQ(
        IviFgen_ConfigureStandardWaveform(s.vi(), "Channel2", IVIFGEN_VAL_WFM_SQUARE, 3, 0, 5e3, 0),
        VI_SUCCESS);
    ViInt32 waveform = 0;
    ASSERT_EQ(IviFgen_GetAttributeViInt32(s.vi(), "2", IVIFGEN_ATTR_FUNC_WAVEFORM, &waveform),
              VI_SUCCESS);
    EXPECT_EQ(waveform, IVIFGEN_VAL_WFM_SQUARE);
    ASSERT_EQ(
        IviFgen_GetAttributeViInt32(s.vi(), "Channel1", IVIFGEN_ATTR_FUNC_WAVEFORM, &waveform),
        VI_SUCCESS);
    EXPECT_EQ(waveform, IVIFGEN_VAL_WFM_SINE);

    // The engine's range query on the specific session knows the virtual names too.
    ViSession specific = 0;
    ASSERT_EQ(IviFgen_GetSpecificDriverCHandle(s.vi(), &specific), VI_SUCCESS);
    EXPECT_NE(specific, s.vi());
    ViReal64 lo = 0, hi = 0;
    ViBoolean hasLo = 0, hasHi = 0;
    ASSERT_EQ(Ivi_GetAttrMinMaxViReal64(specific, "Channel2", IVIFGEN_ATTR_FUNC_FREQUENCY, &lo, &hi,
                                        &hasLo, &hasHi),
              VI_SUCCESS);
    EXPECT_DOUBLE_EQ(hi, 25e6) << "the square wave's limit, so channel 2 was asked";
}

TEST_F(ClassDriverTest, UnknownLogicalNameSaysWhichAndWhere) {
    const std::string path = store_.UseStore("[Bench]\nmodule = builtin\n");
    ViSession vi = 99;
    EXPECT_EQ(IviFgen_InitWithOptions("NoSuchFgen", VI_FALSE, VI_FALSE, "", &vi),
              IVI_ERROR_LOGICAL_NAME_NOT_FOUND);
    EXPECT_EQ(vi, 0u);
    const std::string why = LastError(VI_NULL);
    EXPECT_THAT(why, HasSubstr("\"NoSuchFgen\""));
    EXPECT_THAT(why, HasSubstr(path));
    EXPECT_THAT(why, HasSubstr("Bench, SampleFGen"));
    ViChar elaboration[512] = {};
    IviFgen_InitWithOptions("", VI_FALSE, VI_FALSE, "", &vi);
    ASSERT_EQ(IviFgen_GetAttributeViString(VI_NULL, "", IVI_ATTR_ERROR_ELABORATION,
                                           sizeof elaboration, elaboration),
              VI_SUCCESS);
    EXPECT_THAT(elaboration, HasSubstr("logical name \"\""));
    ViChar message[256] = {};
    ASSERT_EQ(IviFgen_error_message(VI_NULL, IVI_ERROR_LOGICAL_NAME_NOT_FOUND, message),
              VI_SUCCESS);
    EXPECT_STREQ(message, "The logical name is not in the configuration store.");
}

TEST_F(ClassDriverTest, ClosedAndForeignSessionsAreRefused) {
    ViSession vi = 0;
    ASSERT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "", &vi), VI_SUCCESS);
    EXPECT_EQ(IviFgen_close(vi), VI_SUCCESS);
    EXPECT_EQ(IviFgen_close(vi), IVI_ERROR_INVALID_SESSION_HANDLE);
    EXPECT_EQ(IviFgen_ConfigureOutputMode(vi, 0), IVI_ERROR_INVALID_SESSION_HANDLE);
    EXPECT_EQ(IviFgen_InitiateGeneration(0x5100), IVI_ERROR_INVALID_SESSION_HANDLE)
        << "a specific session is no class one";
    EXPECT_THAT(LastError(VI_NULL), HasSubstr("not an open IviFgen session"));
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "", nullptr),
              IVI_ERROR_NULL_POINTER);
}

TEST_F(ClassDriverTest, ErrorMessagesNameTheStatus) {
    ViChar message[256] = {};
    ASSERT_EQ(IviFgen_error_message(VI_NULL, IVI_ERROR_FUNCTION_NOT_SUPPORTED, message),
              VI_SUCCESS);
    EXPECT_STREQ(message, "Function or method not supported.");
    ASSERT_EQ(IviFgen_error_message(VI_NULL, IVI_STATUS_CODE(0xBFFAFFFEu), message), VI_SUCCESS);
    EXPECT_STREQ(message, "Unknown error, status 0xBFFAFFFE.");
    EXPECT_EQ(IviFgen_error_message(VI_NULL, 0, nullptr), IVI_ERROR_NULL_POINTER);
}

TEST_F(ClassDriverTest, StoreOptionsGoFirstAndTheCallersWin) {
    store_.UseStore("[Old]\nmodule = builtin\noptions = Cache=1, DriverSetup=ClassSpec=1\n");
    Session storeOnly("", "Old");
    EXPECT_EQ(storeOnly.Int(IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION), 1);
    Session overridden("DriverSetup=ClassSpec=4", "Old");
    EXPECT_EQ(overridden.Int(IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION), 4);
    ViChar setup[256] = {};
    ASSERT_EQ(IviFgen_GetAttributeViString(overridden.vi(), "", IVI_ATTR_DRIVER_SETUP, sizeof setup,
                                           setup),
              VI_SUCCESS);
    EXPECT_STREQ(setup, "ClassSpec=4");
}

TEST_F(ClassDriverTest, ListsTheLogicalNamesOfTheStore) {
    store_.UseStore("[Bench]\nmodule = builtin\n[Rack2]\nmodule = builtin\n");
    ViInt32 list = 0, count = 0;
    ASSERT_EQ(Ivi_GetLogicalNamesList(&list, &count), VI_SUCCESS);
    ASSERT_EQ(count, 3);
    std::vector<std::string> names;
    for (ViInt32 i = 1; i <= count; ++i) {
        ViChar name[512] = {};
        ViBoolean found = VI_FALSE;
        ASSERT_EQ(Ivi_GetNthLogicalName(list, i, name, sizeof name, &found), VI_SUCCESS);
        EXPECT_EQ(found, VI_TRUE);
        names.emplace_back(name);
    }
    EXPECT_EQ(names, (std::vector<std::string>{"Bench", "Rack2", "SampleFGen"}));
    ViChar name[512] = {};
    ViBoolean found = VI_TRUE;
    EXPECT_EQ(Ivi_GetNthLogicalName(list, 4, name, sizeof name, &found), VI_SUCCESS);
    EXPECT_EQ(found, VI_FALSE);
    EXPECT_EQ(Ivi_DisposeLogicalNamesList(list), VI_SUCCESS);
    EXPECT_EQ(Ivi_DisposeLogicalNamesList(list), IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(Ivi_GetNthLogicalName(list, 1, name, sizeof name, &found), IVI_ERROR_INVALID_VALUE);
}

// ---- Driver modules loaded from files
// ------------------------------------------------------------

TEST_F(ClassDriverTest, AStoreThatNamesTheModuleRunsTheSessionThroughIt) {
    store_.UseStore(
        std::string("[LabFgen]\nmodule = ") + QZIVI_TEST_SIM_MODULE +
        "\nprefix = QZSimFgen\nresource = SIM::LAB\nchannel Out1 = 1\nchannel Out2 = 2\n");
    Session s("", "LabFgen");
    ASSERT_EQ(s.OpenStatus(), VI_SUCCESS) << LastError(VI_NULL);
    EXPECT_EQ(s.Text(QZIVI_ATTR_DRIVER_MODULE), QZIVI_TEST_SIM_MODULE);
    EXPECT_EQ(s.Text(IVI_ATTR_IO_RESOURCE_DESCRIPTOR), "SIM::LAB");
    ViSession specific = 0;
    ASSERT_EQ(IviFgen_GetSpecificDriverCHandle(s.vi(), &specific), VI_SUCCESS);
    EXPECT_GE(specific, 0x6100u)
        << "the loaded module counts its sessions apart from the built-in one";
    ASSERT_EQ(IviFgen_ConfigureStandardWaveform(s.vi(), "Out2", IVIFGEN_VAL_WFM_SINE, 2, 0, 1e3, 0),
              VI_SUCCESS);
    ASSERT_EQ(IviFgen_ConfigureOutputEnabled(s.vi(), "Out2", VI_TRUE), VI_SUCCESS);
    ASSERT_EQ(IviFgen_InitiateGeneration(s.vi()), VI_SUCCESS);
    ViReal64 peak = 0;
    ASSERT_EQ(QZIvi_RenderOutput(s.vi(), "Out2", 0.25e-3, 0, 1, &peak), VI_SUCCESS);
    EXPECT_DOUBLE_EQ(peak, 1.0);
    EXPECT_EQ(IviFgen_ConfigureOutputEnabled(s.vi(), "Channel1", VI_TRUE),
              IVI_ERROR_UNKNOWN_CHANNEL_NAME)
        << "this logical name maps other virtual names";
}

TEST_F(ClassDriverTest, AMissingModuleFileIsNamed) {
    store_.UseStore("[Gone]\nmodule = drivers/libgone.so\nprefix = Gone\n");
    ViSession vi = 0;
    EXPECT_EQ(IviFgen_InitWithOptions("Gone", VI_FALSE, VI_FALSE, "", &vi),
              IVI_ERROR_CANNOT_LOAD_MODULE);
    const std::string why = LastError(VI_NULL);
    EXPECT_THAT(why, HasSubstr((store_.Dir() / "drivers/libgone.so").string()))
        << "relative to the store's folder";
    EXPECT_THAT(why, HasSubstr("\"Gone\""));
}

TEST_F(ClassDriverTest, AModuleWithoutTheRequiredFunctionsIsRefused) {
    store_.UseStore(std::string("[Wrong]\nmodule = ") + QZIVI_TEST_PARTIAL_MODULE +
                    "\nprefix = Nope\n");
    ViSession vi = 0;
    EXPECT_EQ(IviFgen_InitWithOptions("Wrong", VI_FALSE, VI_FALSE, "", &vi),
              IVI_ERROR_MODULE_FUNCTION_MISSING);
    EXPECT_THAT(LastError(VI_NULL), HasSubstr("Nope_InitWithOptions"));
}

TEST_F(ClassDriverTest, AFunctionTheModuleLacksIsNotSupported) {
    store_.UseStore(std::string("[Partial]\nmodule = ") + QZIVI_TEST_PARTIAL_MODULE +
                    "\nprefix = Partial\n");
    Session s("", "Partial");
    ASSERT_EQ(s.OpenStatus(), VI_SUCCESS) << LastError(VI_NULL);
    EXPECT_EQ(IviFgen_ConfigureOutputMode(s.vi(), 0), VI_SUCCESS);
    EXPECT_EQ(IviFgen_ConfigureStandardWaveform(s.vi(), "Channel1", 1, 1, 0, 1e3, 0),
              IVI_ERROR_FUNCTION_NOT_SUPPORTED);
    EXPECT_THAT(s.Elaboration(), HasSubstr("Partial_ConfigureStandardWaveform"));
    EXPECT_THAT(LastError(s.vi()), HasSubstr("Function or method not supported."));
}

// A module runs inside the caller: it is loaded only when no one but its owner (or root) can have
// put it there, the whole way down its path.
TEST_F(ClassDriverTest, AModuleOthersCanReachIsNeverLoaded) {
    namespace fs = std::filesystem;
    const auto place = [&](const std::string& folder, fs::perms folderMode, fs::perms fileMode) {
        fs::create_directories(store_.Dir() / folder);
        const auto copy = store_.Dir() / folder / "libfgen.so";
        fs::copy_file(QZIVI_TEST_SIM_MODULE, copy, fs::copy_options::overwrite_existing);
        fs::permissions(copy, fileMode);
        fs::permissions(store_.Dir() / folder, folderMode);
    };
    place("shared", fs::perms(0755), fs::perms(0666));
    place("open", fs::perms(0777), fs::perms(0644));
    place("sticky", fs::perms(01777), fs::perms(0644));
    const struct {
        std::string module;
        ViStatus status;
        std::string why;
    } cases[] = {
        {"shared/libfgen.so", IVI_ERROR_FILE_NOT_SECURE, "it can be written by any user"},
        {"open/libfgen.so", IVI_ERROR_FILE_NOT_SECURE, "/open\" can be written by any user"},
        {"sticky/../shared/libfgen.so", IVI_ERROR_FILE_NOT_SECURE, "(\"..\")"},
        {"sticky/libfgen.so", VI_SUCCESS, ""}, // a sticky folder, as /tmp, holding the user's own
    };
    for (const auto& c : cases) {
        store_.UseStore("[Lab]\nmodule = " + c.module + "\nprefix = QZSimFgen\n");
        ViSession vi = 0;
        EXPECT_EQ(IviFgen_InitWithOptions("Lab", VI_FALSE, VI_FALSE, "", &vi), c.status)
            << c.module;
        if (c.status == VI_SUCCESS) {
            EXPECT_EQ(IviFgen_close(vi), VI_SUCCESS);
            continue;
        }
        const std::string told = LastError(VI_NULL);
        EXPECT_THAT(told, HasSubstr((store_.Dir() / c.module).string()));
        EXPECT_THAT(told, HasSubstr(c.why));
    }
    for (const char* folder : {"open", "sticky"})
        fs::permissions(store_.Dir() / folder, fs::perms(0755));
}

} // namespace

namespace {

// A text buffer that cannot take the text is refused, never answered with success, and an error
// waiting to be read stays until a buffer can take it.
TEST(ClassDriverBuffers, NegativeSizesAndNullBuffersAreRefused) {
    qzivi::test::StoreScope scope;
    qzivi::test::Session s;
    const ViSession vi = s.vi();
    ViChar text[64] = {};
    EXPECT_EQ(IviFgen_GetAttributeViString(vi, "", IVI_ATTR_SPECIFIC_DRIVER_PREFIX, -1, text),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_GetAttributeViString(vi, "", IVI_ATTR_LOGICAL_NAME, -5, text),
              IVI_ERROR_INVALID_VALUE);
    EXPECT_EQ(IviFgen_GetAttributeViString(vi, "", IVI_ATTR_SPECIFIC_DRIVER_PREFIX, 10, nullptr),
              IVI_ERROR_NULL_POINTER);
    ViInt32 list = 0, count = 0;
    ASSERT_EQ(Ivi_GetLogicalNamesList(&list, &count), VI_SUCCESS);
    ViBoolean found = VI_FALSE;
    EXPECT_EQ(Ivi_GetNthLogicalName(list, 1, nullptr, 16, &found), IVI_ERROR_NULL_POINTER);
    Ivi_DisposeLogicalNamesList(list);

    ASSERT_LT(IviFgen_ConfigureOutputImpedance(vi, "Channel9", 50), 0);
    ViStatus code = 0;
    EXPECT_EQ(IviFgen_GetError(vi, &code, 64, nullptr), IVI_ERROR_NULL_POINTER);
    EXPECT_EQ(IviFgen_GetError(vi, &code, -1, text), IVI_ERROR_INVALID_VALUE);
    ViChar whole[512] = {};
    EXPECT_EQ(IviFgen_GetError(vi, &code, sizeof whole, whole), VI_SUCCESS);
    EXPECT_EQ(code, IVI_ERROR_UNKNOWN_CHANNEL_NAME) << "the error stayed to be read";
}

} // namespace
