// The instrument emulator: the SCPI grammar as a stream of bytes brings it, and the emulated
// generator, whose settings reach the simulator and so its rendered output.
#include "Emulator.h"
#include "Scpi.h"
#include "Vxi11.h"
#include "platform/test_support.h"

#include <gmock/gmock.h>

#include <cstdlib>

namespace qzivi {
namespace {

using scpi::MessageReader;
using ::testing::ElementsAre;
using ::testing::HasSubstr;

std::vector<std::string> Messages(MessageReader& reader, std::string_view bytes) {
    reader.Feed(bytes);
    std::vector<std::string> out;
    std::string message;
    for (;;) {
        const auto got = reader.Next(message);
        if (got == MessageReader::Got::Nothing) return out;
        out.push_back(got == MessageReader::Got::Message ? message : "<too long>");
    }
}

TEST(ScpiGrammar, MessagesEndAtNewlinesOutsideStringsAndBlocks) {
    MessageReader reader;
    // A block may hold a newline and a ';', a string a newline; a message may come in pieces.
    EXPECT_THAT(Messages(reader, "FREQ 1\r\nDATA:ARB a,#15\n;x\na\nDATA:ARB b,#2"),
                ElementsAre("FREQ 1", "DATA:ARB a,#15\n;x\na"));
    EXPECT_THAT(Messages(reader, "03\n\n"), ElementsAre());
    EXPECT_THAT(Messages(reader, "\n\nDISP:TEXT 'a\nb'\n"),
                ElementsAre("DATA:ARB b,#203\n\n\n", "DISP:TEXT 'a\nb'"));
    MessageReader small(8);
    EXPECT_THAT(Messages(small, "FREQ 1000000000"), ElementsAre());
    EXPECT_THAT(Messages(small, "0\n*IDN?\n"), ElementsAre("<too long>", "*IDN?"));
    MessageReader whole(8);
    EXPECT_THAT(Messages(whole, "FREQ 1000000000\n*IDN?\n"), ElementsAre("<too long>", "*IDN?"))
        << "a message past the bound in one read";
}

TEST(ScpiGrammar, HeadersMatchShortOrLongFormsInAnyCaseWithOptionalNodes) {
    const auto nodes = [](std::string_view message) {
        return scpi::ParseMessage(message).commands.at(0).nodes;
    };
    int suffix = 0;
    const scpi::Pattern pattern("[SOURce#:]VOLTage[:LEVel]:OFFSet");
    EXPECT_TRUE(pattern.Matches(nodes("volt:offs 1"), &suffix));
    EXPECT_EQ(suffix, 1);
    EXPECT_TRUE(pattern.Matches(nodes("SOURce2:VOLTAGE:level:OFFSET 1"), &suffix));
    EXPECT_EQ(suffix, 2);
    EXPECT_FALSE(pattern.Matches(nodes("VOLTA:OFFS 1"), nullptr)) << "neither form";
    EXPECT_FALSE(pattern.Matches(nodes("VOLT2:OFFS 1"), nullptr)) << "no suffix there";
    EXPECT_FALSE(pattern.Matches(nodes("VOLT 1"), nullptr));
    const scpi::Pattern common("*IDN");
    EXPECT_TRUE(common.Common());
    EXPECT_TRUE(common.Matches(nodes("*idn?"), nullptr));
    EXPECT_FALSE(pattern.Common());

    const auto parsed = scpi::ParseMessage("SOUR2:FREQ 1 KHZ;VOLT? ; *TRG;:OUTP 'on', #13a,b");
    ASSERT_FALSE(parsed.error);
    ASSERT_EQ(parsed.commands.size(), 4u);
    EXPECT_THAT(parsed.commands[1].nodes, ElementsAre("SOUR2", "VOLT")) << "the path carries";
    EXPECT_EQ(parsed.commands[1].carried, 1u);
    EXPECT_TRUE(parsed.commands[1].query);
    EXPECT_TRUE(parsed.commands[2].common);
    EXPECT_THAT(parsed.commands[3].nodes, ElementsAre("OUTP")) << "':' starts from the root";
    ASSERT_EQ(parsed.commands[3].params.size(), 2u);
    EXPECT_EQ(parsed.commands[3].params[0].kind, scpi::ParamKind::String);
    EXPECT_EQ(parsed.commands[3].params[1].value, "a,b");

    for (const auto& [message, number] :
         std::vector<std::pair<std::string, int>>{{"FREQ 1,,2", -109},
                                                  {"DATA:ARB a,#19ab", -161},
                                                  {"FR@Q 1", -102},
                                                  {"DISP:TEXT 'open", -151},
                                                  {"VERYLONGKEYWORD 1", -112}})
        EXPECT_EQ(scpi::ParseMessage(message).error.value_or(scpi::Error{0, ""}).number, number)
            << message;
}

TEST(ScpiGrammar, NumbersTakeUnitsWithTheirPrefixesAndTheWordsForLimits) {
    const auto n = [](const char* text, const char* unit = "") {
        return scpi::ParseNumber({scpi::ParamKind::Text, text}, -1, 1, 0.5, unit);
    };
    EXPECT_DOUBLE_EQ(n("1.5 KHZ", "HZ"), 1500);
    EXPECT_DOUBLE_EQ(n("2MHz", "HZ"), 2e6) << "M is mega for hertz";
    EXPECT_DOUBLE_EQ(n("20mV", "V"), 0.02) << "and milli for volts";
    EXPECT_DOUBLE_EQ(n("+3e-3"), 3e-3);
    EXPECT_DOUBLE_EQ(n("max"), 1);
    EXPECT_DOUBLE_EQ(n("MINimum"), -1);
    EXPECT_DOUBLE_EQ(n("def"), 0.5);
    for (const char* bad : {"12 furlongs", "1 V", "abc", "nan"})
        EXPECT_THROW(n(bad, "HZ"), scpi::Error) << bad;
    EXPECT_EQ(scpi::Block("ab"), "#12ab");
    EXPECT_EQ(scpi::FormatNumber(1000), "+1.000000000000000E+03");
}

class EmulatorTest : public ::testing::Test {
protected:
    EmulatorTest() { ::setenv("QZIVI_SESSION_MANAGER", "none", 1); }

