// The ways to a SCPI instrument on the network, named by VISA resource strings:
//   TCPIP[board]::host::port::SOCKET   raw SCPI over TCP (port 5025 on bench generators)
//   TCPIP[board]::host[::inst0]::INSTR VXI-11, through liblxi
// Every read and write ends within the time-out; a lost connection, a time-out and a reply past
// its bounds become StatusErrors with the transport's words.
#pragma once

#include <chrono>
#include <memory>
#include <span>
#include <string>
#include <string_view>

namespace qzivi::scpi {

struct Resource {
    enum class Kind { Socket, Vxi11 } kind = Kind::Socket;
    std::string host;
    int port = 5025;              // SOCKET
    std::string device = "inst0"; // INSTR
};

// Throws StatusError(VI_ERROR_RSRC_NFOUND) for a text that names no such resource.
Resource ParseResource(std::string_view text);

class Transport {
public:
    virtual ~Transport() = default;
    // One program message in the parts it was built of, the last ending in its newline.
    virtual void Write(std::span<const std::string_view> message) = 0;
    // One reply up to its newline, without it; a reply longer than `most` bytes is an error.
    virtual std::string ReadLine(std::size_t most) = 0;
};

// Connects within `timeout`; throws StatusError(VI_ERROR_RSRC_NFOUND, VI_ERROR_TMO, VI_ERROR_IO).
std::unique_ptr<Transport> Connect(const Resource& resource, std::chrono::milliseconds timeout);

} // namespace qzivi::scpi
