#include "Emulator.h"

#include <bit>
#include <cmath>
#include <cstring>
#include <stdexcept>

namespace qzivi::emu {

using scpi::Error;
using scpi::FormatNumber;
using scpi::Parameter;
using scpi::ParamKind;

namespace {

constexpr int kChannels = 2;
constexpr std::size_t kMostErrors = 20;
constexpr const char* kIdentity = "QZIviFgen,33522B,EMU0000001,qzfgen-emu 1.0";

// The functions in the instrument's words, and the class's standard waveform for each (0: none).
const std::vector<std::string_view> kFunctions = {"SINusoid", "SQUare", "TRIangle", "RAMP", "PULSe",
                                                  "PRBS",     "NOISe",  "ARB",      "DC"};
const ViInt32 kWaveformOf[] = {IVIFGEN_VAL_WFM_SINE,
                               IVIFGEN_VAL_WFM_SQUARE,
                               IVIFGEN_VAL_WFM_TRIANGLE,
                               IVIFGEN_VAL_WFM_RAMP_UP,
                               0,
                               0,
                               0,
                               0,
                               IVIFGEN_VAL_WFM_DC};
const std::vector<std::string_view> kShapes = {"SINusoid", "SQUare", "TRIangle", "RAMP", "NRAMp"};
const ViInt32 kShapeOf[] = {IVIFGEN_VAL_WFM_SINE, IVIFGEN_VAL_WFM_SQUARE, IVIFGEN_VAL_WFM_TRIANGLE,
                            IVIFGEN_VAL_WFM_RAMP_UP, IVIFGEN_VAL_WFM_RAMP_DOWN};

std::string ShortForm(std::string_view notation) {
    std::string out;
    for (char c : notation)
        if (c >= 'A' && c <= 'Z') out += c;
    return out;
}

std::string UpperName(std::string_view name) {
    std::string out(name);
    for (char& c : out)
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return out;
}

// A name for volatile memory: a letter, then letters, digits and '_', at most 12 in all; a
// folder in front ("INT:\...") is taken off, as the instrument keeps its own names flat.
std::string ArbName(const Parameter& p) {
    std::string name = p.value;
    if (const auto slash = name.find_last_of("\\/"); slash != std::string::npos)
        name = name.substr(slash + 1);
    if (const auto dot = name.rfind('.'); dot != std::string::npos) name = name.substr(0, dot);
    if (name.empty() || name.size() > 12 || !std::isalpha(static_cast<unsigned char>(name[0])))
        throw Error{-224, "Illegal parameter value"};
    for (char c : name)
        if (!std::isalnum(static_cast<unsigned char>(c)) && c != '_')
            throw Error{-224, "Illegal parameter value"};
    return UpperName(name);
}

template <typename T>
T FromBytes(const char* p, bool swapped) {
    using U = std::conditional_t<sizeof(T) == 2, std::uint16_t, std::uint32_t>;
    U raw;
    std::memcpy(&raw, p, sizeof raw);
    if (!swapped) { // NORMal is most significant byte first
        U turned = 0;
        for (std::size_t i = 0; i < sizeof raw; ++i)
            turned = static_cast<U>((turned << 8) | ((raw >> (8 * i)) & 0xFF));
        raw = turned;
    }
    return std::bit_cast<T>(raw);
}

} // namespace

struct Emulator::Call {
    Emulator& emu;
    const scpi::Command& command;
    int channel = 1;

