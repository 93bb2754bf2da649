// The configuration store: its text, its search order, and its refusals.
#include "qzivi/config_store.h"
#include "qzivi/ivi_common.h"
#include "qzivi/trace.h"
#include "test_support.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <fstream>
#include <sys/stat.h>

using qzivi::ivi::ConfigStore;
using qzivi::ivi::EditableConfigStoreFile;
using qzivi::ivi::FindConfigStoreFile;
using qzivi::ivi::LoadConfigStore;
using qzivi::ivi::ParseConfigStore;
using qzivi::ivi::StatusError;
using qzivi::test::LastError;
using qzivi::test::StoreScope;
using ::testing::HasSubstr;

namespace {

// The status and message a store text is refused with.
std::pair<ViStatus, std::string> Refusal(const std::string& text) {
    try {
        ParseConfigStore(text, "/etc/qzivi/qzivi.conf");
    } catch (const StatusError& e) {
        return {e.Status(), e.what()};
    }
    return {0, ""};
}

TEST(ConfigStoreText, ReadsSessionsVirtualNamesAndTrace) {
    const ConfigStore store = ParseConfigStore("# bench set-up\n"
                                               "trace = /tmp/io.log\n"
                                               "\n"
                                               "[Bench]\n"
                                               "  module = drivers/libfgen.so   \n"
                                               "prefix = Acme\n"
                                               "resource = TCPIP::10.0.0.7::INSTR\n"
                                               "options = Simulate=0, DriverSetup=Model=33522\n"
                                               "; the front connectors\n"
                                               "channel Out A = 1\n"
                                               "channel Out B = 2\n",
                                               "/home/me/.config/qzivi/qzivi.conf");
    EXPECT_EQ(store.traceFile, "/tmp/io.log");
    const auto* bench = store.Find("BENCH");
    ASSERT_NE(bench, nullptr);
    EXPECT_EQ(bench->module, "drivers/libfgen.so");
    EXPECT_EQ(bench->prefix, "Acme");
    EXPECT_EQ(bench->resource, "TCPIP::10.0.0.7::INSTR");
    EXPECT_EQ(bench->options, "Simulate=0, DriverSetup=Model=33522");
    using Names = std::vector<std::pair<std::string, std::string>>;
    EXPECT_EQ(bench->virtualNames, (Names{{"Out A", "1"}, {"Out B", "2"}}));
    const auto* sample = store.Find("SampleFGen");
    ASSERT_NE(sample, nullptr) << "the embedded default is always there";
    EXPECT_EQ(sample->module, "builtin");
    EXPECT_EQ(sample->virtualNames, (Names{{"Channel1", "1"}, {"Channel2", "2"}}));
}

TEST(ConfigStoreText, AFileMayRedefineSampleFGen) {
    const ConfigStore store =
        ParseConfigStore("[SampleFGen]\nmodule = builtin\noptions = DriverSetup=NoRanges=1\n", "x");
    ASSERT_EQ(store.sessions.size(), 1u);
    EXPECT_EQ(store.sessions[0].options, "DriverSetup=NoRanges=1");
    EXPECT_TRUE(store.sessions[0].virtualNames.empty());
}

TEST(ConfigStoreText, MistakesNameTheFileAndTheLine) {
    struct Case {
        const char* text;
        const char* says;
    };
    const Case cases[] = {
        {"[A]\nmodule = builtin\ncolour = red\n", "line 3: unknown key \"colour\""},
        {"[A\nmodule = builtin\n", "line 1: a section header must end with ']'"},
        {"module = builtin\n", "line 1: \"module\" must stand inside a [LogicalName] section"},
        {"[A]\nmodule = builtin\n[a]\nmodule = builtin\n",
         "line 3: the logical name \"a\" is defined twice"},
        {"[A]\nmodule builtin\n", "line 2: expected \"key = value\""},
        {"[A]\nmodule = builtin\nchannel X =\n", "line 3: a channel line"},
        {"[A]\nmodule = builtin\nchannel X = 1\nchannel X = 2\n",
         "line 4: the channel name \"X\" is mapped twice"},
        {"[]\n", "line 1: the logical name in brackets is empty"},
        {"[A]\nprefix = Acme\n", "logical name \"A\" has no module"},
        {"[A]\nmodule = libacme.so\n", "names a module file but no prefix"},
    };
    for (const auto& c : cases) {
        const auto [status, message] = Refusal(c.text);
        EXPECT_EQ(status, IVI_ERROR_CONFIG_STORE_INVALID) << c.text;
        EXPECT_THAT(message, HasSubstr("/etc/qzivi/qzivi.conf")) << c.text;
        EXPECT_THAT(message, HasSubstr(c.says)) << c.text;
    }
}

TEST(ConfigStoreSearch, TheNamedFileComesBeforeTheUsersFolder) {
    StoreScope scope;
    const std::string user = scope.Write("qzivi/qzivi.conf", "[UserFgen]\nmodule = builtin\n");
    EXPECT_EQ(qzivi::ivi::FindConfigStoreFile(), user);
    EXPECT_NE(LoadConfigStore().Find("UserFgen"), nullptr);
    const std::string named = scope.UseStore("[NamedFgen]\nmodule = builtin\n", "named.conf");
    EXPECT_EQ(qzivi::ivi::FindConfigStoreFile(), named);
    const ConfigStore store = LoadConfigStore();
    EXPECT_EQ(store.path, named);
    EXPECT_NE(store.Find("NamedFgen"), nullptr);
    EXPECT_EQ(store.Find("UserFgen"), nullptr) << "only the first file found is read";
}

TEST(ConfigStoreSearch, ANamedFileThatIsMissingIsAnError) {
    StoreScope scope;
    ::setenv("QZIVI_CONFIG_STORE", (scope.Dir() / "absent.conf").c_str(), 1);
    ViSession vi = 0;
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "", &vi),
              IVI_ERROR_CANNOT_OPEN_FILE);
    EXPECT_THAT(LastError(VI_NULL), HasSubstr("absent.conf"));
}

