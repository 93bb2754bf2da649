#include "generator.h"

#include "qzivi/ivi_common.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace qzivi::scpi {

using ivi::StatusError;

namespace {

constexpr Model kModels[] = {
    {"33509B", 1, 20e6, 250e6, 1000000}, {"33510B", 2, 20e6, 250e6, 1000000},
    {"33511B", 1, 20e6, 250e6, 1000000}, {"33512B", 2, 20e6, 250e6, 1000000},
    {"33519B", 1, 30e6, 250e6, 1000000}, {"33520B", 2, 30e6, 250e6, 1000000},
    {"33521A", 1, 30e6, 250e6, 1000000}, {"33521B", 1, 30e6, 250e6, 1000000},
    {"33522A", 2, 30e6, 250e6, 1000000}, {"33522B", 2, 30e6, 250e6, 1000000},
    {"33611A", 1, 80e6, 1e9, 4000000},   {"33612A", 2, 80e6, 1e9, 4000000},
    {"33621A", 1, 120e6, 1e9, 4000000},  {"33622A", 2, 120e6, 1e9, 4000000},
};

constexpr std::size_t kMostReply = std::size_t{1} << 28;

const char* Shape(ViInt32 waveform) {
    switch (waveform) {
    case IVIFGEN_VAL_WFM_SQUARE:
        return "SQU";
    case IVIFGEN_VAL_WFM_TRIANGLE:
        return "TRI";
    case IVIFGEN_VAL_WFM_RAMP_UP:
    case IVIFGEN_VAL_WFM_RAMP_DOWN:
        return "RAMP";
    case IVIFGEN_VAL_WFM_DC:
        return "DC";
    default:
        return "SIN";
    }
}

const char* ModulationShape(ViInt32 waveform) {
    return waveform == IVIFGEN_VAL_WFM_RAMP_DOWN ? "NRAM" : Shape(waveform);
}

// The series' names of waveforms and sequences in volatile memory.
std::string WaveformName(ViInt32 handle) {
    return "QZW" + std::to_string(handle);
}
std::string SequenceName(ViInt32 handle) {
    return "QZS" + std::to_string(handle);
}

} // namespace

std::string Number(double value) {
    char text[32];
    std::snprintf(text, sizeof text, "%.15g", value);
    return text;
}

const Model* FindModel(std::string_view identity) {
    const auto first = identity.find(',');
    if (first == std::string_view::npos) return nullptr;
    std::string_view model = identity.substr(first + 1);
    model = ivi::Trim(model.substr(0, model.find(',')));
    for (const Model& m : kModels)
        if (ivi::EqualsNoCase(model, m.name)) return &m;
    return nullptr;
}

Generator::Generator(const std::string& resource, std::chrono::milliseconds timeout, bool reset)
    : transport_(Connect(ParseResource(resource), timeout)), resource_(resource) {
    identity_ = Query("*IDN?");
    model_ = FindModel(identity_);
    if (model_ == nullptr)
        throw StatusError(IVI_ERROR_INSTRUMENT_STATUS,
                          "the instrument at " + resource + " is \"" + identity_ +
                              "\", no generator of the 33500 or 33600 series this driver knows");
    channels_.resize(static_cast<std::size_t>(model_->channels));
    // The class's reset state on the instrument, sent whole; then the volatile memories are
    // emptied, which the channels, back at standard waveforms, no longer play from.
    Send(std::string(reset ? "*RST;" : "") + "*CLS;:FORM:BORD SWAP;:" + GlobalCommands());
    for (int i = 0; i < model_->channels; ++i)
        Send(ChannelCommands(i) + ";:SOUR" + std::to_string(i + 1) + ":DATA:VOL:CLE");
}

int Generator::Index(const std::string& channel) const {
    for (int i = 0; i < model_->channels; ++i)
        if (channel == std::to_string(i + 1)) return i;
    if (channel.empty())
        throw StatusError(IVI_ERROR_CHANNEL_NAME_REQUIRED, "a channel name is required");
    throw StatusError(IVI_ERROR_UNKNOWN_CHANNEL_NAME,
                      "channel \"" + channel + "\" is none of the " + model_->name + "'s");
}

std::string Generator::Query(const std::string& query) {
    const std::string line = query + "\n"; // one piece: one packet on the wire
    const std::string_view message[] = {line};
    transport_->Write(message);
    return transport_->ReadLine(kMostReply);
}

void Generator::Send(const std::string& commands) {
    SendParts({commands});
}