    std::string Name() const { return emu.Channel(channel); }
    const Parameter& Param(std::size_t i) const {
        if (i >= command.params.size()) throw Error{-109, "Missing parameter"};
        return command.params[i];
    }
    void Count(std::size_t n) const {
        if (command.params.size() < n) throw Error{-109, "Missing parameter"};
        if (command.params.size() > n) throw Error{-108, "Parameter not allowed"};
    }
    double Real(ViAttr attr, bool perChannel = true) const {
        ViReal64 value = 0;
        emu.Check(
            IviFgen_GetAttributeViReal64(emu.vi_, perChannel ? Name().c_str() : "", attr, &value));
        return value;
    }
    ViInt32 Int(ViAttr attr, bool perChannel = true) const {
        ViInt32 value = 0;
        emu.Check(
            IviFgen_GetAttributeViInt32(emu.vi_, perChannel ? Name().c_str() : "", attr, &value));
        return value;
    }
    bool Bool(ViAttr attr) const {
        ViBoolean value = VI_FALSE;
        emu.Check(IviFgen_GetAttributeViBoolean(emu.vi_, Name().c_str(), attr, &value));
        return value != VI_FALSE;
    }
    void SetReal(ViAttr attr, double value, bool perChannel = true) const {
        emu.Check(
            IviFgen_SetAttributeViReal64(emu.vi_, perChannel ? Name().c_str() : "", attr, value));
    }
    void SetInt(ViAttr attr, ViInt32 value, bool perChannel = true) const {
        emu.Check(
            IviFgen_SetAttributeViInt32(emu.vi_, perChannel ? Name().c_str() : "", attr, value));
    }
    void SetBool(ViAttr attr, bool value) const {
        emu.Check(IviFgen_SetAttributeViBoolean(emu.vi_, Name().c_str(), attr,
                                                value ? VI_TRUE : VI_FALSE));
    }
    // A number parameter, the only one, with the driver's range for MIN and MAX.
    double Number(ViAttr attr, std::string_view unit, bool perChannel = true) const {
        Count(1);
        ViReal64 low = 0, high = 0;
        ViBoolean hasLow = VI_FALSE, hasHigh = VI_FALSE;
        ViSession specific = 0;
        IviFgen_GetSpecificDriverCHandle(emu.vi_, &specific);
        if (Ivi_GetAttrMinMaxViReal64(specific, perChannel ? Name().c_str() : "", attr, &low, &high,
                                      &hasLow, &hasHigh) != VI_SUCCESS)
            hasLow = hasHigh = VI_FALSE;
        const double now = Real(attr, perChannel);
        return scpi::ParseNumber(Param(0), hasLow ? low : now, hasHigh ? high : now, now, unit);
    }
    static std::string Flag(bool on) { return on ? "1" : "0"; }
};

Emulator::Emulator(const std::string& logicalName) : logicalName_(logicalName) {
    table_ = Table();
    Open();
}

Emulator::~Emulator() {
    if (vi_ != 0) IviFgen_close(vi_);
}

void Emulator::Open() {
    ViSession vi = 0;
    const ViStatus status = IviFgen_InitWithOptions(const_cast<ViChar*>(logicalName_.c_str()),
                                                    VI_FALSE, VI_TRUE, "", &vi);
    if (status < 0) {
        ViStatus code = 0;
        ViChar text[256] = {};
        IviFgen_GetError(VI_NULL, &code, sizeof text, text);
        throw std::runtime_error("cannot open \"" + logicalName_ + "\": " + text);
    }
    vi_ = vi;
    Reset();
}

void Emulator::Reset() {
    for (auto& memory : waveforms_)
        memory.clear();
    for (auto& memory : sequences_)
        memory.clear();
    for (auto& c : channels_)
        c = ChannelState();
    swapped_ = false;
    IviFgen_AbortGeneration(vi_);
    IviFgen_ClearArbSequence(vi_, IVIFGEN_VAL_ALL_SEQUENCES);
    IviFgen_ClearArbWaveform(vi_, IVIFGEN_VAL_ALL_WAVEFORMS);
    IviFgen_ConfigureOutputMode(vi_, IVIFGEN_VAL_OUTPUT_FUNC);
    for (int c = 1; c <= kChannels; ++c) {
        const std::string name = Channel(c);
        // The series' power-on state: 1 kHz sine, 100 mVpp, output off, continuous.
        IviFgen_ConfigureStandardWaveform(vi_, name.c_str(), IVIFGEN_VAL_WFM_SINE, 0.1, 0, 1e3, 0);
        IviFgen_ConfigureOutputEnabled(vi_, name.c_str(), VI_FALSE);
        IviFgen_ConfigureOperationMode(vi_, name.c_str(), IVIFGEN_VAL_OPERATE_CONTINUOUS);
        IviFgen_ConfigureTriggerSource(vi_, name.c_str(), IVIFGEN_VAL_INTERNAL_TRIGGER);
    }
    IviFgen_InitiateGeneration(vi_);
    ViStatus code = 0;
    ViChar text[256];
    IviFgen_GetError(vi_, &code, sizeof text,
                     text); // the reset's refusals, if any, are no client's
}

std::string Emulator::Channel(int number) const {
    return "Channel" + std::to_string(number);
}

void Emulator::Push(const Error& error) {
    if (errors_.size() >= kMostErrors) {
        errors_.back() = {-350, "Queue overflow"};
        return;
    }
    errors_.push_back(error);
}

void Emulator::Check(ViStatus status) {
    if (status >= 0) return;
    ViStatus code = 0;
    ViChar text[256] = {};
    IviFgen_GetError(vi_, &code, sizeof text, text);
    const bool range = status == IVI_ERROR_INVALID_VALUE;
    throw Error{range ? -222 : -221,
                std::string(range ? "Data out of range" : "Settings conflict") + ";" + text};
}

void Emulator::ApplyFunction(int channel) {
    ChannelState& c = channels_[channel - 1];
    const std::string name = Channel(channel);
    const std::size_t index = scpi::ParseChoice(Parameter{ParamKind::Text, c.function}, kFunctions);
    if (kFunctions[index] == "ARB") {
        auto& waveforms = waveforms_[channel - 1];
        auto& sequences = sequences_[channel - 1];
        const bool sequence = sequences.count(c.arb) > 0;
        Check(IviFgen_ConfigureOutputMode(vi_, sequence ? IVIFGEN_VAL_OUTPUT_SEQ
                                                        : IVIFGEN_VAL_OUTPUT_ARB));
        if (sequence)
            Check(IviFgen_SetAttributeViInt32(vi_, name.c_str(), IVIFGEN_ATTR_ARB_SEQUENCE_HANDLE,
                                              sequences[c.arb]));
        else if (waveforms.count(c.arb) > 0)
            Check(IviFgen_SetAttributeViInt32(vi_, name.c_str(), IVIFGEN_ATTR_ARB_WAVEFORM_HANDLE,
                                              waveforms[c.arb]));
        return;
    }
    Check(IviFgen_ConfigureOutputMode(vi_, IVIFGEN_VAL_OUTPUT_FUNC));
    Check(IviFgen_SetAttributeViInt32(vi_, name.c_str(), IVIFGEN_ATTR_FUNC_WAVEFORM,
                                      kWaveformOf[index]));
}

void Emulator::SetVoltageEdges(int channel, double high, double low) {
    if (high <= low) throw Error{-221, "Settings conflict;high level must be above low level"};
    const std::string name = Channel(channel);
    Check(IviFgen_SetAttributeViReal64(vi_, name.c_str(), IVIFGEN_ATTR_FUNC_AMPLITUDE, high - low));
    Check(IviFgen_SetAttributeViReal64(vi_, name.c_str(), IVIFGEN_ATTR_FUNC_DC_OFFSET,
                                       (high + low) / 2));
}

std::string Emulator::Execute(std::string_view message) {
    const scpi::Parsed parsed = scpi::ParseMessage(message);
    std::string answers;
    for (const scpi::Command& command : parsed.commands) {
        try {
            const Entry* found = nullptr;
            int channel = 1;
            // A relative header tries the path it inherits, then the root, as the series does.
            for (std::size_t drop : {std::size_t{0}, command.carried}) {
                const auto nodes = std::span(command.nodes).subspan(drop);
                for (const auto& [pattern, entry] : table_) {
                    if (pattern.Common() != command.common) continue;
                    int suffix = 1;
                    if (pattern.Matches(nodes, &suffix) &&
                        (command.query ? bool(entry.query) : bool(entry.set))) {
                        found = &entry;
                        channel = suffix;
                        break;
                    }
                }
                if (found != nullptr || command.carried == 0) break;
            }
            if (found == nullptr) throw Error{-113, "Undefined header"};
            if (channel < 1 || channel > kChannels) throw Error{-114, "Header suffix out of range"};
            Call call{*this, command, channel};
            if (command.query) {
                const std::string answer = found->query(call);
                answers += (answers.empty() ? "" : ";") + answer;
            } else {
                found->set(call);
            }
        } catch (const Error& error) {
            Push(error);
        }
    }
    if (parsed.error) Push(*parsed.error);
    return answers;
}

std::vector<Emulator::Row> Emulator::Table() {
    std::vector<Row> t;
    auto number = [](ViAttr attr, std::string_view unit, bool perChannel = true) {
        return Entry{
            [=](Call& c) { c.SetReal(attr, c.Number(attr, unit, perChannel), perChannel); },
            [=](Call& c) { return FormatNumber(c.Real(attr, perChannel)); }};
    };
    auto add = [&](std::string_view pattern, Entry entry) {
        t.push_back({scpi::Pattern(pattern), std::move(entry)});
    };

    // ---- Common commands
    add("*IDN", {nullptr, [](Call&) { return std::string(kIdentity); }});
    add("*RST", {[](Call& c) { c.emu.Reset(); }, nullptr});
    add("*CLS", {[](Call& c) { c.emu.errors_.clear(); }, nullptr});
    add("*OPC", {[](Call&) {}, [](Call&) { return std::string("1"); }});
    add("*WAI", {[](Call&) {}, nullptr});
    add("*TRG", {[](Call& c) {
                     if (IviFgen_SendSoftwareTrigger(c.emu.vi_) < 0) {
                         ViStatus code = 0;
                         ViChar text[256];
                         IviFgen_GetError(c.emu.vi_, &code, sizeof text, text);
                         throw Error{-211, "Trigger ignored"};
                     }
                 },
                 nullptr});
    add("SYSTem:ERRor[:NEXT]", {nullptr, [](Call& c) {
                                    if (c.emu.errors_.empty())
                                        return std::string("+0,\"No error\"");
                                    const Error e = c.emu.errors_.front();
                                    c.emu.errors_.pop_front();
                                    return (e.number < 0 ? "" : "+") + std::to_string(e.number) +
                                           ",\"" + e.text + "\"";
                                }});
    add("SYSTem:BEEPer[:IMMediate]", {[](Call&) {}, nullptr});
    add("DISPlay:TEXT[:DATA]", {[](Call&) {}, [](Call&) { return std::string("\"\""); }});
    add("DISPlay:TEXT:CLEar", {[](Call&) {}, nullptr});
    add("FORMat:BORDer",
        {[](Call& c) {
             c.Count(1);
             c.emu.swapped_ = scpi::ParseChoice(c.Param(0), {"NORMal", "SWAPped"}) == 1;
         },
         [](Call& c) { return std::string(c.emu.swapped_ ? "SWAP" : "NORM"); }});

    add("ROSCillator:SOURce",
        {[](Call& c) {
             c.Count(1);
             const std::size_t i = scpi::ParseChoice(c.Param(0), {"INTernal", "EXTernal"});
             c.SetInt(IVIFGEN_ATTR_REF_CLOCK_SOURCE,
                      i == 0 ? IVIFGEN_VAL_REF_CLOCK_INTERNAL : IVIFGEN_VAL_REF_CLOCK_EXTERNAL,
                      false);
         },
         [](Call& c) {
             return std::string(c.Int(IVIFGEN_ATTR_REF_CLOCK_SOURCE, false) ==
                                        IVIFGEN_VAL_REF_CLOCK_EXTERNAL
                                    ? "EXT"
                                    : "INT");
         }});

    // ---- The function and its settings
    add("[SOURce#:]FUNCtion[:SHAPe]",
        {[](Call& c) {
             c.Count(1);
             const std::size_t index = scpi::ParseChoice(c.Param(0), kFunctions);
             if (kWaveformOf[index] == 0 && kFunctions[index] != "ARB")
                 throw Error{-221, "Settings conflict;" + ShortForm(kFunctions[index]) +
                                       " is not generated by this emulator"};
             c.emu.channels_[c.channel - 1].function = ShortForm(kFunctions[index]);
             c.emu.ApplyFunction(c.channel);
         },
         [](Call& c) { return c.emu.channels_[c.channel - 1].function; }});
    add("[SOURce#:]FREQuency[:CW]", number(IVIFGEN_ATTR_FUNC_FREQUENCY, "HZ"));
    add("[SOURce#:]VOLTage[:LEVel][:IMMediate][:AMPLitude]",
        number(IVIFGEN_ATTR_FUNC_AMPLITUDE, "V"));
    add("[SOURce#:]VOLTage[:LEVel][:IMMediate]:OFFSet", number(IVIFGEN_ATTR_FUNC_DC_OFFSET, "V"));
    // The high and low levels, as amplitude and offset: setting one keeps the other.
    auto edge = [](double side) {
        auto level = [side](Call& c) {
            return c.Real(IVIFGEN_ATTR_FUNC_DC_OFFSET) +
                   side * c.Real(IVIFGEN_ATTR_FUNC_AMPLITUDE) / 2;
        };
        return Entry{[=](Call& c) {
                         c.Count(1);
                         const double other = level(c) - side * c.Real(IVIFGEN_ATTR_FUNC_AMPLITUDE);
                         const double value = scpi::ParseNumber(c.Param(0), -5, 5, level(c), "V");
                         c.emu.SetVoltageEdges(c.channel, side > 0 ? value : other,
                                               side > 0 ? other : value);
                     },
                     [=](Call& c) { return FormatNumber(level(c)); }};
    };
    add("[SOURce#:]VOLTage[:LEVel][:IMMediate]:HIGH", edge(+1));
    add("[SOURce#:]VOLTage[:LEVel][:IMMediate]:LOW", edge(-1));
    add("[SOURce#:]VOLTage:UNIT",
        {[](Call& c) {
             c.Count(1);
             if (scpi::ParseChoice(c.Param(0), {"VPP", "VRMS", "DBM"}) != 0)
                 throw Error{-221, "Settings conflict;this emulator sets amplitudes in Vpp only"};
         },
         [](Call&) { return std::string("VPP"); }});
    add("[SOURce#:]FUNCtion:SQUare:DCYCle", number(IVIFGEN_ATTR_FUNC_DUTY_CYCLE_HIGH, "PCT"));
    add("[SOURce#:]FUNCtion:RAMP:SYMMetry",
        {[](Call& c) {
             c.Count(1);
             const double symmetry = scpi::ParseNumber(c.Param(0), 0, 100, 100, "PCT");
             if (symmetry != 0 && symmetry != 100)
                 throw Error{-221, "Settings conflict;this emulator ramps at 0 or 100 % only"};
             c.SetInt(IVIFGEN_ATTR_FUNC_WAVEFORM,
                      symmetry == 100 ? IVIFGEN_VAL_WFM_RAMP_UP : IVIFGEN_VAL_WFM_RAMP_DOWN);
         },
         [](Call& c) {
             return FormatNumber(
                 c.Int(IVIFGEN_ATTR_FUNC_WAVEFORM) == IVIFGEN_VAL_WFM_RAMP_DOWN ? 0 : 100);
         }});
    add("[SOURce#:]PHASe[:ADJust]", number(IVIFGEN_ATTR_FUNC_START_PHASE, "DEG"));

    // ---- Output
    add("OUTPut#[:STATe]",
        {[](Call& c) {
             c.Count(1);
             c.SetBool(IVIFGEN_ATTR_OUTPUT_ENABLED, scpi::ParseBoolean(c.Param(0)));
         },
         [](Call& c) { return Call::Flag(c.Bool(IVIFGEN_ATTR_OUTPUT_ENABLED)); }});
    add("OUTPut#:LOAD", {[](Call& c) {
                             c.Count(1);
                             const Parameter& p = c.Param(0);
                             const bool infinite =
                                 p.kind == ParamKind::Text &&
                                 (UpperName(p.value) == "INF" || UpperName(p.value) == "INFINITY");
                             // High impedance is the simulator's highest load; the channel
                             // remembers the word.
                             c.SetReal(IVIFGEN_ATTR_OUTPUT_IMPEDANCE,
                                       infinite ? 10e3 : scpi::ParseNumber(p, 1, 10e3, 50, "OHM"));
                             c.emu.channels_[c.channel - 1].highZ = infinite;
                         },
                         [](Call& c) {
                             return c.emu.channels_[c.channel - 1].highZ
                                        ? FormatNumber(9.9e37)
                                        : FormatNumber(c.Real(IVIFGEN_ATTR_OUTPUT_IMPEDANCE));
                         }});
    add("OUTPut#:TRIGger[:STATe]", {[](Call& c) {
                                        c.Count(1);
                                        scpi::ParseBoolean(c.Param(0));
                                    },
                                    [](Call&) { return std::string("0"); }});

    // ---- Arbitrary waveforms and sequences
    add("[SOURce#:]DATA:VOLatile:CLEar",
        {[](Call& c) {
             // This channel's memory; the simulator's copies of its waveforms are let go.
             auto& waveforms = c.emu.waveforms_[c.channel - 1];
             auto& sequences = c.emu.sequences_[c.channel - 1];
             for (const auto& [name, handle] : sequences)
                 c.emu.Check(IviFgen_ClearArbSequence(c.emu.vi_, handle));
             for (const auto& [name, handle] : waveforms)
                 c.emu.Check(IviFgen_ClearArbWaveform(c.emu.vi_, handle));
             waveforms.clear();
             sequences.clear();
             c.emu.channels_[c.channel - 1].arb.clear();
         },
         nullptr});
    auto upload = [](bool dac) {
        return [dac](Call& c) {
            if (c.command.params.size() < 2) throw Error{-109, "Missing parameter"};
            const std::string name = ArbName(c.Param(0));
            std::vector<double> points;
            const Parameter& first = c.Param(1);
            if (first.kind == ParamKind::Block) {
                c.Count(2);
                const std::size_t size = dac ? 2 : 4;
                if (first.value.size() % size != 0) throw Error{-161, "Invalid block data"};
                for (std::size_t i = 0; i < first.value.size(); i += size)
                    points.push_back(
                        dac ? FromBytes<std::int16_t>(&first.value[i], c.emu.swapped_) / 32767.0
                            : FromBytes<float>(&first.value[i], c.emu.swapped_));
            } else {
                for (std::size_t i = 1; i < c.command.params.size(); ++i) {
                    const double v =
                        scpi::ParseNumber(c.Param(i), dac ? -32767 : -1, dac ? 32767 : 1, 0);
                    points.push_back(dac ? std::round(v) / 32767.0 : v);
                }
            }
            for (double v : points)
                if (!(v >= -1 && v <= 1)) throw Error{-222, "Data out of range"};
            auto& waveforms = c.emu.waveforms_[c.channel - 1];
            if (waveforms.count(name) > 0 || c.emu.sequences_[c.channel - 1].count(name) > 0)
                throw Error{-221, "Settings conflict;arb name already exists"};
            ViInt32 handle = 0;
            c.emu.Check(IviFgen_CreateArbWaveform(c.emu.vi_, static_cast<ViInt32>(points.size()),
                                                  points.data(), &handle));
            waveforms[name] = handle;
        };
    };
    add("[SOURce#:]DATA:ARBitrary", {upload(false), nullptr});
    add("[SOURce#:]DATA:ARBitrary:DAC", {upload(true), nullptr});
    add("[SOURce#:]DATA:SEQuence",
        {[](Call& c) {
             c.Count(1);
             const Parameter& block = c.Param(0);
             if (block.kind != ParamKind::Block) throw Error{-104, "Data type error"};
             // "name","step",count,play,marker,point,... : five fields a step.
             const scpi::Parsed fields = scpi::ParseMessage("X " + block.value);
             if (fields.error || fields.commands.size() != 1)
                 throw Error{-161, "Invalid block data"};
             const auto& p = fields.commands[0].params;
             if (p.size() < 6 || (p.size() - 1) % 5 != 0) throw Error{-161, "Invalid block data"};
             const std::string name = ArbName(p[0]);
             std::vector<ViInt32> handles, loops;
             for (std::size_t i = 1; i < p.size(); i += 5) {
                 const auto& waveforms = c.emu.waveforms_[c.channel - 1];
                 const auto found = waveforms.find(ArbName(p[i]));
                 if (found == waveforms.end())
                     throw Error{-224, "Illegal parameter value;no arb named " + p[i].value};
                 const std::size_t play = scpi::ParseChoice(
                     p[i + 2], {"once", "onceWaitTrig", "repeat", "repeatInf", "repeatTilTrig"});
                 const double count = scpi::ParseNumber(p[i + 1], 1, 1e6, 1);
                 if (!(count >= 0 && count <= 1e6)) throw Error{-222, "Data out of range"};
                 handles.push_back(found->second);
                 loops.push_back(play == 2 ? static_cast<ViInt32>(std::max(1.0, std::round(count)))
                                 : play == 0 || play == 1 ? 1
                                                          : 1000000);
             }
             auto& sequences = c.emu.sequences_[c.channel - 1];
             if (c.emu.waveforms_[c.channel - 1].count(name) > 0 || sequences.count(name) > 0)
                 throw Error{-221, "Settings conflict;arb name already exists"};
             ViInt32 handle = 0;
             c.emu.Check(IviFgen_CreateArbSequence(c.emu.vi_, static_cast<ViInt32>(handles.size()),
                                                   handles.data(), loops.data(), &handle));
             sequences[name] = handle;
         },
         nullptr});
    add("[SOURce#:]FUNCtion:ARBitrary",
        {[](Call& c) {
             c.Count(1);
             const std::string name = ArbName(c.Param(0));
             if (c.emu.waveforms_[c.channel - 1].count(name) == 0 &&
                 c.emu.sequences_[c.channel - 1].count(name) == 0)
                 throw Error{-224, "Illegal parameter value;no arb named " + c.Param(0).value};
             c.emu.channels_[c.channel - 1].arb = name;
             if (c.emu.channels_[c.channel - 1].function == "ARB") c.emu.ApplyFunction(c.channel);
         },
         [](Call& c) { return "\"" + c.emu.channels_[c.channel - 1].arb + "\""; }});
    add("[SOURce#:]FUNCtion:ARBitrary:SRATe", number(IVIFGEN_ATTR_ARB_SAMPLE_RATE, "SA/S", false));
    add("[SOURce#:]FUNCtion:ARBitrary:ADVance",
        {[](Call& c) {
             c.Count(1);
             scpi::ParseChoice(c.Param(0), {"SRATe", "TRIGger"});
         },
         [](Call&) { return std::string("SRAT"); }});
    add("[SOURce#:]FUNCtion:ARBitrary:FILTer",
        {[](Call& c) {
             c.Count(1);
             scpi::ParseChoice(c.Param(0), {"NORMal", "STEP", "OFF"});
         },
         [](Call&) { return std::string("STEP"); }});

    // ---- Trigger and burst
    add("TRIGger#:SOURce",
        {[](Call& c) {
             c.Count(1);
             static const ViInt32 kSources[] = {IVIFGEN_VAL_INTERNAL_TRIGGER, IVIFGEN_VAL_EXTERNAL,
                                                IVIFGEN_VAL_SOFTWARE_TRIG,
                                                IVIFGEN_VAL_INTERNAL_TRIGGER};
             const std::size_t i =
                 scpi::ParseChoice(c.Param(0), {"IMMediate", "EXTernal", "BUS", "TIMer"});
             c.SetInt(IVIFGEN_ATTR_TRIGGER_SOURCE, kSources[i]);
         },
         [](Call& c) {
             switch (c.Int(IVIFGEN_ATTR_TRIGGER_SOURCE)) {
             case IVIFGEN_VAL_EXTERNAL:
                 return std::string("EXT");
             case IVIFGEN_VAL_SOFTWARE_TRIG:
                 return std::string("BUS");
             default:
                 return std::string("IMM");
             }
         }});
    add("[SOURce#:]BURSt:STATe",
        {[](Call& c) {
             c.Count(1);
             const bool on = scpi::ParseBoolean(c.Param(0));
             c.SetInt(IVIFGEN_ATTR_OPERATION_MODE,
                      on ? IVIFGEN_VAL_OPERATE_BURST : IVIFGEN_VAL_OPERATE_CONTINUOUS);
             if (on)
                 c.SetReal(IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE,
                           1 / c.emu.channels_[c.channel - 1].burstPeriod, false);
         },
         [](Call& c) {
             return Call::Flag(c.Int(IVIFGEN_ATTR_OPERATION_MODE) == IVIFGEN_VAL_OPERATE_BURST);
         }});
    add("[SOURce#:]BURSt:MODE",
        {[](Call& c) {
             c.Count(1);
             if (scpi::ParseChoice(c.Param(0), {"TRIGgered", "GATed"}) != 0)
                 throw Error{-221, "Settings conflict;this emulator bursts on triggers only"};
         },
         [](Call&) { return std::string("TRIG"); }});
    add("[SOURce#:]BURSt:NCYCles",
        {[](Call& c) {
             c.Count(1);
             const double cycles = scpi::ParseNumber(c.Param(0), 1, 100000000, 1);
             if (cycles < 1 || cycles > 100000000) throw Error{-222, "Data out of range"};
             c.SetInt(IVIFGEN_ATTR_BURST_COUNT, static_cast<ViInt32>(std::lround(cycles)));
         },
         [](Call& c) { return FormatNumber(c.Int(IVIFGEN_ATTR_BURST_COUNT)); }});
    add("[SOURce#:]BURSt:INTernal:PERiod",
        {[](Call& c) {
             c.Count(1);
             const double period = scpi::ParseNumber(c.Param(0), 1e-6, 8000, 10e-3, "S");
             if (period < 1e-6 || period > 8000) throw Error{-222, "Data out of range"};
             c.emu.channels_[c.channel - 1].burstPeriod = period;
             c.SetReal(IVIFGEN_ATTR_INTERNAL_TRIGGER_RATE, 1 / period, false);
         },
         [](Call& c) { return FormatNumber(c.emu.channels_[c.channel - 1].burstPeriod); }});

    // ---- Modulation
    auto modulation = [&](const char* am, ViAttr enabled, ViAttr source, ViAttr amount,
                          const char* amountUnit, ViAttr shape, ViAttr frequency) {
        const std::string base = std::string("[SOURce#:]") + am;
        auto pattern = [&](const char* tail) { return base + tail; };
        add(pattern(":STATe"), {[=](Call& c) {
                                    c.Count(1);
                                    c.SetBool(enabled, scpi::ParseBoolean(c.Param(0)));
                                },
                                [=](Call& c) { return Call::Flag(c.Bool(enabled)); }});
        add(pattern(":SOURce"),
            {[=](Call& c) {
                 c.Count(1);
                 const std::size_t i =
                     scpi::ParseChoice(c.Param(0), {"INTernal", "EXTernal", "CH1", "CH2"});
                 if (i > 1)
                     throw Error{-221, "Settings conflict;channels modulate each other not here"};
                 c.SetInt(source, i == 0 ? IVIFGEN_VAL_AM_INTERNAL : IVIFGEN_VAL_AM_EXTERNAL);
             },
             [=](Call& c) {
                 return std::string(c.Int(source) == IVIFGEN_VAL_AM_INTERNAL ? "INT" : "EXT");
             }});
        add(pattern(amountUnit[0] == 'P' ? ":DEPTh" : ":DEViation"),
            {[=](Call& c) { c.SetReal(amount, c.Number(amount, amountUnit, false), false); },
             [=](Call& c) { return FormatNumber(c.Real(amount, false)); }});
        add(pattern(":INTernal:FUNCtion"),
            {[=](Call& c) {
                 c.Count(1);
                 c.SetInt(shape, kShapeOf[scpi::ParseChoice(c.Param(0), kShapes)], false);
             },
             [=](Call& c) {
                 const ViInt32 value = c.Int(shape, false);
                 for (std::size_t i = 0; i < kShapes.size(); ++i)
                     if (kShapeOf[i] == value) return ShortForm(kShapes[i]);
                 return std::string("SIN");
             }});
        add(pattern(":INTernal:FREQuency"),
            {[=](Call& c) { c.SetReal(frequency, c.Number(frequency, "HZ", false), false); },
             [=](Call& c) { return FormatNumber(c.Real(frequency, false)); }});
    };
    modulation("AM", IVIFGEN_ATTR_AM_ENABLED, IVIFGEN_ATTR_AM_SOURCE,
               IVIFGEN_ATTR_AM_INTERNAL_DEPTH, "PCT", IVIFGEN_ATTR_AM_INTERNAL_WAVEFORM,
               IVIFGEN_ATTR_AM_INTERNAL_FREQUENCY);
    modulation("FM", IVIFGEN_ATTR_FM_ENABLED, IVIFGEN_ATTR_FM_SOURCE,
               IVIFGEN_ATTR_FM_INTERNAL_DEVIATION, "HZ", IVIFGEN_ATTR_FM_INTERNAL_WAVEFORM,
               IVIFGEN_ATTR_FM_INTERNAL_FREQUENCY);

    // ---- The emulator's own: what the outputs carry, seconds after generation began.
    add("[SOURce#:]EMULator:RENDer",
        {nullptr, [](Call& c) {
             c.Count(3);
             const double start = scpi::ParseNumber(c.Param(0), 0, 0, 0, "S");
             const double step = scpi::ParseNumber(c.Param(1), 0, 0, 0, "S");
             const double count = scpi::ParseNumber(c.Param(2), 0, 0, 0);
             if (!(count >= 0 && count <= 1e7)) throw Error{-222, "Data out of range"};
             std::vector<ViReal64> volts(static_cast<std::size_t>(count));
             c.emu.Check(QZIvi_RenderOutput(c.emu.vi_, c.Name().c_str(), start, step,
                                            static_cast<ViInt32>(volts.size()), volts.data()));
             std::string out;
             char text[32];
             for (double v : volts) {
                 std::snprintf(text, sizeof text, "%s%.9g", out.empty() ? "" : ",", v);
                 out += text;
             }
             return out;
         }});
    return t;
}

} // namespace qzivi::emu
