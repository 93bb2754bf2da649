// CDblArrayFromFile: a waveform data file as an array of 64-bit floats, sampled on the way from a
// start point, with a step, for a number of points. Three formats, none with a header:
//   1 delimited text, 2 signed 16-bit integers (/ 32767), 3 signed 32-bit integers (/ 2147483647),
// the integers least significant byte first.
//
// The text reader works in blocks of 10000 bytes, and the blocks decide which tokens a stepped
// read takes: each block steps anew from its first token. The file is read through a larger
// buffer and parsed in place, so a large file is never held whole.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace qzivi {

enum QZIviFgenDataFileTypes : std::int32_t {
    DataFileASCII = 1,
    DataFile2ByteInteger = 2,
    DataFile4ByteInteger = 3,
};

class CDblArrayFromFile {
public:
    static constexpr std::size_t kBlockSize = 10000;

    // `count` -1 means all points. An empty result means no data: the readers swallow their own
    // failures (a missing file, too few points, no delimiter, more points than memory takes) and
    // keep their words in Trouble(). Raises -60040 for an unknown file
    // type, and the failure of number 9 when a small text file with a delimiter has no number.
    std::vector<double> RetrieveDblArray(std::int32_t fileType, const std::string& filename,
                                         std::int32_t startIndex, std::int32_t interval,
                                         std::int32_t count) const;

    // Why the last read gave no data, in words ("the data file "x" does not exist"); empty when
    // it gave data or failed for no reason of the file's.
    const std::string& Trouble() const { return m_sTrouble; }

    // The most points a file may give: what half of this computer's memory holds, and never
    // more than a 32-bit count.
    static std::uint64_t MostPoints();

    // The delimiter of a text, probed after its first digit; empty if there is none.
    static std::string FindDelimiter(std::string_view text);

private:
    mutable std::string m_sTrouble;
};

} // namespace qzivi