    std::vector<double> Render(int channel, double step, int count) {
        const std::string answer =
            emu_.Execute("SOUR" + std::to_string(channel) + ":EMUL:REND? 0," +
                         std::to_string(step) + "," + std::to_string(count));
        std::vector<double> volts;
        for (const char* p = answer.c_str(); *p != '\0';) {
            char* end = nullptr;
            volts.push_back(std::strtod(p, &end));
            p = *end == ',' ? end + 1 : end;
        }
        return volts;
    }
    std::string Error() { return emu_.Execute("SYST:ERR?"); }

    test::StoreScope store_;
    emu::Emulator emu_;
};

// What a client of the series sends commonly (shape, levels, bursts, arbitrary data in each form)
// is shown by the PyMeasure client and the network tests; here, what they do not send.
TEST_F(EmulatorTest, LevelsAndLoadsAsTheSeriesTakesThem) {
    EXPECT_THAT(emu_.Execute("*IDN?"), HasSubstr(",33522B,"));
    emu_.Execute("FUNC SQU;FREQ 2 kHz;VOLT 2;VOLT:OFFS 0.5;:OUTP ON");
    EXPECT_THAT(Render(1, 1e-4, 3), ElementsAre(1.5, 1.5, 1.5));
    EXPECT_THAT(Render(2, 1e-4, 2), ElementsAre(0, 0)) << "channel 2's output is off";
    emu_.Execute("VOLT:HIGH 3;VOLT:LOW -1");
    EXPECT_EQ(emu_.Execute("VOLT?;VOLT:OFFS?"), "+4.000000000000000E+00;+1.000000000000000E+00");
    EXPECT_EQ(emu_.Execute("VOLT:HIGH?;VOLT:LOW?"),
              "+3.000000000000000E+00;-1.000000000000000E+00");
    emu_.Execute("OUTP:LOAD INF");
    EXPECT_EQ(emu_.Execute("OUTP:LOAD?"), "+9.900000000000000E+37");
    EXPECT_EQ(Error(), "+0,\"No error\"");
}

TEST_F(EmulatorTest, RefusalsQueueTheirErrorsAndChangeNothing) {
    emu_.Execute("FREQ 5000");
    emu_.Execute("FREQ 1e12");
    emu_.Execute("BOGUS:NODE 1");
    emu_.Execute("SOUR3:FREQ 1");
    emu_.Execute("FREQ");
    emu_.Execute("FUNC:ARB NOSUCH");
    emu_.Execute("DATA:ARB W,2,0,0,0,0,0,0,0");
    EXPECT_THAT(Error(), HasSubstr("-222,\"Data out of range;"));
    EXPECT_EQ(Error(), "-113,\"Undefined header\"");
    EXPECT_EQ(Error(), "-114,\"Header suffix out of range\"");
    EXPECT_EQ(Error(), "-109,\"Missing parameter\"");
    EXPECT_THAT(Error(), HasSubstr("-224,\"Illegal parameter value;no arb named NOSUCH"));
    EXPECT_EQ(Error(), "-222,\"Data out of range\"");
    EXPECT_EQ(Error(), "+0,\"No error\"");
    EXPECT_EQ(emu_.Execute("FREQ?"), "+5.000000000000000E+03");
    for (int i = 0; i < 30; ++i)
        emu_.Execute("BOGUS");
    std::string last;
    for (int i = 0; i < 20; ++i)
        last = Error();
    EXPECT_EQ(last, "-350,\"Queue overflow\"");
    emu_.Execute("*RST");
    EXPECT_EQ(emu_.Execute("FREQ?;FUNC?;OUTP?"), "+1.000000000000000E+03;SIN;0");
    emu_.Execute("*TRG");
    EXPECT_EQ(Error(), "-211,\"Trigger ignored\"") << "no burst waits for the bus";
}

// VXI-11's calls as liblxi sends them are shown by the network test; here, what it does not send:
// records in fragments, and calls that are short, strange or past their bounds.
class Xdr {
public:
    Xdr& Word(std::uint32_t w) {
        for (int shift = 24; shift >= 0; shift -= 8)
            bytes += static_cast<char>((w >> shift) & 0xff);
        return *this;
    }
    // A call's header with empty credentials and verifier.
    static Xdr Call(std::uint32_t program, std::uint32_t version, std::uint32_t procedure) {
        Xdr x;
        x.Word(7).Word(0).Word(2).Word(program).Word(version).Word(procedure);
        x.Word(0).Word(0).Word(0).Word(0);
        return x;
    }
    std::string bytes;
};

// The accept status of a reply, and its first result word.
std::pair<std::uint32_t, std::uint32_t> StatusAndFirst(const std::optional<std::string>& reply) {
    const auto word = [&](std::size_t i) {
        std::uint32_t w = 0;
        for (std::size_t b = 0; b < 4; ++b)
            w = (w << 8) | static_cast<unsigned char>(reply->at(4 * i + b));
        return w;
    };
    return {word(5), reply->size() > 24 ? word(6) : ~0u};
}

TEST_F(EmulatorTest, Vxi11RefusesShortStrangeAndOversizedCalls) {
    using namespace emu::vxi11;
    RecordReader reader(64);
    reader.Feed(Xdr().Word(2).bytes + "ab" + Xdr().Word(0x80000001).bytes);
    std::string record;
    EXPECT_EQ(reader.Next(record), RecordReader::Got::Nothing)
        << "the last fragment is not all here";
    reader.Feed("c");
    ASSERT_EQ(reader.Next(record), RecordReader::Got::Record);
    EXPECT_EQ(record, "abc");
    reader.Feed(Xdr().Word(0x80000100).bytes);
    EXPECT_EQ(reader.Next(record), RecordReader::Got::TooLong) << "256 bytes past a bound of 64";

    const Portmapper portmapper(5555);
    EXPECT_EQ(StatusAndFirst(portmapper.Answer(
                  Xdr::Call(100000, 2, 3).Word(0x0607AF).Word(1).Word(6).Word(0).bytes)),
              std::pair(0u, 5555u));
    EXPECT_EQ(StatusAndFirst(portmapper.Answer(
                  Xdr::Call(100000, 2, 3).Word(100003).Word(3).Word(6).Word(0).bytes)),
              std::pair(0u, 0u))
        << "no other program is here";
    EXPECT_EQ(StatusAndFirst(portmapper.Answer(Xdr::Call(100000, 2, 3).Word(0x0607AF).bytes)),
              std::pair(4u, ~0u))
        << "arguments cut short";
    EXPECT_EQ(StatusAndFirst(portmapper.Answer(Xdr::Call(100000, 9, 3).bytes)), std::pair(2u, 2u))
        << "versions 2 to 4";
    EXPECT_FALSE(portmapper.Answer(Xdr().Word(7).Word(1).bytes)) << "a reply is no call";
    EXPECT_FALSE(portmapper.Answer("")) << "nor are no bytes";

    Core core(emu_);
    EXPECT_EQ(
        StatusAndFirst(core.Answer(
            Xdr::Call(0x0607AF, 1, 12).Word(9).Word(100).Word(0).Word(0).Word(0).Word(0).bytes)),
        std::pair(0u, 4u))
        << "a read on a link never made";
    EXPECT_EQ(StatusAndFirst(core.Answer(Xdr::Call(0x0607AF, 1, 10)
                                             .Word(1)
                                             .Word(0)
                                             .Word(0)
                                             .Word(0xFFFFFFFF) // a device name of 4 GB
                                             .bytes)),
              std::pair(4u, ~0u));
    EXPECT_EQ(StatusAndFirst(core.Answer(Xdr::Call(0x0607AF, 1, 99).bytes)), std::pair(3u, ~0u));
    EXPECT_EQ(Error(), "+0,\"No error\"") << "none of it reached the instrument";
}

} // namespace
} // namespace qzivi
