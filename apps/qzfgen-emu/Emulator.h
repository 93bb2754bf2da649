// A bench generator of the 33500 series, as its SCPI commands see it, backed by a session of the
// simulator: what a client sets ends up in the session, and so in its rendered output. One
// emulator serves every connection; each message is carried out whole before the next.
#pragma once

#include "IviFgen.h"
#include "Scpi.h"

#include <deque>
#include <functional>
#include <map>
#include <string>
#include <vector>

namespace qzivi::emu {

class Emulator {
public:
    // Opens `logicalName` (a simulator) and starts generating, as the instrument does at power-on.
    // Throws std::runtime_error with the driver's message when the session cannot be opened.
    explicit Emulator(const std::string& logicalName = "SampleFGen");
    ~Emulator();
    Emulator(const Emulator&) = delete;
    Emulator& operator=(const Emulator&) = delete;

    // Carries out one program message; the answers of its queries joined by ';', or "" for none.
    std::string Execute(std::string_view message);
    // A message that outgrew the reader's bound.
    void TooMuchData() { Push({-223, "Too much data"}); }

    ViSession Session() const { return vi_; }

private:
    struct Call; // one command as its handler sees it
    struct Entry {
        std::function<void(Call&)> set;
        std::function<std::string(Call&)> query;
    };
    struct Row {
        scpi::Pattern pattern;
        Entry entry;
    };

    void Open();
    void Reset();
    void Push(const scpi::Error& error);
    // Runs a driver call; a refusal becomes an SCPI error carrying the driver's own message.
    void Check(ViStatus status);
    std::string Channel(int number) const;
    std::vector<Row> Table();

    // Per channel what the driver does not keep in the instrument's terms.
    struct ChannelState {
        std::string function = "SIN"; // the FUNCtion last chosen
        std::string arb;              // the arbitrary waveform or sequence FUNCtion:ARBitrary names
        double burstPeriod = 10e-3;
        bool highZ = false; // OUTPut:LOAD INFinity
    };
    void ApplyFunction(int channel);
    void SetVoltageEdges(int channel, double high, double low);

    std::string logicalName_;
    ViSession vi_ = 0;
    std::vector<Row> table_;
    std::deque<scpi::Error> errors_;
    // Each channel's volatile memory, by upper-case name, as the series keeps one a channel.
    std::map<std::string, ViInt32> waveforms_[2];
    std::map<std::string, ViInt32> sequences_[2];
    ChannelState channels_[2];
    bool swapped_ = false; // FORMat:BORDer SWAPped: blocks least significant byte first
};

} // namespace qzivi::emu
