#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/driver/ErrorIds.h"

#include "qzivi/driver/ErrorModule.h"
#include "qzivi/driver/StringTable.h"
#include "qzivi/support/failure.h"

#include <cstdio>
#include <cstring>

namespace qzivi {

namespace {

// Sets InSessionMgrCall for one call into a session object; a failure leaves it set.
template <typename F>
auto SessionMgrCall(F&& call) {
    InSessionMgrCall = true;
    if constexpr (std::is_void_v<decltype(call())>) {
        call();
        InSessionMgrCall = false;
    } else {
        auto result = call();
        InSessionMgrCall = false;
        return result;
    }
}

} // namespace

std::string TrimAtNull(const char* buffer, std::size_t size) {
    const void* nul = std::memchr(buffer, '\0', size);
    return nul != nullptr ? std::string(buffer, static_cast<const char*>(nul)) : std::string();
}

void CIviSaveErrorInfo::SaveInfo(std::int32_t number, std::string source, std::string description) {
    m_lNumber = number;
    m_sSource = std::move(source);
    m_sDescription = std::move(description);
    m_bSaved = true;
}

void CIviSaveErrorInfo::Throw() {
    if (!m_bSaved) return;
    m_bSaved = false;
    throw Failure(m_lNumber, m_sSource, m_sDescription);
}

CIviErrorReport::CIviErrorReport() {
    try {
        m_oSessionMgr = SessionManager::Create();
    } catch (...) {
        m_oSessionMgr = nullptr; // a missing or broken library means direct mode
    }
}

CIviErrorReport::~CIviErrorReport() = default;

// ---- Session and state --------------------------------------------------------------------------

void CIviErrorReport::state(std::int32_t newState) {
    StateChanged(newState, m_lState);
    m_lState = newState;
}

std::int32_t CIviErrorReport::CheckForValidState(std::int32_t forbidden, const std::string& source,
                                                 bool setBusy) {
    if ((forbidden & m_lState) != 0) {
        if (m_lState & IviStateClosed) DoStdError(errid::kNotInitialized, source);
        if (m_lState & IviStateInitialized) DoStdError(errid::kNotConfigured, source);
        DoStdError(errid::kOperationInProgress, source);
    }
    const std::int32_t present = m_lState;
    if (setBusy) state(IviStateBusy);
    return present;
}

std::int32_t CIviErrorReport::CheckForValidState(std::int32_t forbidden, std::string_view path,
                                                 std::string_view word, bool setBusy) {
    if ((forbidden & m_lState) != 0)
        return CheckForValidState(forbidden, std::string(path).append(word), setBusy);
    const std::int32_t present = m_lState;
    if (setBusy) state(IviStateBusy);
    return present;
}

ViSession CIviErrorReport::hSession() const {
    if (m_oIviSession)
        return static_cast<ViSession>(SessionMgrCall([&] { return m_oIviSession->Handle(1); }));
    return m_lSessionNumber;
}

void CIviErrorReport::hSession(ViSession session) {
    if (!m_oIviSession) m_lSessionNumber = session;
}

bool CIviErrorReport::IsInitialized() const {
    if (!UsingSessionMgr()) return m_lSessionNumber != 0;
    if (!m_oIviSession) return false;
    return SessionMgrCall([&] { return m_oIviSession->IsOpen(); });
}

std::string CIviErrorReport::BuildOptionString(bool doReset, bool doIDQuery,
                                               const std::string& optionString) {
    std::string text =
        std::string("Reset=") + (doReset ? "1" : "0") + ",IDQuery=" + (doIDQuery ? "1" : "0");
    if (!optionString.empty()) text += "," + optionString;
    return text;
}

void CIviErrorReport::Init(std::string& name, bool doIDQuery, bool doReset,
                           const std::string& optionString, std::int32_t reInitBehavior) {
    try {
        if (name.empty()) name = m_sLastLogicalName;
        if (name != m_sLastLogicalName) reInitBehavior = qziviCloseAndInit;
        if (IsInitialized()) {
            if (reInitBehavior == qziviNoOp) return;
            if (reInitBehavior == qziviCloseAndInit)
                CloseSession(true);
            else
                DoStdError(errid::kAlreadyInitialized, "Init");
        }
        CheckForValidState(IviStateBusy, "Init", true);
        if (UsingSessionMgr()) {
            InSessionMgrCall = true;
            m_oIviSession = m_oSessionMgr->GetSession("IVI::IVIFGEN::" + name, 0);
            m_oIviSession->Open(BuildOptionString(doReset, doIDQuery, optionString));
            InSessionMgrCall = false;
            state(IviStateInitialized);
            m_sLastLogicalName = name;
        } else {
            ViSession session = 0;
            const ViStatus status =
                IviFgen_InitWithOptions(name.c_str(), ToViBoolean(doIDQuery), ToViBoolean(doReset),
                                        optionString.c_str(), &session);
            IviCheckError(status, "Init", 0, "");
            hSession(session);
            state(IviStateInitialized);
            m_sLastLogicalName = name;
        }
        if (!IsSpecVersionOk()) DoStdError(errid::kClassSpecVersion, "Init");
        Initialized();
    } catch (...) {
        const PendingFailure failure = CurrentFailure();
        m_oSavedError.SaveInfo(failure.number, failure.source, failure.description);
        try {
            CloseSession(false);
        } catch (...) {
        }
        try {
            state(IviStateClosed);
        } catch (...) {
        }
        m_oIviSession.reset();
        m_oSavedError.Throw();
    }
}

void CIviErrorReport::CloseSession(bool raiseAgain) {
    try {
        CheckForValidState(IviStateClosed | IviStateBusy, "CloseSession", true);
        if (UsingSessionMgr()) {
            m_oIviSession.reset();
        } else {
            const ViStatus status = IviFgen_close(m_lSessionNumber);
            m_lSessionNumber = 0;
            IviCheckError(status, "CloseSession", 0, "");
        }
        state(IviStateClosed);
        SessionClosed();
    } catch (...) {
        try {
            state(IviStateClosed);
        } catch (...) {
        }
        m_oIviSession.reset();
        if (raiseAgain) ReRaise();
    }
}

bool CIviErrorReport::IsSpecVersionOk() {
    ViInt32 version = 0;
    IviFgen_GetAttributeViInt32(hSession(), "", IVI_ATTR_SPECIFIC_DRIVER_CLASS_SPEC_MAJOR_VERSION,
                                &version);
    return version >= 2 || IsVxFgenCompliant();
}

bool CIviErrorReport::IsVxFgenCompliant() {
    ViChar prefix[10] = {};
    IviFgen_GetAttributeViString(hSession(), "", IVI_ATTR_SPECIFIC_DRIVER_PREFIX, sizeof prefix,
                                 prefix);
    if (std::strncmp(prefix, "vxFgen", 6) != 0) return false;
    ViInt32 major = 0, minor = 0;
    IviFgen_GetAttributeViInt32(hSession(), "", IVI_ATTR_SPECIFIC_DRIVER_MAJOR_VERSION, &major);
    IviFgen_GetAttributeViInt32(hSession(), "", IVI_ATTR_SPECIFIC_DRIVER_MINOR_VERSION, &minor);
    const std::string minorText =
        std::to_string(minor < 0 ? -static_cast<std::int64_t>(minor) : minor);
    return major >= 1 && minorText.front() >= '5';
}

Variant CIviErrorReport::GetLogicalNames(const std::string& className) {
    std::shared_ptr<SessionManager> manager;
    try {
        manager = SessionManager::Create();
    } catch (...) {
    }
    if (manager) return manager->ListSessions(className, 1, 0);
    ViInt32 list = 0, count = 0;
    Ivi_GetLogicalNamesList(&list, &count);
    Variant names;
    if (count > 0) {
        std::vector<Variant> items;
        for (ViInt32 i = 1; i <= count; ++i) {
            ViChar buffer[512] = {};
            ViBoolean found = VI_FALSE;
            Ivi_GetNthLogicalName(list, i, buffer, sizeof buffer, &found);
            items.emplace_back(TrimAtNull(buffer, sizeof buffer));
        }
        names = Variant::Array(std::move(items));
    }
    Ivi_DisposeLogicalNamesList(list);
    return names;
}

// ---- Errors -------------------------------------------------------------------------------------

std::int32_t CIviErrorReport::MapIviError(ViStatus status) {
    struct RangeMap {
        std::uint32_t from, to, mask;
        std::int32_t base;
        int sign;
    };
    static constexpr RangeMap ranges[] = {
        {0xBFFA0000u, 0xBFFA1FFFu, 0xFFFu, -30700, -1},
        {0xBFFA2000u, 0xBFFA3FFFu, 0xFFFu, -31000, -1},
        {0xBFFA4000u, 0xBFFA6FFFu, 0xFFFu, -31500, -1},
        {0xBFFC0000u, 0xBFFCFFFFu, 0xFFFFu, -30900, -1},
        {0xBFFF0000u, 0xBFFFFFFFu, 0xFFFFu, -30500, -1},
        {0x3FFA0000u, 0x3FFA1FFFu, 0xFFFu, 30700, 1},
        {0x3FFA2000u, 0x3FFA3FFFu, 0xFFFu, 31000, 1},
        {0x3FFA4000u, 0x3FFA6FFFu, 0xFFFu, 31500, 1},
        {0x3FFC0000u, 0x3FFCFFFFu, 0xFFFFu, 30900, 1},
        {0x3FFF0000u, 0x3FFFFFFFu, 0xFFFFu, 30500, 1},
    };
    if (status == static_cast<ViStatus>(0x3FFF0080u)) return 31629;
    // Signed comparison within each range, as the statuses are signed 32-bit values.
    for (const auto& range : ranges) {
        const auto from = static_cast<ViStatus>(range.from);
        const auto to = static_cast<ViStatus>(range.to);
        if (status >= from && status <= to) {
            const auto low =
                static_cast<std::int32_t>(static_cast<std::uint32_t>(status) & range.mask);
            return range.base + range.sign * low;
        }
    }
    return status;
}

std::string CIviErrorReport::BuildIviDescription(ViStatus status, std::string_view extra) const {
    ViChar message[256] = {};
    ViChar elaboration[256] = {};
    ViSession session = 0;
    try {
        session = hSession();
    } catch (
        ...) { // the texts are a courtesy: a session that cannot be named gives the generic ones
    }
    IviFgen_error_message(session, status, message);
    IviFgen_GetAttributeViString(session, "", IVI_ATTR_ERROR_ELABORATION, sizeof elaboration,
                                 elaboration);
    std::string text;
    if (!extra.empty()) text.append("(").append(extra).append(") ");
    text += TrimAtNull(message, sizeof message);
    const std::string more = TrimAtNull(elaboration, sizeof elaboration);
    if (!more.empty()) text += " " + more;
    char hex[16];
    std::snprintf(hex, sizeof hex, "%X", static_cast<unsigned>(status));
    text += status > 0 ? " [IVI Warning Code:  " : " [IVI Error Code:  ";
    text += hex;
    text += "]";
    return text;
}

ViStatus CIviErrorReport::ReportStatus(ViStatus status, std::string_view sourceGiven,
                                       std::int32_t flags, std::string_view extra) {
    const std::int32_t code = MapIviError(status);
    m_lLastIviError = code;
    if (code == status) return status;
    if (!sourceGiven.empty()) m_sLastSource = sourceGiven;
    const std::string source = m_sLastSource;
    const std::string description = BuildIviDescription(status, extra);
    if (flags & 8) return status;
    if (status > 0) {
        Warning(code, source, description);
        return status;
    }
    throw Failure(code, source, description);
}

void CIviErrorReport::RaiseErrorEvents(std::int32_t code, const std::string& source,
                                       const std::string& description) {
    AllError(code, source, description);
    Error(code, source, description);
    m_lLastErrorNumber = code;
    m_sLastErrorSource = source;
    m_sLastErrorDescription = description;
}

void CIviErrorReport::DoStdError(std::int32_t code, const std::string& source, ViStatus iviStatus,
                                 const std::string& extra) {
    std::string description;
    try {
        description = LoadResString(-code) + " (" + source + ")";
    } catch (...) {
    }
    if (iviStatus < 0) description += "  " + BuildIviDescription(iviStatus, extra);
    throw Failure(code, source, description);
}

} // namespace qzivi
