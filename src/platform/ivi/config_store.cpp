#include "qzivi/config_store.h"

#include "qzivi/ivi_common.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <sys/stat.h>
#include <unistd.h>

namespace qzivi::ivi {

namespace {

DriverSession EmbeddedSampleFGen() {
    return {"SampleFGen", std::string(kBuiltinModule),           "QZSimFgen", "SIM::FGEN0",
            "Simulate=1", {{"Channel1", "1"}, {"Channel2", "2"}}};
}

bool Exists(const std::string& path) {
    struct stat info {};
    return ::stat(path.c_str(), &info) == 0;
}

std::string Env(const char* name) {
    const char* value = std::getenv(name);
    return value != nullptr ? value : "";
}

} // namespace

const DriverSession* ConfigStore::Find(std::string_view logicalName) const {
    for (const auto& session : sessions)
        if (EqualsNoCase(session.logicalName, logicalName)) return &session;
    return nullptr;
}

ConfigStore ParseConfigStore(std::string_view text, const std::string& path) {
    ConfigStore store;
    store.path = path;
    int lineNumber = 0;
    auto fail = [&](const std::string& why) -> void {
        throw StatusError(IVI_ERROR_CONFIG_STORE_INVALID,
                          "configuration store " + (path.empty() ? std::string("text") : path) +
                              ", line " + std::to_string(lineNumber) + ": " + why);
    };
    // An editor's byte-order mark is no part of the first line.
    if (text.starts_with("\xEF\xBB\xBF")) text.remove_prefix(3);
    std::istringstream lines{std::string(text)};
    std::string raw;
    while (std::getline(lines, raw)) {
        ++lineNumber;
        if (raw.find('\0') != std::string::npos) fail("a NUL byte stands in the line");
        const std::string_view line = Trim(raw);
        if (line.empty() || line.front() == '#' || line.front() == ';') continue;
        if (line.front() == '[') {
            if (line.back() != ']') fail("a section header must end with ']'");
            const std::string name(Trim(line.substr(1, line.size() - 2)));
            if (name.empty()) fail("the logical name in brackets is empty");
            if (store.Find(name) != nullptr)
                fail("the logical name \"" + name + "\" is defined twice");
            store.sessions.push_back({name, {}, {}, {}, {}, {}});
            continue;
        }
        const auto equals = line.find('=');
        if (equals == std::string_view::npos) fail("expected \"key = value\" or \"[LogicalName]\"");
        const std::string_view key = Trim(line.substr(0, equals));
        const std::string value(Trim(line.substr(equals + 1)));
        if (store.sessions.empty()) {
            if (key != "trace")
                fail("\"" + std::string(key) + "\" must stand inside a [LogicalName] section");
            store.traceFile = value;
            continue;
        }
        DriverSession& session = store.sessions.back();
        if (key == "module") {
            session.module = value;
        } else if (key == "prefix") {
            session.prefix = value;
        } else if (key == "resource") {
            session.resource = value;
        } else if (key == "options") {
            session.options = value;
        } else if (key.starts_with("channel ") || key.starts_with("channel\t")) {
            const std::string virtualName(Trim(key.substr(8)));
            if (virtualName.empty() || value.empty())
                fail("a channel line reads \"channel Virtual = Physical\"");
            for (const auto& [known, physical] : session.virtualNames)
                if (known == virtualName)
                    fail("the channel name \"" + virtualName + "\" is mapped twice");
            session.virtualNames.emplace_back(virtualName, value);
        } else {
            fail("unknown key \"" + std::string(key) + "\"");
        }
    }
    for (const auto& session : store.sessions) {
        if (session.module.empty())
            throw StatusError(IVI_ERROR_CONFIG_STORE_INVALID,
                              "configuration store " + path + ": logical name \"" +
                                  session.logicalName + "\" has no module");
        if (session.module != kBuiltinModule && session.prefix.empty())
            throw StatusError(IVI_ERROR_CONFIG_STORE_INVALID,
                              "configuration store " + path + ": logical name \"" +
                                  session.logicalName + "\" names a module file but no prefix");
    }
    if (store.Find("SampleFGen") == nullptr) store.sessions.push_back(EmbeddedSampleFGen());
    return store;
}

void RefuseIfWritableByOthers(const std::string& path, std::string_view what) {
    struct stat info {};
    if (::stat(path.c_str(), &info) != 0) return; // the caller reports a missing file its own way
    if ((info.st_mode & S_IWOTH) != 0)
        throw StatusError(IVI_ERROR_FILE_NOT_SECURE,
                          std::string(what) + " \"" + path +
                              "\" can be written by any user and is refused; "
                              "remove that permission (chmod o-w)");
}

int OpenTrustedFile(const std::string& path, std::string_view what) {
    const auto refuse = [&](const std::string& why) {
        throw StatusError(IVI_ERROR_FILE_NOT_SECURE,
                          std::string(what) + " \"" + path + "\" is refused: " + why);
    };
    for (const auto& part : std::filesystem::path(path))
        if (part == "..") refuse("its path climbs out of a folder (\"..\")");
    char* resolved = ::realpath(path.c_str(), nullptr);
    if (resolved == nullptr)
        refuse(std::string("its path cannot be followed: ") + std::strerror(errno));
    const std::string real = resolved;
    std::free(resolved);
    // Each folder from the root down, and what lies in it.
    for (std::size_t slash = 0; slash != std::string::npos && slash + 1 < real.size();) {
        const std::string folder = slash == 0 ? "/" : real.substr(0, slash);
        const std::size_t next = real.find('/', slash + 1);
        const std::string inner = real.substr(0, next);
        struct stat folderInfo {
        }, innerInfo{};
        if (::stat(folder.c_str(), &folderInfo) != 0 || ::lstat(inner.c_str(), &innerInfo) != 0)
            refuse(std::string("its path cannot be followed: ") + std::strerror(errno));
        const bool sticky = (folderInfo.st_mode & S_ISVTX) != 0;
        const bool ownInner = innerInfo.st_uid == ::getuid() || innerInfo.st_uid == 0;
        if ((folderInfo.st_mode & S_IWOTH) != 0 && !(sticky && ownInner))
            refuse("the folder \"" + folder +
                   "\" can be written by any user (remove that permission: chmod o-w)");
        slash = next;
    }
    const int fd = ::open(real.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK);
    if (fd < 0)
        throw StatusError(IVI_ERROR_CANNOT_LOAD_MODULE,
                          std::string(what) + " \"" + path +
                              "\" cannot be opened: " + std::strerror(errno));
    struct stat info {};
    if (::fstat(fd, &info) != 0 || !S_ISREG(info.st_mode) || (info.st_mode & S_IWOTH) != 0) {
        ::close(fd);
        refuse(S_ISREG(info.st_mode)
                   ? "it can be written by any user (remove that permission: chmod o-w)"
                   : "it is no regular file");
    }
    return fd;
}

std::vector<std::string> ConfigStoreSearchOrder() {
    if (const std::string named = Env("QZIVI_CONFIG_STORE"); !named.empty()) return {named};
    std::vector<std::string> order;
    std::string home = Env("XDG_CONFIG_HOME");
    if (home.empty() && !Env("HOME").empty()) home = Env("HOME") + "/.config";
    if (!home.empty()) order.push_back(home + "/qzivi/qzivi.conf");
    order.push_back(std::string(QZIVI_SYSCONFDIR) + "/qzivi.conf");
    return order;
}

std::string FindConfigStoreFile() {
    const auto order = ConfigStoreSearchOrder();
    if (!Env("QZIVI_CONFIG_STORE").empty()) return order.front(); // named: it must be there
    for (const auto& path : order)
        if (Exists(path)) return path;
    return {};
}

std::string EditableConfigStoreFile() {
    if (std::string found = FindConfigStoreFile(); !found.empty()) return found;
    std::string home = Env("XDG_CONFIG_HOME");
    if (home.empty() && !Env("HOME").empty()) home = Env("HOME") + "/.config";
    if (home.empty())
        throw StatusError(IVI_ERROR_CANNOT_OPEN_FILE, "no place for a configuration store: "
                                                      "neither XDG_CONFIG_HOME nor HOME is set");
    const std::string path = home + "/qzivi/qzivi.conf";
    std::error_code ignored;
    std::filesystem::create_directories(home + "/qzivi", ignored);
    const DriverSession d = EmbeddedSampleFGen();
    std::ofstream file(path);
    file << "# The IVI configuration store: one [LogicalName] section a session.\n"
         << "# \"" << d.logicalName << "\" stands built in, as if written here:\n#\n"
         << "# [" << d.logicalName << "]\n# module = " << d.module << "\n# prefix = " << d.prefix
         << "\n# resource = " << d.resource << "\n# options = " << d.options << "\n";
    for (const auto& [virtualName, physical] : d.virtualNames)
        file << "# channel " << virtualName << " = " << physical << "\n";
    if (!file.flush())
        throw StatusError(IVI_ERROR_CANNOT_OPEN_FILE,
                          "configuration store \"" + path +
                              "\" cannot be written: " + std::strerror(errno));
    // The store names code to load: it must not be writable by others, whatever the umask.
    std::filesystem::permissions(path, std::filesystem::perms(0644), ignored);
    return path;
}

ConfigStore LoadConfigStore() {
    const std::string path = FindConfigStoreFile();
    if (path.empty()) return ParseConfigStore("", "");
    // Opened without waiting and read only if it is a plain file: a FIFO would block the
    // caller for good, and a folder would read as an empty store.
    const int fd = ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
    if (fd < 0)
        throw StatusError(IVI_ERROR_CANNOT_OPEN_FILE,
                          "configuration store \"" + path +
                              "\" cannot be read: " + std::strerror(errno));
    struct stat info {};
    if (::fstat(fd, &info) != 0 || !S_ISREG(info.st_mode)) {
        ::close(fd);
        throw StatusError(IVI_ERROR_CANNOT_OPEN_FILE,
                          "configuration store \"" + path + "\" is no regular file");
    }
    std::string text;
    char block[4096];
    for (ssize_t got; (got = ::read(fd, block, sizeof block)) != 0;) {
        if (got < 0) {
            if (errno == EINTR) continue;
            const int error = errno;
            ::close(fd);
            throw StatusError(IVI_ERROR_CANNOT_OPEN_FILE,
                              "configuration store \"" + path +
                                  "\" cannot be read: " + std::strerror(error));
        }
        text.append(block, static_cast<std::size_t>(got));
    }
    ::close(fd);
    RefuseIfWritableByOthers(path, "configuration store");
    return ParseConfigStore(text, path);
}

} // namespace qzivi::ivi