void Generator::SendParts(std::initializer_list<std::string_view> parts) {
    // The parts as they are: a waveform's block is not copied into a message here.
    std::vector<std::string_view> message(parts);
    message.push_back(";:SYST:ERR?\n");
    transport_->Write(message);
    const std::string error = transport_->ReadLine(kMostReply);
    if (error.rfind("+0,", 0) == 0 || error.rfind("0,", 0) == 0) return;
    // Empty the queue, so the next call starts clean; the first entry is the cause.
    for (int i = 0; i < 32 && Query("SYST:ERR?").find("No error") == std::string::npos; ++i) {
    }
    const int number = std::atoi(error.c_str());
    throw StatusError(number == -222 || number == -224 ? IVI_ERROR_INVALID_VALUE
                                                       : IVI_ERROR_INSTRUMENT_STATUS,
                      "the instrument refused it: " + error);
}

std::string Generator::GlobalCommands() const {
    const Global& g = global_;
    return std::string("ROSC:SOUR ") +
           (g.refClock == IVIFGEN_VAL_REF_CLOCK_EXTERNAL ? "EXT" : "INT");
}

std::string Generator::ChannelCommands(int index) const {
    const Channel& c = channels_[static_cast<std::size_t>(index)];
    const Global& g = global_;
    const std::string n = std::to_string(index + 1), s = "SOUR" + n + ":";
    std::string m = "OUTP" + n + ":LOAD " + Number(c.impedance);
    if (g.outputMode == IVIFGEN_VAL_OUTPUT_FUNC) {
        m += ";:" + s + "FUNC " + Shape(c.waveform);
        if (c.waveform == IVIFGEN_VAL_WFM_RAMP_UP || c.waveform == IVIFGEN_VAL_WFM_RAMP_DOWN)
            m += ";:" + s + "FUNC:RAMP:SYMM " +
                 (c.waveform == IVIFGEN_VAL_WFM_RAMP_UP ? "100" : "0");
        if (c.waveform == IVIFGEN_VAL_WFM_SQUARE)
            m += ";:" + s + "FUNC:SQU:DCYC " + Number(c.dutyCycle);
        m += ";:" + s + "FREQ " + Number(c.frequency) + ";:" + s + "VOLT " + Number(c.amplitude) +
             ";:" + s + "VOLT:OFFS " + Number(c.offset) + ";:" + s + "PHAS " + Number(c.phase);
    } else {
        const bool sequence = g.outputMode == IVIFGEN_VAL_OUTPUT_SEQ;
        const ViInt32 handle = sequence ? c.sequenceHandle : c.arbHandle;
        if (handle != 0)
            m += ";:" + s + "FUNC:ARB " + (sequence ? SequenceName(handle) : WaveformName(handle));
        m += ";:" + s + "FUNC ARB;:" + s + "FUNC:ARB:SRAT " + Number(g.sampleRate) + ";:" + s +
             "VOLT " + Number(2 * c.arbGain) + ";:" + s + "VOLT:OFFS " + Number(c.arbOffset);
    }
    const char* trigger = c.triggerSource == IVIFGEN_VAL_EXTERNAL        ? "EXT"
                          : c.triggerSource == IVIFGEN_VAL_SOFTWARE_TRIG ? "BUS"
                                                                         : "IMM";
    m += ";:TRIG" + n + ":SOUR " + trigger + ";:" + s + "BURS:NCYC " +
         std::to_string(c.burstCount) + ";:" + s + "BURS:INT:PER " + Number(1 / g.triggerRate) +
         ";:" + s + "BURS:STAT " + (c.operationMode == IVIFGEN_VAL_OPERATE_BURST ? "ON" : "OFF");
    m += ";:" + s + "AM:SOUR " + (c.amSource == IVIFGEN_VAL_AM_INTERNAL ? "INT" : "EXT") +
         ";:" + s + "AM:DEPT " + Number(g.amDepth) + ";:" + s + "AM:INT:FUNC " +
         ModulationShape(g.amWaveform) + ";:" + s + "AM:INT:FREQ " + Number(g.amFrequency) +
         ";:" + s + "AM:STAT " + (c.am ? "ON" : "OFF");
    m += ";:" + s + "FM:SOUR " + (c.fmSource == IVIFGEN_VAL_FM_INTERNAL ? "INT" : "EXT") +
         ";:" + s + "FM:DEV " + Number(g.fmDeviation) + ";:" + s + "FM:INT:FUNC " +
         ModulationShape(g.fmWaveform) + ";:" + s + "FM:INT:FREQ " + Number(g.fmFrequency) +
         ";:" + s + "FM:STAT " + (c.fm ? "ON" : "OFF");
    m += ";:OUTP" + n + " " + (generating_ && c.enabled ? "ON" : "OFF");
    return m;
}

void Generator::ConfigureStandardWaveform(const std::string& channel, ViInt32 waveform,
                                          double amplitude, double offset, double frequency,
                                          double phase) {
    Channel& c = channels_[static_cast<std::size_t>(Index(channel))];
    const Channel old = c;
    c.waveform = waveform, c.amplitude = amplitude, c.offset = offset, c.frequency = frequency,
    c.phase = phase;
    try {
        Validate(global_, c);
        Send(ChannelCommands(Index(channel)));
    } catch (...) {
        c = old;
        throw;
    }
}

