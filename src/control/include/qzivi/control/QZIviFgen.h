// QZIviFgen: the one object the host sees. Every public member forwards to the property set, the
// session and error report, or the engine, in one guarded frame: a failure fires IviError and
// reaches the caller as a Failure only when ExceptionOnError is true.
#pragma once

#include "qzivi/control/PageLink.h"
#include "qzivi/driver/CIviErrorReport.h"
#include "qzivi/engine/CIviFgenIOImp.h"
#include "qzivi/model/CIviFgenPropImp.h"
#include "qzivi/support/event.h"
#include "qzivi/support/timers.h"

#include <cstdint>
#include <memory>
#include <string>

namespace qzivi {

class IQZIviFgenHost;
class IQZIviFgenPanel;
class PropertyBag;

class QZIviFgen : public IQZCtlUtil {
public:
    // `host` may be null: the control then behaves as at run time with no panel.
    explicit QZIviFgen(IQZIviFgenHost* host = nullptr);
    ~QZIviFgen() override;
    QZIviFgen(const QZIviFgen&) = delete;
    QZIviFgen& operator=(const QZIviFgen&) = delete;

    // ---- The host's life-cycle notices; none of them lets a failure out ----
    void InitProperties();                       // defaults for a new instance
    void ReadProperties(const PropertyBag& bag); // a stored instance
    void WriteProperties(PropertyBag& bag);
    void AmbientChanged(const std::string& name);
    // The host resized the control: the panel has the last word on the size.
    void Resized();
    // The control got the input focus: at run time without a panel it moves the focus on.
    void GotFocus();

    // ---- Methods ----
    void Init(bool DoIDQuery = false, bool DoReset = false, const std::string& OptionString = "",
              std::int32_t ReInitBehavior = qziviNoOp);
    void CloseSession();
    void Configure();
    void Initiate();
    void Abort();
    void SendSoftwareTrigger();
    std::int32_t GetLastIviError();
    void AboutBox();

    // ---- Properties ----
    std::string LogicalName();
    void LogicalName(const std::string& value);
    std::shared_ptr<QZIviConfigurations> Configurations();
    std::int32_t UIStyle();
    void UIStyle(std::int32_t value);
    bool Enabled();
    void Enabled(bool value);
    bool AutoConfigure();
    void AutoConfigure(bool value);
    std::shared_ptr<QZIviFgenSequences> Sequences();
    std::shared_ptr<QZIviFgenArbWaveforms> Waveforms();
    std::shared_ptr<QZIviFgenChannels> Channels();
    std::shared_ptr<QZIviFgenInternalConfig> Internal();
    std::int32_t RefClockSource();
    void RefClockSource(std::int32_t value);
    std::int32_t OutputMode();
    void OutputMode(std::int32_t value);
    std::int32_t Extensions();
    void Extensions(std::int32_t value);
    bool AutoStopStart();
    void AutoStopStart(bool value);
    double ArbSampleRate();
    void ArbSampleRate(double value);
    bool ExceptionOnError();
    void ExceptionOnError(bool value);
    std::int32_t SessionHandle();
    // A value of the root by the name of its row, as a host with generic properties sets it;
    // UIStyle and Enabled reach the panel as their own puts do.
    PropertyValue Property(const std::string& name);
    void Property(const std::string& name, const PropertyValue& value);

    // ---- Events ----
    Event<std::int32_t, const std::string&, const std::string&> IviError;
    Event<std::int32_t, const std::string&, const std::string&> IviWarning;
    Event<> Configured;
    Event<> Initialized;

    // The host's name of this control, "QZIviFgen" where it has none; it prefixes every error
    // source of the property tree.
    const std::string& DisplayName() const { return m_sDisplayName; }

    // The engine, for the panels and pages that sit on this control.
    CIviFgenIOImp& Engine() { return *m_oIO; }
    // The panel of the present style, if any.
    const std::shared_ptr<IQZIviFgenPanel>& Panel() const { return m_oUI; }
    // After an apply from the pages changed Enabled: the panel takes the state of the control.
    void RefreshPanel();

    // ---- The property pages' link (IQZCtlUtil); failures raise to the page ----
    std::shared_ptr<CIviFgenPropImp> PropCopy() override;
    std::int32_t LastChangeIndex() override;
    std::int32_t IncrementLastChangeIndex() override;
    void RegisterSelectionChanged() override;
    void RegisterApplyChanges() override;
    void ReleaseCopy(bool force) override;

private:
    template <typename F>
    auto Frame(const char* source, F&& body) -> decltype(body());
    // A member the pages call: the failure is reported to no one and raised to the page.
    template <typename F>
    auto PageFrame(const char* source, F&& body) -> decltype(body());
    void FinishLoad();
    void SetDisplayName(const std::string& name);
    void ConnectPropertySet();
    // The only place where a panel is made or dropped.
    void SetUiStyle(std::int32_t style);
    // UiState with bit 0 ("design mode") from the host's mode, Enabled, the panel at 0, 0.
    void ShowPanelState(std::int32_t state);
    void ArmAutoConfigure();
    void AutoConfigureTick();

    IQZIviFgenHost* m_oHost;
    std::unique_ptr<CIviFgenIOImp> m_oIO;
    std::shared_ptr<CIviFgenPropImp> m_oProp;
    std::shared_ptr<CIviErrorReport> m_oErr;
    std::shared_ptr<IQZIviFgenPanel> m_oUI;
    std::string m_sDisplayName;
    std::shared_ptr<CTimer> m_oAutoConfigHack;
    Connection m_cAutoConfigTick;
    // What SetUiStyle keeps from call to call.
    struct StyleMemory {
        std::int32_t lastStyle = 0;
        bool applied = false;
        bool wasVisible = false;
        std::int32_t savedWidth = 0, savedHeight = 0;
        std::int32_t savedState = 0;
    } m_oStyle;
    bool m_bResizing = false;
    // The pages' working copy, present while a page link holds it, and their change counter.
    std::shared_ptr<CIviFgenPropImp> m_oPropCopy;
    std::int32_t m_nCopyUsers = 0;
    std::int32_t m_nLastChangeIndex = 0;
    Connection m_cPropertyChange;
    Connection m_cError;
    Connection m_cWarning;
    Connection m_cInitialized;
    Connection m_cConfigured;
};

} // namespace qzivi
