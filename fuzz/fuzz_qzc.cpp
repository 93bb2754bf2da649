// A .qzc file of any bytes loaded into the tree: the system's error or a tree; a loaded tree
// saved again and loaded once more saves the same bytes.
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/support/failure.h"

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <unistd.h>

namespace {

std::string Slurp(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::stringstream bytes;
    bytes << in.rdbuf();
    return bytes.str();
}

std::shared_ptr<qzivi::CIviFgenPropImp> Tree() {
    auto tree = qzivi::CIviFgenPropImp::Create();
    auto err = std::make_shared<qzivi::CIviErrorReport>();
    err->ExceptionOnError(true);
    tree->Attach(err);
    tree->InitProperties();
    return tree;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    // On tmpfs the save's fsync costs nothing; on a disk it would bound the rate.
    static const std::string base =
        std::string(::access("/dev/shm", W_OK) == 0 ? "/dev/shm" : "/tmp") + "/qzivi-fuzz-" +
        std::to_string(::getpid());
    const std::string in = base + "-in.qzc", out = base + "-out.qzc", out2 = base + "-out2.qzc";
    std::ofstream(in, std::ios::binary)
        .write(reinterpret_cast<const char*>(data), static_cast<std::streamsize>(size));
    auto tree = Tree();
    try {
        tree->Configurations()->Add("in", in)->Load();
    } catch (const qzivi::Failure&) {
        return 0;
    }
    try {
        tree->Configurations()->Add("out")->Export(out);
        auto again = Tree();
        again->Configurations()->Add("out", out)->Load();
        again->Configurations()->Add("out2")->Export(out2);
    } catch (const qzivi::Failure&) {
        return 0; // a tree that cannot be saved says why (a held waveform without its file)
    }
    if (Slurp(out) != Slurp(out2)) std::abort();
    return 0;
}
