// An export killed at any moment leaves the file on disk whole: the old configuration or the new
// one, never a mix or a stump. A child process exports again and again and is killed at a point
// that moves through the writing; after each kill the file must be one of the two and load.
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/model/Waveforms.h"
#include "tree_fixture.h"

#include <csignal>
#include <fstream>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

namespace qzivi {
namespace {

class CrashSafetyTest : public test::TreeTest {
protected:
    static std::string Slurp(const std::string& path) {
        std::ifstream in(path, std::ios::binary);
        std::stringstream bytes;
        bytes << in.rdbuf();
        return bytes.str();
    }
};

TEST_F(CrashSafetyTest, AnExportKilledAnywhereLeavesTheOldFileOrTheNew) {
    const std::string path = (dir_ / "bench.qzc").string();
    tree_->Channels()->Add("Channel1");
    tree_->Configurations()->Add("old")->Export(path);
    const std::string before = Slurp(path);
    // The new one is large enough (some 16 MB of held points) that a kill lands inside writing.
    for (int i = 0; i < 4; ++i)
        tree_->Waveforms()->Add("")->Data(std::vector<double>(500'000, 0.25 * i));
    const std::string fresh = (dir_ / "fresh.qzc").string();
    tree_->Configurations()->Add("new")->Export(fresh);
    const std::string after = Slurp(fresh);
    ASSERT_NE(before, after);

    int sawOld = 0, sawNew = 0;
    for (int round = 0; round < 40; ++round) {
        const pid_t child = ::fork();
        ASSERT_GE(child, 0);
        if (child == 0) {
            for (;;)
                tree_->Configurations()->Item(Variant("new"))->Export(path);
        }
        // A moment that moves through the first export and into the ones after it.
        ::usleep(static_cast<useconds_t>(500 + round * 4000));
        ::kill(child, SIGKILL);
        ::waitpid(child, nullptr, 0);
        const std::string now = Slurp(path);
        ASSERT_TRUE(now == before || now == after)
            << "round " << round << ": " << now.size() << " bytes, neither old nor new";
        (now == before ? sawOld : sawNew)++;
        auto loaded = NewTree();
        EXPECT_EQ(Raised([&] { loaded->Configurations()->Add("check", path)->Load(); }), 0);
    }
    RecordProperty("old", sawOld); // how often each came up, in the test's XML report

    RecordProperty("new", sawNew);
}

} // namespace
} // namespace qzivi
