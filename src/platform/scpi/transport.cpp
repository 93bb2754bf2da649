#include "transport.h"

#include "IviFgen.h"
#include "qzivi/ivi_common.h"

#include <cerrno>
#include <climits>
#include <cstring>
#include <fcntl.h>
#include <lxi.h>
#include <mutex>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>
#include <vector>

namespace qzivi::scpi {

using ivi::StatusError;

namespace {

std::vector<std::string> SplitFields(std::string_view text) {
    std::vector<std::string> fields;
    for (;;) {
        const auto at = text.find("::");
        fields.emplace_back(text.substr(0, at));
        if (at == std::string_view::npos) return fields;
        text.remove_prefix(at + 2);
    }
}

bool StartsNoCase(std::string_view text, std::string_view prefix) {
    return text.size() >= prefix.size() && ivi::EqualsNoCase(text.substr(0, prefix.size()), prefix);
}

using Clock = std::chrono::steady_clock;

// Whether `fd` is ready before `deadline`.
bool Wait(int fd, short events, Clock::time_point deadline) {
    pollfd p{fd, events, 0};
    for (;;) {
        const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now());
        if (left.count() <= 0) return false;
        const int n = ::poll(&p, 1, static_cast<int>(left.count()));
        if (n < 0 && errno == EINTR) continue;
        errno = 0;
        return n > 0;
    }
}

// A TCP connection to host:port made before `deadline`, non-blocking; throws
// StatusError(VI_ERROR_RSRC_NFOUND) with the reason.
int ConnectTcp(const std::string& host, int port, Clock::time_point deadline) {
    const std::string where = host + ":" + std::to_string(port);
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    addrinfo* found = nullptr;
    if (const int error = ::getaddrinfo(host.c_str(), std::to_string(port).c_str(), &hints, &found);
        error != 0)
        throw StatusError(VI_ERROR_RSRC_NFOUND,
                          "the host \"" + host + "\" is not known: " + ::gai_strerror(error));
    std::string why = "no address";
    int connected = -1;
    for (addrinfo* a = found; a != nullptr && connected < 0; a = a->ai_next) {
        const int fd =
            ::socket(a->ai_family, a->ai_socktype | SOCK_CLOEXEC | SOCK_NONBLOCK, a->ai_protocol);
        if (fd < 0) continue;
        if (::connect(fd, a->ai_addr, a->ai_addrlen) == 0 ||
            (errno == EINPROGRESS && Wait(fd, POLLOUT, deadline))) {
            int error = 0;
            socklen_t length = sizeof error;
            ::getsockopt(fd, SOL_SOCKET, SO_ERROR, &error, &length);
            if (error == 0) {
                connected = fd;
                break;
            }
            why = std::strerror(error);
        } else {
            why = errno == 0 ? "no answer within the time-out" : std::strerror(errno);
        }
        ::close(fd);
    }
    ::freeaddrinfo(found);
    if (connected < 0)
        throw StatusError(VI_ERROR_RSRC_NFOUND, "cannot connect to " + where + ": " + why);
    return connected;
}

// ---- Raw SCPI over TCP --------------------------------------------------------------------------

class Socket final : public Transport {
public:
    Socket(const Resource& r, std::chrono::milliseconds timeout)
        : fd_(ConnectTcp(r.host, r.port, Clock::now() + timeout)), timeout_(timeout),
          where_(r.host + ":" + std::to_string(r.port)) {
        const int yes = 1;
        ::setsockopt(fd_, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof yes);
    }
    ~Socket() override { ::close(fd_); }

    void Write(std::span<const std::string_view> message) override {
        const auto deadline = Clock::now() + timeout_;
        for (std::string_view bytes : message)
            Send(bytes, deadline);
    }

    // The time-out bounds the whole reply, however slowly its bytes trickle in.
    std::string ReadLine(std::size_t most) override {
        const auto deadline = Clock::now() + timeout_;
        for (;;) {
            if (const auto end = pending_.find('\n'); end != std::string::npos) {
                std::string line = pending_.substr(0, end);
                pending_.erase(0, end + 1);
                if (!line.empty() && line.back() == '\r') line.pop_back();
                return line;
            }
            if (pending_.size() > most)
                throw StatusError(VI_ERROR_IO, "the reply of " + where_ + " runs past " +
                                                   std::to_string(most) + " bytes without an end");
            if (!Wait(fd_, POLLIN, deadline))
                throw StatusError(VI_ERROR_TMO, "no reply from " + where_ + " within " +
                                                    std::to_string(timeout_.count()) + " ms");
            char bytes[1 << 16];
            const ssize_t got = ::recv(fd_, bytes, sizeof bytes, 0);
            if (got > 0) {
                pending_.append(bytes, static_cast<std::size_t>(got));
            } else if (got == 0 || (errno != EINTR && errno != EAGAIN)) {
                throw StatusError(
                    VI_ERROR_CONN_LOST,
                    "the connection to " + where_ + " was lost" +
                        (got == 0 ? std::string() : std::string(": ") + std::strerror(errno)));
            }
        }
    }

private:
    void Send(std::string_view bytes, Clock::time_point deadline) {
        while (!bytes.empty()) {
            const ssize_t put = ::send(fd_, bytes.data(), bytes.size(), MSG_NOSIGNAL);
            if (put > 0) {
                bytes.remove_prefix(static_cast<std::size_t>(put));
                continue;
            }
            if (put < 0 && errno == EINTR) continue;
            if (put < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) {
                if (!Wait(fd_, POLLOUT, deadline))
                    throw StatusError(VI_ERROR_TMO, "writing to " + where_ + " timed out");
                continue;
            }
            throw StatusError(VI_ERROR_CONN_LOST,
                              "the connection to " + where_ + " was lost: " + std::strerror(errno));
        }
    }

