// A specific driver as the class driver sees it: a table of its functions, built in or loaded.
#pragma once

#include "IviDriverFunctions.h"
#include "qzivi/config_store.h"

#include <memory>
#include <string>

namespace qzivi::ivi {

struct DriverTable {
#define QZIVI_TABLE_SLOT(name, params) ViStatus(*name) params = nullptr;
    QZIVI_SPECIFIC_DRIVER_FUNCTIONS(QZIVI_TABLE_SLOT)
#undef QZIVI_TABLE_SLOT
};

class DriverModule {
public:
    DriverModule(std::string location, std::string prefix, DriverTable table, void* library);
    ~DriverModule();
    DriverModule(const DriverModule&) = delete;
    DriverModule& operator=(const DriverModule&) = delete;

    const std::string& Location() const { return location_; }
    const std::string& Prefix() const { return prefix_; }
    const DriverTable& Table() const { return table_; }

private:
    std::string location_; // "builtin" or the file
    std::string prefix_;
    DriverTable table_;
    void* library_; // dlopen handle, or null
};

// The module of a store entry: the built-in simulator, or a shared library (path relative to
// the store's folder) kept loaded while a session uses it. Throws StatusError naming the file
// and what is wrong with it.
std::shared_ptr<DriverModule> LoadDriverModule(const DriverSession& session,
                                               const std::string& storePath);

} // namespace qzivi::ivi
