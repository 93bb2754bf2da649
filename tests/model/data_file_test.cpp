// Waveform data files: the three formats, the text reader's rules and quirks, and a comparison
// with a literal model of those rules over many generated files.
#include "literal_reader.h"
#include "qzivi/model/CDblArrayFromFile.h"
#include "qzivi/support/failure.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <optional>
#include <random>
#include <unistd.h>

namespace qzivi {
namespace {

namespace fs = std::filesystem;

class DataFileTest : public ::testing::Test {
protected:
    DataFileTest() {
        dir_ = fs::temp_directory_path() / ("qzivi-data-" + std::to_string(::getpid()));
        fs::create_directories(dir_);
    }
    ~DataFileTest() override { fs::remove_all(dir_); }

    std::string Write(const std::string& bytes, const std::string& name = "data.txt") {
        const auto path = (dir_ / name).string();
        std::ofstream(path, std::ios::binary) << bytes;
        return path;
    }
    template <typename Int>
    std::string WriteInts(const std::vector<Int>& values) {
        return Write(
            std::string(reinterpret_cast<const char*>(values.data()), values.size() * sizeof(Int)),
            "data.bin");
    }
    std::vector<double> Text(const std::string& bytes, std::int32_t start = 0,
                             std::int32_t interval = 1, std::int32_t count = -1) {
        return reader_.RetrieveDblArray(DataFileASCII, Write(bytes), start, interval, count);
    }
    static std::string Repeat(const std::string& piece, int times) {
        std::string s;
        for (int i = 0; i < times; ++i)
            s += piece;
        return s;
    }

