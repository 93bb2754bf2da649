// qzfgen: opens a function generator by its logical name, configures a sine through the IviFgen
// class driver, starts it, and prints the driver calls and what the output carries.
#include "IviFgen.h"
#include "qzivi/trace.h"

#include <cstdio>
#include <string>
#include <vector>

namespace {

bool Check(ViSession vi, ViStatus status, const char* what) {
    if (status >= 0) return true;
    ViStatus code = 0;
    ViChar text[1024] = {};
    IviFgen_GetError(vi, &code, sizeof text, text);
    std::fprintf(stderr, "qzfgen: %s failed: %s\n", what, text);
    return false;
}

} // namespace

int main(int argc, char** argv) {
    if (argc > 2 ||
        (argc == 2 && (std::string(argv[1]) == "-h" || std::string(argv[1]) == "--help"))) {
        std::printf(
            "usage: qzfgen [logical-name]\n"
            "Opens the generator (default \"SampleFGen\", the built-in simulator), configures a\n"
            "1 kHz sine of 2 Vpp on Channel1, starts it and prints the driver calls and "
            "samples.\n");
        return argc > 2 ? 2 : 0;
    }
    const char* logicalName = argc == 2 ? argv[1] : "SampleFGen";
    qzivi::ivi::SetTraceSink([](const qzivi::ivi::TraceRecord& record) {
        std::printf("  %s\n", record.Line().c_str());
    });

    std::printf("Driver calls:\n");
    ViSession vi = 0;
    if (!Check(VI_NULL, IviFgen_InitWithOptions(logicalName, VI_FALSE, VI_TRUE, "", &vi),
               "opening the session"))
        return 1;
    const char* channel = "Channel1";
    const bool ok =
        Check(vi, IviFgen_ConfigureOutputMode(vi, IVIFGEN_VAL_OUTPUT_FUNC), "output mode") &&
        Check(vi, IviFgen_ConfigureOperationMode(vi, channel, IVIFGEN_VAL_OPERATE_CONTINUOUS),
              "operation mode") &&
        Check(vi,
              IviFgen_ConfigureStandardWaveform(vi, channel, IVIFGEN_VAL_WFM_SINE, 2.0, 0.0, 1000.0,
                                                0.0),
              "sine") &&
        Check(vi, IviFgen_ConfigureOutputEnabled(vi, channel, VI_TRUE), "output") &&
        Check(vi, IviFgen_InitiateGeneration(vi), "start");
    std::vector<ViReal64> volts(9);
    const bool rendered =
        ok && Check(vi, QZIvi_RenderOutput(vi, channel, 0.0, 125e-6, 9, volts.data()), "rendering");
    IviFgen_close(vi);
    qzivi::ivi::SetTraceSink({});
    if (!rendered) return 1;

    std::printf("\n%s carries (1 kHz sine, 2 Vpp), one sample every 125 us:\n", channel);
    for (size_t k = 0; k < volts.size(); ++k)
        std::printf("  t = %6.1f us   %+.4f V\n", 125.0 * k, volts[k]);
    return 0;
}
