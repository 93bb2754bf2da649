// CIviErrorReport: the owner of the instrument session, its state, and the error path that turns
// driver statuses and fixed conditions into numbered failures and events.
#pragma once

#include "IviFgen.h"
#include "qzivi/driver/SessionManager.h"
#include "qzivi/support/event.h"
#include "qzivi/support/variant.h"

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

namespace qzivi {

// The session states, single bits so that a set of them fits in one mask.
enum IviStates : std::int32_t {
    IviStateClosed = 1,
    IviStateInitialized = 2,
    IviStateConfigured = 4,
    IviStateBusy = 8,
};

enum QZIviReInitBehaviors : std::int32_t {
    qziviNoOp = 0,
    qziviCloseAndInit = 1,
    qziviRaiseError = 2,
};

// Holds a failure across the clean-up of Init.
class CIviSaveErrorInfo {
public:
    void SaveInfo(std::int32_t number, std::string source, std::string description);
    // Raises the stored failure again, without help file and context; does nothing if none.
    void Throw();

private:
    std::int32_t m_lNumber = 0;
    std::string m_sSource;
    std::string m_sDescription;
    bool m_bSaved = false;
};

class CIviErrorReport {
public:
    // Looks for the session manager: managed mode if it is there, direct mode otherwise.
    CIviErrorReport();
    ~CIviErrorReport();
    CIviErrorReport(const CIviErrorReport&) = delete;
    CIviErrorReport& operator=(const CIviErrorReport&) = delete;

    // ---- Session and state ----
    void Init(std::string& name, bool doIDQuery, bool doReset, const std::string& optionString,
              std::int32_t reInitBehavior);
    void CloseSession(bool raiseAgain);

    std::int32_t state() const { return m_lState; }
    void state(std::int32_t newState); // fires StateChanged(new, old) first

    // Refuses, through DoStdError, a call whose forbidden mask meets the present state;
    // otherwise returns the present state and, if asked, turns busy.
    std::int32_t CheckForValidState(std::int32_t forbidden, const std::string& source,
                                    bool setBusy);
    // The same, with the source made of a path and a word only when the call is refused.
    std::int32_t CheckForValidState(std::int32_t forbidden, std::string_view path,
                                    std::string_view word, bool setBusy);

    ViSession hSession() const;
    void hSession(ViSession session);
    bool IsInitialized() const;
    bool UsingSessionMgr() const { return m_oSessionMgr != nullptr; }
    const std::shared_ptr<SessionManager>& SessionMgr() const { return m_oSessionMgr; }
    const std::shared_ptr<SessionObject>& IviSession() const { return m_oIviSession; }
    void IviSession(std::shared_ptr<SessionObject> session) { m_oIviSession = std::move(session); }

    static std::string BuildOptionString(bool doReset, bool doIDQuery,
                                         const std::string& optionString);
    static ViBoolean ToViBoolean(bool value) { return value ? VI_TRUE : VI_FALSE; }
    bool IsSpecVersionOk();
    bool IsVxFgenCompliant();
    // The logical names: the session manager's for the class, or else every name the engine knows.
    // An array of texts, or empty when there are none.
    Variant GetLogicalNames(const std::string& className);

    // ---- Errors ----
    static std::int32_t MapIviError(ViStatus status);
    // Reports a driver status: warnings fire, errors raise; flags 8 only looks. Returns `status`.
    ViStatus IviCheckError(ViStatus status, std::string_view source, std::int32_t flags,
                           std::string_view extra) {
        if (status == 0) { // the common case, kept inline: it runs after every driver call
            m_lLastIviError = 0;
            return status;
        }
        return ReportStatus(status, source, flags, extra);
    }
    std::int32_t GetLastIviError() const { return m_lLastIviError; }
    void RaiseErrorEvents(std::int32_t code, const std::string& source,
                          const std::string& description);
    [[noreturn]] void DoStdError(std::int32_t code, const std::string& source,
                                 ViStatus iviStatus = 0, const std::string& extra = {});
    std::string BuildIviDescription(ViStatus status, std::string_view extra) const;

    bool ExceptionOnError() const { return m_bExceptionOnError; }
    void ExceptionOnError(bool value) { m_bExceptionOnError = value; }
    std::int32_t LastErrorNumber() const { return m_lLastErrorNumber; }
    const std::string& LastErrorDescription() const { return m_sLastErrorDescription; }
    const std::string& LastErrorSource() const { return m_sLastErrorSource; }

    // Events, in the order the system lists them.
    Event<std::int32_t, const std::string&, const std::string&> Error;
    Event<std::int32_t, const std::string&, const std::string&> AllError;
    Event<std::int32_t, std::int32_t> StateChanged;
    Event<std::int32_t, const std::string&, const std::string&> Warning;
    Event<> Initialized;
    Event<> SessionClosed;

private:
    ViStatus ReportStatus(ViStatus status, std::string_view source, std::int32_t flags,
                          std::string_view extra);

    std::int32_t m_lState = IviStateClosed;
    ViSession m_lSessionNumber = 0;
    std::shared_ptr<SessionManager> m_oSessionMgr;
    std::shared_ptr<SessionObject> m_oIviSession;
    std::string m_sLastLogicalName;
    CIviSaveErrorInfo m_oSavedError;

    bool m_bExceptionOnError = true; // the control's default, so a set read before any put agrees
    std::int32_t m_lLastErrorNumber = 0;
    std::string m_sLastErrorDescription;
    std::string m_sLastErrorSource;
    std::int32_t m_lLastIviError = 0;
    std::string m_sLastSource;
};

std::string TrimAtNull(const char* buffer, std::size_t size);

} // namespace qzivi
