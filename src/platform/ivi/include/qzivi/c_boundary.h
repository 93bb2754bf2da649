// What every driver of this project does at its C boundary: a table of open sessions, the IVI
// error record of a session or of a call without one, and the one wrapper of every exported entry
// that turns any C++ exception into an IVI status, so that none ever crosses into C.
#pragma once

#include "IviFgen.h"
#include "qzivi/ivi_common.h"

#include <array>
#include <atomic>
#include <cstddef>
#include <exception>
#include <memory>
#include <mutex>
#include <new>
#include <string>

namespace qzivi::ivi {

// The last failure of a session (or of a thread's calls without one) and its elaboration, as
// GetError answers them.
struct ErrorRecord {
    ViStatus status = 0;
    std::string elaboration;
    bool pending = false; // set by Set, cleared by a Report that takes the text

    // Keeps the failure and returns its status. Never throws: an elaboration that cannot be kept
    // is dropped.
    ViStatus Set(ViStatus failure, const char* function, const char* what) noexcept;
    // GetError: the status in `code`, the text and elaboration into the caller's buffer; a call
    // with a buffer clears the record. Returns what CopyText returns.
    ViStatus Report(ViStatus* code, ViInt32 bufferSize, ViChar description[]) noexcept;
};

// Runs the body of one exported entry. A StatusError gives its status; out of memory, any other
// exception, and an exception of an unknown type give their IVI statuses; each is kept in
// `record` with the function's name.
template <typename Body>
ViStatus CEntry(const char* function, ErrorRecord& record, Body&& body) noexcept {
    try {
        return body();
    } catch (const StatusError& e) {
        return record.Set(e.Status(), function, e.what());
    } catch (const std::bad_alloc&) {
        return record.Set(IVI_ERROR_OUT_OF_MEMORY, function, "out of memory");
    } catch (const std::exception& e) {
        return record.Set(IVI_ERROR_CANNOT_RECOVER, function, e.what());
    } catch (...) {
        return record.Set(IVI_ERROR_CANNOT_RECOVER, function, "an exception of an unknown type");
    }
}

// An output parameter of an entry; a null pointer is the caller's error.
template <typename T>
void Out(T* pointer, T value) {
    if (pointer == nullptr)
        throw StatusError(IVI_ERROR_NULL_POINTER, "an output parameter is a null pointer");
    *pointer = value;
}

// A session number that is none of the driver's, kept in `record` with the function's name.
inline ViStatus InvalidSession(ErrorRecord& record, ViSession vi, const char* function) noexcept {
    return CEntry(function, record, [&]() -> ViStatus {
        throw StatusError(IVI_ERROR_INVALID_SESSION_HANDLE,
                          std::to_string(vi) + " is not a session of this driver");
    });
}

// Every driver's error_message: the class's text of a status.
inline ViStatus ErrorMessage(ErrorRecord& record, ViStatus status, ViChar message[]) noexcept {
    return CEntry("error_message", record, [&]() -> ViStatus {
        if (message == nullptr) throw StatusError(IVI_ERROR_NULL_POINTER, "message is null");
        StatusMessage(status, message);
        return VI_SUCCESS;
    });
}

// The open sessions of one driver, numbered from `first`: lookups are lock-free, opening and
// closing take the table's lock. A number of another driver falls outside the range.
template <typename Session, std::size_t Slots = 256>
class SessionTable {
public:
    explicit SessionTable(ViSession first) : first_(first) {}
    ~SessionTable() {
        for (auto& slot : slots_)
            delete slot.load();
    }

    Session* Find(ViSession vi) const {
        if (vi < first_ || vi >= first_ + static_cast<ViSession>(Slots)) return nullptr;
        return slots_[vi - first_].load(std::memory_order_acquire);
    }

    // The new session's number; throws StatusError(IVI_ERROR_TOO_MANY_SESSIONS) when all are open.
    ViSession Insert(std::unique_ptr<Session> session) {
        std::lock_guard lock(mutex_);
        for (std::size_t slot = 0; slot < Slots; ++slot)
            if (slots_[slot].load(std::memory_order_relaxed) == nullptr) {
                slots_[slot].store(session.release(), std::memory_order_release);
                return first_ + static_cast<ViSession>(slot);
            }
        throw StatusError(IVI_ERROR_TOO_MANY_SESSIONS,
                          "all " + std::to_string(Slots) + " sessions are open");
    }

    // Takes the session out; null if the number is no open session.
    std::unique_ptr<Session> Remove(ViSession vi) {
        std::lock_guard lock(mutex_);
        if (Find(vi) == nullptr) return nullptr;
        return std::unique_ptr<Session>(slots_[vi - first_].exchange(nullptr));
    }

    template <typename F>
    Session* FindIf(F&& match) const {
        for (const auto& slot : slots_)
            if (Session* s = slot.load(std::memory_order_acquire); s != nullptr && match(*s))
                return s;
        return nullptr;
    }

    // Every driver's GetError: the session's record, or `orphans` for a number of no session.
    ViStatus Report(ViSession vi, ErrorRecord& orphans, ViStatus* code, ViInt32 bufferSize,
                    ViChar description[]) noexcept {
        Session* s = Find(vi);
        if (s == nullptr) return orphans.Report(code, bufferSize, description);
        return CEntry("GetError", s->record, [&] {
            std::lock_guard lock(s->mutex);
            return s->record.Report(code, bufferSize, description);
        });
    }

private:
    ViSession first_;
    std::array<std::atomic<Session*>, Slots> slots_{};
    std::mutex mutex_;
};

} // namespace qzivi::ivi
