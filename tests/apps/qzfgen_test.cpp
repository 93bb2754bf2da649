// qzfgen in a child process: its subcommands' output, files and exit codes, and one clear line
// on standard error for every misuse and refusal.
#include "platform/test_support.h"

#include <gtest/gtest.h>

#ifdef QZFGEN_HAS_PNG
#include <QImage>
#endif

#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <sys/wait.h>

namespace {

struct Ran {
    int code = -1;
    std::string out, err;
};

class QzfgenTest : public ::testing::Test {
protected:
    QzfgenTest() { ::setenv("QZIVI_SESSION_MANAGER", "none", 1); }

    std::string Path(const std::string& name) const { return (store_.Dir() / name).string(); }
    static std::string Slurp(const std::string& path) {
        std::ifstream in(path, std::ios::binary);
        std::stringstream text;
        text << in.rdbuf();
        return text.str();
    }
    Ran Run(const std::string& arguments) const {
        const std::string out = Path("stdout"), err = Path("stderr");
        const int status = std::system(
            (std::string(QZFGEN_PATH) + " " + arguments + " >" + out + " 2>" + err).c_str());
        return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, Slurp(out), Slurp(err)};
    }
    static int Lines(const std::string& text) {
        return static_cast<int>(std::count(text.begin(), text.end(), '\n'));
    }

    qzivi::test::StoreScope store_;
};

TEST_F(QzfgenTest, EveryMisuseIsOneLineOnStandardErrorAndExitCode2) {
    const struct {
        const char* arguments;
        const char* says;
    } cases[] = {
        {"bogus", "unknown command \"bogus\""},
        {"configure", "configuration file is missing"},
        {"configure a.qzc b.qzc", "one configuration file only"},
        {"configure a.qzc --colour red", "unknown option \"--colour\""},
        {"configure a.qzc --name", "--name needs a value"},
        {"export", "file to write is missing"},
        {"export x.qzc --frequency fast", "--frequency: \"fast\" is not a number"},
        {"export x.qzc --waveform noise", "is none of sine, square"},
        {"export x.qzc --from missing.qzc", "\"missing.qzc\" is not there"},
        {"render --channel Channel1 --rate 1x", "--rate: \"1x\" is not a number"},
        {"render --channel Channel1 --points 0", "is not a whole number from 1"},
        {"render --points 10", "--channel is missing"},
        {"trigger extra", "takes no argument, not \"extra\""},
    };
    for (const auto& c : cases) {
        const Ran ran = Run(c.arguments);
        EXPECT_EQ(ran.code, 2) << c.arguments;
        EXPECT_EQ(Lines(ran.err), 1) << c.arguments << ": " << ran.err;
        EXPECT_NE(ran.err.find(c.says), std::string::npos) << c.arguments << ": " << ran.err;
        EXPECT_TRUE(ran.out.empty()) << c.arguments;
    }
    EXPECT_EQ(Run("").code, 2);
}

TEST_F(QzfgenTest, ARefusalNamesTheErrorNumberAndExitCode1) {
    store_.Write("notes.txt", "not a configuration\n");
    const struct {
        std::string arguments;
        const char* says;
    } cases[] = {
        {"configure " + Path("missing.qzc"), "error -31606:"},
        {"configure " + Path("notes.txt"), "error -31609:"},
        {"configure " + Path("notes.txt") + "", "does not begin with \"QZIviFgen\""},
        {"abort --name NoSuchGenerator", "\"NoSuchGenerator\" is not in the configuration store"},
    };
    for (const auto& c : cases) {
        const Ran ran = Run(c.arguments);
        EXPECT_EQ(ran.code, 1) << c.arguments;
        EXPECT_EQ(Lines(ran.err), 1) << ran.err;
        EXPECT_NE(ran.err.find(c.says), std::string::npos) << ran.err;
    }
}