ViInt32 Generator::CreateArbWaveform(ViInt32 size, const ViReal64* data) {
    if (data == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER, "the waveform's points are a null pointer");
    if (size < 8 || size > model_->maxPoints)
        throw StatusError(IVI_ERROR_INVALID_VALUE,
                          "CreateArbWaveform: waveform size " + std::to_string(size) +
                              " is outside the range 8 to " + std::to_string(model_->maxPoints));
    if (static_cast<ViInt32>(waveforms_.size()) >= kMaxWaveforms)
        throw StatusError(IVIFGEN_ERROR_NO_WFMS_AVAILABLE,
                          "all " + std::to_string(kMaxWaveforms) + " waveforms are in use");
    for (ViInt32 i = 0; i < size; ++i)
        if (!(data[i] >= -1 && data[i] <= 1))
            throw StatusError(IVI_ERROR_INVALID_VALUE,
                              "CreateArbWaveform: point " + std::to_string(i) + " (" +
                                  Number(data[i]) + ") is outside -1 to 1");
    // IEEE 488.2 definite-length block of 32-bit floats, least significant byte first.
    std::string points(static_cast<std::size_t>(size) * 4, '\0');
    for (ViInt32 i = 0; i < size; ++i) {
        const float f = static_cast<float>(data[i]);
        std::memcpy(&points[static_cast<std::size_t>(i) * 4], &f, 4);
    }
    const std::string length = std::to_string(points.size());
    const ViInt32 handle = nextHandle_++;
    const std::string header = "#" + std::to_string(length.size()) + length;
    // Each channel has a memory of its own: the waveform goes to every one.
    for (int i = 1; i <= model_->channels; ++i)
        SendParts({"SOUR" + std::to_string(i) + ":DATA:ARB " + WaveformName(handle) + "," + header,
                   points});
    waveforms_[handle] = size;
    return handle;
}

void Generator::ClearArbWaveform(ViInt32 handle) {
    if (handle == IVIFGEN_VAL_ALL_WAVEFORMS) {
        for (const Channel& c : channels_)
            if (generating_ && c.arbHandle != 0 && global_.outputMode == IVIFGEN_VAL_OUTPUT_ARB)
                throw StatusError(IVIFGEN_ERROR_WFM_IN_USE, "a channel is generating a waveform");
        for (int i = 1; i <= model_->channels; ++i)
            Send("SOUR" + std::to_string(i) + ":DATA:VOL:CLE");
        waveforms_.clear();
        sequences_.clear();
        for (Channel& c : channels_)
            c.arbHandle = c.sequenceHandle = 0;
        return;
    }
    if (waveforms_.count(handle) == 0)
        throw StatusError(IVI_ERROR_INVALID_VALUE,
                          "ClearArbWaveform: no waveform has the handle " + std::to_string(handle));
    for (const auto& [h, steps] : sequences_)
        if (std::find(steps.begin(), steps.end(), handle) != steps.end())
            throw StatusError(IVIFGEN_ERROR_WFM_IN_USE, "sequence " + std::to_string(h) +
                                                            " plays waveform " +
                                                            std::to_string(handle));
    for (const Channel& c : channels_)
        if (c.arbHandle == handle && generating_)
            throw StatusError(IVIFGEN_ERROR_WFM_IN_USE,
                              "a channel is generating waveform " + std::to_string(handle));
    // The series clears its volatile memory only whole; the name stays there unused.
    waveforms_.erase(handle);
    for (Channel& c : channels_)
        if (c.arbHandle == handle) c.arbHandle = 0;
}

void Generator::ConfigureArb(const std::string& channel, ViInt32 handle, double gain, double offset,
                             bool sequence) {
    Channel& c = channels_[static_cast<std::size_t>(Index(channel))];
    const Channel old = c;
    (sequence ? c.sequenceHandle : c.arbHandle) = handle;
    c.arbGain = gain, c.arbOffset = offset;
    try {
        if (handle == 0 || (sequence ? sequences_.count(handle) : waveforms_.count(handle)) == 0)
            throw StatusError(IVI_ERROR_INVALID_VALUE,
                              std::string(sequence ? "ConfigureArbSequence: no sequence"
                                                   : "ConfigureArbWaveform: no waveform") +
                                  " has the handle " + std::to_string(handle));
        Validate(global_, c);
        Send(ChannelCommands(Index(channel)));
    } catch (...) {
        c = old;
        throw;
    }
}

