// qzfgen-emu: a two-channel bench generator of the 33500 series on the loopback address, speaking
// SCPI over raw TCP, and over VXI-11 when asked, backed by the simulator. Its first line of output
// is the port it listens on.
#include "Emulator.h"
#include "Vxi11.h"

#include <arpa/inet.h>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <string>
#include <sys/socket.h>
#include <unistd.h>
#include <vector>

namespace {

constexpr const char* kUsage =
    "usage: qzfgen-emu [--port N] [--name LOGICAL-NAME] [--vxi11]\n"
    "  --port N  the TCP port on 127.0.0.1 (5025; 0 for a free one)\n"
    "  --name    the simulator's logical name (SampleFGen)\n"
    "  --vxi11   also VXI-11 (TCPIP0::127.0.0.1::inst0::INSTR), with a portmapper on port 111\n";

using namespace qzivi::emu;

constexpr long kPortmapperPort = 111;

enum class Kind { Scpi, Portmapper, Core };

struct Client {
    Client(Kind k, int descriptor) : kind(k), fd(descriptor) {}
    Kind kind;
    int fd;
    qzivi::scpi::MessageReader reader; // Scpi
    vxi11::RecordReader records;       // Portmapper, Core
    std::unique_ptr<vxi11::Core> core;
};

bool SendAll(int fd, const std::string& bytes) {
    std::size_t done = 0;
    while (done < bytes.size()) {
        const ssize_t put = ::send(fd, bytes.data() + done, bytes.size() - done, MSG_NOSIGNAL);
        if (put < 0 && errno == EINTR) continue;
        if (put <= 0) return false;
        done += static_cast<std::size_t>(put);
    }
    return true;
}

// Answers each whole RPC call; false when the client is gone or sent what is no call.
bool ServeRpc(Client& client, std::string_view bytes, const vxi11::Portmapper& portmapper) {
    client.records.Feed(bytes);
    std::string record;
    for (;;) {
        const auto what = client.records.Next(record);
        if (what == vxi11::RecordReader::Got::Nothing) return true;
        if (what == vxi11::RecordReader::Got::TooLong) return false;
        const auto reply =
            client.kind == Kind::Core ? client.core->Answer(record) : portmapper.Answer(record);
        if (!reply || !SendAll(client.fd, vxi11::Frame(*reply))) return false;
    }
}

// Reads what the client sent and answers each whole message; false when the client is gone.
bool Serve(Client& client, Emulator& emulator, const vxi11::Portmapper& portmapper) {
    char bytes[1 << 16];
    const ssize_t got = ::recv(client.fd, bytes, sizeof bytes, 0);
    if (got < 0 && errno == EINTR) return true;
    if (got <= 0) return false;
    if (client.kind != Kind::Scpi)
        return ServeRpc(client, std::string_view(bytes, static_cast<std::size_t>(got)), portmapper);
    client.reader.Feed(std::string_view(bytes, static_cast<std::size_t>(got)));
    std::string message;
    for (;;) {
        const auto what = client.reader.Next(message);
        if (what == qzivi::scpi::MessageReader::Got::Nothing) return true;
        if (what == qzivi::scpi::MessageReader::Got::TooLong) {
            emulator.TooMuchData();
            continue;
        }
        const std::string answer = emulator.Execute(message);
        if (!answer.empty() && !SendAll(client.fd, answer + "\n")) return false;
    }
}

// A listener on the loopback address, never beyond this machine; -1 with errno when refused.
int Listen(long port) {
    const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (fd < 0) return -1;
    const int yes = 1;
    ::setsockopt(fd, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(static_cast<std::uint16_t>(port));
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    if (::bind(fd, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
        ::listen(fd, 8) != 0) {
        const int error = errno;
        ::close(fd);
        errno = error;
        return -1;
    }
    return fd;
}

int PortOf(int fd) {
    sockaddr_in address{};
    socklen_t length = sizeof address;
    ::getsockname(fd, reinterpret_cast<sockaddr*>(&address), &length);
    return ntohs(address.sin_port);
}

} // namespace

int main(int argc, char** argv) {
    long port = 5025;
    std::string name = "SampleFGen";
    bool vxi11 = false;
    for (int i = 1; i < argc; ++i) {
        const std::string arg = argv[i];
        if (arg == "--help" || arg == "-h") {
            std::fputs(kUsage, stdout);
            return 0;
        }
        if (arg == "--vxi11") {
            vxi11 = true;
            continue;
        }
        if ((arg == "--port" || arg == "--name") && i + 1 < argc) {
            const std::string value = argv[++i];
            if (arg == "--name") {
                name = value;
                continue;
            }
            char* end = nullptr;
            port = std::strtol(value.c_str(), &end, 10);
            if (value.empty() || *end != '\0' || port < 0 || port > 65535) {
                std::fprintf(stderr, "qzfgen-emu: the port \"%s\" is no number from 0 to 65535\n",
                             value.c_str());
                return 2;
            }
            continue;
        }
        std::fprintf(stderr, "qzfgen-emu: unknown argument \"%s\"\n%s", arg.c_str(), kUsage);
        return 2;
    }

    std::unique_ptr<Emulator> emulator;
    try {
        emulator = std::make_unique<Emulator>(name);
    } catch (const std::exception& e) {
        std::fprintf(stderr, "qzfgen-emu: %s\n", e.what());
        return 1;
    }

    std::vector<std::pair<int, Kind>> listeners;
    const auto listen = [&](long at, Kind kind) {
        const int fd = Listen(at);
        if (fd < 0) {
            std::fprintf(stderr, "qzfgen-emu: cannot listen on 127.0.0.1:%ld: %s\n", at,
                         std::strerror(errno));
            std::exit(1);
        }
        listeners.emplace_back(fd, kind);
        return PortOf(fd);
    };
    const int scpiPort = listen(port, Kind::Scpi);
    vxi11::Portmapper portmapper(vxi11 ? listen(0, Kind::Core) : 0);
    if (vxi11) listen(kPortmapperPort, Kind::Portmapper);
    std::printf("%d\n", scpiPort);
    std::fflush(stdout);

    std::vector<std::unique_ptr<Client>> clients;
    for (;;) {
        std::vector<pollfd> watched;
        for (const auto& [fd, kind] : listeners)
            watched.push_back({fd, POLLIN, 0});
        for (const auto& c : clients)
            watched.push_back({c->fd, POLLIN, 0});
        if (::poll(watched.data(), watched.size(), -1) < 0) {
            if (errno == EINTR) continue;
            std::perror("qzfgen-emu: poll");
            return 1;
        }
        for (std::size_t i = clients.size(); i-- > 0;) {
            if (watched[listeners.size() + i].revents == 0) continue;
            if (!Serve(*clients[i], *emulator, portmapper)) {
                ::close(clients[i]->fd);
                clients.erase(clients.begin() + static_cast<std::ptrdiff_t>(i));
            }
        }
        for (std::size_t i = 0; i < listeners.size(); ++i) {
            if ((watched[i].revents & POLLIN) == 0) continue;
            const int fd = ::accept4(listeners[i].first, nullptr, nullptr, SOCK_CLOEXEC);
            if (fd < 0) continue;
            const int yes = 1;
            ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof yes);
            auto client = std::make_unique<Client>(listeners[i].second, fd);
            if (client->kind == Kind::Portmapper) // a question of a few words
                client->records = vxi11::RecordReader(std::size_t{1} << 16);
            if (client->kind == Kind::Core) client->core = std::make_unique<vxi11::Core>(*emulator);
            clients.push_back(std::move(client));
        }
    }
}
