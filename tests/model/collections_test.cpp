// The collections of the object model: names, positions, the active channel, the cascades of
// Remove, and the reference rules of channels and sequence items.
#include "qzivi/driver/ErrorIds.h"
#include "qzivi/model/PropertyBag.h"
#include "tree_fixture.h"

#include <gmock/gmock.h>

namespace qzivi {
namespace {

using test::Change;
using ::testing::ElementsAre;

class ChannelsTest : public test::TreeTest {
protected:
    QZIviFgenChannels& channels() { return *tree_->Channels(); }
};

TEST_F(ChannelsTest, AddNamesMakesActiveAndTells) {
    const auto first = channels().Add();
    EXPECT_EQ(first->Name(), "Channel1");
    EXPECT_EQ(first->FuncFrequency(), 1000);
    EXPECT_EQ(first->FuncAmplitude(), 2);
    EXPECT_TRUE(first->OutputEnabled());
    EXPECT_EQ(first->BurstCount(), 2);
    EXPECT_THAT(seen_, ElementsAre(Change{"QZIviFgenChannels", ChangeRenamed, "", ""},
                                   Change{"QZIviFgenChannels", ChangeRenamed, "Channel1", ""},
                                   Change{"QZIviFgenChannels", ChangeActive, "1", ""},
                                   Change{"QZIviFgenChannels", ChangeAdded, "1", ""}));
    const auto second = channels().Add();
    EXPECT_EQ(second->Name(), "Channel2");
    EXPECT_EQ(channels().ActiveChannel(), second) << "a new channel becomes active";
    EXPECT_EQ(channels().Add("Custom")->Name(), "Custom");
    channels().Remove("Channel1");
    EXPECT_EQ(channels().Add()->Name(), "Channel1") << "the lowest free number";
    second->Name("CHANNEL4");
    channels().Add("channel3");
    EXPECT_EQ(channels().Add()->Name(), "Channel2") << "names compare without case";
    channels().Add("Custom");
    EXPECT_EQ(channels().Count(), 6) << "duplicate names are allowed";
}

TEST_F(ChannelsTest, ItemTakesPositionsAndNamesRemoveTakesNumericTexts) {
    channels().Add();
    const auto two = channels().Add();
    channels().Add("2");
    EXPECT_EQ(channels().Item(2), two);
    EXPECT_EQ(channels().Item("Channel2"), two);
    EXPECT_EQ(channels().Item("channel2"), two);
    EXPECT_EQ(channels().Item("2")->Name(), "2") << "a text is a name";
    EXPECT_EQ(channels().IndexOfName("channel2"), -1) << "IndexOfName compares exactly";
    EXPECT_EQ(channels().IndexOfName("Channel2"), 2);
    EXPECT_EQ(Raised([&] { channels().Item(0); }), -31624);
    EXPECT_EQ(Raised([&] { channels().Item(4); }), -31624);
    EXPECT_EQ(Raised([&] { channels().Remove(0); }), -31611);
    EXPECT_EQ(Raised([&] { channels().Remove("nosuch"); }), -31611);
    channels().Remove("2");
    EXPECT_EQ(channels().IndexOfObject(two.get()), -1) << "a numeric text is a position for Remove";
    EXPECT_EQ(channels().Item("2")->Name(), "2");
}

TEST_F(ChannelsTest, TheActiveChannelMovesBeforeItsRemoval) {
    const auto a = channels().Add(), b = channels().Add(), c = channels().Add();
    channels().ActiveChannel(a);
    seen_.clear();
    channels().Remove(1);
    EXPECT_EQ(channels().ActiveChannel(), b);
    EXPECT_THAT(seen_, ElementsAre(Change{"QZIviFgenChannels", ChangeActive, "2", ""},
                                   Change{"QZIviFgenChannels", ChangeRemoved, "1", ""}))
        << "the index counts with the old channel still present";
    channels().ActiveChannel(c);
    channels().Remove(2);
    EXPECT_EQ(channels().ActiveChannel(), b) << "the third gone, the second is active";
    channels().Remove(1);
    EXPECT_EQ(channels().ActiveChannel(), nullptr);
    EXPECT_EQ(channels().Count(), 0);
}

TEST_F(ChannelsTest, ActiveChannelGetterPicksTheFirstQuietlyAndRefusesStrangers) {
    channels().Add();
    channels().Add();
    channels().ActiveChannel(nullptr);
    seen_.clear();
    EXPECT_EQ(channels().ActiveChannel(), channels().Item(1));
    EXPECT_TRUE(seen_.empty());
    auto other = NewTree();
    const auto stranger = other->Channels()->Add();
    EXPECT_EQ(Raised([&] { channels().ActiveChannel(stranger); }), -31618);
    EXPECT_EQ(channels().ActiveChannel(), channels().Item(1));
    EXPECT_TRUE(seen_.empty());
}

TEST_F(ChannelsTest, SettersStoreAnyValue) {
    const auto ch = channels().Add();
    ch->BurstCount(-5);
    ch->FuncDutyCycleHigh(500);
    ch->TriggerSource(999);
    EXPECT_EQ(ch->BurstCount(), -5);
    EXPECT_EQ(ch->FuncDutyCycleHigh(), 500);
    EXPECT_EQ(ch->TriggerSource(), 999);
}

TEST_F(ChannelsTest, ReferencesAreCheckedAgainstTheTreeByUniqueId) {
    const auto ch = channels().Add();
    const auto mine = tree_->Waveforms()->Add("Mine");
    const auto seq = tree_->Sequences()->Add("Seq");
    ch->ArbWaveform(mine);
    ch->Sequence(seq);
    auto other = NewTree();
    const auto foreignWaveform = other->Waveforms()->Add("Mine");
    const auto foreignSequence = other->Sequences()->Add("Seq");
    // ArbWaveform checks before it stores; Sequence stores before it checks.
    EXPECT_EQ(Raised([&] { ch->ArbWaveform(foreignWaveform); }), -31618);
    EXPECT_EQ(ch->ArbWaveform(), mine);
    EXPECT_EQ(Raised([&] { ch->Sequence(foreignSequence); }), -31618);
    EXPECT_EQ(ch->Sequence(), foreignSequence);
    EXPECT_EQ(Raised([&] { ch->Sequence(nullptr); }), 0) << "none is always taken";
    // A waveform of a clone of this tree has the same UniqueId and is taken as it is.
    const auto clone = tree_->Clone(nullptr);
    const auto twin = clone->Waveforms()->Item("Mine");
    ASSERT_NE(twin, mine);
    ch->ArbWaveform(twin);
    EXPECT_EQ(ch->ArbWaveform(), twin);
}

TEST_F(ChannelsTest, AnyRenameOrNewWaveformDropsTheReferenceOfEveryChannel) {
    const auto a = channels().Add(), b = channels().Add();
    const auto w1 = tree_->Waveforms()->Add("W1");
    const auto w2 = tree_->Waveforms()->Add("W2");
    a->ArbWaveform(w1);
    b->ArbWaveform(w2);
    w2->Name("W2b");
    EXPECT_EQ(a->ArbWaveform(), nullptr) << "whichever waveform changed";
    EXPECT_EQ(b->ArbWaveform(), nullptr);
    a->ArbWaveform(w1);
    tree_->Waveforms()->Add();
    EXPECT_EQ(a->ArbWaveform(), nullptr) << "adding names a waveform, which is a rename";
    const auto s = tree_->Sequences()->Add("S");
    a->Sequence(s);
    a->Name("Renamed");
    EXPECT_EQ(a->Sequence(), s) << "renaming a channel touches nothing else";
    tree_->Sequences()->Add();
    EXPECT_EQ(a->Sequence(), nullptr);
}

// ---- Waveforms ---------------------------------------------------------------------------------

class WaveformsTest : public test::TreeTest {
protected:
    QZIviFgenArbWaveforms& waveforms() { return *tree_->Waveforms(); }
};

TEST_F(WaveformsTest, AddSetsPersistedSourceAndTheGivenMode) {
    const auto w = waveforms().Add("Ramp");
    EXPECT_EQ(w->Source(), qzivifgenpersisted);
    EXPECT_EQ(w->AutoNormalizeMode(), qzivifgenNormalize);
    EXPECT_EQ(w->Filename(), "");
    const auto f =
        waveforms().Add("", qzivifgen2ByteInteger, "/tmp/x.bin", qzivifgenNoAutoNormalize);
    EXPECT_EQ(f->Name(), "Waveform1");
    EXPECT_EQ(f->Source(), qzivifgen2ByteInteger);
    EXPECT_EQ(f->AutoNormalizeMode(), qzivifgenNoAutoNormalize);
    EXPECT_EQ(Raised([&] { waveforms().Item(0); }), -31625);
    EXPECT_EQ(Raised([&] { waveforms().Item("nosuch"); }), -31625);
    EXPECT_EQ(Raised([&] { waveforms().Remove("nosuch"); }), -31611);
}

TEST_F(WaveformsTest, RemoveQueuesItsHandleAndCascadesIntoSequences) {
    const auto a = waveforms().Add("A"), b = waveforms().Add("B"), c = waveforms().Add("C");
    a->SetWaveformHandle(5);
    const auto seq = tree_->Sequences()->Add("S");
    seq->Add(a, 1);
    seq->Add(b, 2);
    seq->Add(a, 3);
    const auto other = tree_->Sequences()->Add("T");
    other->Add(a, 1);
    waveforms().Remove("A");
    EXPECT_EQ(seq->Count(), 1) << "both items of A went";
    EXPECT_EQ(seq->At(1)->Waveform(), b);
    EXPECT_EQ(other->Count(), 0) << "an empty sequence stays";
    EXPECT_EQ(tree_->Sequences()->Count(), 2);
    EXPECT_EQ(waveforms().DeletedHandleCount(), 1);
    EXPECT_EQ(waveforms().DeletedHandleAt(1), 5);
    waveforms().Remove(1);
    waveforms().Remove(1);
    EXPECT_EQ(waveforms().DeletedHandleCount(), 1) << "handle 0 leaves no trace";
    waveforms().RemoveDeletedHandleAt(1);
    EXPECT_EQ(waveforms().DeletedHandleCount(), 0);
    (void)c;
}

TEST_F(WaveformsTest, AnItemWithoutWaveformStopsTheRemoval) {
    const auto a = waveforms().Add("A");
    tree_->Sequences()->Add("S")->Add(nullptr, 1);
    EXPECT_NE(Raised([&] { waveforms().Remove("A"); }), 0);
    EXPECT_EQ(waveforms().Count(), 1) << "the waveform stays";
    (void)a;
}

TEST_F(WaveformsTest, LimitsNeedASessionAndLeaveTheStateAlone) {
    EXPECT_EQ(Raised([&] { waveforms().GetMaxNumWaveforms(); }), -31600);
    EXPECT_EQ(err_->state(), IviStateClosed);
    std::string name = "SampleFGen";
    err_->Init(name, false, false, "DriverSetup=MaxWaveforms=42; Quantum=4", 0);
    EXPECT_EQ(waveforms().GetMaxNumWaveforms(), 42);
    EXPECT_EQ(waveforms().GetWaveformQuantum(), 4);
    EXPECT_EQ(tree_->Sequences()->GetMaxLoopCount(), 65535);
    EXPECT_EQ(err_->state(), IviStateInitialized);
    err_->CloseSession(true);
}

TEST_F(WaveformsTest, DataComesFromTheFileEachTimeOrOnceWhenPersisted) {
    const auto path = File("w.txt", "0,0.5,1,-1\n");
    const auto file = waveforms().Add("F", qzivifgenASCIIFile, path);
    EXPECT_EQ(*file->Data(), (std::vector<double>{0, 0.5, 1, -1}));
    File("w.txt", "0,2,-4\n");
    EXPECT_EQ(*file->Data(), (std::vector<double>{0, 0.5, -1}))
        << "read again, normalised by its peak";
    EXPECT_EQ(file->DataSize(), 3);

    const auto held = waveforms().Add("P", qzivifgenpersisted, path);
    EXPECT_EQ(held->Data()->size(), 3u);
    File("w.txt", "1,1,1,1,1,1\n");
    EXPECT_EQ(held->Data()->size(), 3u) << "a persisted waveform reads once";
    held->Filename(path);
    EXPECT_TRUE(held->DataGotOnce()) << "the same name keeps the points";
    held->Filename((dir_ / "W.txt").string());
    EXPECT_FALSE(held->DataGotOnce()) << "a name that differs by case does not";
}

TEST_F(WaveformsTest, HeldPointsNeedNoFileAndSurviveTheBag) {
    const auto w = waveforms().Add("Held");
    w->Data({0.25, -0.5, 1.0});
    EXPECT_EQ(w->DataSize(), 3);
    EXPECT_EQ(*w->Data(), (std::vector<double>{0.25, -0.5, 1.0})) << "stored as given";
    EXPECT_EQ(Raised([&] { w->GetDataSample(0, 1, -1); }), -31613) << "there is no file";
    PropertyBag bag;
    tree_->WriteProperties(bag, "", false);
    EXPECT_EQ(bag.ReadInt32("Waveforms_Item1_Waveform_ByteSize", 0), 24);
    auto copy = NewTree();
    copy->ReadProperties(bag, "", false);
    EXPECT_EQ(*copy->Waveforms()->Item(1)->Data(), (std::vector<double>{0.25, -0.5, 1.0}));
}

TEST_F(WaveformsTest, GetDataSampleGivesNoneForOnePointAndFailsForNoFile) {
    const auto w = waveforms().Add("W", qzivifgenASCIIFile, File("s.txt", "1,2,3,4\n"));
    EXPECT_EQ(w->GetDataSample(0, 1, 1), nullptr) << "one point is none";
    EXPECT_EQ(w->GetDataSample(1, 2, -1)->size(), 2u);
    w->Filename("");
    EXPECT_EQ(Raised([&] { w->GetDataSample(0, 1, -1); }), -31613);
    EXPECT_EQ(Raised([&] { w->Data(); }), -31613);
    EXPECT_FALSE(w->ForceReload()) << "no handle to forget";
    w->SetWaveformHandle(9);
    EXPECT_TRUE(w->ForceReload());
    EXPECT_EQ(w->WaveformHandle(), 0);
}

// A file that gives no points is told by its cause, under the number the step that met it has;
// the waveform keeps its file, to be read again once the file is mended.
TEST_F(WaveformsTest, AFileWithoutPointsIsToldByItsCause) {
    const struct {
        std::string path;
        std::int32_t number;
        std::string told;
    } cases[] = {
        {(dir_ / "gone.txt").string(), -31613, "Invalid Waveform. (W)  The data file \""},
        {dir_.string(), errid::kInvalidType, "is no regular file."},
        {File("one.txt", "1,"), errid::kInvalidType, "gives only one point."},
        {File("words.txt", "volts and amps"), errid::kInvalidType, "holds no delimited numbers."},
    };
    for (const auto& c : cases) {
        const auto w = waveforms().Add("W", qzivifgenASCIIFile, c.path);
        try {
            w->Data();
            ADD_FAILURE() << c.path;
        } catch (const Failure& f) {
            EXPECT_EQ(f.Number(), c.number) << f.Description();
            EXPECT_NE(f.Description().find(c.told), std::string::npos) << f.Description();
            EXPECT_NE(f.Description().find(c.path), std::string::npos) << f.Description();
        }
        EXPECT_EQ(w->Filename(), c.path);
        EXPECT_EQ(Raised([&] { w->DataSize(); }), c.number) << "asked again, told again";
    }
}

TEST_F(WaveformsTest, NormalizeInEveryMode) {
    const auto w = waveforms().Add("N");
    auto normalized = [&](std::int32_t mode, std::vector<double> points) {
        w->AutoNormalizeMode(mode);
        w->Normalize(points);
        return points;
    };
    using V = std::vector<double>;
    EXPECT_EQ(normalized(0, {5, -7}), (V{5, -7}));
    EXPECT_EQ(normalized(1, {-0.5, 1}), (V{-0.5, 1})) << "a peak of exactly 1 stays";
    EXPECT_EQ(normalized(1, {-2, 1}), (V{-1, 0.5}));
    EXPECT_EQ(normalized(1, {2, 4}), (V{0.5, 1}))
        << "the low end starts at 0, not at the first point";
    EXPECT_EQ(normalized(2, {-1, 3}), (V{-1, 1}));
    EXPECT_EQ(normalized(2, {-3, 1}), (V{-0.5, 0.5}));
    const V third = normalized(2, {1, 3});
    EXPECT_DOUBLE_EQ(third[0], -1.0 / 3);
    EXPECT_DOUBLE_EQ(third[1], 1);
    for (std::int32_t mode : {1, 2}) {
        EXPECT_EQ(Raised([&] { normalized(mode, {0, 0}); }), runtime::kOverflow) << "0 / 0";
        w->AutoNormalizeMode(mode);
        w->Filename(File("zeros.txt", "0,0,0\n"));
        w->Source(qzivifgenASCIIFile);
        EXPECT_EQ(Raised([&] { w->GetDataSample(0, 1, -1); }), -30006)
            << "through the handler of GetDataSample";
    }
}

// ---- Sequences ---------------------------------------------------------------------------------

class SequencesTest : public test::TreeTest {
protected:
    // A waveform of n points held by the tree.
    std::shared_ptr<QZIviFgenArbWaveform> Held(const std::string& name, int n) {
        auto w = tree_->Waveforms()->Add(name);
        std::vector<double> points(static_cast<std::size_t>(n));
        for (int i = 0; i < n; ++i)
            points[static_cast<std::size_t>(i)] = i / double(n);
        w->Data(points);
        return w;
    }
    static std::vector<std::size_t> Sizes(const SampleBlocks& blocks) {
        std::vector<std::size_t> sizes;
        for (const auto& b : blocks)
            sizes.push_back(b ? b->size() : 0);
        return sizes;
    }
};

TEST_F(SequencesTest, DataSizeAndSamplesUnrollTheRepetitions) {
    const auto seq = tree_->Sequences()->Add("S");
    const auto a = Held("A", 100), b = Held("B", 100);
    seq->Add(a, 3);
    seq->Add(b, 2);
    EXPECT_EQ(seq->DataSize(), 500);
    EXPECT_EQ(seq->PreviewDataSize(), 200);
    const auto files = [&](const std::string& name, int n) {
        std::string text;
        for (int i = 0; i < n; ++i)
            text += std::to_string(i % 7 - 3) + ",";
        auto w = tree_->Waveforms()->Add(name, qzivifgenASCIIFile, File(name + ".txt", text));
        return w;
    };
    const auto fseq = tree_->Sequences()->Add("F");
    fseq->Add(files("FA", 100), 3);
    fseq->Add(files("FB", 100), 2);
    EXPECT_EQ(Sizes(fseq->GetDataSample(250, 1, -1)), (std::vector<std::size_t>{50, 100, 100}));
    EXPECT_EQ(Sizes(fseq->GetDataSample(300, 1, -1)), (std::vector<std::size_t>{100, 100}))
        << "a start at the end of the first run is still in it: no block of it";
    EXPECT_EQ(Sizes(fseq->GetDataSample(0, 1, 120)), (std::vector<std::size_t>{100, 20}));
    fseq->CollapseIterations(true);
    EXPECT_EQ(Sizes(fseq->GetDataSample(0, 1, -1)), (std::vector<std::size_t>{100, 100}));
    EXPECT_EQ(Sizes(fseq->GetDataSample(0, 1, -1)).size(), 5u)
        << "collapsing holds for one call only";
}

TEST_F(SequencesTest, HeldWaveformsGiveWholeBlocksAndTooFewPointsStillReturn) {
    const auto seq = tree_->Sequences()->Add("S");
    seq->Add(Held("A", 100), 2);
    err_->ExceptionOnError(true);
    EXPECT_EQ(Sizes(seq->GetDataSample(10, 3, 50)), (std::vector<std::size_t>{100, 100}))
        << "all of a held array each time, so the first block already holds more than asked";
    codes_.clear();
    EXPECT_EQ(Sizes(seq->GetDataSample(0, 1, 1000)), (std::vector<std::size_t>{100, 100}));
    EXPECT_EQ(codes_, (std::vector<std::int32_t>{-31615})) << "reported, not raised";
    EXPECT_TRUE(seq->GetDataSample(900, 1, -1).empty()) << "a start past the end finds nothing";
}

TEST_F(SequencesTest, ItemsWithoutWaveformOrRepetitionsAreInvalid) {
    const auto seq = tree_->Sequences()->Add("S");
    seq->Add(Held("A", 10), 0);
    EXPECT_TRUE(seq->GetDataSample(0, 1, -1).empty()) << "no repetition, no block";
    err_->ExceptionOnError(false);
    EXPECT_EQ(Raised([&] { seq->DataSize(); }), -31616) << "raises whatever ExceptionOnError says";
    seq->Add(nullptr, 2);
    EXPECT_EQ(Raised([&] { seq->GetDataSample(0, 1, -1); }), -31616);
}

TEST_F(SequencesTest, ItemsArePositionsAndTheCollectionQueuesHandles) {
    const auto seq = tree_->Sequences()->Add();
    EXPECT_EQ(seq->Name(), "Sequence1");
    const auto item = seq->Add(Held("A", 10), 4);
    EXPECT_EQ(seq->SequenceItem(1), item);
    EXPECT_EQ(Raised([&] { seq->SequenceItem("1"); }), -31626) << "no names here";
    EXPECT_EQ(Raised([&] { seq->SequenceItem(2); }), -31626);
    EXPECT_EQ(Raised([&] { seq->Remove(3); }), -31611);
    EXPECT_EQ(Raised([&] { tree_->Sequences()->Item("nosuch"); }), -31627);
    EXPECT_EQ(Raised([&] { tree_->Sequences()->Remove("nosuch"); }), -31611);
    auto other = NewTree();
    EXPECT_EQ(Raised([&] { seq->Add(other->Waveforms()->Add("X"), 1); }), -31618);
    EXPECT_EQ(seq->Count(), 1);
    seq->SetSequenceHandle(0);
    tree_->Sequences()->Remove(1);
    EXPECT_EQ(tree_->Sequences()->DeletedHandleCount(), 0);
}

TEST_F(SequencesTest, AnItemFollowsRenamesOfItsWaveformsTwinInAnotherCopy) {
    const auto a = Held("A", 10);
    const auto seq = tree_->Sequences()->Add("S");
    seq->Add(a, 1);
    const auto copy = tree_->Clone(nullptr);
    const auto copiedItem = copy->Sequences()->Item("S")->At(1);
    EXPECT_EQ(copiedItem->Waveform(), a) << "the clone's item refers to this tree's object";
    copy->Waveforms()->Item("A")->Name("A2");
    EXPECT_EQ(a->Name(), "A2") << "the rename reaches the object of the other copy";
    copy->Waveforms()->Item("A2")->Name("");
    EXPECT_EQ(a->Name(), "A2") << "a rename to nothing is ignored";
    a->Name("A3");
    EXPECT_EQ(seq->At(1)->Waveform(), a) << "a rename keeps the item's reference";
}

TEST_F(SequencesTest, AnItemOfAnotherCopyKeepsItsWaveformWhileTheNameLivesOn) {
    const auto a = Held("A", 10);
    Held("B", 10);
    const auto seq = tree_->Sequences()->Add("S");
    seq->Add(a, 1);
    const auto copy = tree_->Clone(nullptr);
    const auto copiedItem = copy->Sequences()->Item("S")->At(1);
    ASSERT_EQ(copiedItem->Waveform(), a);
    copy->Waveforms()->Remove("B");
    EXPECT_EQ(copiedItem->Waveform(), a) << "the name A lives on in the copy";
    a->Name("Z"); // the copy is not told
    copy->Waveforms()->Add("C");
    copy->Waveforms()->Remove("C");
    EXPECT_EQ(copiedItem->Waveform(), nullptr) << "no Z in the copy: the reference goes";
}

// A waveform given its own name again, while a sequence uses it: the twins follow a rename, and
// a rename to the same name must end at once instead of renaming them without end.
TEST_F(SequencesTest, AWaveformRenamedToItsOwnNameEndsAtOnce) {
    const auto waveform = tree_->Waveforms()->Add("Ramp");
    tree_->Sequences()->Add("Train")->Add(waveform, 2);
    waveform->Name("Ramp");
    EXPECT_EQ(tree_->Sequences()->Item(1)->SequenceItem(1)->Waveform(), waveform);
    EXPECT_EQ(waveform->Name(), "Ramp");
}

} // namespace
} // namespace qzivi