    fs::path dir_;
    CDblArrayFromFile reader_;
};

using V = std::vector<double>;
using test::Literal;
using test::LiteralRead;

TEST_F(DataFileTest, TextSplitsAtTheDelimiterFoundAfterTheFirstDigit) {
    EXPECT_EQ(Text("0,1,2,3,4,5", 1, 2), (V{1, 3, 5}));
    EXPECT_EQ(Text("1,x,3"), (V{1, 3})) << "a token that is no number takes no place";
    EXPECT_EQ(Text("1.5\r\n-2\r\n3e2\r\n"), (V{1.5, -2, 300}))
        << "carriage return, then tokens with a line feed";
    EXPECT_EQ(Text("Volts\n0.25 0.5 +1"), (V{0.25, 0.5, 1}))
        << "a header before the first digit is skipped";
    EXPECT_EQ(Text("1;2,3,4"), (V{1})) << "the semicolon comes first in the order of delimiters";
    EXPECT_EQ(Text(" 1 , 2 ,\t3"), (V{1, 2, 3}));
}

TEST_F(DataFileTest, TextQuirksStayAsTheyAre) {
    EXPECT_EQ(Text("-1.5,2"), (V{1.5, 2})) << "the first number loses its sign";
    EXPECT_EQ(Text(".5,2"), (V{5, 2})) << "and its leading point";
    EXPECT_TRUE(Text("1.5").empty()) << "no delimiter, no data";
    EXPECT_EQ(Text("1.5,"), (V{1.5})) << "a delimiter: the tokens 1.5 and one without a number";
    EXPECT_TRUE(Text("").empty());
    EXPECT_TRUE(Text("no digits at all, none").empty());
    EXPECT_EQ(Text("1,2,3,"), (V{1, 2, 3})) << "a trailing delimiter's empty token gives nothing";
    EXPECT_EQ(Text("1,2,3", 0, 1, 3), (V{1, 2, 3}));
    EXPECT_TRUE(Text("1,2,3", 0, 1, 4).empty()) << "one more than there are: no data";
    EXPECT_TRUE(Text("1,2,3", 0, 0).empty()) << "a step of 0";
    EXPECT_TRUE(Text("1,2,3", 5).empty()) << "a start past the end";
    EXPECT_EQ(Text("1,2,3,4,5,6", 0, 4), (V{1, 5})) << "tokens 0 and 4";
    EXPECT_EQ(Text("0,1,2,3,4,5", 1, 2, 3), (V{1, 3, 5})) << "three points are there to take";
    EXPECT_EQ(Text("1,inf,nan,0x10,2"), (V{1, 2})) << "only plain decimal numbers";
}

TEST_F(DataFileTest, ASmallFileWithADelimiterButNoNumberFails) {
    try {
        Text("1x,y");
        FAIL() << "the cut to no element must fail";
    } catch (const Failure& f) {
        EXPECT_EQ(f.Number(), runtime::kIndexOutOfRange);
    }
}

TEST_F(DataFileTest, TenThousandBytesIsSmallTenThousandAndOneIsBlocks) {
    // 5000 tokens in the first 10000 bytes; a larger file steps anew in its next block.
    const std::string first = "7," + Repeat("0,", 4999);
    ASSERT_EQ(first.size(), 10000u);
    const V small = Text(first, 0, 3);
    EXPECT_EQ(small.size(), 1667u);
    const V blocks = Text(first + "5,6,7,8,", 0, 3);
    ASSERT_EQ(blocks.size(), 1669u);
    EXPECT_EQ(blocks[0], 7);
    EXPECT_EQ(blocks[1667], 5) << "the second block starts again at its token 0";
    EXPECT_EQ(blocks[1668], 8);
    EXPECT_EQ(Text(first + "5,6,7,8,", 6000), (V{5, 6, 7, 8}))
        << "a start beyond the first block skips that block";
    // At the end of the file the text after the last delimiter is cut away as the tail.
    const V cut = Text(first + "5,6,7,8");
    EXPECT_EQ(cut.back(), 7);
    const std::string exact = Repeat("1,", 4998) + "7,89";
    ASSERT_EQ(exact.size(), 10000u);
    EXPECT_EQ(Text(exact).back(), 89) << "the small path keeps it";
}

TEST_F(DataFileTest, IntegerFormatsScaleAndStep) {
    const auto path16 = WriteInts<std::int16_t>({32767, -32768, 0, 16384, 1, 2, 3, 4, 5, 6});
    const V all = reader_.RetrieveDblArray(DataFile2ByteInteger, path16, 0, 1, -1);
    ASSERT_EQ(all.size(), 10u);
    EXPECT_EQ(all[0], 1.0);
    EXPECT_EQ(all[1], -32768.0 / 32767.0) << "just below -1";
    EXPECT_EQ(reader_.RetrieveDblArray(DataFile2ByteInteger, path16, 1, 3, -1),
              (V{-32768.0 / 32767, 1 / 32767.0, 4 / 32767.0}));
    EXPECT_EQ(reader_.RetrieveDblArray(DataFile2ByteInteger, path16, 2, 2, 2), (V{0, 1 / 32767.0}));
    EXPECT_TRUE(reader_.RetrieveDblArray(DataFile2ByteInteger, path16, 2, 2, 5).empty())
        << "beyond the data";
    EXPECT_TRUE(reader_.RetrieveDblArray(DataFile2ByteInteger, path16, 0, 0, -1).empty())
        << "a step of 0";
    EXPECT_TRUE(reader_.RetrieveDblArray(DataFile2ByteInteger, path16, -1, 1, 3).empty())
        << "before the file";

    const auto path32 = WriteInts<std::int32_t>({2147483647, -1073741824});
    EXPECT_EQ(reader_.RetrieveDblArray(DataFile4ByteInteger, path32, 0, 1, -1),
              (V{1.0, -1073741824 / 2147483647.0}));
    EXPECT_EQ(reader_.RetrieveDblArray(DataFile2ByteInteger,
                                       Write(std::string("\x01\x00\x02\x00\x03", 5), "odd.bin"), 0,
                                       1, -1),
              (V{1 / 32767.0, 2 / 32767.0}))
        << "a rest shorter than one element is dropped";
    EXPECT_TRUE(
        reader_.RetrieveDblArray(DataFile4ByteInteger, Write("", "empty.bin"), 0, 1, -1).empty());
}

TEST_F(DataFileTest, BadFilesGiveNoDataWithTheirCauseAndAnUnknownTypeFails) {
    // A sparse file of 2^33 16-bit points: more than any memory takes, refused before reading.
    const std::string huge = (dir_ / "huge.i16").string();
    std::ofstream(huge, std::ios::binary) << "ab";
    fs::resize_file(huge, std::uintmax_t{1} << 34);
    const struct {
        std::int32_t format;
        std::string path;
        std::int32_t count;
        std::string trouble;
    } cases[] = {
        {DataFileASCII, (dir_ / "missing.txt").string(), -1, "does not exist"},
        {DataFile2ByteInteger, "", -1, "no data file is named"},
        {DataFile4ByteInteger, dir_.string(), -1, "is no regular file"},
        {DataFileASCII, Write("", "empty.txt"), -1, "is empty"},
        {DataFileASCII, Write("volts", "words.txt"), -1, "holds no delimited numbers"},
        {DataFile2ByteInteger, Write("abcd", "two.i16"), 3, "fewer than the 3 points asked for"},
        {DataFile2ByteInteger, huge, -1, "more than this computer's memory can take"},
    };
    for (const auto& c : cases) {
        EXPECT_TRUE(reader_.RetrieveDblArray(c.format, c.path, 0, 1, c.count).empty()) << c.path;
        EXPECT_NE(reader_.Trouble().find(c.trouble), std::string::npos) << reader_.Trouble();
    }
    EXPECT_EQ(reader_.RetrieveDblArray(DataFile2ByteInteger, huge, 0, 1, 1),
              V{('b' * 256 + 'a') / 32767.0})
        << "a part of it is read";
    EXPECT_EQ(reader_.Trouble(), "");
    try {
        reader_.RetrieveDblArray(4, Write("1,2"), 0, 1, -1);
        FAIL();
    } catch (const Failure& f) {
        EXPECT_EQ(f.Number(), -60040);
        EXPECT_EQ(f.Description(), "Improper file type.");
    }
    std::mt19937 random(11);
    for (int round = 0; round < 30; ++round) {
        std::string noise(static_cast<std::size_t>(random() % 30000), '\0');
        for (char& c : noise)
            c = static_cast<char>(random());
        const auto path = Write(noise, "noise.bin");
        EXPECT_EQ(reader_.RetrieveDblArray(DataFile2ByteInteger, path, 0, 1, -1).size(),
                  noise.size() / 2);
        EXPECT_EQ(reader_.RetrieveDblArray(DataFile4ByteInteger, path, 0, 1, -1).size(),
                  noise.size() / 4);
        try {
            for (double v : reader_.RetrieveDblArray(DataFileASCII, path, 0, 1, -1))
                EXPECT_FALSE(std::isnan(v));
        } catch (const Failure& f) {
            EXPECT_EQ(f.Number(), runtime::kIndexOutOfRange);
        }
    }
}

TEST_F(DataFileTest, AgreesWithTheLiteralRulesOnGeneratedFiles) {
    std::mt19937 random(2024);
    const std::string alphabet = "0123456789012345678901234567890123456789..--+e,,,,;\r\n\n  \tx";
    int compared = 0;
    for (int round = 0; round < 400; ++round) {
        const std::size_t size = random() % 3 == 0 ? 9990 + random() % 20 : random() % 32000;
        std::string file(size, ' ');
        for (char& c : file)
            c = alphabet[random() % alphabet.size()];
        if (round % 7 == 0 && !file.empty()) file[random() % file.size()] = '\0';
        const auto path = Write(file);
        const std::int32_t start =
            static_cast<std::int32_t>(random() % 5 == 0 ? random() % 12000 : random() % 4);
        const std::int32_t interval =
            static_cast<std::int32_t>(random() % 6) - (round % 29 == 0 ? 1 : 0);
        const std::int32_t count =
            random() % 3 == 0 ? static_cast<std::int32_t>(random() % 3000) : -1;
        const Literal expected = LiteralRead(file, start, interval, count);
        SCOPED_TRACE("round " + std::to_string(round) + ", " + std::to_string(size) +
                     " bytes, start " + std::to_string(start) + ", interval " +
                     std::to_string(interval) + ", count " + std::to_string(count));
        try {
            const V got = reader_.RetrieveDblArray(DataFileASCII, path, start, interval, count);
            ASSERT_FALSE(expected.cutFails);
            ASSERT_EQ(got, expected.values.value_or(V{}));
        } catch (const Failure& f) {
            ASSERT_TRUE(expected.cutFails) << f.Description();
        }
        ++compared;
    }
    EXPECT_EQ(compared, 400);
}

} // namespace
} // namespace qzivi
