// qzfgen: configures a function generator through the QZIviFgen control, from a saved .qzc
// configuration or from a built-in two-channel example, and prints the driver calls it made and
// what the outputs then carry.
#include "IviFgen.h"
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/support/failure.h"
#include "qzivi/trace.h"

#include <cmath>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

namespace {

struct Options {
    std::string logicalName = "SampleFGen";
    std::string load;
    std::string save;
    bool quiet = false;
};

void Usage(std::FILE* out) {
    std::fprintf(
        out,
        "usage: qzfgen [--logical-name NAME] [--load FILE.qzc] [--save FILE.qzc] [--quiet]\n"
        "Configures the generator (default \"SampleFGen\", the built-in simulator) from FILE.qzc,\n"
        "or from a built-in example of two channels, then prints the driver calls and samples.\n"
        "--save writes the configuration that was sent to FILE.qzc.\n");
}

bool Parse(int argc, char** argv, Options& options) {
    for (int i = 1; i < argc; ++i) {
        const std::string arg = argv[i];
        auto value = [&](std::string& into) {
            if (i + 1 >= argc) return false;
            into = argv[++i];
            return true;
        };
        if (arg == "--logical-name" && value(options.logicalName)) continue;
        if (arg == "--load" && value(options.load)) continue;
        if (arg == "--save" && value(options.save)) continue;
        if (arg == "--quiet") {
            options.quiet = true;
            continue;
        }
        return false;
    }
    return true;
}

// The built-in example: a sine on one channel, a square on the other.
void Example(qzivi::QZIviFgen& fgen) {
    const auto sine = fgen.Channels()->Add();
    sine->FuncFrequency(1000);
    sine->FuncAmplitude(2);
    const auto square = fgen.Channels()->Add();
    square->FuncWaveform(qzivi::qzivifgenWaveformSquare);
    square->FuncFrequency(2500);
    square->FuncAmplitude(1);
    square->FuncDCOffset(0.5);
}

} // namespace

int main(int argc, char** argv) {
    Options options;
    if (argc == 2 && (std::strcmp(argv[1], "--help") == 0 || std::strcmp(argv[1], "-h") == 0)) {
        Usage(stdout);
        return 0;
    }
    if (!Parse(argc, argv, options)) {
        Usage(stderr);
        return 2;
    }
    qzivi::QZIviFgen fgen;
    fgen.InitProperties();
    fgen.ExceptionOnError(true);
    try {
        if (!options.load.empty())
            fgen.Configurations()->Add("loaded", options.load)->Load();
        else
            Example(fgen);
        fgen.LogicalName(options.logicalName);

        if (!options.quiet)
            qzivi::ivi::SetTraceSink(
                [](const qzivi::ivi::TraceRecord& r) { std::printf("  %s\n", r.Line().c_str()); });
        std::printf("Driver calls of Init and Configure on \"%s\":\n", options.logicalName.c_str());
        fgen.Init();
        fgen.Configure();
        qzivi::ivi::SetTraceSink({});

        if (!options.save.empty()) {
            fgen.Configurations()->Add("saved")->Export(options.save);
            std::printf("\nSaved the configuration to %s\n", options.save.c_str());
        }

        // A table of what each channel carries, 16 samples over 1 ms.
        std::printf("\n  t [us]");
        for (const auto& channel : *fgen.Channels())
            std::printf("  %10s", channel->Name().c_str());
        std::printf("\n");
        std::vector<std::vector<double>> volts;
        for (const auto& channel : *fgen.Channels()) {
            try {
                volts.push_back(fgen.Engine().RenderOutput(channel->Name(), 0.0, 62.5e-6, 16));
            } catch (const qzivi::Failure&) { // a driver that cannot tell: no figures
                volts.emplace_back(16, std::nan(""));
            }
        }
        for (int k = 0; k < 16; ++k) {
            std::printf("  %6.1f", 62.5 * k);
            for (const auto& v : volts)
                std::printf("  %+9.4f V", v[static_cast<std::size_t>(k)]);
            std::printf("\n");
        }
        fgen.CloseSession();
    } catch (const qzivi::Failure& f) {
        qzivi::ivi::SetTraceSink({});
        std::fprintf(stderr, "qzfgen: %s (error %d, %s)\n", f.Description().c_str(), f.Number(),
                     f.Source().c_str());
        return 1;
    }
    return 0;
}
