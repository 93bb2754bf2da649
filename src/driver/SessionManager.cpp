#include "qzivi/driver/SessionManager.h"

#include "VXSessionServer.h"
#include "qzivi/support/failure.h"

#include <cstdlib>
#include <dlfcn.h>
#include <mutex>

namespace qzivi {

struct SessionLibrary {
    decltype(&VXSessionServer_CreateManager) CreateManager = nullptr;
    decltype(&VXSessionServer_ReleaseManager) ReleaseManager = nullptr;
    decltype(&VXSessionServer_GetSession) GetSession = nullptr;
    decltype(&VXSessionServer_Open) Open = nullptr;
    decltype(&VXSessionServer_IsOpen) IsOpen = nullptr;
    decltype(&VXSessionServer_Handle) Handle = nullptr;
    decltype(&VXSessionServer_ReleaseSession) ReleaseSession = nullptr;
    decltype(&VXSessionServer_ListSessions) ListSessions = nullptr;
    decltype(&VXSessionServer_NameCount) NameCount = nullptr;
    decltype(&VXSessionServer_Name) Name = nullptr;
    decltype(&VXSessionServer_ReleaseNames) ReleaseNames = nullptr;
};

namespace {

constexpr const char* kSource = "VXSessionServer";

// The library stays loaded for the process once found; a missing one is looked for again.
std::shared_ptr<const SessionLibrary> Load() {
    static std::mutex mutex;
    static std::shared_ptr<const SessionLibrary> loaded;
    std::lock_guard lock(mutex);
    const char* named = std::getenv("QZIVI_SESSION_MANAGER");
    const std::string file = named != nullptr && *named != '\0' ? named : "libqzivisessions.so";
    if (file == "none") return nullptr;
    if (loaded) return loaded;
    void* handle = ::dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (handle == nullptr) return nullptr;
    auto library = std::make_shared<SessionLibrary>();
    bool complete = true;
    auto bind = [&](auto& slot, const char* name) {
        slot = reinterpret_cast<std::remove_reference_t<decltype(slot)>>(::dlsym(handle, name));
        complete = complete && slot != nullptr;
    };
    bind(library->CreateManager, "VXSessionServer_CreateManager");
    bind(library->ReleaseManager, "VXSessionServer_ReleaseManager");
    bind(library->GetSession, "VXSessionServer_GetSession");
    bind(library->Open, "VXSessionServer_Open");
    bind(library->IsOpen, "VXSessionServer_IsOpen");
    bind(library->Handle, "VXSessionServer_Handle");
    bind(library->ReleaseSession, "VXSessionServer_ReleaseSession");
    bind(library->ListSessions, "VXSessionServer_ListSessions");
    bind(library->NameCount, "VXSessionServer_NameCount");
    bind(library->Name, "VXSessionServer_Name");
    bind(library->ReleaseNames, "VXSessionServer_ReleaseNames");
    if (!complete) {
        ::dlclose(handle);
        return nullptr;
    }
    loaded = std::move(library);
    return loaded;
}

void Check(std::int32_t number, const char* text) {
    if (number != 0) throw Failure(number, kSource, text);
}

} // namespace

std::shared_ptr<SessionManager> SessionManager::Create() {
    auto library = Load();
    if (!library) return nullptr;
    void* manager = nullptr;
    char error[1024] = {};
    if (library->CreateManager(reinterpret_cast<VXSessionManager**>(&manager), error,
                               sizeof error) != 0)
        return nullptr;
    return std::make_shared<SessionManager>(std::move(library), manager);
}

SessionManager::SessionManager(std::shared_ptr<const SessionLibrary> library, void* manager)
    : library_(std::move(library)), manager_(manager) {}

SessionManager::~SessionManager() {
    library_->ReleaseManager(static_cast<VXSessionManager*>(manager_));
}

std::shared_ptr<SessionObject> SessionManager::GetSession(const std::string& address,
                                                          std::int32_t flags) {
    VXSession* session = nullptr;
    char error[2048] = {};
    Check(library_->GetSession(static_cast<VXSessionManager*>(manager_), address.c_str(), flags,
                               &session, error, sizeof error),
          error);
    return std::make_shared<SessionObject>(library_, session);
}

Variant SessionManager::ListSessions(const std::string& className, std::int32_t flags,
                                     std::int32_t reserved) {
    VXNameList* names = nullptr;
    char error[1024] = {};
    Check(library_->ListSessions(static_cast<VXSessionManager*>(manager_), className.c_str(), flags,
                                 reserved, &names, error, sizeof error),
          error);
    std::vector<Variant> items;
    for (std::int32_t i = 0; i < library_->NameCount(names); ++i)
        items.emplace_back(library_->Name(names, i));
    library_->ReleaseNames(names);
    return Variant::Array(std::move(items));
}

SessionObject::SessionObject(std::shared_ptr<const SessionLibrary> library, void* session)
    : library_(std::move(library)), session_(session) {}

SessionObject::~SessionObject() {
    library_->ReleaseSession(static_cast<VXSession*>(session_));
}

void SessionObject::Open(const std::string& options) {
    char error[2048] = {};
    Check(library_->Open(static_cast<VXSession*>(session_), options.c_str(), error, sizeof error),
          error);
}

bool SessionObject::IsOpen() const {
    return library_->IsOpen(static_cast<VXSession*>(session_)) != 0;
}

std::int32_t SessionObject::Handle(std::int32_t which) const {
    std::int32_t handle = 0;
    char error[1024] = {};
    Check(library_->Handle(static_cast<VXSession*>(session_), which, &handle, error, sizeof error),
          error);
    return handle;
}

} // namespace qzivi
