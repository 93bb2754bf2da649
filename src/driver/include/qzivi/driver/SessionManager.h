// The session manager library, reached at run time: present means managed mode.
#pragma once

#include "qzivi/support/variant.h"

#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

struct SessionLibrary;

// A session object of the manager. Dropping the last reference releases it, which closes the
// driver session when no other object of the same logical name holds it.
class SessionObject {
public:
    SessionObject(std::shared_ptr<const SessionLibrary> library, void* session);
    ~SessionObject();
    SessionObject(const SessionObject&) = delete;
    SessionObject& operator=(const SessionObject&) = delete;

    void Open(const std::string& options);
    bool IsOpen() const;
    std::int32_t Handle(std::int32_t which) const;

private:
    std::shared_ptr<const SessionLibrary> library_;
    void* session_;
};

class SessionManager {
public:
    // The manager, or null if the library cannot be had. QZIVI_SESSION_MANAGER names the library
    // file ("none" for none); otherwise "libqzivisessions.so" through the loader's search path.
    static std::shared_ptr<SessionManager> Create();

    SessionManager(std::shared_ptr<const SessionLibrary> library, void* manager);
    ~SessionManager();
    SessionManager(const SessionManager&) = delete;
    SessionManager& operator=(const SessionManager&) = delete;

    // Failures raise the library's number with the source "VXSessionServer" and its text.
    std::shared_ptr<SessionObject> GetSession(const std::string& address, std::int32_t flags);
    // An array of texts.
    Variant ListSessions(const std::string& className, std::int32_t flags, std::int32_t reserved);

private:
    std::shared_ptr<const SessionLibrary> library_;
    void* manager_;
};

} // namespace qzivi