ViInt32 Generator::CreateArbSequence(ViInt32 length, const ViInt32* handles, const ViInt32* loops) {
    if (handles == nullptr || loops == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER, "the sequence's steps are a null pointer");
    if (length < 1 || length > kMaxSequenceLength)
        throw StatusError(IVI_ERROR_INVALID_VALUE,
                          "CreateArbSequence: length " + std::to_string(length) +
                              " is outside the range 1 to " + std::to_string(kMaxSequenceLength));
    if (static_cast<ViInt32>(sequences_.size()) >= kMaxSequences)
        throw StatusError(IVIFGEN_ERROR_NO_SEQS_AVAILABLE,
                          "all " + std::to_string(kMaxSequences) + " sequences are in use");
    const ViInt32 handle = nextHandle_++;
    std::string text = "\"" + SequenceName(handle) + "\"";
    for (ViInt32 i = 0; i < length; ++i) {
        if (waveforms_.count(handles[i]) == 0)
            throw StatusError(IVI_ERROR_INVALID_VALUE,
                              "CreateArbSequence: step " + std::to_string(i + 1) +
                                  " names no waveform (handle " + std::to_string(handles[i]) + ")");
        if (loops[i] < 1 || loops[i] > kMaxLoopCount)
            throw StatusError(IVI_ERROR_INVALID_VALUE,
                              "CreateArbSequence: loop count " + std::to_string(loops[i]) +
                                  " is outside the range 1 to " + std::to_string(kMaxLoopCount));
        text += ",\"" + WaveformName(handles[i]) + "\"," + std::to_string(loops[i]) +
                (loops[i] == 1 ? ",once" : ",repeat") + ",maintain,4";
    }
    const std::string count = std::to_string(text.size());
    for (int i = 1; i <= model_->channels; ++i)
        Send("SOUR" + std::to_string(i) + ":DATA:SEQ #" + std::to_string(count.size()) + count +
             text);
    sequences_[handle] = std::vector<ViInt32>(handles, handles + length);
    return handle;
}

void Generator::ClearArbSequence(ViInt32 handle) {
    if (handle == IVIFGEN_VAL_ALL_SEQUENCES) {
        sequences_.clear();
        for (Channel& c : channels_)
            c.sequenceHandle = 0;
        return;
    }
    if (sequences_.count(handle) == 0)
        throw StatusError(IVI_ERROR_INVALID_VALUE,
                          "ClearArbSequence: no sequence has the handle " + std::to_string(handle));
    for (const Channel& c : channels_)
        if (c.sequenceHandle == handle && generating_)
            throw StatusError(IVIFGEN_ERROR_SEQ_IN_USE,
                              "a channel is generating sequence " + std::to_string(handle));
    sequences_.erase(handle);
    for (Channel& c : channels_)
        if (c.sequenceHandle == handle) c.sequenceHandle = 0;
}

void Generator::SendSoftwareTrigger() {
    ivi::RequireSoftwareTrigger(channels_, generating_);
    Send("*TRG");
}

void Generator::InitiateGeneration() {
    if (generating_) return;
    generating_ = true;
    try {
        for (int i = 0; i < model_->channels; ++i)
            Send(ChannelCommands(i));
    } catch (...) {
        generating_ = false;
        throw;
    }
}

void Generator::AbortGeneration() {
    generating_ = false;
    std::string off;
    for (int i = 1; i <= model_->channels; ++i)
        off += (off.empty() ? "" : ";:") + std::string("OUTP") + std::to_string(i) + " OFF";
    Send(off);
}

void Generator::Render(const std::string& channel, double start, double step, ViInt32 count,
                       ViReal64* volts) {
    if (count < 0)
        throw StatusError(IVI_ERROR_INVALID_VALUE,
                          "the count of samples " + std::to_string(count) + " is negative");
    if (count > 0 && volts == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER, "the sample buffer is a null pointer");
    if (count == 0) return;
    // An instrument that does not know the query answers only the error queue's entry.
    const std::string reply =
        Query("SOUR" + std::to_string(Index(channel) + 1) + ":EMUL:REND? " + Number(start) + "," +
              Number(step) + "," + std::to_string(count) + ";:SYST:ERR?");
    const auto split = reply.rfind(';');
    if (split == std::string::npos || reply.find("No error", split) == std::string::npos) {
        Query("*CLS;*OPC?");
        throw StatusError(IVI_ERROR_FUNCTION_NOT_SUPPORTED,
                          "the " + std::string(model_->name) + " at " + resource_ +
                              " cannot tell what its outputs carry");
    }
    const char* p = reply.c_str();
    for (ViInt32 i = 0; i < count; ++i) {
        char* end = nullptr;
        volts[i] = std::strtod(p, &end);
        if (end == p || (*end != ',' && *end != ';'))
            throw StatusError(VI_ERROR_IO, "the instrument's samples are garbled at sample " +
                                               std::to_string(i));
        p = end + 1;
    }
}

} // namespace qzivi::scpi
