// The waveform data readers on any file, with a start, an interval and a count from the input:
// points or none, never a failure of another kind, and never more points than asked.
#include "qzivi/model/CDblArrayFromFile.h"
#include "qzivi/support/failure.h"

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <unistd.h>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 4) return 0;
    static const std::string path = "/tmp/qzivi-fuzz-data-" + std::to_string(::getpid());
    std::ofstream(path, std::ios::binary)
        .write(reinterpret_cast<const char*>(data + 4), static_cast<std::streamsize>(size - 4));
    const std::int32_t type = data[0] % 3 + 1;
    const std::int32_t start = data[1] % 16;
    const std::int32_t interval = data[2] % 8 + 1;
    const std::int32_t count = data[3] < 128 ? -1 : data[3] % 64;
    try {
        const auto points =
            qzivi::CDblArrayFromFile().RetrieveDblArray(type, path, start, interval, count);
        if (count >= 0 && points.size() > static_cast<std::size_t>(count)) std::abort();
    } catch (const qzivi::Failure&) {
    }
    return 0;
}
