// The session manager: shared IviFgen sessions by logical name.
#include "VXSessionServer.h"

#include "IviFgen.h"
#include "qzivi/ivi_common.h"

#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

using qzivi::ivi::CopyText;
using qzivi::ivi::EqualsNoCase;

namespace {

constexpr std::string_view kAddressPrefix = "IVI::IVIFGEN::";

// One driver session, shared by every session object of its logical name.
struct Shared {
    std::string logicalName;
    ViSession vi = 0;
    int users = 0;
};

std::mutex g_mutex;
std::map<std::string, std::shared_ptr<Shared>> g_shared; // by lower-case logical name

std::string Key(std::string_view name) {
    std::string key(name);
    for (char& c : key)
        c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return key;
}

// The failure's text goes to the caller's buffer where one can take it; the number always returns.
int32_t Fail(int32_t number, const std::string& text, char* error, int32_t errorSize) noexcept {
    try {
        CopyText(text, errorSize, error);
    } catch (...) {
    }
    return number;
}

std::vector<std::string> LogicalNames() {
    std::vector<std::string> names;
    ViInt32 list = 0, count = 0;
    if (Ivi_GetLogicalNamesList(&list, &count) < 0) return names;
    for (ViInt32 i = 1; i <= count; ++i) {
        ViChar name[512] = {};
        ViBoolean found = VI_FALSE;
        if (Ivi_GetNthLogicalName(list, i, name, sizeof name, &found) >= 0 && found)
            names.emplace_back(name);
    }
    Ivi_DisposeLogicalNamesList(list);
    return names;
}

} // namespace

struct VXSessionManager {};

struct VXSession {
    std::shared_ptr<Shared> shared;
};

struct VXNameList {
    std::vector<std::string> names;
};

extern "C" {

int32_t VXSessionServer_CreateManager(VXSessionManager** manager, char* error, int32_t errorSize) {
    if (manager == nullptr)
        return Fail(-1, "VXSessionServer: manager is a null pointer", error, errorSize);
    *manager = new VXSessionManager;
    return 0;
}

void VXSessionServer_ReleaseManager(VXSessionManager* manager) {
    delete manager;
}

int32_t VXSessionServer_GetSession(VXSessionManager* manager, const char* address, int32_t flags,
                                   VXSession** session, char* error, int32_t errorSize) {
    (void)flags;
    if (manager == nullptr || address == nullptr || session == nullptr)
        return Fail(-1, "VXSessionServer: GetSession was given a null pointer", error, errorSize);
    *session = nullptr;
    const std::string_view text(address);
    if (text.size() < kAddressPrefix.size() ||
        !EqualsNoCase(text.substr(0, kAddressPrefix.size()), kAddressPrefix))
        return Fail(VXSESSIONSERVER_ERROR_UNKNOWN_NAME,
                    "The address \"" + std::string(text) +
                        "\" is not of the form IVI::IVIFGEN::<logical name>.",
                    error, errorSize);
    const std::string name(text.substr(kAddressPrefix.size()));
    bool known = false;
    for (const auto& candidate : LogicalNames())
        known = known || EqualsNoCase(candidate, name);
    if (!known)
        return Fail(VXSESSIONSERVER_ERROR_UNKNOWN_NAME,
                    "The logical name \"" + name + "\" is not known to the session manager.", error,
                    errorSize);
    std::lock_guard lock(g_mutex);
    auto& shared = g_shared[Key(name)];
    if (!shared) shared = std::make_shared<Shared>(Shared{name, 0, 0});
    ++shared->users;
    *session = new VXSession{shared};
    return 0;
}

int32_t VXSessionServer_Open(VXSession* session, const char* options, char* error,
                             int32_t errorSize) {
    if (session == nullptr)
        return Fail(-1, "VXSessionServer: Open was given a null pointer", error, errorSize);
    std::lock_guard lock(g_mutex);
    Shared& shared = *session->shared;
    if (shared.vi != 0) return 0;
    ViBoolean reset = VI_FALSE, idQuery = VI_FALSE;
    std::vector<qzivi::ivi::Option> driverOptions;
    try {
        for (auto& option : qzivi::ivi::ParseOptions(options != nullptr ? options : "")) {
            if (EqualsNoCase(option.name, "Reset"))
                reset = qzivi::ivi::ParseBoolOption(option) ? VI_TRUE : VI_FALSE;
            else if (EqualsNoCase(option.name, "IDQuery"))
                idQuery = qzivi::ivi::ParseBoolOption(option) ? VI_TRUE : VI_FALSE;
            else
                driverOptions.push_back(std::move(option));
        }
    } catch (const qzivi::ivi::StatusError& e) {
        return Fail(e.Status(),
                    "The session \"" + shared.logicalName + "\" could not be opened.\n" + e.what(),
                    error, errorSize);
    }
    ViSession vi = 0;
    const ViStatus status =
        IviFgen_InitWithOptions(shared.logicalName.c_str(), idQuery, reset,
                                qzivi::ivi::JoinOptions(driverOptions).c_str(), &vi);
    if (status < 0) {
        ViStatus code = 0;
        ViChar text[1024] = {};
        IviFgen_GetError(VI_NULL, &code, sizeof text, text);
        return Fail(status,
                    "The session \"" + shared.logicalName + "\" could not be opened.\n" + text,
                    error, errorSize);
    }
    shared.vi = vi;
    return 0;
}

int32_t VXSessionServer_IsOpen(VXSession* session) {
    if (session == nullptr) return 0;
    std::lock_guard lock(g_mutex);
    return session->shared->vi != 0 ? 1 : 0;
}

int32_t VXSessionServer_Handle(VXSession* session, int32_t which, int32_t* handle, char* error,
                               int32_t errorSize) {
    if (session == nullptr || handle == nullptr)
        return Fail(-1, "VXSessionServer: Handle was given a null pointer", error, errorSize);
    if (which != 1)
        return Fail(-1, "VXSessionServer: only handle 1, the class session, exists", error,
                    errorSize);
    std::lock_guard lock(g_mutex);
    *handle = static_cast<int32_t>(session->shared->vi);
    return 0;
}

void VXSessionServer_ReleaseSession(VXSession* session) {
    if (session == nullptr) return;
    {
        std::lock_guard lock(g_mutex);
        Shared& shared = *session->shared;
        if (--shared.users == 0) {
            if (shared.vi != 0) IviFgen_close(shared.vi);
            shared.vi = 0;
            g_shared.erase(Key(shared.logicalName));
        }
    }
    delete session;
}

int32_t VXSessionServer_ListSessions(VXSessionManager* manager, const char* className,
                                     int32_t flags, int32_t reserved, VXNameList** names,
                                     char* error, int32_t errorSize) {
    (void)flags;
    (void)reserved;
    if (manager == nullptr || names == nullptr)
        return Fail(-1, "VXSessionServer: ListSessions was given a null pointer", error, errorSize);
    *names = new VXNameList;
    if (className != nullptr && EqualsNoCase(className, "IVI::IviFgen"))
        (*names)->names = LogicalNames();
    return 0;
}

int32_t VXSessionServer_NameCount(const VXNameList* names) {
    return names != nullptr ? static_cast<int32_t>(names->names.size()) : 0;
}

const char* VXSessionServer_Name(const VXNameList* names, int32_t index) {
    if (names == nullptr || index < 0 || static_cast<size_t>(index) >= names->names.size())
        return nullptr;
    return names->names[static_cast<size_t>(index)].c_str();
}

void VXSessionServer_ReleaseNames(VXNameList* names) {
    delete names;
}

} // extern "C"
