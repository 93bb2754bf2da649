// Saved configurations: snapshots added, changed, loaded, moved through .qzc files, and bad files
// that change nothing.
#include "qzivi/model/CPropBagFile.h"
#include "tree_fixture.h"

#include <gmock/gmock.h>

#include <cstring>
#include <fstream>
#include <random>

namespace qzivi {
namespace {

using test::Describe;
using ::testing::HasSubstr;

class ConfigurationsTest : public test::TreeTest {
protected:
    ConfigurationsTest() {
        tree_->ExceptionOnError(false); // the configurations raise whatever it says
        tree_->Channels()->Add()->FuncFrequency(2500);
        const auto held = tree_->Waveforms()->Add("Held");
        held->Data({0.0, 0.5, -1.0, 0.25});
        tree_->Sequences()->Add("S")->Add(held, 3);
        tree_->OutputMode(1);
    }
    QZIviConfigurations& configs() { return *tree_->Configurations(); }
    std::string Bytes(const std::string& path) {
        std::ifstream in(path, std::ios::binary);
        return std::string(std::istreambuf_iterator<char>(in), {});
    }
};

TEST_F(ConfigurationsTest, ASnapshotComesBackWithEveryValueAndItsPoints) {
    const std::string saved = Describe(*tree_);
    const auto a = configs().Add("A");
    tree_->Channels()->Item(1)->FuncFrequency(99);
    tree_->Waveforms()->Item("Held")->Data({1.0, 1.0});
    tree_->OutputMode(0);
    a->Load();
    EXPECT_EQ(Describe(*tree_), saved);
    EXPECT_EQ(tree_->Waveforms()->Item("Held")->WaveformHandle(), 0) << "new objects after a load";
    EXPECT_EQ(configs().Count(), 1) << "a load leaves the configurations";
    EXPECT_EQ(configs().LastLoaded().AsInt32(), 1);

    tree_->Internal()->AMInternalDepth(12);
    a->Store();
    const std::string stored = Describe(*tree_);
    tree_->InitProperties();
    a->Load();
    EXPECT_EQ(Describe(*tree_), stored);
}

TEST_F(ConfigurationsTest, ExportAndImportUnderAnotherName) {
    const std::string saved = Describe(*tree_);
    const auto path = (dir_ / "bench.qzc").string();
    configs().Add("A")->Export(path);
    tree_->InitProperties();
    const auto b = configs().Add("B");
    b->Import(path);
    EXPECT_EQ(b->Name(), "B") << "the file carries no name";
    b->Load();
    EXPECT_EQ(Describe(*tree_), saved);
    EXPECT_EQ(configs().Add("C", path)->Name(), "C") << "Add can take a file";

    // The same snapshot gives the same file, byte for byte.
    const auto again = (dir_ / "again.qzc").string();
    b->Export(again);
    EXPECT_EQ(Bytes(again), Bytes(path));
}

TEST_F(ConfigurationsTest, TheFileKeepsItsLayoutByteForByte) {
    const auto path = (dir_ / "layout.qzc").string();
    const auto a = configs().Add("A");
    a->Export(path);
    const std::string file = Bytes(path);
    ASSERT_GT(file.size(), 25u);
    EXPECT_EQ(file.substr(0, 9), "QZIviFgen");
    std::int32_t highest = 0, count = 0, lowerBound = -1;
    std::uint16_t tag = 0, dimensions = 0;
    std::memcpy(&highest, file.data() + 9, 4);
    std::memcpy(&tag, file.data() + 13, 2);
    std::memcpy(&dimensions, file.data() + 15, 2);
    std::memcpy(&count, file.data() + 17, 4);
    std::memcpy(&lowerBound, file.data() + 21, 4);
    EXPECT_EQ(tag, 0x2011);
    EXPECT_EQ(dimensions, 1);
    EXPECT_EQ(lowerBound, 0);
    EXPECT_EQ(count, static_cast<std::int32_t>(file.size()) - 25);
    EXPECT_EQ(highest, count - 1);
    // The contents are a bag with the one key "Bag": the snapshot.
    PropertyBag bag;
    bag.SetContents(
        std::span(reinterpret_cast<const std::uint8_t*>(file.data()) + 25, file.size() - 25));
    EXPECT_EQ(bag.Size(), 1u);
    EXPECT_EQ(bag.ReadSharedBytes("Bag"), a->Bag());
}

TEST_F(ConfigurationsTest, ItemTakesNamesAsTextAndRemoveTakesPositions) {
    configs().Add("first");
    configs().Add("2");
    configs().Add("third");
    EXPECT_EQ(configs().Item("2")->Name(), "2") << "a text is a name";
    EXPECT_EQ(configs().Item(2)->Name(), "2");
    EXPECT_EQ(configs().Item(3)->Name(), "third");
    configs().Remove("2");
    EXPECT_EQ(configs().Item(2)->Name(), "third") << "a numeric text removes a position";
    configs().Remove("first");
    EXPECT_EQ(configs().Count(), 1);
    EXPECT_EQ(Raised([&] { configs().Item("First"); }), -31623) << "names compare exactly";
    EXPECT_EQ(Raised([&] { configs().Item(7); }), -31623);
    EXPECT_EQ(Raised([&] { configs().Remove(2); }), -31611);
    EXPECT_EQ(Raised([&] { configs().Remove("nosuch"); }), -31611);
    EXPECT_FALSE(tree_->ExceptionOnError()) << "they raised all the same";
}

TEST_F(ConfigurationsTest, TheRootKeepsItsConfigurationsThroughItsBag) {
    configs().Add("A");
    configs().Add("B");
    PropertyBag bag;
    tree_->WriteProperties(bag, "", true);
    EXPECT_EQ(bag.ReadInt32("Config_Count", 0), 2);
    EXPECT_EQ(bag.ReadText("Config_Item2_Name", ""), "B");
    auto copy = NewTree();
    copy->ReadProperties(bag, "", true);
    ASSERT_EQ(copy->Configurations()->Count(), 2);
    EXPECT_EQ(copy->Configurations()->Item(1)->Bag(), configs().Item(1)->Bag());
    const auto clone = tree_->Clone(nullptr);
    EXPECT_EQ(clone->Configurations()->Item("B")->Bag(), configs().Item("B")->Bag());
    // A clone's Load acts on the clone.
    tree_->OutputMode(2);
    clone->Configurations()->Item("A")->Load();
    EXPECT_EQ(clone->OutputMode(), 1);
    EXPECT_EQ(tree_->OutputMode(), 2);
}

TEST_F(ConfigurationsTest, BadFilesLeaveTheSnapshotAsItWas) {
    const auto a = configs().Add("A");
    const auto before = a->Bag();
    const auto good = (dir_ / "good.qzc").string();
    a->Export(good);
    const std::string file = Bytes(good);
    auto write = [&](const std::string& name, const std::string& bytes) {
        const auto path = (dir_ / name).string();
        std::ofstream(path, std::ios::binary) << bytes;
        return path;
    };
    std::string lying = file;
    const std::int32_t huge = 0x7FFFFFF0;
    std::memcpy(lying.data() + 17, &huge, 4);
    std::string torn = file.substr(0, file.size() - 10);
    std::string noise = file.substr(0, 25);
    std::mt19937 random(3);
    for (std::size_t i = 0; i < 400; ++i)
        noise.push_back(static_cast<char>(random()));
    const std::int32_t noiseCount = 400, noiseHighest = 399;
    std::memcpy(noise.data() + 17, &noiseCount, 4);
    std::memcpy(noise.data() + 9, &noiseHighest, 4);
    const struct {
        std::string path;
        std::int32_t number;
    } cases[] = {
        {write("short.qzc", "QZIvi"), -31609},
        {write("other.qzc", "NOTQZIVIFGEN and more"), -31609},
        {write("lying.qzc", lying), -31609},
        {write("torn.qzc", torn), -31609},
        {write("noise.qzc", noise), -31609},
        {write("bare.qzc", "QZIviFgen"), -31609}, // an identifier alone holds no configuration
        {(dir_ / "missing.qzc").string(), -31606},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.path);
        EXPECT_EQ(Raised([&] { a->Import(c.path); }), c.number);
        EXPECT_EQ(a->Bag(), before);
    }
}

TEST(CPropBagFile, WritesANewFileAndReplacesTheOldWhole) {
    const auto dir =
        std::filesystem::temp_directory_path() / ("qzivi-bagfile-" + std::to_string(::getpid()));
    std::filesystem::create_directories(dir);
    const auto path = (dir / "f.qzc").string();
    {
        CPropBagFile big;
        big.InitPropBagFile(path, "QZIviFgen");
        big.WritableBag().WriteBytes("Bag", Bytes(5000, 7));
    }
    {
        CPropBagFile small;
        small.InitPropBagFile(path, "QZIviFgen");
        small.WritableBag().WriteText("Name", "x");
    }
    CPropBagFile read;
    read.LoadPropBagFile(path, "QZIviFgen");
    ASSERT_NE(read.Bag(), nullptr);
    EXPECT_EQ(read.Bag()->ReadText("Name", ""), "x");
    EXPECT_FALSE(read.Bag()->Contains("Bag"));
    EXPECT_LT(std::filesystem::file_size(path), 100u) << "no bytes of the old, longer file remain";
    CPropBagFile none;
    none.LoadPropBagFile((dir / "absent.qzc").string(), "QZIviFgen");
    EXPECT_EQ(none.Bag(), nullptr);
    std::filesystem::remove_all(dir);
}

} // namespace
} // namespace qzivi
