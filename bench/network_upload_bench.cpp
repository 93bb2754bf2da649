// Uploading a one-million-point arbitrary waveform to the emulator on the loopback address:
// through the SCPI driver, and as the same bytes written by hand on a plain socket. Both ask
// the error queue after each channel's upload and clear the memories after each round, as the
// driver does, so the difference is what the driver and the class driver add.
#include "IviFgen.h"

#include <benchmark/benchmark.h>

#include <arpa/inet.h>
#include <cmath>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <stdexcept>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace {

constexpr int kPoints = 1000000;

// The emulator in a child process for the whole run, and a store that names it "Bench".
class Bench {
public:
    Bench() {
        int out[2];
        if (::pipe(out) != 0) throw std::runtime_error("pipe");
        pid_ = ::fork();
        if (pid_ == 0) {
            ::dup2(out[1], 1);
            ::execl(QZFGEN_EMU_PATH, QZFGEN_EMU_PATH, "--port", "0", nullptr);
            ::_exit(127);
        }
        ::close(out[1]);
        char line[16] = {};
        for (std::size_t i = 0;
             i < sizeof line - 1 && ::read(out[0], line + i, 1) == 1 && line[i] != '\n'; ++i) {
        }
        ::close(out[0]);
        port_ = std::atoi(line);
        dir_ =
            std::filesystem::temp_directory_path() / ("qzivi-bench-" + std::to_string(::getpid()));
        std::filesystem::create_directories(dir_);
        const auto store = dir_ / "store.conf";
        std::ofstream(store) << "[Bench]\nmodule = " << QZIVI_SCPI_MODULE
                             << "\nprefix = QZScpiFgen\nresource = TCPIP0::127.0.0.1::" << port_
                             << "::SOCKET\noptions = DriverSetup=Timeout=20000\n";
        std::filesystem::permissions(store, std::filesystem::perms(0644));
        ::setenv("QZIVI_CONFIG_STORE", store.c_str(), 1);
        ::setenv("QZIVI_SESSION_MANAGER", "none", 1);
        ::unsetenv("QZIVI_TRACE");
    }
    ~Bench() {
        ::kill(pid_, SIGTERM);
        ::waitpid(pid_, nullptr, 0);
        std::filesystem::remove_all(dir_);
    }
    int Port() const { return port_; }

private:
    pid_t pid_ = 0;
    int port_ = 0;
    std::filesystem::path dir_;
};

Bench& TheBench() {
    static Bench bench;
    return bench;
}

std::vector<double> Points() {
    std::vector<double> points(kPoints);
    for (int i = 0; i < kPoints; ++i)
        points[static_cast<std::size_t>(i)] = std::sin(i * 2 * 3.14159265358979 / 1000);
    return points;
}

void BM_UploadThroughTheDriver(benchmark::State& state) {
    TheBench();
    ViSession vi = 0;
    if (IviFgen_InitWithOptions(const_cast<ViChar*>("Bench"), VI_FALSE, VI_FALSE, "", &vi) !=
        VI_SUCCESS) {
        state.SkipWithError("the driver could not open the emulator");
        return;
    }
    const auto points = Points();
    std::int64_t bytes = 0;
    for (auto _ : state) {
        ViInt32 handle = 0;
        if (IviFgen_CreateArbWaveform(vi, kPoints, points.data(), &handle) != VI_SUCCESS ||
            IviFgen_ClearArbWaveform(vi, IVIFGEN_VAL_ALL_WAVEFORMS) != VI_SUCCESS) {
            state.SkipWithError("the upload failed");
            break;
        }
        bytes += 2 * 4 * kPoints; // a copy for each channel's memory
    }
    state.SetBytesProcessed(bytes);
    IviFgen_close(vi);
}
BENCHMARK(BM_UploadThroughTheDriver)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_TheSameBytesOnAPlainSocket(benchmark::State& state) {
    const int fd = ::socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_port = htons(static_cast<std::uint16_t>(TheBench().Port()));
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    const int yes = 1;
    ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof yes);
    if (::connect(fd, reinterpret_cast<sockaddr*>(&a), sizeof a) != 0) {
        state.SkipWithError("no emulator");
        return;
    }
    const auto points = Points();
    std::string block(4 * kPoints, '\0');
    for (int i = 0; i < kPoints; ++i) {
        const float f = static_cast<float>(points[static_cast<std::size_t>(i)]);
        std::memcpy(&block[4 * static_cast<std::size_t>(i)], &f, 4);
    }
    const std::string length = std::to_string(block.size());
    block = "#" + std::to_string(length.size()) + length + block;
    auto ask = [&](const std::string& message) {
        for (std::size_t done = 0; done < message.size();)
            done += static_cast<std::size_t>(
                ::send(fd, message.data() + done, message.size() - done, 0));
        char c = 0;
        while (::recv(fd, &c, 1, 0) == 1 && c != '\n') {
        }
    };
    ask("FORM:BORD SWAP;:SYST:ERR?\n");
    std::int64_t bytes = 0;
    for (auto _ : state) {
        for (int channel = 1; channel <= 2; ++channel)
            ask("SOUR" + std::to_string(channel) + ":DATA:ARB QZW1," + block + ";:SYST:ERR?\n");
        for (int channel = 1; channel <= 2; ++channel)
            ask("SOUR" + std::to_string(channel) + ":DATA:VOL:CLE;:SYST:ERR?\n");
        bytes += 2 * 4 * kPoints;
    }
    state.SetBytesProcessed(bytes);
    ::close(fd);
}
BENCHMARK(BM_TheSameBytesOnAPlainSocket)->Unit(benchmark::kMillisecond)->UseRealTime();

} // namespace
