// VXI-11 for the emulator: ONC RPC calls over TCP for the two programs a VXI-11 client reaches,
// the portmapper, which tells where the device core listens, and the device core, whose links
// carry the same SCPI messages as the raw socket. A write's END flag ends a message, as the
// instrument's EOI does.
#pragma once

#include "Emulator.h"
#include "Scpi.h"

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace qzivi::emu::vxi11 {

// Cuts RPC records out of a TCP byte stream: fragments, each after a 4-byte length whose top bit
// marks a record's last one.
class RecordReader {
public:
    enum class Got { Nothing, Record, TooLong };

    explicit RecordReader(std::size_t mostBytes = std::size_t{1} << 28) : most_(mostBytes) {}
    void Feed(std::string_view bytes) { buffer_.append(bytes); }
    // The next whole record in `record`; nothing until more bytes come; or a record that claims
    // more than the bound, after which the connection has nothing more to say.
    Got Next(std::string& record);

private:
    std::string buffer_, record_;
    std::size_t most_;
};

// A record of one fragment, ready to send.
std::string Frame(std::string_view record);

// The portmapper's side: versions 2 (GETPORT) and 3 and 4 (GETADDR) know the device core.
class Portmapper {
public:
    explicit Portmapper(int corePort) : corePort_(corePort) {}
    // The reply to a call, or nothing for bytes that are no call.
    std::optional<std::string> Answer(std::string_view call) const;

private:
    int corePort_;
};

// One client connection to the device core, with its links.
class Core {
public:
    explicit Core(Emulator& emulator) : emulator_(emulator) {}
    std::optional<std::string> Answer(std::string_view call);

private:
    struct Link {
        scpi::MessageReader reader;
        std::string output; // the answers not yet read
    };
    void Write(Link& link, std::string_view data, bool end);

    Emulator& emulator_;
    std::map<std::int32_t, Link> links_;
    std::int32_t nextLink_ = 1;
};

} // namespace qzivi::emu::vxi11