    int fd_;
    std::chrono::milliseconds timeout_;
    std::string where_;
    std::string pending_;
};

// ---- VXI-11 -------------------------------------------------------------------------------------

class Vxi11 final : public Transport {
public:
    static constexpr int kPortmapper = 111;

    Vxi11(const Resource& r, std::chrono::milliseconds timeout)
        : timeout_(static_cast<int>(timeout.count())), where_(r.host + " (" + r.device + ")") {
        // The portmapper first, within the time-out: liblxi's own connect can stall on a host
        // that refuses it.
        try {
            ::close(ConnectTcp(r.host, kPortmapper, Clock::now() + timeout));
        } catch (const StatusError& e) {
            throw StatusError(VI_ERROR_RSRC_NFOUND, "cannot reach the VXI-11 device " + where_ +
                                                        ": no portmapper answers (" + e.what() +
                                                        ")");
        }
        static std::once_flag once;
        std::call_once(once, [] { lxi_init(); });
        device_ = lxi_connect(r.host.c_str(), 0, r.device.c_str(), timeout_, VXI11);
        if (device_ == LXI_ERROR)
            throw StatusError(VI_ERROR_RSRC_NFOUND, "cannot reach the VXI-11 device " + where_);
    }
    ~Vxi11() override { lxi_disconnect(device_); }

    void Write(std::span<const std::string_view> message) override {
        // liblxi marks every write with END, which the instrument takes for the message's end:
        // the parts go out as one.
        std::size_t size = 0;
        for (std::string_view part : message)
            size += part.size();
        std::string whole;
        whole.reserve(size);
        for (std::string_view part : message)
            whole += part;
        if (whole.size() > INT_MAX ||
            lxi_send(device_, whole.data(), static_cast<int>(whole.size()), timeout_) == LXI_ERROR)
            throw StatusError(VI_ERROR_IO, "writing to the VXI-11 device " + where_ + " failed");
    }
    std::string ReadLine(std::size_t most) override {
        std::string reply(std::min<std::size_t>(most, 1 << 20), '\0');
        const int got =
            lxi_receive(device_, reply.data(), static_cast<int>(reply.size()), timeout_);
        if (got == LXI_ERROR)
            throw StatusError(VI_ERROR_TMO, "no reply from the VXI-11 device " + where_);
        reply.resize(static_cast<std::size_t>(got));
        while (!reply.empty() && (reply.back() == '\n' || reply.back() == '\r'))
            reply.pop_back();
        return reply;
    }

private:
    int timeout_;
    std::string where_;
    int device_ = LXI_ERROR;
};

} // namespace

Resource ParseResource(std::string_view text) {
    const auto fields = SplitFields(ivi::Trim(text));
    const auto refuse = [&] {
        throw StatusError(VI_ERROR_RSRC_NFOUND,
                          "\"" + std::string(text) +
                              "\" is no resource of a network instrument "
                              "(TCPIP0::host::5025::SOCKET or TCPIP0::host::inst0::INSTR)");
    };
    if (fields.size() < 3 || !StartsNoCase(fields[0], "TCPIP") || fields[1].empty()) refuse();
    for (char c : fields[0].substr(5))
        if (c < '0' || c > '9') refuse();
    Resource r;
    r.host = fields[1];
    if (ivi::EqualsNoCase(fields.back(), "SOCKET")) {
        if (fields.size() != 4) refuse();
        char* end = nullptr;
        const long port = std::strtol(fields[2].c_str(), &end, 10);
        if (fields[2].empty() || *end != '\0' || port < 1 || port > 65535) refuse();
        r.kind = Resource::Kind::Socket;
        r.port = static_cast<int>(port);
    } else if (ivi::EqualsNoCase(fields.back(), "INSTR")) {
        if (fields.size() > 4) refuse();
        r.kind = Resource::Kind::Vxi11;
        if (fields.size() == 4) r.device = fields[2];
    } else {
        refuse();
    }
    return r;
}

std::unique_ptr<Transport> Connect(const Resource& resource, std::chrono::milliseconds timeout) {
    if (resource.kind == Resource::Kind::Vxi11) return std::make_unique<Vxi11>(resource, timeout);
    return std::make_unique<Socket>(resource, timeout);
}

} // namespace qzivi::scpi
