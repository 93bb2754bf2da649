// Helpers for tests of the IVI layer: a private configuration store and an open session.
#pragma once

#include "IviFgen.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <unistd.h>

namespace qzivi::test {

// Points the store search at a fresh folder for the test's lifetime: no store file anywhere
// unless the test writes one.
class StoreScope {
public:
    StoreScope() {
        dir_ = std::filesystem::temp_directory_path() /
               ("qzivi-test-" + std::to_string(::getpid()) + "-" + std::to_string(counter_++));
        std::filesystem::create_directories(dir_);
        Save("QZIVI_CONFIG_STORE", "");
        Save("XDG_CONFIG_HOME", dir_.string());
        Save("QZIVI_TRACE", "");
    }
    ~StoreScope() {
        for (auto& [name, value, had] : saved_)
            had ? ::setenv(name.c_str(), value.c_str(), 1) : ::unsetenv(name.c_str());
        std::filesystem::remove_all(dir_);
    }

    // Writes `text` as the store named by QZIVI_CONFIG_STORE and returns its path.
    std::string UseStore(const std::string& text, const std::string& name = "store.conf") {
        const std::string path = Write(name, text);
        ::setenv("QZIVI_CONFIG_STORE", path.c_str(), 1);
        return path;
    }

    std::string Write(const std::string& name, const std::string& text) {
        const auto path = dir_ / name;
        std::filesystem::create_directories(path.parent_path());
        std::ofstream(path) << text;
        std::filesystem::permissions(path, std::filesystem::perms(0644));
        return path.string();
    }

    const std::filesystem::path& Dir() const { return dir_; }

private:
    void Save(const std::string& name, const std::string& value) {
        const char* old = std::getenv(name.c_str());
        saved_.push_back({name, old ? old : "", old != nullptr});
        value.empty() ? ::unsetenv(name.c_str()) : ::setenv(name.c_str(), value.c_str(), 1);
    }

    struct Saved {
        std::string name, value;
        bool had;
    };
    std::vector<Saved> saved_;
    std::filesystem::path dir_;
    static inline int counter_ = 0;
};

inline std::string LastError(ViSession vi) {
    ViStatus code = 0;
    ViChar text[2048] = {};
    IviFgen_GetError(vi, &code, sizeof text, text);
    return text;
}

// An IviFgen session on "SampleFGen" (or another name) that closes itself.
class Session {
public:
    explicit Session(const std::string& options = "", const std::string& name = "SampleFGen") {
        status_ = IviFgen_InitWithOptions(name.c_str(), VI_FALSE, VI_TRUE, options.c_str(), &vi_);
    }
    ~Session() {
        if (vi_ != 0) IviFgen_close(vi_);
    }
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;

    ViSession vi() const { return vi_; }
    ViStatus OpenStatus() const { return status_; }

    ViInt32 Int(ViAttr attr, const char* channel = "") const {
        ViInt32 value = -999;
        EXPECT_EQ(IviFgen_GetAttributeViInt32(vi_, channel, attr, &value), VI_SUCCESS)
            << LastError(vi_);
        return value;
    }
    ViReal64 Real(ViAttr attr, const char* channel = "Channel1") const {
        ViReal64 value = -999;
        EXPECT_EQ(IviFgen_GetAttributeViReal64(vi_, channel, attr, &value), VI_SUCCESS)
            << LastError(vi_);
        return value;
    }
    std::string Text(ViAttr attr) const {
        ViChar value[1000] = {};
        EXPECT_EQ(IviFgen_GetAttributeViString(vi_, "", attr, sizeof value, value), VI_SUCCESS)
            << LastError(vi_);
        return value;
    }
    std::string Elaboration() const {
        ViChar value[1000] = {};
        IviFgen_GetAttributeViString(vi_, "", IVI_ATTR_ERROR_ELABORATION, sizeof value, value);
        return value;
    }

private:
    ViSession vi_ = 0;
    ViStatus status_ = 0;
};

} // namespace qzivi::test
