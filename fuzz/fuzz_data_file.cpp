// The waveform data readers on any file, with a start, an interval and a count from the input,
// against the literal model of their rules: the same points, or none, and the cut's failure for
// a small text file exactly when the model has it.
#include "literal_reader.h"
#include "qzivi/model/CDblArrayFromFile.h"
#include "qzivi/support/failure.h"

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <unistd.h>

namespace {

std::int16_t Int16At(const std::uint8_t* p) {
    std::int16_t value;
    std::memcpy(&value, p, sizeof value);
    return value;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::size_t kHeader = 6;
    if (size < kHeader) return 0;
    static const std::string path = "/tmp/qzivi-fuzz-data-" + std::to_string(::getpid());
    const std::string file(reinterpret_cast<const char*>(data + kHeader), size - kHeader);
    std::ofstream(path, std::ios::binary) << file;
    const std::int32_t type = data[0] % 3 + 1;
    const std::int32_t start = Int16At(data + 1);
    const std::int32_t interval = static_cast<std::int8_t>(data[3]);
    const std::int32_t count = std::max<std::int32_t>(Int16At(data + 4), -1);

    using namespace qzivi;
    std::optional<std::vector<double>> expected;
    bool cutFails = false;
    switch (type) {
    case DataFileASCII: {
        const auto literal = test::LiteralRead(file, start, interval, count);
        expected = literal.values;
        cutFails = literal.cutFails;
        break;
    }
    case DataFile2ByteInteger:
        expected = test::LiteralIntegers<std::int16_t>(file, start, interval, count, 32767.0);
        break;
    default:
        expected = test::LiteralIntegers<std::int32_t>(file, start, interval, count, 2147483647.0);
    }
    try {
        const auto points =
            CDblArrayFromFile().RetrieveDblArray(type, path, start, interval, count);
        if (cutFails || points != expected.value_or(std::vector<double>())) std::abort();
    } catch (const Failure& f) {
        if (!cutFails || f.Number() != runtime::kIndexOutOfRange) std::abort();
    }
    return 0;
}
