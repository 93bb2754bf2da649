#include "driver_module.h"

#include "QZSimFgen.h"
#include "qzivi/ivi_common.h"

#include <dlfcn.h>
#include <map>
#include <mutex>
#include <sys/stat.h>
#include <unistd.h>

namespace qzivi::ivi {

DriverModule::DriverModule(std::string location, std::string prefix, DriverTable table,
                           void* library)
    : location_(std::move(location)), prefix_(std::move(prefix)), table_(table), library_(library) {
}

DriverModule::~DriverModule() {
    if (library_ != nullptr) ::dlclose(library_);
}

namespace {

std::shared_ptr<DriverModule> Builtin() {
    static const auto builtin = [] {
        DriverTable table;
#define QZIVI_BUILTIN_SLOT(name, params) table.name = &QZSimFgen_##name;
        QZIVI_SPECIFIC_DRIVER_FUNCTIONS(QZIVI_BUILTIN_SLOT)
#undef QZIVI_BUILTIN_SLOT
        return std::make_shared<DriverModule>(std::string(kBuiltinModule), QZSIMFGEN_PREFIX, table,
                                              nullptr);
    }();
    return builtin;
}

std::string Resolve(const std::string& module, const std::string& storePath) {
    if (module.empty() || module.front() == '/') return module;
    const auto slash = storePath.rfind('/');
    return slash == std::string::npos ? module : storePath.substr(0, slash + 1) + module;
}

std::mutex g_mutex;
std::map<std::string, std::weak_ptr<DriverModule>> g_loaded; // by file and prefix

} // namespace

std::shared_ptr<DriverModule> LoadDriverModule(const DriverSession& session,
                                               const std::string& storePath) {
    if (session.module == kBuiltinModule) return Builtin();
    const std::string file = Resolve(session.module, storePath);
    const std::string where =
        "driver module \"" + file + "\" of logical name \"" + session.logicalName + "\"";
    std::lock_guard lock(g_mutex);
    const std::string key = file + "\n" + session.prefix;
    if (auto loaded = g_loaded[key].lock()) return loaded;

    struct stat info {};
    if (::stat(file.c_str(), &info) != 0)
        throw StatusError(IVI_ERROR_CANNOT_LOAD_MODULE, where + " does not exist");
    void* library = nullptr;
    {
        const int fd = OpenTrustedFile(file, "driver module");
        // Loaded through the descriptor, the file checked is the file run; without /proc the
        // path is all there is.
        const std::string opened = "/proc/self/fd/" + std::to_string(fd);
        library = ::dlopen(::access(opened.c_str(), R_OK) == 0 ? opened.c_str() : file.c_str(),
                           RTLD_NOW | RTLD_LOCAL);
        ::close(fd);
    }
    if (library == nullptr) {
        const char* why = ::dlerror();
        throw StatusError(IVI_ERROR_CANNOT_LOAD_MODULE,
                          where + " cannot be loaded: " + (why ? why : "unknown reason"));
    }
    DriverTable table;
#define QZIVI_LOAD_SLOT(name, params)                                                              \
    table.name = reinterpret_cast<decltype(table.name)>(                                           \
        ::dlsym(library, (session.prefix + "_" #name).c_str()));
    QZIVI_SPECIFIC_DRIVER_FUNCTIONS(QZIVI_LOAD_SLOT)
#undef QZIVI_LOAD_SLOT
    for (auto [function, name] :
         {std::pair{reinterpret_cast<void*>(table.InitWithOptions), "InitWithOptions"},
          std::pair{reinterpret_cast<void*>(table.close), "close"},
          std::pair{reinterpret_cast<void*>(table.error_message), "error_message"}})
        if (function == nullptr) {
            ::dlclose(library);
            throw StatusError(IVI_ERROR_MODULE_FUNCTION_MISSING,
                              where + " lacks the required function " + session.prefix + "_" +
                                  name);
        }
    auto module = std::make_shared<DriverModule>(file, session.prefix, table, library);
    g_loaded[key] = module;
    return module;
}

} // namespace qzivi::ivi
