// A headless program on the control: builds a two-channel output in code (a sine, and a sequence
// of two arbitrary waveforms made from points), configures the simulated "SampleFGen", prints
// what channel 2 now carries, and saves the whole state as a .qzc file.
//
//   headless_example [FILE.qzc]        (default: headless.qzc)
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/support/failure.h"

#include <cmath>
#include <cstdio>
#include <numbers>
#include <string>
#include <vector>

int main(int argc, char** argv) {
    const std::string file = argc > 1 ? argv[1] : "headless.qzc";
    qzivi::QZIviFgen fgen;
    fgen.InitProperties();
    fgen.ExceptionOnError(true); // a failure is a qzivi::Failure with number and text
    try {
        fgen.LogicalName("SampleFGen");
        fgen.Extensions(fgen.Extensions() | qzivi::qzivifgenArbWfmExt | qzivi::qzivifgenArbSeqExt);
        fgen.OutputMode(qzivi::qzivifgenOutputSeq);
        fgen.ArbSampleRate(1e6);

        // Two waveforms held in the configuration: a ramp and a half sine.
        std::vector<double> ramp(100), hump(100);
        for (std::size_t i = 0; i < 100; ++i) {
            ramp[i] = static_cast<double>(i) / 99;
            hump[i] = std::sin(std::numbers::pi * static_cast<double>(i) / 99);
        }
        const auto rampWfm = fgen.Waveforms()->Add("Ramp");
        rampWfm->Data(ramp);
        const auto humpWfm = fgen.Waveforms()->Add("Hump");
        humpWfm->Data(hump);
        const auto train = fgen.Sequences()->Add("Train");
        train->Add(rampWfm, 2);
        train->Add(humpWfm, 1);

        const auto ch1 = fgen.Channels()->Add("Channel1");
        ch1->Sequence(train);
        ch1->ArbGain(1);
        const auto ch2 = fgen.Channels()->Add("Channel2");
        ch2->Sequence(train);
        ch2->ArbGain(0.5);
        ch2->ArbOffset(0.25);

        fgen.Init();
        fgen.Configure();
        fgen.Initiate();
        const std::vector<double> volts = fgen.Engine().RenderOutput("Channel2", 0, 10e-6, 30);
        std::printf("Channel2, every 10 us:");
        for (double v : volts)
            std::printf(" %.3f", v);
        std::printf("\n");
        fgen.Configurations()->Add("saved")->Export(file);
        std::printf("Saved %s\n", file.c_str());
        fgen.CloseSession();
    } catch (const qzivi::Failure& failure) {
        std::fprintf(stderr, "error %d: %s\n", failure.Number(), failure.Description().c_str());
        return 1;
    }
    return 0;
}