TEST(ConfigStoreSearch, AStoreOthersCanWriteIsRefused) {
    StoreScope scope;
    const std::string path = scope.UseStore("[Bench]\nmodule = builtin\n");
    std::filesystem::permissions(path, std::filesystem::perms(0646));
    ViSession vi = 0;
    EXPECT_EQ(IviFgen_InitWithOptions("Bench", VI_FALSE, VI_FALSE, "", &vi),
              IVI_ERROR_FILE_NOT_SECURE);
    const std::string why = LastError(VI_NULL);
    EXPECT_THAT(why, HasSubstr(path));
    EXPECT_THAT(why, HasSubstr("chmod o-w"));
    EXPECT_EQ(vi, 0u);
}

TEST(ConfigStoreSearch, AMalformedStoreStopsTheOpenWithItsLine) {
    StoreScope scope;
    scope.UseStore("[Bench]\nmodule = builtin\nwhat is this\n");
    ViSession vi = 0;
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "", &vi),
              IVI_ERROR_CONFIG_STORE_INVALID);
    EXPECT_THAT(LastError(VI_NULL), HasSubstr("line 3"));
}

} // namespace

// The configuration tool's file: the store in use, or a new one at the user's place that reads as
// the embedded default alone and shows it as an example.
TEST(ConfigStoreFile, TheEditableStoreIsTheOneInUseOrANewCommentedOne) {
    StoreScope scope;
    const std::string made = EditableConfigStoreFile();
    EXPECT_EQ(made, (scope.Dir() / "qzivi" / "qzivi.conf").string());
    EXPECT_EQ(FindConfigStoreFile(), made) << "found from now on";
    const ConfigStore store = LoadConfigStore(); // not refused as writable by others
    ASSERT_EQ(store.sessions.size(), 1u);
    EXPECT_EQ(store.sessions[0].logicalName, "SampleFGen");
    std::ifstream file(made);
    const std::string text((std::istreambuf_iterator<char>(file)), {});
    EXPECT_THAT(text, ::testing::HasSubstr("# [SampleFGen]\n# module = builtin\n"));
    EXPECT_THAT(text, ::testing::HasSubstr("# channel Channel2 = 2\n"));

    const std::string named = scope.UseStore("[Bench]\nmodule = builtin\n");
    EXPECT_EQ(EditableConfigStoreFile(), named);
}

// A FIFO or a folder named as the store, or as the trace file, is refused at once: none of them
// may block the caller or read as an empty store.
TEST(ConfigStoreSearch, AStoreOrTraceThatIsNoFileIsRefusedAtOnce) {
    StoreScope scope;
    const std::string fifo = (scope.Dir() / "fifo").string();
    ASSERT_EQ(::mkfifo(fifo.c_str(), 0644), 0);
    std::filesystem::create_directory(scope.Dir() / "folder");
    for (const std::string& path : {fifo, (scope.Dir() / "folder").string()}) {
        ::setenv("QZIVI_CONFIG_STORE", path.c_str(), 1);
        ViSession vi = 0;
        EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "", &vi),
                  IVI_ERROR_CANNOT_OPEN_FILE);
        EXPECT_THAT(LastError(VI_NULL), HasSubstr("is no regular file"));
    }
    ::unsetenv("QZIVI_CONFIG_STORE");
    ::setenv("QZIVI_TRACE", fifo.c_str(), 1);
    ViSession vi = 0;
    EXPECT_EQ(IviFgen_InitWithOptions("SampleFGen", VI_FALSE, VI_FALSE, "", &vi),
              IVI_ERROR_CANNOT_OPEN_FILE);
    EXPECT_THAT(LastError(VI_NULL), HasSubstr("a pipe that nobody reads"));
    ::unsetenv("QZIVI_TRACE");
    qzivi::ivi::SetTraceFile("");
}

TEST(ConfigStoreText, AByteOrderMarkIsNoTextAndANulByteIsRefused) {
    const ConfigStore store =
        ParseConfigStore("\xEF\xBB\xBF[Bench]\nmodule = builtin\n", "bom.conf");
    EXPECT_NE(store.Find("Bench"), nullptr);
    try {
        ParseConfigStore(std::string("[Be\0nch]\nmodule = builtin\n", 26), "nul.conf");
        FAIL() << "a NUL byte was taken into a name";
    } catch (const qzivi::ivi::StatusError& e) {
        EXPECT_THAT(e.what(), HasSubstr("nul.conf, line 1: a NUL byte stands in the line"));
    }
}

TEST(ConfigStoreSearch, AHugeLogicalNameIsToldByItsStart) {
    StoreScope scope;
    const std::string name(10'000'000, 'x');
    ViSession vi = 0;
    EXPECT_EQ(IviFgen_InitWithOptions(name.c_str(), VI_FALSE, VI_FALSE, "", &vi),
              IVI_ERROR_LOGICAL_NAME_NOT_FOUND);
    const std::string why = LastError(VI_NULL);
    EXPECT_LT(why.size(), 1000u);
    EXPECT_THAT(why, HasSubstr(std::string(80, 'x') + "...\" is not in the configuration store"));
}
