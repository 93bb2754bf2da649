#include "qzivi/model/CDblArrayFromFile.h"

#include "qzivi/support/failure.h"

#include <algorithm>
#include <bit>
#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <limits>
#include <new>
#include <optional>
#include <sys/stat.h>
#include <unistd.h>

namespace qzivi {

namespace {

static_assert(std::endian::native == std::endian::little, "the integer formats are read in place");

constexpr std::string_view kDelimiters = ";,\t\r\n ";
constexpr std::size_t kReadSize = 1 << 20;

std::string Quoted(const std::string& filename) {
    return "\"" + filename + "\"";
}

// The readers' own failures; the readers swallow them, and their words become the trouble.
[[noreturn]] void ImproperFile(const std::string& filename) {
    RaiseRuntime(-runtime::kImproperFile,
                 "the data file " + Quoted(filename) + " holds no delimited numbers");
}
[[noreturn]] void NotAccessible(const std::string& why) {
    RaiseRuntime(-runtime::kFileNotAccessible, why);
}
[[noreturn]] void TooFewData(const std::string& filename, std::int64_t asked) {
    RaiseRuntime(-runtime::kTooFewData, "the data file " + Quoted(filename) +
                                            " holds fewer than the " + std::to_string(asked) +
                                            " points asked for");
}
[[noreturn]] void TooManyPoints(const std::string& filename) {
    RaiseRuntime(-runtime::kOutOfMemory, "the data file " + Quoted(filename) + " holds more than " +
                                             std::to_string(CDblArrayFromFile::MostPoints()) +
                                             " points, more than this computer's memory can take");
}
[[noreturn]] void CutFails() {
    RaiseRuntime(runtime::kIndexOutOfRange, "Subscript out of range.");
}

// Reserving beyond this lets the points grow as they are read: a count guessed from the file's
// length must not claim memory the file's points may never need.
constexpr std::uint64_t kMostReserved = std::uint64_t{1} << 24;

// The file, open for reading as bytes; closed on every way out.
class File {
public:
    explicit File(const std::string& name) : name_(name) {
        if (name.empty()) NotAccessible("no data file is named");
        fd_ = ::open(name.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC); // a FIFO must not block
        if (fd_ < 0) {
            const int error = errno;
            NotAccessible(error == ENOENT ? "the data file " + Quoted(name) + " does not exist"
                                          : "the data file " + Quoted(name) +
                                                " cannot be opened: " + std::strerror(error));
        }
        struct stat info {};
        if (::fstat(fd_, &info) != 0 || !S_ISREG(info.st_mode)) {
            ::close(fd_);
            NotAccessible(Quoted(name) + " is no regular file");
        }
        size_ = static_cast<std::uint64_t>(info.st_size);
        if (size_ == 0) {
            ::close(fd_);
            NotAccessible("the data file " + Quoted(name) + " is empty");
        }
    }
    ~File() { ::close(fd_); }
    File(const File&) = delete;
    File& operator=(const File&) = delete;

