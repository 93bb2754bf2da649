// The configuration store's parser: any text is a store or the store's error naming a line.
#include "qzivi/config_store.h"
#include "qzivi/ivi_common.h"

#include <cstdlib>
#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    try {
        const auto store = qzivi::ivi::ParseConfigStore(
            std::string_view(reinterpret_cast<const char*>(data), size), "fuzz.conf");
        if (store.Find("SampleFGen") == nullptr) std::abort(); // the embedded default stands
    } catch (const qzivi::ivi::StatusError& e) {
        if (std::string_view(e.what()).find("fuzz.conf") == std::string_view::npos) std::abort();
    }
    return 0;
}
