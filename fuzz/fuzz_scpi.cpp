// The emulator's SCPI side on any bytes, cut into reads of any size: every message is carried
// out or refused into the error queue, the queue never grows past its bound, and the same bytes
// cut differently make the same messages.
#include "Emulator.h"
#include "Scpi.h"

#include <cstdlib>
#include <memory>

namespace {

std::vector<std::string> Cut(const std::uint8_t* data, std::size_t size, std::size_t piece) {
    qzivi::scpi::MessageReader reader(4096);
    std::vector<std::string> messages;
    std::string message;
    for (std::size_t at = 0; at < size; at += piece) {
        reader.Feed(
            std::string_view(reinterpret_cast<const char*>(data) + at, std::min(piece, size - at)));
        for (;;) {
            const auto got = reader.Next(message);
            if (got == qzivi::scpi::MessageReader::Got::Nothing) break;
            messages.push_back(got == qzivi::scpi::MessageReader::Got::Message ? message
                                                                               : "\x01too long");
        }
    }
    return messages;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 1) return 0;
    static std::unique_ptr<qzivi::emu::Emulator> emulator = [] {
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        ::setenv("QZIVI_CONFIG_STORE", "", 1);
        return std::make_unique<qzivi::emu::Emulator>();
    }();
    const std::size_t piece = data[0] % 16 + 1;
    const auto messages = Cut(data + 1, size - 1, piece);
    if (messages != Cut(data + 1, size - 1, size)) std::abort();
    for (const auto& message : messages) {
        if (message == "\x01too long") {
            emulator->TooMuchData();
            continue;
        }
        if (message.find("RST") != std::string::npos) continue; // a reset per input is slow
        emulator->Execute(message);
    }
    // Drain the queue: at most its bound of entries, then "No error".
    int entries = 0;
    while (emulator->Execute("SYST:ERR?") != "+0,\"No error\"")
        if (++entries > 20) std::abort();
    return 0;
}