    const std::string& Name() const { return name_; }
    std::uint64_t Size() const { return size_; }
    // Reads up to `size` bytes at `offset`; fewer only at the end of the file.
    std::size_t ReadAt(std::uint64_t offset, char* into, std::size_t size) const {
        std::size_t done = 0;
        while (done < size) {
            const ssize_t got =
                ::pread(fd_, into + done, size - done, static_cast<off_t>(offset + done));
            if (got < 0 && errno == EINTR) continue;
            if (got < 0)
                NotAccessible("the data file " + Quoted(name_) +
                              " cannot be read: " + std::strerror(errno));
            if (got == 0) break;
            done += static_cast<std::size_t>(got);
        }
        return done;
    }
    [[noreturn]] void Shrank() const {
        NotAccessible("the data file " + Quoted(name_) + " shrank while it was read");
    }

private:
    std::string name_;
    int fd_ = -1;
    std::uint64_t size_ = 0;
};

bool IsSpace(char c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\v' || c == '\f';
}
bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}

// A token as a number: it ends at its first NUL or at `end`; white space around the number, a sign,
// a decimal point and an exponent are taken, the same under any locale.
bool ParseToken(const char* p, const char* end, double& value) {
    while (p < end && IsSpace(*p))
        ++p;
    if (p == end) return false;
    bool negative = false;
    if (*p == '+' || *p == '-') {
        negative = *p == '-';
        ++p;
    }
    if (p == end || !(IsDigit(*p) || *p == '.')) return false;
    auto [q, error] = std::from_chars(p, end, value);
    if (error == std::errc::result_out_of_range) {
        // Too large is no number; too small is zero, as strtod has it.
        const std::string copy(p, static_cast<std::size_t>(q - p));
        value = std::strtod(copy.c_str(), nullptr);
        if (!std::isfinite(value)) return false;
    } else if (error != std::errc()) {
        return false;
    }
    const char* rest = q;
    while (rest < end && IsSpace(*rest))
        ++rest;
    if (rest != end && *rest != '\0') return false;
    if (negative) value = -value;
    return true;
}

// Integer division as the system's first language did it: towards zero; by zero it fails.
std::int64_t IntDiv(std::int64_t a, std::int64_t b) {
    if (b == 0) RaiseRuntime(runtime::kDivisionByZero, "Division by zero.");
    return a / b;
}

// ---- Integer formats --------------------------------------------------------------------------

template <typename Int>
std::vector<double> ReadIntegers(const std::string& filename, std::int32_t startIndex,
                                 std::int32_t interval, std::int32_t count, double scale) {
    const File file(filename);
    const auto n = static_cast<std::int64_t>(file.Size() / sizeof(Int));
    const std::int64_t available = IntDiv(n, interval) - IntDiv(startIndex, interval);
    const std::int64_t points = count == -1 ? available : count;
    if (points > available) TooFewData(filename, points);
    if (points <= 0 || startIndex < 0 || interval < 0) return {};
    if (static_cast<std::uint64_t>(points) > CDblArrayFromFile::MostPoints())
        TooManyPoints(filename);

    std::vector<double> result(static_cast<std::size_t>(points));
    const std::uint64_t step = static_cast<std::uint64_t>(interval);
    // Elements are read in runs of whole chunks and picked out: one pass, in order.
    const std::uint64_t span = (static_cast<std::uint64_t>(points) - 1) * step + 1;
    std::vector<Int> chunk(static_cast<std::size_t>(
        std::min<std::uint64_t>(span, kReadSize / sizeof(Int)))); // a small file, a small buffer
    std::uint64_t element = static_cast<std::uint64_t>(startIndex);
    std::size_t out = 0;
    while (out < result.size()) {
        const std::uint64_t last = element + (result.size() - out - 1) * step;
        const std::uint64_t span = std::min<std::uint64_t>(last - element + 1, chunk.size());
        const std::size_t got =
            file.ReadAt(element * sizeof(Int), reinterpret_cast<char*>(chunk.data()),
                        static_cast<std::size_t>(span * sizeof(Int))) /
            sizeof(Int);
        if (got == 0) file.Shrank();
        std::uint64_t k = 0;
        if (step == 1) {
            const std::size_t take = std::min<std::size_t>(got, result.size() - out);
            for (; k < take; ++k)
                result[out + k] = chunk[k] / scale;
            out += take;
        } else {
            for (; k < got && out < result.size(); k += step)
                result[out++] = chunk[k] / scale;
        }
        element += k;
    }
    return result;
}

// ---- Text format --------------------------------------------------------------------------------

// The first block of the file, padded with NUL to a whole block, as the reader sees it.
std::string FirstBlock(const File& file) {
    std::string block(CDblArrayFromFile::kBlockSize, '\0');
    file.ReadAt(0, block.data(), block.size());
    return block;
}

// The tokens of [begin, end) split at `delimiter`, handed to `take(index, tokenBegin, tokenEnd)`
// until it answers false.
template <typename Take>
void ForEachToken(const char* begin, const char* end, char delimiter, Take&& take) {
    std::int64_t index = 0;
    for (const char* p = begin;; ++index) {
        const char* stop =
            static_cast<const char*>(std::memchr(p, delimiter, static_cast<std::size_t>(end - p)));
        if (!take(index, p, stop != nullptr ? stop : end) || stop == nullptr) return;
        p = stop + 1;
    }
}

// Takes every `interval`-th token of [begin, end) from token `wanted` on, while fewer than `limit`
// points are held: the stepping loop of both paths.
void TakeTokens(const char* begin, const char* end, char delimiter, std::int64_t wanted,
                std::int32_t interval, std::uint64_t limit, std::vector<double>& result) {
    ForEachToken(begin, end, delimiter, [&](std::int64_t index, const char* a, const char* b) {
        if (result.size() >= limit) return false;
        if (index == wanted) {
            double value = 0;
            if (ParseToken(a, b, value)) result.push_back(value);
            wanted += interval;
        }
        return true;
    });
}

// Nothing for no data; an empty array when no token converted, where the cut of the array fails.
std::optional<std::vector<double>> SmallFile(const std::string& filename, const std::string& block,
                                             std::size_t firstDigit, char delimiter,
                                             std::int32_t startIndex, std::int32_t interval,
                                             std::int32_t count) {
    const char* begin = block.data() + firstDigit;
    const char* end = block.data() + block.size();
    const auto tokens = static_cast<std::int64_t>(std::count(begin, end, delimiter)) + 1;
    // The tokens the step reaches: "0,1,2,3,4,5" from 1 by 2 gives 1, 3 and 5.
    const std::int64_t available =
        tokens > startIndex ? (tokens - startIndex + interval - 1) / interval : 0;
    const std::int64_t limit = count == -1 ? available : count;
    if (limit <= 0) return std::nullopt;
    if (count != -1 && limit > available) TooFewData(filename, limit);
    std::vector<double> result;
    result.reserve(static_cast<std::size_t>(std::min(limit, tokens)));
    TakeTokens(begin, end, delimiter, startIndex, interval, static_cast<std::uint64_t>(limit),
               result);
    return result;
}

// The block path. The text of each round is the tail of the last one and the next block, which in
// the file are one run of bytes: [textStart, blockEnd). Bytes past the end of the file are NUL.
std::vector<double> BlockPath(const File& file, std::size_t firstDigit, char delimiter,
                              std::int32_t startIndex, std::int32_t interval, std::int32_t count,
                              std::uint64_t estimate) {
    const std::uint64_t length = file.Size();
    // One point past the most memory takes is enough to know the file is too large.
    const std::uint64_t limit =
        std::min(count == -1 ? length : static_cast<std::uint64_t>(std::max(count, 0)),
                 CDblArrayFromFile::MostPoints() + 1);
    std::vector<double> result;
    result.reserve(static_cast<std::size_t>(std::min({limit, estimate, kMostReserved})));

    std::vector<char> buffer(kReadSize + 2 * CDblArrayFromFile::kBlockSize);
    std::uint64_t bufferStart = 0, bufferEnd = 0; // file offsets held in the buffer
    std::uint64_t textStart = 0, blockEnd = CDblArrayFromFile::kBlockSize;
    std::size_t skip = firstDigit;
    bool first = true;
    for (;;) {
        const std::uint64_t realEnd = std::min(blockEnd, length);
        if (realEnd > bufferEnd) {
            const std::size_t keep = static_cast<std::size_t>(bufferEnd - textStart);
            std::memmove(buffer.data(), buffer.data() + (textStart - bufferStart), keep);
            bufferStart = textStart;
            bufferEnd = textStart + keep +
                        file.ReadAt(textStart + keep, buffer.data() + keep, buffer.size() - keep);
            if (bufferEnd < realEnd) file.Shrank();
        }
        const char* text = buffer.data() + (textStart - bufferStart);
        const char* textEnd = buffer.data() + (realEnd - bufferStart);
        const char* last = static_cast<const char*>(
            ::memrchr(text, delimiter, static_cast<std::size_t>(textEnd - text)));
        // Cut after the last delimiter; with none the whole text is one token and no tail is kept.
        const char* bodyEnd = last != nullptr ? last + 1 : textEnd;
        std::int64_t wanted = first ? startIndex : 0; // each block steps anew from its first token
        // A body that ends in the delimiter has one more, empty, token after it: it converts to
        // nothing and is the last of its block, so it is left out.
        const char* tokensEnd = last != nullptr ? bodyEnd - 1 : bodyEnd;
        TakeTokens(text + skip, tokensEnd, delimiter, wanted, interval, limit, result);
        first = false;
        skip = 0;
        // Once the points are all taken the rest of the file cannot change the result.
        if (blockEnd >= length || result.size() >= limit) {
            if (result.size() > CDblArrayFromFile::MostPoints()) TooManyPoints(file.Name());
            if (count != -1 && limit >= result.size() + 1) TooFewData(file.Name(), limit);
            return result;
        }
        textStart = last != nullptr
                        ? static_cast<std::uint64_t>(bodyEnd - buffer.data()) + bufferStart
                        : blockEnd;
        blockEnd += CDblArrayFromFile::kBlockSize;
    }
}

// Runs a reader; its failure becomes `trouble` and no data.
template <typename Read>
std::vector<double> Swallowed(const std::string& filename, std::string& trouble, Read&& read) {
    try {
        return read();
    } catch (const Failure& f) {
        trouble = f.Description();
    } catch (const std::bad_alloc&) {
        trouble = "memory ran out while the data file " + Quoted(filename) + " was read";
    }
    return {};
}

std::vector<double> ReadText(const std::string& filename, std::int32_t startIndex,
                             std::int32_t interval, std::int32_t count, std::string& trouble) {
    std::optional<std::vector<double>> small;
    auto points = Swallowed(filename, trouble, [&]() -> std::vector<double> {
        const File file(filename);
        const std::string block = FirstBlock(file);
        const std::string delimiter = CDblArrayFromFile::FindDelimiter(block);
        if (delimiter.empty()) ImproperFile(filename);
        const std::size_t firstDigit = block.find_first_of("0123456789");
        // A step of 0 or below, or a start before the first token, reads nothing on either path.
        if (interval <= 0 || startIndex < 0) return {};
        if (file.Size() > CDblArrayFromFile::kBlockSize) {
            // The points of the whole file at the density of its first block, and a tenth more.
            const auto tokens = static_cast<std::uint64_t>(
                std::count(block.begin() +
                               static_cast<std::ptrdiff_t>(std::min(firstDigit, block.size())),
                           block.end(), delimiter[0]) +
                1);
            const std::uint64_t estimate = file.Size() / CDblArrayFromFile::kBlockSize * tokens /
                                               static_cast<std::uint64_t>(interval) * 11 / 10 +
                                           tokens;
            return BlockPath(file, firstDigit, delimiter[0], startIndex, interval, count, estimate);
        }
        small = SmallFile(filename, block, firstDigit, delimiter[0], startIndex, interval, count);
        return {};
    });
    if (small && small->empty()) CutFails(); // the cut of the array to no element
    return small ? std::move(*small) : std::move(points);
}

} // namespace

