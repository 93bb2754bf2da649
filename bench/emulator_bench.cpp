// The emulator carrying out what the SCPI driver sends for one channel of a standard waveform
// (twenty-two commands in one message) and the error-queue query after it, in process, so that
// what is timed is the emulator's reading and matching of headers and its class-driver calls.
#include "Emulator.h"

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <stdexcept>

namespace {

constexpr const char* kChannelSetup =
    "OUTP1:LOAD 50;:SOUR1:FUNC SQU;:SOUR1:FUNC:SQU:DCYC 25;:SOUR1:FREQ 1000;:SOUR1:VOLT 1;"
    ":SOUR1:VOLT:OFFS 0;:SOUR1:PHAS 0;:TRIG1:SOUR IMM;:SOUR1:BURS:NCYC 1;"
    ":SOUR1:BURS:INT:PER 0.001;:SOUR1:BURS:STAT OFF;:SOUR1:AM:SOUR INT;:SOUR1:AM:DEPT 100;"
    ":SOUR1:AM:INT:FUNC SIN;:SOUR1:AM:INT:FREQ 100;:SOUR1:AM:STAT OFF;:SOUR1:FM:SOUR INT;"
    ":SOUR1:FM:DEV 100;:SOUR1:FM:INT:FUNC SIN;:SOUR1:FM:INT:FREQ 10;:SOUR1:FM:STAT OFF;"
    ":OUTP1 OFF";

void BM_ChannelSetupMessage(benchmark::State& state) {
    ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
    ::setenv("QZIVI_CONFIG_STORE", "", 1);
    qzivi::emu::Emulator emulator;
    for (auto _ : state) {
        emulator.Execute(kChannelSetup);
        if (emulator.Execute("SYST:ERR?") != "+0,\"No error\"")
            throw std::logic_error("the emulator refused the channel setup");
    }
    state.SetItemsProcessed(state.iterations() * 23); // commands, with the query
}
BENCHMARK(BM_ChannelSetupMessage);

} // namespace
