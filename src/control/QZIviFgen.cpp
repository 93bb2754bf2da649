#include "qzivi/control/QZIviFgen.h"

#include "qzivi/control/Host.h"
#include "qzivi/control/Panel.h"
#include "qzivi/driver/ErrorModule.h"
#include "qzivi/model/PropertyBag.h"
#include "qzivi/support/failure.h"

namespace qzivi {

QZIviFgen::QZIviFgen(IQZIviFgenHost* host) : m_oHost(host) {
    m_oIO = std::make_unique<CIviFgenIOImp>();
    m_oProp = CIviFgenPropImp::Create();
    m_oErr = std::make_shared<CIviErrorReport>();
    m_oIO->Construct(m_oProp, m_oErr);
    m_oProp->Attach(m_oErr);
    ConnectPropertySet();
    m_cError =
        m_oErr->Error.Connect([this](std::int32_t code, const std::string& source,
                                     const std::string& text) { IviError(code, source, text); });
    m_cWarning = m_oErr->Warning.Connect(
        [this](std::int32_t code, const std::string& source, const std::string& text) {
            IviWarning(code, source, text);
        });
    m_cInitialized = m_oErr->Initialized.Connect([this] { Initialized(); });
    m_cConfigured = m_oIO->Configured.Connect([this] { Configured(); });
}

QZIviFgen::~QZIviFgen() {
    m_cAutoConfigTick.Disconnect();
    m_oAutoConfigHack.reset();
    try {
        if (m_oUI && m_oHost) m_oHost->RemoveChild("UI");
    } catch (...) {
    }
    m_oUI.reset();
    try {
        ReleaseCopy(true);
    } catch (...) {
    }
    try {
        m_oProp->Detach();
    } catch (...) {
    }
    m_oIO.reset(); // closes an open session
    m_cPropertyChange.Disconnect();
    m_oProp.reset();
    m_cError.Disconnect();
    m_cWarning.Disconnect();
    m_cInitialized.Disconnect();
    m_oErr.reset();
}

void QZIviFgen::ConnectPropertySet() {
    m_cPropertyChange = m_oProp->PropertyChange.Connect([this](const std::string& name) {
        if (m_oHost) m_oHost->PropertyChanged(name);
    });
}

template <typename F>
auto QZIviFgen::Frame(const char* source, F&& body) -> decltype(body()) {
    try {
        return body();
    } catch (...) {
        HandleError(source, m_oProp->ExceptionOnError() ? -1 : 0, m_oErr.get());
        if constexpr (!std::is_void_v<decltype(body())>) return {};
    }
}

template <typename F>
auto QZIviFgen::PageFrame(const char* source, F&& body) -> decltype(body()) {
    try {
        return body();
    } catch (...) {
        HandleError(source, -1, nullptr);
        throw; // not reached: mode -1 raises
    }
}

// ---- Host notices ------------------------------------------------------------------------------

void QZIviFgen::InitProperties() {
    try {
        m_oProp->InitProperties();
    } catch (...) {
    }
    FinishLoad();
}

void QZIviFgen::ReadProperties(const PropertyBag& bag) {
    try {
        m_oProp->ReadProperties(bag, "", true);
    } catch (...) { // a half-read set carries on; the load still finishes
    }
    FinishLoad();
}

void QZIviFgen::WriteProperties(PropertyBag& bag) {
    try {
        m_oProp->WriteProperties(bag, "", true);
    } catch (...) {
    }
}

void QZIviFgen::FinishLoad() {
    try {
        SetDisplayName(m_oHost ? m_oHost->DisplayName() : std::string());
    } catch (...) {
    }
    try {
        SetUiStyle(m_oProp->UIStyle());
    } catch (...) {
    }
    ArmAutoConfigure();
}

// ---- Panel hosting -----------------------------------------------------------------------------

namespace {
std::int32_t Whole(float value) {
    return static_cast<std::int32_t>(value);
}
} // namespace

void QZIviFgen::SetUiStyle(std::int32_t style) {
    if (style == m_oStyle.lastStyle && style >= 0 && m_oStyle.applied) return;
    Quietly([&] {
        if (m_oUI) m_oStyle.savedState = m_oUI->UiState();
    });
    m_oUI.reset();
    Quietly([&] {
        if (m_oHost) m_oHost->RemoveChild("UI");
    });
    const bool userMode = m_oHost && m_oHost->UserMode();
    if (m_oHost && (!userMode || style != qzivifgenInvisibleAtRuntime)) {
        const std::string className = style == qzivifgenInvisibleAtRuntime
                                          ? "QZIviFgenLib.XUILess"
                                          : "QZIviFgenLib.XUIFgen" + std::to_string(style);
        m_oUI = m_oHost->AddChild(className, "UI");
        if (m_oUI) m_oUI->Construct(m_oIO.get(), m_oProp, m_oErr);
    }
    if (!m_oUI) {
        if (m_oHost) {
            m_oHost->SetSize(0, 0);
            Quietly([&] {
                m_oStyle.wasVisible = m_oHost->FormEntryVisible() && userMode;
                m_oHost->SetFormEntryVisible(!userMode);
            });
        }
    } else {
        ShowPanelState(m_oStyle.savedState);
        if (m_oStyle.lastStyle != qzivifgenInvisibleAtRuntime || !m_oStyle.applied) {
            m_oStyle.savedWidth = Whole(m_oHost->Width());
            m_oStyle.savedHeight = Whole(m_oHost->Height());
        } else {
            // Back from the invisible style: the size and visibility of before.
            if (m_oStyle.savedWidth >= 1 || m_oStyle.savedHeight >= 1)
                m_oHost->SetSize(static_cast<float>(m_oStyle.savedWidth),
                                 static_cast<float>(m_oStyle.savedHeight));
            Quietly([&] {
                if (m_oStyle.wasVisible) m_oHost->SetFormEntryVisible(true);
            });
        }
        Resized();
        m_oUI->Visible(true);
    }
    m_oStyle.lastStyle = style;
    m_oStyle.applied = true;
}

void QZIviFgen::ShowPanelState(std::int32_t state) {
    const bool userMode = m_oHost && m_oHost->UserMode();
    m_oUI->UiState(userMode ? state & ~1 : state | 1);
    m_oUI->Enabled(m_oProp->Enabled());
    m_oUI->Move(0, 0);
}

void QZIviFgen::Resized() {
    if (m_bResizing || !m_oUI || !m_oHost) return;
    m_bResizing = true;
    Quietly([&] {
        m_oUI->Size(m_oHost->Width(), m_oHost->Height());
        m_oHost->SetSize(m_oUI->Width(), m_oUI->Height());
    });
    m_bResizing = false;
}

void QZIviFgen::RefreshPanel() {
    std::int32_t state = 0;
    Quietly([&] {
        if (m_oUI) state = m_oUI->UiState();
    });
    if (!m_oUI) {
        if (!m_oHost) return;
        Quietly([&] {
            m_oHost->SetSize(0, 0);
            m_oHost->SetFormEntryVisible(!m_oHost->UserMode());
        });
        return;
    }
    Quietly([&] { ShowPanelState(state); });
    Resized();
}

void QZIviFgen::GotFocus() {
    Quietly([&] {
        if (m_oHost && m_oHost->UserMode() && !m_oUI) m_oHost->SendTab();
    });
}

void QZIviFgen::ArmAutoConfigure() {
    try {
        if (m_oProp->AutoConfigure() && m_oHost && m_oHost->UserMode()) {
            m_oAutoConfigHack = CTimer::Create();
            m_cAutoConfigTick = m_oAutoConfigHack->Timer.Connect([this] { AutoConfigureTick(); });
            m_oAutoConfigHack->OneShot(1);
        }
    } catch (...) {
        HandleError("AutoConfigure", 0, m_oErr.get());
    }
}

// The host's own load code has run: now the instrument is configured, and whatever fails is
// reported without a raise.
void QZIviFgen::AutoConfigureTick() {
    try {
        m_oIO->Configure(false);
    } catch (...) {
        HandleError("AutoConfigure", 0, m_oErr.get());
    }
    m_cAutoConfigTick.Disconnect();
    m_oAutoConfigHack.reset();
}

void QZIviFgen::AmbientChanged(const std::string& name) {
    try {
        if (name == "UserMode") {
            if (m_oHost && m_oHost->UserMode()) {
                if (m_oUI) m_oUI->UiState(m_oUI->UiState() & ~1);
                FinishLoad();
            }
        } else if (name == "DisplayName") {
            SetDisplayName(m_oHost ? m_oHost->DisplayName() : std::string());
        }
    } catch (...) {
    }
}

void QZIviFgen::SetDisplayName(const std::string& name) {
    // Without a host, or with one that gives no name, error sources start with the class's name,
    // not with a bare "." ("QZIviFgen.Channels.Item").
    m_sDisplayName = name.empty() ? "QZIviFgen" : name;
    m_oProp->SetPath(m_sDisplayName);
}

// ---- Methods -----------------------------------------------------------------------------------

void QZIviFgen::Init(bool DoIDQuery, bool DoReset, const std::string& OptionString,
                     std::int32_t ReInitBehavior) {
    Frame("Init", [&] { m_oIO->Init(DoIDQuery, DoReset, OptionString, ReInitBehavior); });
}

void QZIviFgen::CloseSession() {
    Frame("CloseSession", [&] { m_oIO->CloseSession(); });
}

void QZIviFgen::Configure() {
    Frame("Configure", [&] { m_oIO->Configure(false); });
}

void QZIviFgen::Initiate() {
    Frame("Initiate", [&] { m_oIO->Initiate(false); });
}

void QZIviFgen::Abort() {
    Frame("Abort", [&] { m_oIO->Abort(false); });
}

void QZIviFgen::SendSoftwareTrigger() {
    Frame("SendSoftwareTrigger", [&] { m_oIO->SendSoftwareTrigger(); });
}

std::int32_t QZIviFgen::GetLastIviError() {
    return Frame("GetLastIviError", [&] { return m_oErr->GetLastIviError(); });
}

void QZIviFgen::AboutBox() {
    Frame("AboutBox", [&] {
        if (m_oHost) m_oHost->ShowAboutBox();
    });
}

// ---- Properties --------------------------------------------------------------------------------

std::string QZIviFgen::LogicalName() {
    return Frame("LogicalName", [&] { return m_oProp->LogicalName(); });
}
void QZIviFgen::LogicalName(const std::string& value) {
    Frame("LogicalName", [&] { m_oProp->LogicalName(value); });
}

std::shared_ptr<QZIviConfigurations> QZIviFgen::Configurations() {
    return Frame("Configurations", [&] { return m_oProp->Configurations(); });
}

std::int32_t QZIviFgen::UIStyle() {
    return Frame("UIStyle", [&] { return m_oProp->UIStyle(); });
}
void QZIviFgen::UIStyle(std::int32_t value) {
    Property("UIStyle", value);
}

bool QZIviFgen::Enabled() {
    return Frame("Enabled", [&] { return m_oProp->Enabled(); });
}
void QZIviFgen::Enabled(bool value) {
    Property("Enabled", value);
}

bool QZIviFgen::AutoConfigure() {
    return Frame("AutoConfigure", [&] { return m_oProp->AutoConfigure(); });
}
void QZIviFgen::AutoConfigure(bool value) {
    Frame("AutoConfigure", [&] { m_oProp->AutoConfigure(value); });
}

std::shared_ptr<QZIviFgenSequences> QZIviFgen::Sequences() {
    return Frame("Sequences", [&] { return m_oProp->Sequences(); });
}
std::shared_ptr<QZIviFgenArbWaveforms> QZIviFgen::Waveforms() {
    return Frame("Waveforms", [&] { return m_oProp->Waveforms(); });
}
std::shared_ptr<QZIviFgenChannels> QZIviFgen::Channels() {
    return Frame("Channels", [&] { return m_oProp->Channels(); });
}
std::shared_ptr<QZIviFgenInternalConfig> QZIviFgen::Internal() {
    return Frame("Internal", [&] { return m_oProp->Internal(); });
}

std::int32_t QZIviFgen::RefClockSource() {
    return Frame("RefClockSource", [&] { return m_oProp->RefClockSource(); });
}
void QZIviFgen::RefClockSource(std::int32_t value) {
    Frame("RefClockSource", [&] { m_oProp->RefClockSource(value); });
}

std::int32_t QZIviFgen::OutputMode() {
    return Frame("OutputMode", [&] { return m_oProp->OutputMode(); });
}
void QZIviFgen::OutputMode(std::int32_t value) {
    Frame("OutputMode", [&] { m_oProp->OutputMode(value); });
}

std::int32_t QZIviFgen::Extensions() {
    return Frame("Extensions", [&] { return m_oProp->Extensions(); });
}
void QZIviFgen::Extensions(std::int32_t value) {
    Frame("Extensions", [&] { m_oProp->Extensions(value); });
}

bool QZIviFgen::AutoStopStart() {
    return Frame("AutoStopStart", [&] { return m_oProp->AutoStopStart(); });
}
void QZIviFgen::AutoStopStart(bool value) {
    Frame("AutoStopStart", [&] { m_oProp->AutoStopStart(value); });
}

double QZIviFgen::ArbSampleRate() {
    return Frame("ArbSampleRate", [&] { return m_oProp->ArbSampleRate(); });
}
void QZIviFgen::ArbSampleRate(double value) {
    Frame("ArbSampleRate", [&] { m_oProp->ArbSampleRate(value); });
}

bool QZIviFgen::ExceptionOnError() {
    return Frame("ExceptionOnError", [&] { return m_oProp->ExceptionOnError(); });
}
void QZIviFgen::ExceptionOnError(bool value) {
    Frame("ExceptionOnError", [&] { m_oProp->ExceptionOnError(value); });
}

namespace {
const PropertyRow<CIviFgenPropImp>& RootRow(const std::string& name) {
    for (const auto& row : CIviFgenPropImp::Properties())
        if (row.name == name) return row;
    RaiseRuntime(runtime::kWrongType, "The control has no property \"" + name + "\".");
}
} // namespace

PropertyValue QZIviFgen::Property(const std::string& name) {
    return Frame(name.c_str(), [&] { return RootRow(name).get(*m_oProp); });
}

void QZIviFgen::Property(const std::string& name, const PropertyValue& value) {
    Frame(name.c_str(), [&] {
        m_oProp->Put(RootRow(name), value);
        if (name == "UIStyle") SetUiStyle(m_oProp->UIStyle());
        if (name == "Enabled" && m_oUI) m_oUI->Enabled(m_oProp->Enabled());
    });
}

std::int32_t QZIviFgen::SessionHandle() {
    return Frame("SessionHandle", [&] { return static_cast<std::int32_t>(m_oErr->hSession()); });
}

// ---- The property pages' link -----------------------------------------------------------------

std::shared_ptr<CIviFgenPropImp> QZIviFgen::PropCopy() {
    return PageFrame("PropCopy", [&] { return m_oPropCopy; });
}

std::int32_t QZIviFgen::LastChangeIndex() {
    return PageFrame("LastChangeIndex", [&] { return m_nLastChangeIndex; });
}

std::int32_t QZIviFgen::IncrementLastChangeIndex() {
    return PageFrame("IncrementLastChangeIndex",
                     [&] { return m_nLastChangeIndex = NextChangeIndex(m_nLastChangeIndex); });
}

void QZIviFgen::RegisterSelectionChanged() {
    PageFrame("RegisterSelectionChanged", [&] {
        // Pages opened together share one copy; it is not refreshed from the live set meanwhile.
        if (++m_nCopyUsers == 1) m_oPropCopy = m_oProp->Clone(nullptr);
    });
}

void QZIviFgen::RegisterApplyChanges() {
    PageFrame("RegisterApplyChanges", [&] {
        auto next = m_oPropCopy->Clone(nullptr);
        next->OwnReferences(); // the working copy may go; the live tree must not lean on it
        next->SetPath(m_sDisplayName);
        if (m_oUI) m_oUI->SetNewPropSet(next);
        m_oIO->SetNewPropSet(next);
        const bool wasEnabled = m_oProp->Enabled();
        m_cPropertyChange.Disconnect();
        m_oProp->Detach();
        m_oProp = std::move(next);
        ConnectPropertySet();
        const bool enabled = m_oProp->Enabled();
        SetUiStyle(m_oProp->UIStyle());
        if (wasEnabled != enabled) RefreshPanel();
        if (m_oHost) m_oHost->PropertyChanged(""); // the host asks for everything again
    });
}

void QZIviFgen::ReleaseCopy(bool force) {
    PageFrame("ReleaseCopy", [&] {
        m_nCopyUsers = force ? 0 : std::max(0, m_nCopyUsers - 1);
        if (m_nCopyUsers == 0 && m_oPropCopy) {
            m_oPropCopy->Detach();
            m_oPropCopy.reset();
        }
    });
}

} // namespace qzivi