std::string CDblArrayFromFile::FindDelimiter(std::string_view text) {
    const std::size_t first = text.find_first_of("0123456789");
    const std::size_t d = first == std::string_view::npos ? text.size() + 1 : first + 1; // 1-based
    const auto rest = static_cast<std::int64_t>(text.size()) - static_cast<std::int64_t>(d);
    std::string_view probe;
    if (rest >= 25)
        probe = text.substr(d - 1, 25);
    else if (rest >= 2)
        probe = text.substr(d, static_cast<std::size_t>(rest));
    else
        return {};
    for (char c : kDelimiters)
        if (probe.find(c) != std::string_view::npos) return std::string(1, c);
    return {};
}

std::uint64_t CDblArrayFromFile::MostPoints() {
    // Half the memory, as doubles, and no more than a point count the instruments can name.
    static const std::uint64_t most = [] {
        const long pages = ::sysconf(_SC_PHYS_PAGES), pageSize = ::sysconf(_SC_PAGESIZE);
        const std::uint64_t memory =
            pages > 0 && pageSize > 0
                ? static_cast<std::uint64_t>(pages) * static_cast<std::uint64_t>(pageSize)
                : std::uint64_t{1} << 32;
        return std::min<std::uint64_t>(memory / 2 / sizeof(double),
                                       std::numeric_limits<std::int32_t>::max());
    }();
    return most;
}

std::vector<double> CDblArrayFromFile::RetrieveDblArray(std::int32_t fileType,
                                                        const std::string& filename,
                                                        std::int32_t startIndex,
                                                        std::int32_t interval,
                                                        std::int32_t count) const {
    // The readers keep their own failures and give no data, but one: a small text file that has
    // a delimiter and yet no number fails at the cut of its array.
    m_sTrouble.clear();
    switch (fileType) {
    case DataFileASCII:
        return ReadText(filename, startIndex, interval, count, m_sTrouble);
    case DataFile2ByteInteger:
        return Swallowed(filename, m_sTrouble, [&] {
            return ReadIntegers<std::int16_t>(filename, startIndex, interval, count, 32767.0);
        });
    case DataFile4ByteInteger:
        return Swallowed(filename, m_sTrouble, [&] {
            return ReadIntegers<std::int32_t>(filename, startIndex, interval, count, 2147483647.0);
        });
    default:
        RaiseRuntime(-runtime::kImproperFile, "Improper file type.");
    }
}

} // namespace qzivi
