// The property bag's parser: any bytes are refused with the system's error or taken; what is
// taken writes back to the same bytes' meaning, so writing and reading again changes nothing.
#include "qzivi/model/PropertyBag.h"
#include "qzivi/support/failure.h"

#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    qzivi::PropertyBag bag;
    try {
        bag.SetContents(std::span(data, size));
    } catch (const qzivi::Failure&) {
        return 0;
    }
    const qzivi::Bytes written = bag.Contents();
    qzivi::PropertyBag again;
    again.SetContents(std::span(written.data(), written.size())); // what it wrote, it reads
    if (again.Contents() != written) std::abort();
    return 0;
}
