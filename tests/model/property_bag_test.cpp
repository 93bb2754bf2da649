// The property bag: typed values with defaults, and its block of bytes read back, or refused
// cleanly when it is not one.
#include "qzivi/model/PropertyBag.h"
#include "qzivi/support/failure.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cctype>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace qzivi {
namespace {

PropertyBag Sample() {
    PropertyBag bag;
    bag.WriteInt32("Channels_ItemCount", 2, 0);
    bag.WriteDouble("ArbSampleRate", 2.5e6, 1000);
    bag.WriteBool("AutoStopStart", false, true);
    bag.WriteText("LogicalName", "Bench Fgen \xC3\xA4");
    bag.WriteBytes("Waveforms_Item1_Waveform_Data", {0, 1, 2, 255});
    return bag;
}

TEST(PropertyBag, ReadsWhatWasWrittenAndDefaultsForTheRest) {
    const PropertyBag bag = Sample();
    EXPECT_EQ(bag.ReadInt32("channels_itemcount", 0), 2) << "names ignore case";
    EXPECT_EQ(bag.ReadInt32("CHANNELS_ITEMCOUNT", 0), 2);
    EXPECT_EQ(bag.ReadInt32("Channels_ItemCoun", 0), 0);
    EXPECT_EQ(bag.ReadInt32(std::string("Channels_ItemCount\0", 19), 0), 0)
        << "no name is padded to another";
    EXPECT_EQ(bag.ReadDouble("ArbSampleRate", 0), 2.5e6);
    EXPECT_FALSE(bag.ReadBool("AutoStopStart", true));
    EXPECT_EQ(bag.ReadText("LogicalName", ""), "Bench Fgen \xC3\xA4");
    EXPECT_EQ(bag.ReadBytes("Waveforms_Item1_Waveform_Data"), (Bytes{0, 1, 2, 255}));
    EXPECT_EQ(bag.ReadInt32("Missing", 17), 17);
    EXPECT_EQ(bag.ReadText("Missing", "x"), "x");
    EXPECT_TRUE(bag.ReadBytes("Missing").empty());
}

TEST(PropertyBag, FoldsOnlyTheAsciiCapitals) {
    // Each pair differs by the bit that tells a capital from a small letter, at every place of
    // a word: beside the letters ('@' 'A', 'Z' '['), and in bytes past ASCII ("\xC3\x84" is
    // a capital, "\xC3\xA4" its small letter: this bag keeps both apart).
    const std::vector<std::pair<std::string, std::string>> distinct = {
        {"@", "`"},       {"[", "{"},
        {"A@Z[", "a`z{"}, {"\xC3\x84", "\xC3\xA4"},
        {"\xC1", "\xE1"}, {"Waveforms_Item1@", "Waveforms_Item1`"},
        {"^_", "~\x7F"}};
    for (const auto& [a, b] : distinct) {
        PropertyBag bag;
        bag.WriteInt32(a, 1, 0);
        bag.WriteInt32(b, 2, 0);
        EXPECT_EQ(bag.Size(), 2u) << a << " and " << b << " are two names";
        EXPECT_EQ(bag.ReadInt32(a, 0), 1);
        EXPECT_EQ(bag.ReadInt32(b, 0), 2);
    }
    PropertyBag bag;
    const std::string name = "Sequences_Item12_Waveforms_Item345_Count";
    bag.WriteInt32(name, 7, 0);
    std::string other = name;
    for (std::size_t i = 0; i < name.size(); ++i) {
        other[i] = static_cast<char>(std::islower(static_cast<unsigned char>(name[i]))
                                         ? std::toupper(static_cast<unsigned char>(name[i]))
                                         : std::tolower(static_cast<unsigned char>(name[i])));
        EXPECT_EQ(bag.ReadInt32(other, 0), 7) << other;
    }
}

TEST(PropertyBag, KeepsNoValueEqualToItsDefault) {
    PropertyBag bag;
    bag.WriteInt32("UIStyle", 2, 1);
    EXPECT_TRUE(bag.Contains("UIStyle"));
    bag.WriteInt32("UIStyle", 1, 1);
    EXPECT_FALSE(bag.Contains("UIStyle")) << "writing the default again removes the old value";
    EXPECT_EQ(bag.ReadInt32("UIStyle", 1), 1);
    bag.WriteText("LogicalName", "");
    EXPECT_TRUE(bag.Contains("LogicalName")) << "a text with no default is always kept";
}

TEST(PropertyBag, ConvertsBetweenNumbersButRefusesTextAsNumber) {
    PropertyBag bag;
    bag.WriteText("Name", "Channel1", "");
    bag.WriteDouble("Big", 1e12, 0);
    try {
        bag.ReadInt32("Name", 0);
        FAIL() << "a text is no number";
    } catch (const Failure& f) {
        EXPECT_EQ(f.Number(), runtime::kWrongType);
    }
    try {
        bag.ReadInt32("Big", 0);
        FAIL() << "1e12 does not fit 32 bits";
    } catch (const Failure& f) {
        EXPECT_EQ(f.Number(), runtime::kOverflow);
    }
    EXPECT_EQ(bag.ReadText("Big", ""), "1000000000000");
}

TEST(PropertyBag, ContentsComeBackWhole) {
    const PropertyBag bag = Sample();
    const Bytes block = bag.Contents();
    ASSERT_GE(block.size(), 9u);
    EXPECT_EQ(std::string(block.begin(), block.begin() + 4), "QZPB");
    PropertyBag copy;
    copy.WriteInt32("Stale", 1, 0);
    copy.SetContents(block);
    EXPECT_EQ(copy, bag);
    EXPECT_FALSE(copy.Contains("Stale"));
    EXPECT_EQ(copy.Contents(), block);
}

// Every cut of a good block, and random blocks, are refused with the improper-file failure and
// leave the bag as it was.
TEST(PropertyBag, RefusesEveryTruncationAndRandomBytes) {
    const Bytes block = Sample().Contents();
    PropertyBag bag;
    bag.WriteText("Keep", "me", "");
    const PropertyBag before = bag;
    for (std::size_t size = 0; size < block.size(); ++size) {
        try {
            bag.SetContents(std::span(block.data(), size));
            FAIL() << "a block cut at " << size << " was taken";
        } catch (const Failure& f) {
            EXPECT_EQ(f.Number(), runtime::kImproperFile);
            EXPECT_THAT(f.Description(), ::testing::HasSubstr("corrupt"));
        }
        ASSERT_EQ(bag, before);
    }
    std::mt19937 random(7);
    for (int round = 0; round < 200; ++round) {
        Bytes noise(static_cast<std::size_t>(random() % 64));
        for (auto& b : noise)
            b = static_cast<std::uint8_t>(random());
        if (round % 2 == 0 && noise.size() >= 9)
            std::copy(block.begin(), block.begin() + 5, noise.begin());
        EXPECT_THROW(bag.SetContents(noise), Failure);
        ASSERT_EQ(bag, before);
    }
}

TEST(PropertyBag, NeverTrustsALength) {
    Bytes block = Sample().Contents();
    // A count of four billion entries in a block of a few dozen bytes.
    block[5] = block[6] = block[7] = block[8] = 0xFF;
    PropertyBag bag;
    try {
        bag.SetContents(block);
        FAIL();
    } catch (const Failure& f) {
        EXPECT_THAT(f.Description(), ::testing::HasSubstr("cannot fit"));
    }
    // A text that claims 4 GiB.
    PropertyBag one;
    one.WriteText("T", "abc");
    Bytes text = one.Contents();
    text[text.size() - 7] = text[text.size() - 6] = text[text.size() - 5] = text[text.size() - 4] =
        0xFF;
    EXPECT_THROW(bag.SetContents(text), Failure);
    // Trailing bytes, a doubled name, an unknown type.
    Bytes trailing = one.Contents();
    trailing.push_back(0);
    EXPECT_THROW(bag.SetContents(trailing), Failure);
}

} // namespace
} // namespace qzivi