TEST_F(QzfgenTest, AnExportedFileConfiguresAndTellsWhatEachChannelDoes) {
    const std::string file = Path("tri.qzc"), trace = Path("trace.log");
    Ran ran = Run("export " + file +
                  " --waveform triangle --frequency 2.5k --amplitude 3 "
                  "--offset -0.5");
    ASSERT_EQ(ran.code, 0) << ran.err;
    EXPECT_EQ(ran.out, "Wrote " + file + ": 2 channels.\n");
    ran = Run("configure " + file + " --trace " + trace);
    ASSERT_EQ(ran.code, 0) << ran.err;
    EXPECT_NE(ran.out.find("Driver: QZSimFgen ("), std::string::npos) << ran.out;
    EXPECT_NE(ran.out.find("on \"SampleFGen\""), std::string::npos) << ran.out;
    for (const char* channel : {"Channel1", "Channel2"})
        EXPECT_NE(ran.out.find(std::string("  ") + channel +
                               ": Triangle 2.500 kHz, 3.000 Vpp, offset -500.000 mV"),
                  std::string::npos)
            << ran.out;
    const std::string calls = Slurp(trace);
    EXPECT_NE(calls.find("IviFgen_ConfigureStandardWaveform("), std::string::npos) << calls;
    EXPECT_NE(calls.find("2500"), std::string::npos);
    // A second export from the first, changed by an option, keeps the rest.
    ran = Run("export " + Path("square.qzc") + " --from " + file + " --waveform square --duty 25");
    ASSERT_EQ(ran.code, 0) << ran.err;
    ran = Run("configure " + Path("square.qzc"));
    EXPECT_NE(ran.out.find("Channel2: Square 2.500 kHz, 3.000 Vpp, offset -500.000 mV, duty 25 %"),
              std::string::npos)
        << ran.out;
}

TEST_F(QzfgenTest, EverySampleConfigurationConfigures) {
    int samples = 0;
    for (const auto& entry : std::filesystem::directory_iterator(QZIVI_SOURCE_DIR "/examples")) {
        if (entry.path().extension() != ".qzc") continue;
        const Ran ran = Run("configure " + entry.path().string());
        EXPECT_EQ(ran.code, 0) << entry.path() << ": " << ran.err;
        EXPECT_EQ(ran.out.find("output off"), std::string::npos) << ran.out;
        ++samples;
    }
    EXPECT_GE(samples, 4);
}

// Data files of each format become held waveforms; a sequence plays them in order.
TEST_F(QzfgenTest, ASequenceFromDataFilesPlaysThemInOrder) {
    // A is high then low, B low then high: the order shows in the samples.
    store_.Write("high.txt", "1\n1\n1\n1\n0\n0\n0\n0\n");
    std::string low;
    for (int i = 0; i < 8; ++i)
        low += i < 4 ? std::string("\x00\x00", 2) : std::string("\x00\x20", 2);
    store_.Write("low.i16", low);
    const std::string file = Path("train.qzc");
    Ran ran = Run("export " + file + " --mode sequence --data " + Path("high.txt") + "," +
                  Path("low.i16") + " --iterations 1,2 --sample-rate 1M");
    ASSERT_EQ(ran.code, 0) << ran.err;
    std::remove(Path("high.txt").c_str()); // the points are in the configuration now
    ran = Run("render " + file + " --channel Channel1 --points 24 --rate 1M --start 0.5u");
    ASSERT_EQ(ran.code, 0) << ran.err;
    std::istringstream lines(ran.out);
    std::string line;
    std::getline(lines, line);
    for (int k = 0; std::getline(lines, line); ++k) {
        const double v = std::stod(line.substr(line.find(',') + 1));
        // Normalised on reading: each waveform's peak becomes 1. A once, then B twice.
        const bool high = k < 8 ? k < 4 : (k % 8) >= 4;
        EXPECT_NEAR(v, high ? 1.0 : 0.0, 1e-9) << "sample " << k;
    }
    EXPECT_EQ(Run("export x.qzc --mode sequence").code, 2);
    EXPECT_EQ(Run("export x.qzc --mode arb --data " + Path("low.i16") + " --format int64").code, 2);
}

