#include "Vxi11.h"

#include <algorithm>
#include <cstring>

namespace qzivi::emu::vxi11 {

namespace {

constexpr std::uint32_t kLastFragment = 0x80000000u;

// ONC RPC and the two programs' numbers.
enum : std::uint32_t {
    kCall = 0,
    kReply = 1,
    kAccepted = 0,
    kSuccess = 0,
    kProgramUnavailable = 1,
    kProgramMismatch = 2,
    kProcedureUnavailable = 3,
    kGarbageArguments = 4,
    kPortmapperProgram = 100000,
    kCoreProgram = 0x0607AF,
};
enum : std::int32_t { kNoError = 0, kNotAccessible = 3, kInvalidLink = 4, kTimeout = 15 };
enum : std::uint32_t { kEndFlag = 0x08, kReasonRequestCount = 1, kReasonEnd = 4 };

struct Garbage {}; // arguments shorter than their types say

// XDR: big-endian 32-bit words; opaque data and strings padded to a word.
class In {
public:
    explicit In(std::string_view bytes) : bytes_(bytes) {}
    std::uint32_t Word() {
        if (bytes_.size() - at_ < 4) throw Garbage{};
        std::uint32_t w = 0;
        for (int i = 0; i < 4; ++i)
            w = (w << 8) | static_cast<unsigned char>(bytes_[at_++]);
        return w;
    }
    std::int32_t Int() { return static_cast<std::int32_t>(Word()); }
    std::string_view Opaque() {
        const std::size_t size = Word();
        const std::size_t padded = size + (-size & 3);
        if (padded < size || bytes_.size() - at_ < padded) throw Garbage{};
        const std::string_view data = bytes_.substr(at_, size);
        at_ += padded;
        return data;
    }

private:
    std::string_view bytes_;
    std::size_t at_ = 0;
};

class Out {
public:
    Out& Word(std::uint32_t w) {
        for (int shift = 24; shift >= 0; shift -= 8)
            bytes_ += static_cast<char>((w >> shift) & 0xff);
        return *this;
    }
    Out& Int(std::int32_t i) { return Word(static_cast<std::uint32_t>(i)); }
    Out& Opaque(std::string_view data) {
        Word(static_cast<std::uint32_t>(data.size()));
        bytes_ += data;
        bytes_.append(-data.size() & 3, '\0');
        return *this;
    }
    std::string Take() { return std::move(bytes_); }

private:
    std::string bytes_;
};

struct Call {
    std::uint32_t xid, program, version, procedure;
    In arguments;
};

std::optional<Call> ReadCall(std::string_view record) {
    try {
        In in(record);
        const std::uint32_t xid = in.Word();
        if (in.Word() != kCall || in.Word() != 2) return std::nullopt;
        const std::uint32_t program = in.Word(), version = in.Word(), procedure = in.Word();
        for (int i = 0; i < 2; ++i) { // the credentials and the verifier, whatever they are
            in.Word();
            in.Opaque();
        }
        return Call{xid, program, version, procedure, in};
    } catch (const Garbage&) {
        return std::nullopt;
    }
}

// An accepted reply with its status; `results` follow a success.
std::string Reply(std::uint32_t xid, std::uint32_t status, std::string_view results = {}) {
    Out out;
    out.Word(xid).Word(kReply).Word(kAccepted).Word(0).Word(0).Word(status);
    std::string reply = out.Take();
    reply += results;
    return reply;
}

std::string Mismatch(std::uint32_t xid, std::uint32_t lowest, std::uint32_t highest) {
    return Reply(xid, kProgramMismatch, Out().Word(lowest).Word(highest).Take());
}

} // namespace

RecordReader::Got RecordReader::Next(std::string& record) {
    for (;;) {
        if (buffer_.size() < 4) return Got::Nothing;
        std::uint32_t mark = 0;
        for (int i = 0; i < 4; ++i)
            mark = (mark << 8) | static_cast<unsigned char>(buffer_[static_cast<std::size_t>(i)]);
        const std::size_t size = mark & ~kLastFragment;
        if (record_.size() + size > most_) return Got::TooLong;
        if (buffer_.size() - 4 < size) return Got::Nothing;
        record_.append(buffer_, 4, size);
        buffer_.erase(0, 4 + size);
        if ((mark & kLastFragment) != 0) {
            record = std::move(record_);
            record_.clear();
            return Got::Record;
        }
    }
}

std::string Frame(std::string_view record) {
    std::string framed =
        Out().Word(kLastFragment | static_cast<std::uint32_t>(record.size())).Take();
    framed += record;
    return framed;
}

std::optional<std::string> Portmapper::Answer(std::string_view record) const {
    auto call = ReadCall(record);
    if (!call) return std::nullopt;
    if (call->program != kPortmapperProgram) return Reply(call->xid, kProgramUnavailable);
    if (call->version < 2 || call->version > 4) return Mismatch(call->xid, 2, 4);
    if (call->procedure == 0) return Reply(call->xid, kSuccess);
    if (call->procedure != 3) return Reply(call->xid, kProcedureUnavailable);
    try {
        In& in = call->arguments;
        const std::uint32_t program = in.Word(), version = in.Word();
        const bool core = program == kCoreProgram && version == 1;
        if (call->version == 2) // GETPORT: the port, 0 for a program not here
            return Reply(call->xid, kSuccess, Out().Word(core ? corePort_ : 0).Take());
        // GETADDR: the universal address, "127.0.0.1.p1.p2", or "" for none
        const std::string address = core ? "127.0.0.1." + std::to_string(corePort_ >> 8) + "." +
                                               std::to_string(corePort_ & 0xff)
                                         : "";
        return Reply(call->xid, kSuccess, Out().Opaque(address).Take());
    } catch (const Garbage&) {
        return Reply(call->xid, kGarbageArguments);
    }
}

void Core::Write(Link& link, std::string_view data, bool end) {
    link.reader.Feed(data);
    if (end && !data.ends_with('\n')) link.reader.Feed("\n");
    std::string message;
    for (;;) {
        const auto got = link.reader.Next(message);
        if (got == scpi::MessageReader::Got::Nothing) return;
        if (got == scpi::MessageReader::Got::TooLong) {
            emulator_.TooMuchData();
            continue;
        }
        const std::string answer = emulator_.Execute(message);
        if (!answer.empty()) link.output += answer + "\n";
    }
}

std::optional<std::string> Core::Answer(std::string_view record) {
    auto call = ReadCall(record);
    if (!call) return std::nullopt;
    if (call->program != kCoreProgram) return Reply(call->xid, kProgramUnavailable);
    if (call->version != 1) return Mismatch(call->xid, 1, 1);
    const auto ok = [&](Out& results) { return Reply(call->xid, kSuccess, results.Take()); };
    try {
        In& in = call->arguments;
        switch (call->procedure) {
        case 0:
            return Reply(call->xid, kSuccess);
        case 10: { // create_link: client id, lock, lock time-out, device name
            in.Int();
            in.Word();
            in.Word();
            const std::string_view device = in.Opaque();
            Out out;
            if (device != "inst0") return ok(out.Int(kNotAccessible).Int(0).Word(0).Word(0));
            const std::int32_t id = nextLink_++;
            links_.try_emplace(id);
            return ok(out.Int(kNoError).Int(id).Word(0).Word(1u << 20));
        }
        case 11: { // device_write: link, I/O and lock time-outs, flags, data
            const auto link = links_.find(in.Int());
            in.Word();
            in.Word();
            const bool end = (in.Word() & kEndFlag) != 0;
            const std::string_view data = in.Opaque();
            Out out;
            if (link == links_.end()) return ok(out.Int(kInvalidLink).Word(0));
            Write(link->second, data, end);
            return ok(out.Int(kNoError).Word(static_cast<std::uint32_t>(data.size())));
        }
        case 12: { // device_read: link, size asked for, time-outs, flags, end character
            const auto link = links_.find(in.Int());
            const std::size_t asked = in.Word();
            Out out;
            if (link == links_.end()) return ok(out.Int(kInvalidLink).Word(0).Opaque({}));
            std::string& output = link->second.output;
            // Nothing to read ends at once: the client's own time-out stands for the wait.
            if (output.empty()) return ok(out.Int(kTimeout).Word(0).Opaque({}));
            const std::size_t size = std::min(asked, output.size());
            out.Int(kNoError).Word(size == output.size() ? kReasonEnd : kReasonRequestCount);
            out.Opaque(std::string_view(output).substr(0, size));
            output.erase(0, size);
            return ok(out);
        }
        case 23: { // destroy_link
            Out out;
            return ok(out.Int(links_.erase(in.Int()) == 1 ? kNoError : kInvalidLink));
        }
        default:
            return Reply(call->xid, kProcedureUnavailable);
        }
    } catch (const Garbage&) {
        return Reply(call->xid, kGarbageArguments);
    }
}

} // namespace qzivi::emu::vxi11
