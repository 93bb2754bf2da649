#include "Commands.h"

#include "Arguments.h"

#include "IviFgen.h"
#include "qzivi/config_store.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/model/Waveforms.h"
#include "qzivi/panels/MUiAndStringUtil.h"
#include "qzivi/support/failure.h"
#include "qzivi/support/text.h"
#include "qzivi/trace.h"

#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <optional>

namespace qzfgen {

namespace {

using qzivi::QZIviFgen;

constexpr const char* kDefaultName = "SampleFGen";

// A control that raises what fails, on a fresh default tree.
struct Control {
    Control() {
        fgen.InitProperties();
        fgen.ExceptionOnError(true);
    }
    ~Control() {
        qzivi::Quietly([&] {
            if (fgen.SessionHandle() != 0) fgen.CloseSession();
        });
    }
    QZIviFgen fgen;
};

void Load(QZIviFgen& fgen, const std::string& file) {
    fgen.Configurations()->Add("file", file)->Load();
}

std::string Engineering(double value, const char* unit) {
    std::string text = qzivi::FormatEngineering(value, 3); // " 2.500 k": the blank of the sign
    if (!text.empty() && text[0] == ' ') text.erase(0, 1);
    return text + unit;
}

// "Sine" for 1, from the names the pages show.
std::string FunctionName(std::int32_t waveform) {
    static const char* const kNames[] = {"",        "Sine",      "Square", "Triangle",
                                         "Ramp Up", "Ramp Down", "DC"};
    return waveform >= 1 && waveform <= 6 ? kNames[waveform] : std::to_string(waveform);
}

std::string DriverText(QZIviFgen& fgen, ViAttr attribute) {
    try {
        return fgen.Engine().GetAttributeVi(qzivi::AttrType::String, attribute, "").AsText();
    } catch (const qzivi::Failure&) {
        return "?";
    }
}

// What each channel whose output is on now does, one line each.
void PrintOutputs(QZIviFgen& fgen) {
    std::printf("Driver: %s (%s), %s, on \"%s\"\n",
                DriverText(fgen, IVI_ATTR_SPECIFIC_DRIVER_PREFIX).c_str(),
                DriverText(fgen, IVI_ATTR_SPECIFIC_DRIVER_DESCRIPTION).c_str(),
                DriverText(fgen, IVI_ATTR_INSTRUMENT_MODEL).c_str(), fgen.LogicalName().c_str());
    for (const auto& channel : *fgen.Channels()) {
        const auto& c = *channel;
        std::string does;
        if (!c.OutputEnabled()) {
            does = "output off";
        } else if (fgen.OutputMode() == qzivi::qzivifgenOutputArb && c.ArbWaveform()) {
            does = "waveform \"" + c.ArbWaveform()->Name() + "\", gain " +
                   qzivi::text::FormatNumber(c.ArbGain()) + ", offset " +
                   Engineering(c.ArbOffset(), "V");
        } else if (fgen.OutputMode() == qzivi::qzivifgenOutputSeq && c.Sequence()) {
            does = "sequence \"" + c.Sequence()->Name() + "\" of " +
                   std::to_string(c.Sequence()->Count()) + " items, gain " +
                   qzivi::text::FormatNumber(c.ArbGain()) + ", offset " +
                   Engineering(c.ArbOffset(), "V");
        } else {
            does = FunctionName(c.FuncWaveform()) + " " + Engineering(c.FuncFrequency(), "Hz") +
                   ", " + Engineering(c.FuncAmplitude(), "Vpp") + ", offset " +
                   Engineering(c.FuncDCOffset(), "V");
            if (c.FuncWaveform() == qzivi::qzivifgenWaveformSquare)
                does += ", duty " + qzivi::text::FormatNumber(c.FuncDutyCycleHigh()) + " %";
        }
        if (c.OutputEnabled() && c.OperationMode() == qzivi::qzivifgenOperateBurst)
            does += ", bursts of " + std::to_string(c.BurstCount());
        std::printf("  %s: %s\n", c.Name().c_str(), does.c_str());
    }
}

std::vector<std::string> Split(const std::string& list) {
    std::vector<std::string> parts;
    std::size_t from = 0;
    for (std::size_t comma; (comma = list.find(',', from)) != std::string::npos; from = comma + 1)
        parts.push_back(list.substr(from, comma - from));
    parts.push_back(list.substr(from));
    return parts;
}

void RequireFile(const std::string& path);

// The format of a data file: named by --format, else by its extension (.i16, .i32, else text).
std::int32_t FormatOf(const std::string& path, const std::optional<std::string>& named) {
    const std::string name =
        named ? qzivi::text::Lower(*named) : std::filesystem::path(path).extension().string();
    if (name == "ascii" || name == "text") return qzivi::qzivifgenASCIIFile;
    if (name == "int16" || name == ".i16") return qzivi::qzivifgen2ByteInteger;
    if (name == "int32" || name == ".i32") return qzivi::qzivifgen4ByteInteger;
    if (named) throw Misuse("--format: \"" + *named + "\" is none of ascii, int16, int32");
    return qzivi::qzivifgenASCIIFile;
}

// Waveforms from the data files of --data, their points held in the configuration so that it
// stands alone; for --mode sequence one sequence of them all with --iterations (1 each by default);
// every channel plays the first waveform or the sequence.
void AddArbitrary(QZIviFgen& fgen, const Arguments& args, bool sequence) {
    const auto data = args.Text("data");
    if (!data)
        throw Misuse("--mode " + std::string(sequence ? "sequence" : "arb") +
                     " needs --data FILE[,FILE...]");
    const auto files = Split(*data);
    std::vector<std::int32_t> iterations(files.size(), 1);
    if (const auto list = args.Text("iterations")) {
        const auto parts = Split(*list);
        if (parts.size() != files.size())
            throw Misuse("--iterations: one count for each data file");
        for (std::size_t i = 0; i < parts.size(); ++i) {
            const auto n = ParseNumber(parts[i]);
            if (!n || *n < 1 || *n != std::floor(*n) || *n > 2147483647.0)
                throw Misuse("--iterations: \"" + parts[i] + "\" is not a whole number from 1");
            iterations[i] = static_cast<std::int32_t>(*n);
        }
    }
    fgen.Extensions(fgen.Extensions() | qzivi::qzivifgenArbWfmExt |
                    (sequence ? qzivi::qzivifgenArbSeqExt : 0));
    fgen.OutputMode(sequence ? qzivi::qzivifgenOutputSeq : qzivi::qzivifgenOutputArb);
    if (const auto rate = args.Number("sample-rate")) fgen.ArbSampleRate(*rate);
    std::shared_ptr<qzivi::QZIviFgenSequence> train;
    if (sequence) train = fgen.Sequences()->Add();
    std::shared_ptr<qzivi::QZIviFgenArbWaveform> first;
    for (std::size_t i = 0; i < files.size(); ++i) {
        RequireFile(files[i]);
        qzivi::QZIviFgenArbWaveform file;
        file.Name(files[i]);
        file.Source(FormatOf(files[i], args.Text("format")));
        file.Filename(files[i]);
        const qzivi::Points points = file.GetDataSample(0, 1, -1);
        if (!points) throw Misuse("\"" + files[i] + "\" holds no points in that format");
        const auto waveform =
            fgen.Waveforms()->Add(std::filesystem::path(files[i]).stem().string());
        waveform->Data(*points);
        if (!first) first = waveform;
        if (train) train->Add(waveform, iterations[i]);
    }
    for (const auto& channel : *fgen.Channels()) {
        channel->ArbWaveform(first);
        if (train) channel->Sequence(train);
        channel->ArbGain(1);
    }
}

// The settings the options give, on the tree as it stands; the built-in example otherwise.
void BuildFromOptions(QZIviFgen& fgen, const Arguments& args, bool haveFile) {
    const long long channels = args.Whole("channels", haveFile ? 0 : 2, 0, 64);
    while (fgen.Channels()->Count() < channels)
        fgen.Channels()->Add();
    std::int32_t waveform = 0;
    if (const auto name = args.Text("waveform")) {
        // "ramp-up" names "Ramp Up"
        const auto spoken = [](std::string text) {
            for (char& c : text)
                if (c == '-' || c == '_') c = ' ';
            return qzivi::text::Lower(text);
        };
        for (std::int32_t w = 1; w <= 6; ++w)
            if (spoken(FunctionName(w)) == spoken(*name)) waveform = w;
        if (waveform == 0)
            throw Misuse("--waveform: \"" + *name +
                         "\" is none of sine, square, triangle, ramp-up, ramp-down, dc");
    }
    const auto frequency = args.Number("frequency"), amplitude = args.Number("amplitude"),
               offset = args.Number("offset"), duty = args.Number("duty");
    const std::string mode = qzivi::text::Lower(args.Text("mode", "function"));
    if (mode == "arb" || mode == "sequence")
        AddArbitrary(fgen, args, mode == "sequence");
    else if (mode != "function")
        throw Misuse("--mode: \"" + mode + "\" is none of function, arb, sequence");
    int index = 0;
    for (const auto& channel : *fgen.Channels()) {
        auto& c = *channel;
        if (!haveFile && !args.Text("waveform") && index == 1) { // the example's second channel
            c.FuncWaveform(qzivi::qzivifgenWaveformSquare);
            c.FuncFrequency(2500);
            c.FuncAmplitude(1);
            c.FuncDCOffset(0.5);
        } else if (!haveFile) {
            c.FuncFrequency(1000);
            c.FuncAmplitude(2);
        }
        if (waveform != 0) c.FuncWaveform(waveform);
        if (frequency) c.FuncFrequency(*frequency);
        if (amplitude) c.FuncAmplitude(*amplitude);
        if (offset) c.FuncDCOffset(*offset);
        if (duty) c.FuncDutyCycleHigh(*duty);
        ++index;
    }
}

void RequireFile(const std::string& path) {
    std::error_code error;
    if (!std::filesystem::is_regular_file(path, error))
        throw Misuse("\"" + path + "\" is " +
                     (std::filesystem::exists(path, error) ? "no regular file" : "not there"));
}

void Open(QZIviFgen& fgen, const Arguments& args) {
    fgen.LogicalName(
        args.Text("name", fgen.LogicalName().empty() ? kDefaultName : fgen.LogicalName()));
    fgen.Init();
}

// ---- The commands ----

int Names(const std::vector<std::string>& words) {
    const Arguments args(words, {}, {});
    args.NoneMore();
    const auto store = qzivi::ivi::LoadConfigStore();
    std::printf("Store: %s\n\n", store.path.empty()
                                     ? "none; only the built-in \"SampleFGen\" stands"
                                     : store.path.c_str());
    std::printf("%-16s %-10s %-12s %-16s %s\n", "LOGICAL NAME", "MODULE", "PREFIX", "RESOURCE",
                "OPTIONS");
    for (const auto& session : store.sessions)
        std::printf("%-16s %-10s %-12s %-16s %s\n", session.logicalName.c_str(),
                    session.module.c_str(), session.prefix.c_str(), session.resource.c_str(),
                    session.options.c_str());
    return 0;
}

int Store(const std::vector<std::string>& words) {
    const Arguments args(words, {}, {});
    args.NoneMore();
    const std::string used = qzivi::ivi::FindConfigStoreFile();
    std::printf("The class driver reads the first store of these that exists:\n");
    int n = 0;
    std::error_code error;
    for (const auto& path : qzivi::ivi::ConfigStoreSearchOrder())
        std::printf("  %d. %s  [%s]\n", ++n, path.c_str(),
                    path == used                           ? "in use"
                    : std::filesystem::exists(path, error) ? "exists"
                                                           : "missing");
    if (used.empty()) std::printf("None exists: only the built-in \"SampleFGen\" stands.\n");
    return 0;
}

int Configure(const std::vector<std::string>& words) {
    const Arguments args(words, {"name", "trace"}, {});
    const std::string file = args.Only("configuration file");
    Control control;
    Load(control.fgen, file);
    if (const auto trace = args.Text("trace")) qzivi::ivi::SetTraceFile(*trace);
    Open(control.fgen, args);
    control.fgen.Configure();
    qzivi::ivi::SetTraceFile("");
    PrintOutputs(control.fgen);
    return 0;
}

int Initiate(const std::vector<std::string>& words) {
    const Arguments args(words, {"name"}, {});
    const std::string file = args.Only("configuration file", false);
    Control control;
    if (!file.empty()) Load(control.fgen, file);
    Open(control.fgen, args);
    if (!file.empty()) control.fgen.Configure();
    control.fgen.Initiate();
    std::printf("Generation started on \"%s\".\n", control.fgen.LogicalName().c_str());
    return 0;
}

int Abort(const std::vector<std::string>& words) {
    const Arguments args(words, {"name"}, {});
    args.NoneMore();
    Control control;
    Open(control.fgen, args);
    control.fgen.Abort();
    std::printf("Generation stopped on \"%s\".\n", control.fgen.LogicalName().c_str());
    return 0;
}

int Trigger(const std::vector<std::string>& words) {
    const Arguments args(words, {"name"}, {});
    args.NoneMore();
    Control control;
    Open(control.fgen, args);
    control.fgen.SendSoftwareTrigger();
    std::printf("Software trigger sent to \"%s\".\n", control.fgen.LogicalName().c_str());
    return 0;
}

int Export(const std::vector<std::string>& words) {
    const Arguments args(words,
                         {"from", "channels", "waveform", "frequency", "amplitude", "offset",
                          "duty", "mode", "data", "format", "iterations", "sample-rate"},
                         {});
    const std::string file = args.Only("file to write");
    Control control;
    const auto from = args.Text("from");
    if (from) {
        RequireFile(*from);
        Load(control.fgen, *from);
    }
    BuildFromOptions(control.fgen, args, from.has_value());
    control.fgen.Configurations()->Add("export")->Export(file);
    std::printf("Wrote %s: %d channels.\n", file.c_str(), control.fgen.Channels()->Count());
    return 0;
}

int Render(const std::vector<std::string>& words) {
    const Arguments args(words, {"channel", "points", "rate", "start", "csv", "png", "name"}, {});
    const std::string file = args.Only("configuration file", false);
    const auto channelName = args.Text("channel");
    if (!channelName) throw Misuse("--channel is missing");
    const long long points = args.Whole("points", 1000, 1, 10'000'000);
    const double rate = args.Number("rate", 1e6);
    if (rate <= 0) throw Misuse("--rate must be above 0");
    const double start = args.Number("start", 0);
    Control control;
    if (!file.empty())
        Load(control.fgen, file);
    else
        BuildFromOptions(control.fgen, Arguments({}, {}, {}), false);
    Open(control.fgen, args);
    control.fgen.Configure();
    control.fgen.Initiate();
    const std::vector<double> volts = control.fgen.Engine().RenderOutput(
        *channelName, start, 1 / rate, static_cast<std::int32_t>(points));
    const auto csv = args.Text("csv");
    const auto png = args.Text("png");
    if (csv || !png) {
        std::FILE* out = csv ? std::fopen(csv->c_str(), "w") : stdout;
        if (!out) throw std::runtime_error("\"" + *csv + "\" cannot be written");
        std::fprintf(out, "time_s,volts\n");
        for (std::size_t k = 0; k < volts.size(); ++k)
            std::fprintf(out, "%.12g,%.9g\n", start + static_cast<double>(k) / rate, volts[k]);
        if (csv && std::fclose(out) != 0)
            throw std::runtime_error("\"" + *csv + "\" cannot be written");
    }
    if (png &&
        !WritePlot(*png, volts, rate, *channelName + " of \"" + control.fgen.LogicalName() + "\""))
        throw Misuse("--png needs the Qt layer, which this build of qzfgen lacks");
    return 0;
}

// clang-format off
constexpr Command kCommands[] = {
    {"names", "the store's logical names, with module, resource and options", R"(usage: qzfgen names

Lists the logical names of the configuration store in use (and the
built-in "SampleFGen"), with the module, prefix, resource and options of each.
)", Names},
    {"store", "the store files searched, in order, and which one is used", R"(usage: qzfgen store

Shows where the class driver looks for its configuration store, in order,
and which of those files exist and which one is in use.
)", Store},
    {"configure", "applies a .qzc to a generator and tells what its outputs do", R"(usage: qzfgen configure FILE.qzc [--name LOGICAL] [--trace FILE]

Loads the saved configuration, opens the generator (default "SampleFGen")
and sends it all with Configure. Prints the driver and what each channel
now does. --trace appends every driver call to FILE.
)", Configure},
    {"initiate", "starts generation, after a .qzc if one is given", R"(usage: qzfgen initiate [FILE.qzc] [--name LOGICAL]

Opens the generator, configures it from FILE.qzc if given, and starts the
outputs.
)", Initiate},
    {"abort", "stops generation", R"(usage: qzfgen abort [--name LOGICAL]

Opens the generator and stops its outputs.
)", Abort},
    {"trigger", "sends a software trigger", R"(usage: qzfgen trigger [--name LOGICAL]

Opens the generator and sends it a software trigger.
)", Trigger},
    {"export", "writes a .qzc built from options or from another file", R"(usage: qzfgen export FILE.qzc [--from OTHER.qzc] [--channels N]
                    [--waveform W] [--frequency F] [--amplitude A]
                    [--offset O] [--duty D]
                    [--mode arb|sequence --data FILE[,FILE...]
                     [--format ascii|int16|int32] [--iterations N[,N...]]
                     [--sample-rate R]]

Writes a configuration: the one in OTHER.qzc, or a built-in example of two
channels, changed by the options for every channel. W is one of sine,
square, triangle, ramp-up, ramp-down, dc. Numbers take SI prefixes: 2.5k.
With --mode arb the channels play the first data file's points, with
--mode sequence a sequence of all of them; the points are kept in the
configuration. A file's format follows its extension (.i16, .i32, else
text) unless --format names it.
)", Export},
    {"render", "the simulator's output as CSV or as a picture", R"(usage: qzfgen render [FILE.qzc] --channel C [--points N] [--rate R]
                    [--start T] [--csv FILE] [--png FILE] [--name LOGICAL]

Configures the generator from FILE.qzc (or the built-in example), starts it
and writes N samples (default 1000) of channel C taken R times a second
(default 1M) from T seconds on: as CSV to FILE or standard output, and as a
plot picture with --png. Needs a driver that renders, as the simulator does.
)", Render},
};
// clang-format on

} // namespace

std::span<const Command> Commands() {
    return kCommands;
}

} // namespace qzfgen
