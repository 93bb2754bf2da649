// qzfgen-emu: a two-channel bench generator of the 33500 series on the loopback address, speaking
// SCPI over raw TCP, backed by the simulator. Its first line of output is the port it listens on.
#include "Emulator.h"

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

constexpr const char* kUsage = "usage: qzfgen-emu [--port N] [--name LOGICAL-NAME]\n"
                               "  --port N  the TCP port on 127.0.0.1 (5025; 0 for a free one)\n"
                               "  --name    the simulator's logical name (SampleFGen)\n";

struct Client {
    int fd;
    qzivi::scpi::MessageReader reader;
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

// Reads what the client sent and answers each whole message; false when the client is gone.
bool Serve(Client& client, qzivi::emu::Emulator& emulator) {
    char bytes[1 << 16];
    const ssize_t got = ::recv(client.fd, bytes, sizeof bytes, 0);
    if (got < 0 && errno == EINTR) return true;
    if (got <= 0) return false;
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

} // namespace

int main(int argc, char** argv) {
    long port = 5025;
    std::string name = "SampleFGen";
    for (int i = 1; i < argc; ++i) {
        const std::string arg = argv[i];
        if (arg == "--help" || arg == "-h") {
            std::fputs(kUsage, stdout);
            return 0;
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

    std::unique_ptr<qzivi::emu::Emulator> emulator;
    try {
        emulator = std::make_unique<qzivi::emu::Emulator>(name);
    } catch (const std::exception& e) {
        std::fprintf(stderr, "qzfgen-emu: %s\n", e.what());
        return 1;
    }

    const int listener = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const int yes = 1;
    ::setsockopt(listener, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(static_cast<std::uint16_t>(port));
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK); // never beyond this machine
    socklen_t length = sizeof address;
    if (listener < 0 ||
        ::bind(listener, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
        ::listen(listener, 8) != 0 ||
        ::getsockname(listener, reinterpret_cast<sockaddr*>(&address), &length) != 0) {
        std::fprintf(stderr, "qzfgen-emu: cannot listen on 127.0.0.1:%ld: %s\n", port,
                     std::strerror(errno));
        return 1;
    }
    std::printf("%u\n", ntohs(address.sin_port));
    std::fflush(stdout);

    std::vector<std::unique_ptr<Client>> clients;
    for (;;) {
        std::vector<pollfd> watched{{listener, POLLIN, 0}};
        for (const auto& c : clients)
            watched.push_back({c->fd, POLLIN, 0});
        if (::poll(watched.data(), watched.size(), -1) < 0) {
            if (errno == EINTR) continue;
            std::perror("qzfgen-emu: poll");
            return 1;
        }
        for (std::size_t i = clients.size(); i-- > 0;) {
            if (watched[i + 1].revents == 0) continue;
            if (!Serve(*clients[i], *emulator)) {
                ::close(clients[i]->fd);
                clients.erase(clients.begin() + static_cast<std::ptrdiff_t>(i));
            }
        }
        if ((watched[0].revents & POLLIN) != 0) {
            const int fd = ::accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
            if (fd >= 0) {
                ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof yes);
                clients.push_back(
                    std::make_unique<Client>(Client{fd, qzivi::scpi::MessageReader()}));
            }
        }
    }
}
