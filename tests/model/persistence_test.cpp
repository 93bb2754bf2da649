// A whole tree through the bag and through Clone: channels, waveforms of every source, sequences
// and internal settings come back equal, with references resolved by index.
#include "qzivi/driver/ErrorIds.h"
#include "qzivi/model/PropertyBag.h"
#include "tree_fixture.h"

#include <sys/stat.h>

namespace qzivi {
namespace {

using test::Describe;

class PersistenceTest : public test::TreeTest {
protected:
    void Build() {
        tree_->ArbSampleRate(2e6);
        tree_->Extensions(0x3FF);
        tree_->OutputMode(2);
        tree_->LogicalName("Bench");
        tree_->Internal()->AMInternalDepth(75);
        tree_->Internal()->FMInternalWaveform(3);
        auto& w = *tree_->Waveforms();
        const auto held = w.Add("Held");
        held->Data({0.0, 0.5, -0.25, 1.0});
        const auto text = w.Add("Text", qzivifgenASCIIFile, File("t.txt", "0,1,-2,4\n"),
                                qzivifgenNormalizeAndRemoveOffset);
        const std::int16_t shorts[] = {32767, 0, -16384};
        w.Add("Short", qzivifgen2ByteInteger,
              File("s.bin", std::string(reinterpret_cast<const char*>(shorts), 6)));
        const std::int32_t longs[] = {2147483647, -1, 1 << 30};
        w.Add("Long", qzivifgen4ByteInteger,
              File("l.bin", std::string(reinterpret_cast<const char*>(longs), 12)),
              qzivifgenNoAutoNormalize);
        const auto notYet = w.Add("NotYet");
        notYet->PersistedWfmSource("1");
        notYet->Filename(
            File("n.txt", "3,2,1\n")); // persisted, taken from the file at its first write
        auto& s = *tree_->Sequences();
        const auto s1 = s.Add("Up");
        s1->Add(held, 3);
        s1->Add(text, 1);
        s.Add("Empty");
        auto& c = *tree_->Channels();
        const auto c1 = c.Add();
        c1->FuncWaveform(2);
        c1->FuncDutyCycleHigh(25);
        c1->OutputImpedance(75);
        c1->TriggerSource(3);
        c1->ArbWaveform(text);
        c1->Sequence(s1);
        const auto c2 = c.Add("Out B");
        c2->AMEnabled(true);
        c2->BurstCount(7);
        c2->ArbWaveform(held);
    }
};

TEST_F(PersistenceTest, WriteThenReadGivesAnEqualTree) {
    Build();
    PropertyBag bag;
    tree_->WriteProperties(bag, "", true);
    EXPECT_EQ(bag.ReadInt32("Channels_Item1_Channel_ArbWaveform", 0), 2) << "by index";
    EXPECT_EQ(bag.ReadInt32("Sequences_Item1_Sequence_Item2_SequenceItem_Waveform", 0), 2);
    EXPECT_EQ(bag.ReadInt32("Waveforms_Item5_Waveform_ByteSize", 0), 24)
        << "the points came from the file";
    PropertyBag carried;
    carried.SetContents(bag.Contents());
    auto copy = NewTree();
    copy->ReadProperties(carried, "", true);
    EXPECT_EQ(Describe(*copy), Describe(*tree_));
    // The persisted waveforms need their files no more.
    std::filesystem::remove(dir_ / "n.txt");
    EXPECT_EQ(copy->Waveforms()->Item("NotYet")->Data()->size(), 3u);
}

TEST_F(PersistenceTest, CloneGivesAnEqualTreeThatSharesTheReferences) {
    Build();
    const auto copy = tree_->Clone(nullptr);
    EXPECT_EQ(Describe(*copy), Describe(*tree_));
    EXPECT_EQ(copy->Channels()->Item(1)->ArbWaveform(), tree_->Waveforms()->Item("Text"))
        << "a clone's channel refers to the very object of the source tree";
    copy->Channels()->Item(1)->FuncFrequency(5);
    EXPECT_EQ(tree_->Channels()->Item(1)->FuncFrequency(), 1000);
}

TEST_F(PersistenceTest, DuplicateNamesResolveToTheFirst) {
    const auto first = tree_->Waveforms()->Add("Dup");
    const auto second = tree_->Waveforms()->Add("Dup");
    const auto ch = tree_->Channels()->Add();
    ch->ArbWaveform(second);
    PropertyBag bag;
    tree_->WriteProperties(bag, "", true);
    EXPECT_EQ(bag.ReadInt32("Channels_Item1_Channel_ArbWaveform", 0), 1);
    auto copy = NewTree();
    copy->ReadProperties(bag, "", true);
    EXPECT_EQ(copy->Waveforms()->IndexOfObject(copy->Channels()->Item(1)->ArbWaveform().get()), 1);
    (void)first;
}

TEST_F(PersistenceTest, AChannelWithoutWaveformStoresNoReference) {
    tree_->Channels()->Add();
    PropertyBag bag;
    tree_->WriteProperties(bag, "", true);
    EXPECT_FALSE(bag.Contains("Channels_Item1_Channel_ArbWaveform"));
    auto copy = NewTree();
    copy->ReadProperties(bag, "", true);
    EXPECT_EQ(copy->Channels()->Item(1)->ArbWaveform(), nullptr);
    EXPECT_EQ(copy->Channels()->Item(1)->Name(), "Channel1");
}

TEST_F(PersistenceTest, ANewWaveformWithoutPointsSavesQuietlyButAMissingFileReports) {
    tree_->Waveforms()->Add("New");
    PropertyBag bag;
    EXPECT_EQ(Raised([&] { tree_->WriteProperties(bag, "", true); }), 0);
    EXPECT_EQ(Raised([&] { tree_->Clone(nullptr); }), 0);
    EXPECT_TRUE(codes_.empty()) << "nothing to obtain, nothing to report";
    tree_->Waveforms()->Item("New")->Filename((dir_ / "gone.txt").string());
    EXPECT_EQ(Raised([&] { tree_->WriteProperties(bag, "", true); }), -31613);
}

TEST_F(PersistenceTest, HostileCountsAndShortPointsAreRefused) {
    PropertyBag bag;
    bag.WriteInt32("Waveforms_ItemCount", 2000000000, 0);
    EXPECT_EQ(Raised([&] { NewTree()->ReadProperties(bag, "", true); }), runtime::kImproperFile);
    // The margin for items that store nothing is shared by the whole bag: a million channels,
    // or fifty sequences of forty thousand steps each, are refused before any is made.
    PropertyBag channels;
    channels.WriteInt32("Channels_ItemCount", 1000000, 0);
    PropertyBag otherCase; // the bag finds keys whatever their case, and so does the bound
    otherCase.WriteInt32("Channels_ITEMCOUNT", 1000000, 0);
    PropertyBag sequences;
    sequences.WriteInt32("Sequences_ItemCount", 50, 0);
    for (int i = 1; i <= 50; ++i)
        sequences.WriteInt32("Sequences_Item" + std::to_string(i) + "_Sequence_ItemCount", 40000,
                             0);
    for (const PropertyBag* hostile : {&channels, &otherCase, &sequences}) {
        auto tree = NewTree();
        EXPECT_EQ(Raised([&] { tree->ReadProperties(*hostile, "", true); }),
                  runtime::kImproperFile);
        EXPECT_EQ(tree->Sequences()->Count(), 0) << "nothing half read";
    }
    try {
        NewTree()->ReadProperties(sequences, "", true);
    } catch (const Failure& f) {
        EXPECT_NE(f.Description().find("claims 2000050 items (40000 under"), std::string::npos)
            << f.Description();
    }
    // Within the margin a bag loads, its default items made.
    PropertyBag spare;
    spare.WriteInt32("Sequences_ItemCount", 2, 0);
    spare.WriteInt32("Sequences_Item2_Sequence_ItemCount", 4000, 0);
    auto tree = NewTree();
    ASSERT_EQ(Raised([&] { tree->ReadProperties(spare, "", true); }), 0);
    EXPECT_EQ(tree->Sequences()->Item(2)->Count(), 4000);
    PropertyBag shortPoints;
    shortPoints.WriteInt32("Waveforms_ItemCount", 1, 0);
    shortPoints.WriteInt32("Waveforms_Item1_Waveform_Source", 0, 1);
    shortPoints.WriteInt32("Waveforms_Item1_Waveform_ByteSize", 800, 0);
    shortPoints.WriteBytes("Waveforms_Item1_Waveform_Data", Bytes(16));
    EXPECT_EQ(Raised([&] { NewTree()->ReadProperties(shortPoints, "", true); }),
              runtime::kImproperFile);
    // A size of part of a point, with bytes enough behind it: refused, not cut or read from
    // nothing.
    for (const std::int32_t size : {1, 7, 13}) {
        PropertyBag partial;
        partial.WriteInt32("Waveforms_ItemCount", 1, 0);
        partial.WriteInt32("Waveforms_Item1_Waveform_Source", 0, 1);
        partial.WriteInt32("Waveforms_Item1_Waveform_ByteSize", size, 0);
        partial.WriteBytes("Waveforms_Item1_Waveform_Data", Bytes(64));
        EXPECT_EQ(Raised([&] { NewTree()->ReadProperties(partial, "", true); }),
                  runtime::kImproperFile)
            << size;
    }
}

// A FIFO or a folder where a file is expected is refused at once: reading it must neither block
// nor pass for an empty file.
TEST_F(PersistenceTest, AFifoOrAFolderIsNoConfigurationAndNoDataFile) {
    const std::string fifo = (dir_ / "fifo").string();
    ASSERT_EQ(::mkfifo(fifo.c_str(), 0644), 0);
    std::filesystem::create_directory(dir_ / "folder");
    for (const std::string& path : {fifo, (dir_ / "folder").string()}) {
        EXPECT_EQ(Raised([&] { tree_->Configurations()->Add("file", path); }), errid::kFileAccess)
            << path;
        const auto waveform = tree_->Waveforms()->Add("", qzivifgenASCIIFile, path);
        // The readers give no points for what is no file, as for a file without any.
        EXPECT_EQ(waveform->GetDataSample(0, 1, -1), nullptr) << path;
    }
}

// What loads must save again: a held waveform that claims its points were got but holds none.
TEST_F(PersistenceTest, AHeldWaveformWithoutPointsLoadsAndSavesAgain) {
    PropertyBag bag;
    bag.WriteInt32("Waveforms_ItemCount", 1, 0);
    bag.WriteText("Waveforms_Item1_Waveform_Name", "Empty", "");
    bag.WriteInt32("Waveforms_Item1_Waveform_Source", 0, 1);
    bag.WriteBool("Waveforms_Item1_Waveform_DataGotOnce", true, false);
    auto tree = NewTree();
    ASSERT_EQ(Raised([&] { tree->ReadProperties(bag, "", true); }), 0);
    PropertyBag again;
    EXPECT_EQ(Raised([&] { tree->WriteProperties(again, "", true); }), 0);
    EXPECT_TRUE(codes_.empty());
    EXPECT_FALSE(tree->Waveforms()->Item(1)->DataGotOnce());
}

} // namespace
} // namespace qzivi