TEST_F(QzfgenTest, NamesAndStoreShowTheStoreInUse) {
    Ran ran = Run("store");
    EXPECT_EQ(ran.code, 0);
    EXPECT_NE(ran.out.find("None exists"), std::string::npos) << ran.out;
    const std::string path = store_.UseStore("[Bench]\nmodule = builtin\nprefix = QZSimFgen\n"
                                             "resource = SIM::BENCH\noptions = Simulate=1\n"
                                             "channel Channel1 = 1\nchannel Channel2 = 2\n");
    ran = Run("names");
    EXPECT_EQ(ran.code, 0) << ran.err;
    EXPECT_NE(ran.out.find("Store: " + path), std::string::npos) << ran.out;
    EXPECT_NE(ran.out.find("Bench "), std::string::npos);
    EXPECT_NE(ran.out.find("SIM::BENCH"), std::string::npos);
    EXPECT_NE(ran.out.find("SampleFGen "), std::string::npos);
    ran = Run("store");
    EXPECT_NE(ran.out.find(path + "  [in use]"), std::string::npos) << ran.out;
    ASSERT_EQ(Run("export " + Path("a.qzc")).code, 0);
    ran = Run("initiate " + Path("a.qzc") + " --name Bench");
    EXPECT_EQ(ran.code, 0) << ran.err;
    EXPECT_EQ(ran.out, "Generation started on \"Bench\".\n");
}

TEST_F(QzfgenTest, RenderWritesTheSimulatorsSamples) {
    const std::string csv = Path("out.csv");
    const Ran ran = Run("render --channel Channel1 --points 200 --rate 100k --csv " + csv);
    ASSERT_EQ(ran.code, 0) << ran.err;
    std::istringstream lines(Slurp(csv));
    std::string line;
    std::getline(lines, line);
    EXPECT_EQ(line, "time_s,volts");
    int rows = 0;
    while (std::getline(lines, line)) {
        const double t = std::stod(line.substr(0, line.find(',')));
        const double v = std::stod(line.substr(line.find(',') + 1));
        // The built-in example: a 1 kHz sine of 2 Vpp on channel 1.
        EXPECT_NEAR(v, std::sin(2 * M_PI * 1000 * t), 1e-6) << line;
        ++rows;
    }
    EXPECT_EQ(rows, 200);
}

#ifdef QZFGEN_HAS_PNG
// The picture's scale marks the highest and the lowest level beside the rows where the trace
// reaches them, as a reader of the plot takes them.
TEST_F(QzfgenTest, ThePlotMarksItsLevelsWhereTheTraceReachesThem) {
    const std::string png = Path("out.png");
    const Ran ran = Run("render --channel Channel2 --points 500 --png " + png);
    ASSERT_EQ(ran.code, 0) << ran.err;
    const QImage image(QString::fromStdString(png));
    ASSERT_FALSE(image.isNull());
    const auto yellow = [&](int x, int y) {
        const QColor c = image.pixelColor(x, y);
        return c.red() > 120 && c.green() > 100 && c.blue() < 60;
    };
    int left = image.width(), top = image.height(), bottom = -1;
    for (int y = 0; y < image.height(); ++y)
        for (int x = 0; x < image.width(); ++x)
            if (yellow(x, y)) {
                left = std::min(left, x);
                top = std::min(top, y);
                bottom = std::max(bottom, y);
            }
    ASSERT_LT(top, bottom) << "no trace drawn";
    // A mark: light grey, left of where the trace begins, within a row of the level.
    const auto marked = [&](int row) {
        for (int y = row - 1; y <= row + 1; ++y)
            for (int x = 0; x < left; ++x) {
                const QColor c = image.pixelColor(x, y);
                if (c.red() > 100 && c.red() == c.green() && c.green() == c.blue()) return true;
            }
        return false;
    };
    EXPECT_TRUE(marked(top)) << "row " << top;
    EXPECT_TRUE(marked(bottom)) << "row " << bottom;
}
#endif

TEST_F(QzfgenTest, EveryCommandExplainsItself) {
    for (const char* command :
         {"names", "store", "configure", "initiate", "abort", "trigger", "export", "render"}) {
        const Ran ran = Run(std::string(command) + " --help");
        EXPECT_EQ(ran.code, 0) << command;
        EXPECT_EQ(ran.out.rfind(std::string("usage: qzfgen ") + command, 0), 0u) << ran.out;
    }
    const Ran overview = Run("help");
    EXPECT_EQ(overview.code, 0);
    EXPECT_NE(
        overview.out.find("exit codes: 0 done, 1 the control or the instrument refused, 2 misuse"),
        std::string::npos);
}

} // namespace
